// The exported VISA functions: argument checks, the call record, and the
// hand-over to the handle table and the sessions.

#include "Handles.h"
#include "Recorder.h"
#include "ResourceName.h"
#include "Session.h"
#include "corvisa/corvisa.h"

#include "platform/Environment.h"

#include <cstring>
#include <new>
#include <string>
#include <vector>

using namespace Corvane::Wavemill::CorVisa;

namespace {

// Connecting when the caller gives no open time-out (0 or infinite).
constexpr ViUInt32 defaultConnectTimeoutInMS = 5000;
constexpr int defaultInstrPort = 5025;

void record(const char *call) {
  if (isRecording())
    recordLine(call);
}

void record(const char *call, const std::string &argument) {
  if (isRecording())
    recordLine(std::string(call) + " " + argument);
}

// Copies at most VI_FIND_BUFLEN bytes, the zero included.
void copyDescription(const std::string &text, ViChar *desc) {
  const std::size_t length = text.size() < VI_FIND_BUFLEN - 1 ? text.size() : VI_FIND_BUFLEN - 1;
  std::memcpy(desc, text.data(), length);
  desc[length] = '\0';
}

// A text from a caller, read no further than `limit` bytes, so that an
// unterminated buffer is not run through.
std::string boundedText(const char *text, std::size_t limit) { return std::string(text, strnlen(text, limit)); }

const char *statusText(ViStatus status) {
  switch (status) {
  case VI_SUCCESS:
    return "VI_SUCCESS: Operation completed successfully.";
  case VI_SUCCESS_TERM_CHAR:
    return "VI_SUCCESS_TERM_CHAR: The specified termination character was read.";
  case VI_SUCCESS_MAX_CNT:
    return "VI_SUCCESS_MAX_CNT: The number of bytes read is equal to the input count.";
  case VI_ERROR_SYSTEM_ERROR:
    return "VI_ERROR_SYSTEM_ERROR: Unknown system error (miscellaneous error).";
  case VI_ERROR_INV_OBJECT:
    return "VI_ERROR_INV_OBJECT: The given session or object reference is invalid.";
  case VI_ERROR_RSRC_NFOUND:
    return "VI_ERROR_RSRC_NFOUND: Insufficient location information or the requested device or resource is not "
           "present in the system.";
  case VI_ERROR_INV_RSRC_NAME:
    return "VI_ERROR_INV_RSRC_NAME: Invalid resource reference specified. Parsing error.";
  case VI_ERROR_TMO:
    return "VI_ERROR_TMO: Timeout expired before operation completed.";
  case VI_ERROR_NSUP_ATTR:
    return "VI_ERROR_NSUP_ATTR: The specified attribute is not defined or supported by the referenced session, "
           "event, or find list.";
  case VI_ERROR_NSUP_ATTR_STATE:
    return "VI_ERROR_NSUP_ATTR_STATE: The specified state of the attribute is not valid, or is not supported as "
           "defined by the session, event, or find list.";
  case VI_ERROR_ALLOC:
    return "VI_ERROR_ALLOC: Insufficient system resources to perform necessary memory allocation.";
  case VI_ERROR_IO:
    return "VI_ERROR_IO: Could not perform operation because of I/O error.";
  case VI_ERROR_INV_PARAMETER:
    return "VI_ERROR_INV_PARAMETER: The value of some parameter (which parameter is not known) is invalid.";
  case VI_ERROR_CONN_LOST:
    return "VI_ERROR_CONN_LOST: The connection for the given session has been lost.";
  default:
    // Bytes outside printable ASCII on purpose: clients filter descriptions.
    return "Unknown status \x01\x7f\xc3\xa9"
           " code";
  }
}

std::vector<std::string> resourcesMatching(const std::string &expression) {
  std::vector<std::string> found;
  const std::string list = Corvane::Wavemill::Platform::environmentVariable("CORVISA_RESOURCES");
  std::size_t start = 0;
  while (start <= list.size()) {
    std::size_t end = list.find(';', start);
    if (end == std::string::npos)
      end = list.size();
    std::size_t first = start, last = end;
    while (first < last && (list[first] == ' ' || list[first] == '\t'))
      ++first;
    while (last > first && (list[last - 1] == ' ' || list[last - 1] == '\t'))
      --last;
    const std::string name = list.substr(first, last - first);
    if (!name.empty() && matchesPattern(expression, name))
      found.push_back(name);
    start = end + 1;
  }
  return found;
}

// Runs `body`; an allocation failure or any other exception becomes a
// status, because no exception may cross into a C caller.
template <typename Body> ViStatus guarded(Body body) noexcept {
  try {
    return body();
  } catch (const std::bad_alloc &) {
    return VI_ERROR_ALLOC;
  } catch (...) {
    return VI_ERROR_SYSTEM_ERROR;
  }
}

// What viRead and viWrite share: the record, the count reset, the checks of
// handle and buffer, and the count handed back also on failure.
template <class Buffer, class Transfer>
ViStatus transfer(const char *name, ViSession vi, Buffer buf, ViUInt32 cnt, ViPUInt32 retCnt, Transfer move) {
  return guarded([&] {
    record(name, std::to_string(cnt));
    if (retCnt != nullptr)
      *retCnt = 0;
    const auto session = Handles::instance().session(vi);
    if (!session)
      return VI_ERROR_INV_OBJECT;
    if (buf == nullptr && cnt > 0)
      return VI_ERROR_INV_PARAMETER;
    ViUInt32 moved = 0;
    const ViStatus status = move(*session, buf, cnt, moved);
    if (retCnt != nullptr)
      *retCnt = moved;
    return status;
  });
}

} // namespace

extern "C" {

ViStatus viOpenDefaultRM(ViPSession vi) {
  return guarded([&] {
    record("viOpenDefaultRM");
    if (vi == nullptr)
      return VI_ERROR_INV_PARAMETER;
    *vi = Handles::instance().addManager();
    return VI_SUCCESS;
  });
}

ViStatus viOpen(ViSession sesn, ViConstRsrc name, ViAccessMode, ViUInt32 timeout, ViPSession vi) {
  return guarded([&] {
    const std::string resource = name == nullptr ? std::string() : boundedText(name, maxResourceNameLength + 1);
    record("viOpen", resource);
    if (vi != nullptr)
      *vi = VI_NULL;
    if (!Handles::instance().isManager(sesn))
      return VI_ERROR_INV_OBJECT;
    if (name == nullptr || vi == nullptr)
      return VI_ERROR_INV_PARAMETER;
    if (resource.size() > maxResourceNameLength)
      return VI_ERROR_INV_RSRC_NAME;
    int instrPort = parsePort(Corvane::Wavemill::Platform::environmentVariable("CORVISA_INSTR_PORT"));
    if (instrPort == 0)
      instrPort = defaultInstrPort;
    ResourceAddress address;
    if (!parseResourceName(resource, instrPort, address))
      return VI_ERROR_RSRC_NFOUND;
    const ViUInt32 limit =
        timeout == VI_TMO_IMMEDIATE || timeout == VI_TMO_INFINITE ? defaultConnectTimeoutInMS : timeout;
    // Nobody listening there is the same to a caller as no such resource.
    auto session = Session::connect(address, static_cast<int>(limit < 0x7FFFFFFF ? limit : 0x7FFFFFFF));
    if (!session)
      return VI_ERROR_RSRC_NFOUND;
    return Handles::instance().addSession(sesn, std::move(session), *vi);
  });
}

ViStatus viClose(ViObject vi) {
  return guarded([&] {
    record("viClose");
    return Handles::instance().close(vi);
  });
}

ViStatus viClear(ViSession vi) {
  return guarded([&] {
    record("viClear");
    const auto session = Handles::instance().session(vi);
    return session ? session->clear() : VI_ERROR_INV_OBJECT;
  });
}

ViStatus viFindRsrc(ViSession sesn, ViConstString expr, ViPFindList vi, ViPUInt32 retCnt, ViChar desc[]) {
  return guarded([&] {
    const std::string expression = expr == nullptr ? std::string() : boundedText(expr, 4096);
    record("viFindRsrc", expression);
    if (vi != nullptr)
      *vi = VI_NULL;
    if (retCnt != nullptr)
      *retCnt = 0;
    if (!Handles::instance().isManager(sesn))
      return VI_ERROR_INV_OBJECT;
    if (expr == nullptr)
      return VI_ERROR_INV_PARAMETER;
    auto found = resourcesMatching(expression);
    if (found.empty())
      return VI_ERROR_RSRC_NFOUND;
    if (desc != nullptr)
      copyDescription(found.front(), desc);
    const auto count = static_cast<ViUInt32>(found.size());
    // Without a place for the list the caller wants the count only.
    if (vi != nullptr) {
      const ViStatus status = Handles::instance().addFindList(sesn, std::move(found), *vi);
      if (status != VI_SUCCESS)
        return status;
    }
    if (retCnt != nullptr)
      *retCnt = count;
    return VI_SUCCESS;
  });
}

ViStatus viFindNext(ViFindList vi, ViChar desc[]) {
  return guarded([&] {
    record("viFindNext");
    if (desc == nullptr)
      return VI_ERROR_INV_PARAMETER;
    std::string found;
    const ViStatus status = Handles::instance().nextFound(vi, found);
    if (status == VI_SUCCESS)
      copyDescription(found, desc);
    return status;
  });
}

ViStatus viSetAttribute(ViObject vi, ViAttr attrName, ViAttrState attrValue) {
  return guarded([&] {
    if (isRecording())
      recordLine("viSetAttribute " + hex8(attrName) + " " + std::to_string(attrValue));
    if (const auto session = Handles::instance().session(vi))
      return session->setAttribute(attrName, attrValue);
    // A resource manager or a find list is open but has none of these attributes.
    return Handles::instance().isOpen(vi) ? VI_ERROR_NSUP_ATTR : VI_ERROR_INV_OBJECT;
  });
}

ViStatus viGetAttribute(ViObject vi, ViAttr attrName, void *attrValue) {
  return guarded([&] {
    record("viGetAttribute", hex8(attrName));
    const auto session = Handles::instance().session(vi);
    if (!session)
      return Handles::instance().isOpen(vi) ? VI_ERROR_NSUP_ATTR : VI_ERROR_INV_OBJECT;
    if (attrValue == nullptr)
      return VI_ERROR_INV_PARAMETER;
    return session->getAttribute(attrName, attrValue);
  });
}

ViStatus viRead(ViSession vi, ViPBuf buf, ViUInt32 cnt, ViPUInt32 retCnt) {
  return transfer("viRead", vi, buf, cnt, retCnt, [](auto &session, ViPBuf data, ViUInt32 count, ViUInt32 &moved) {
    return session.read(data, count, moved);
  });
}

ViStatus viWrite(ViSession vi, ViConstBuf buf, ViUInt32 cnt, ViPUInt32 retCnt) {
  return transfer("viWrite", vi, buf, cnt, retCnt, [](auto &session, ViConstBuf data, ViUInt32 count, ViUInt32 &moved) {
    return session.write(data, count, moved);
  });
}

ViStatus viStatusDesc(ViObject, ViStatus status, ViChar desc[]) {
  return guarded([&] {
    record("viStatusDesc", hex8(static_cast<ViUInt32>(status)));
    if (desc == nullptr)
      return VI_ERROR_INV_PARAMETER;
    copyDescription(statusText(status), desc);
    return VI_SUCCESS;
  });
}

} // extern "C"
