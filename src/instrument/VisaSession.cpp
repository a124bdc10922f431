#include "instrument/VisaSession.h"

#include "instrument/VisaStatusText.h"

#include "platform/Environment.h"
#include "platform/Module.h"
#include "wavemill/tools/Exceptions.h"

#include <algorithm>
#include <climits>
#include <cstring>

namespace Corvane::Wavemill {

using namespace Visa;

namespace {

constexpr const char *defaultVisaLibrary = "libcorvisa.so";
// A piece of binary data goes out in at most this many bytes, whatever
// block size the caller asks for.
constexpr int maxPiece = 1024;
constexpr ViUInt32 readPiece = 1024;
constexpr ViBoolean viTrue = 1;
constexpr ViBoolean viFalse = 0;

void *loadVisaLibrary() {
  std::string name = Platform::environmentVariable("WAVEMILL_VISA_LIBRARY");
  if (name.empty())
    name = defaultVisaLibrary;
  // Without a VISA layer the table stays empty and every session fails at
  // its first use; the loader's message has nobody to go to.
  std::string error;
  return Platform::loadModule(name, error);
}

template <class F> F lookUp(void *module, const char *name) {
  return reinterpret_cast<F>(Platform::moduleSymbol(module, name));
}

Visa32Functions bindVisa32(void *module) {
  Visa32Functions table;
  table.viOpenDefaultRM = lookUp<ViOpenDefaultRM>(module, "viOpenDefaultRM");
  table.viOpen = lookUp<ViOpen>(module, "viOpen");
  table.viClose = lookUp<ViClose>(module, "viClose");
  table.viClear = lookUp<ViClear>(module, "viClear");
  table.viFindRsrc = lookUp<ViFindRsrc>(module, "viFindRsrc");
  table.viFindNext = lookUp<ViFindNext>(module, "viFindNext");
  table.viSetAttribute = lookUp<ViSetAttribute>(module, "viSetAttribute");
  table.viGetAttribute = lookUp<ViGetAttribute>(module, "viGetAttribute");
  table.viRead = lookUp<ViRead>(module, "viRead");
  table.viWrite = lookUp<ViWrite>(module, "viWrite");
  table.viStatusDesc = lookUp<ViStatusDesc>(module, "viStatusDesc");
  return table;
}

// A missing function answers as a failing VISA layer would.
template <class F, class... A> ViStatus call(F function, A... arguments) {
  return function == nullptr ? viErrorSystemError : function(arguments...);
}

// The digits of the decimal text of `value`; 0 has one.
int digitCount(long long value) {
  int digits = 1;
  for (; value >= 10; value /= 10)
    ++digits;
  return digits;
}

std::string textUpToZero(const char *buffer, std::size_t capacity) {
  return std::string(buffer, std::find(buffer, buffer + capacity, '\0'));
}

} // namespace

void *VisaIOSession::VisaSession::s_visa32Module = loadVisaLibrary();
Visa32Functions VisaIOSession::VisaSession::s_visa32 = bindVisa32(s_visa32Module);

VisaIOSession::VisaSession::VisaSession(std::string address) : address(std::move(address)) {}

std::string VisaIOSession::VisaSession::getAddress() const { return address; }

bool VisaIOSession::VisaSession::checkStatus(int status, bool throwOnError) {
  if (status == viSuccess || status == viSuccessMaxCount)
    return true;
  if (!throwOnError)
    return false;
  char buffer[viFindBufferLength] = {};
  // A warning (a positive status) still comes with a description.
  if (call(s_visa32.viStatusDesc, ViObject{0}, status, buffer) < 0)
    throw ApplicationException("Unknown VISA error");
  throw ApplicationException(visaStatusText(buffer, sizeof buffer));
}

void VisaIOSession::VisaSession::open() {
  checkStatus(call(s_visa32.viOpenDefaultRM, &resourceManager), true);
  const ViStatus status =
      call(s_visa32.viOpen, resourceManager, address.c_str(), ViAccessMode{0}, ViUInt32{0}, &session);
  if (!checkStatus(status, false)) {
    call(s_visa32.viClose, resourceManager);
    throw InstrumentException("");
  }
  isOpen = true;
}

void VisaIOSession::VisaSession::close() {
  if (!isOpen)
    return;
  call(s_visa32.viClose, session);
  call(s_visa32.viClose, resourceManager);
  isOpen = false;
}

void VisaIOSession::VisaSession::clear() { call(s_visa32.viClear, session); }

void VisaIOSession::VisaSession::setAttribute(ViAttr attribute, ViAttrState value) {
  checkStatus(call(s_visa32.viSetAttribute, session, attribute, value), true);
}

bool VisaIOSession::VisaSession::getAttribute(ViAttr attribute, std::size_t width, ViAttrState &value) {
  // VISA writes the attribute in its own width; the buffer is wider so that
  // a library that writes more cannot write past it.
  unsigned char buffer[sizeof(ViAttrState)] = {};
  if (!checkStatus(call(s_visa32.viGetAttribute, session, attribute, static_cast<void *>(buffer)), false))
    return false;
  if (width == sizeof(ViBoolean)) {
    ViBoolean narrow = 0;
    std::memcpy(&narrow, buffer, sizeof narrow);
    value = narrow;
  } else {
    ViUInt32 narrow = 0;
    std::memcpy(&narrow, buffer, sizeof narrow);
    value = narrow;
  }
  return true;
}

bool VisaIOSession::VisaSession::getTimeout(int &timeoutInMS) {
  ViAttrState value = 0;
  if (!getAttribute(viAttrTimeoutValue, sizeof(ViUInt32), value))
    return false;
  // VISA's "wait for ever" is all bits set; it reads back as -1.
  timeoutInMS = value > static_cast<ViAttrState>(INT_MAX) ? -1 : static_cast<int>(value);
  return true;
}

bool VisaIOSession::VisaSession::setTimeout(int timeoutInMS) {
  // A negative time-out waits for ever, as VISA's all-bits-set value does.
  const ViUInt32 value = timeoutInMS < 0 ? ViUInt32{0xFFFFFFFFu} : static_cast<ViUInt32>(timeoutInMS);
  return checkStatus(call(s_visa32.viSetAttribute, session, viAttrTimeoutValue, ViAttrState{value}), false);
}

void VisaIOSession::VisaSession::setSendEndEnable(bool value) {
  setAttribute(viAttrSendEndEnable, value ? viTrue : viFalse);
}

void VisaIOSession::VisaSession::writeAll(const unsigned char *data, std::size_t count) {
  while (count > 0) {
    const auto piece = static_cast<ViUInt32>(std::min<std::size_t>(count, UINT32_MAX));
    ViUInt32 written = 0;
    checkStatus(call(s_visa32.viWrite, session, data, piece, &written), true);
    // A write that reports success and moves nothing would loop for ever.
    if (written == 0)
      checkStatus(viErrorIo, true);
    const std::size_t moved = std::min<std::size_t>(written, piece);
    data += moved;
    count -= moved;
  }
}

std::size_t VisaIOSession::VisaSession::readSome(unsigned char *data, std::size_t count) {
  ViUInt32 received = 0;
  checkStatus(call(s_visa32.viRead, session, data, static_cast<ViUInt32>(count), &received), true);
  return std::min<std::size_t>(received, count);
}

void VisaIOSession::VisaSession::write(const std::string &text, bool endEnable) {
  ViAttrState endBefore = viTrue; // VISA's default, for a library that cannot tell
  getAttribute(viAttrSendEndEnable, sizeof(ViBoolean), endBefore);
  setSendEndEnable(endEnable);

  const std::string data = text + '\n';
  // 5 seconds for every full 300000 bytes, so that a long text does not run
  // into a time-out meant for short commands.
  const long long needed = (static_cast<long long>(data.size()) / 300000 + 1) * 5000;
  ViAttrState timeoutBefore = 0;
  const bool raise = getAttribute(viAttrTimeoutValue, sizeof(ViUInt32), timeoutBefore) &&
                     needed > static_cast<long long>(timeoutBefore);
  if (raise)
    setAttribute(viAttrTimeoutValue, static_cast<ViAttrState>(needed));

  writeAll(reinterpret_cast<const unsigned char *>(data.data()), data.size());

  if (raise)
    setAttribute(viAttrTimeoutValue, timeoutBefore);
  setAttribute(viAttrSendEndEnable, endBefore);
}

std::string VisaIOSession::VisaSession::read() {
  std::string result;
  unsigned char buffer[readPiece];
  for (;;) {
    ViUInt32 received = 0;
    const ViStatus status = call(s_visa32.viRead, session, buffer, readPiece, &received);
    checkStatus(status, true);
    result.append(reinterpret_cast<const char *>(buffer), std::min(received, readPiece));
    if (status != viSuccessMaxCount)
      return result;
  }
}

std::vector<unsigned char> VisaIOSession::VisaSession::readBlock(const std::string &command) {
  write(command, true);
  unsigned char byte = 0;
  readSome(&byte, 1);
  if (byte != '#') {
    clear();
    return {};
  }
  readSome(&byte, 1);
  // A digit count or a length digit that is no digit is no block either.
  if (byte < '0' || byte > '9') {
    clear();
    return {};
  }
  const int digits = byte - '0';
  std::size_t length = 0;
  for (int i = 0; i < digits; ++i) {
    readSome(&byte, 1);
    if (byte < '0' || byte > '9') {
      clear();
      return {};
    }
    length = length * 10 + static_cast<std::size_t>(byte - '0');
  }
  std::vector<unsigned char> block(length);
  if (length > 0)
    block.resize(readSome(block.data(), length));
  readSome(&byte, 1); // the terminator
  return block;
}

void VisaIOSession::VisaSession::writeBinary(const unsigned char *data, int length, int blockSize, bool endEnable) {
  const int piece = std::clamp(blockSize, 1, maxPiece);
  const int size = std::max(length, 0);
  const int whole = size / piece;
  const int rest = size % piece;
  setSendEndEnable(false);
  for (int i = 0; i < whole; ++i) {
    // END goes with the last byte of the message only.
    if (i == whole - 1 && rest == 0)
      setSendEndEnable(endEnable);
    writeAll(data + static_cast<std::size_t>(i) * piece, static_cast<std::size_t>(piece));
  }
  if (rest > 0) {
    setSendEndEnable(endEnable);
    writeAll(data + static_cast<std::size_t>(whole) * piece, static_cast<std::size_t>(rest));
  }
}

void VisaIOSession::VisaSession::writeBlock(const std::string &command, gsl::span<unsigned char> data) {
  // The header names the digit count only, not the length: this transport
  // sends it so.
  const std::string header = command + "#" + std::to_string(digitCount(static_cast<long long>(data.size())));
  writeBinary(reinterpret_cast<const unsigned char *>(header.data()), static_cast<int>(header.size()), maxPiece, false);
  writeBinary(data.data(), static_cast<int>(data.size()), 102400, false);
  const unsigned char end = 0;
  writeBinary(&end, 1, maxPiece, true);
}

void VisaIOSession::VisaSession::writeManyBlocksStart(const std::string &command, gsl::span<unsigned char> firstPart,
                                                      int totalLength) {
  const int length = std::max(totalLength, 0);
  const std::string header = command + "#" + std::to_string(digitCount(length)) + std::to_string(length);
  writeBinary(reinterpret_cast<const unsigned char *>(header.data()), static_cast<int>(header.size()), maxPiece, false);
  writeBinary(firstPart.data(), static_cast<int>(firstPart.size()), 102400, false);
}

std::vector<std::string> VisaIOSession::VisaSession::discover(const std::string &expression) {
  std::vector<std::string> resources;
  ViSession manager = 0;
  if (!checkStatus(call(s_visa32.viOpenDefaultRM, &manager), false))
    return resources;
  ViFindList list = 0;
  ViUInt32 count = 0;
  char description[viFindBufferLength] = {};
  if (checkStatus(call(s_visa32.viFindRsrc, manager, expression.c_str(), &list, &count, description), false)) {
    // Only running out of memory throws here, and the handles close all
    // the same.
    try {
      if (count > 0)
        resources.push_back(textUpToZero(description, sizeof description));
      for (ViUInt32 i = 1; i < count; ++i) {
        if (!checkStatus(call(s_visa32.viFindNext, list, description), false))
          break;
        resources.push_back(textUpToZero(description, sizeof description));
      }
    } catch (...) {
    }
    call(s_visa32.viClose, list);
  }
  call(s_visa32.viClose, manager);
  return resources;
}

} // namespace Corvane::Wavemill
