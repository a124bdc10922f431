#include "corvisa/corvisa.h"
#include "platform/Environment.h"
#include "platform/Module.h"
#include "platform/Socket.h"
#include "wavemill/simulator/SimulatedInstrument.h"

#include <gtest/gtest.h>

#include <chrono>
#include <cstring>
#include <functional>
#include <string>
#include <vector>

using namespace Corvane::Wavemill;

namespace {

// The library's functions, looked up by name as a VISA client does.
struct CorVisa {
  decltype(&viOpenDefaultRM) openDefaultRM;
  decltype(&viOpen) open;
  decltype(&viClose) close;
  decltype(&viClear) clear;
  decltype(&viFindRsrc) findRsrc;
  decltype(&viFindNext) findNext;
  decltype(&viSetAttribute) setAttribute;
  decltype(&viGetAttribute) getAttribute;
  decltype(&viRead) read;
  decltype(&viWrite) write;
  decltype(&viStatusDesc) statusDesc;
  decltype(&corvisa_record) record;
  decltype(&corvisa_record_take) recordTake;
};

template <typename F> void lookUp(void *module, const char *name, F &function) {
  function = reinterpret_cast<F>(Platform::moduleSymbol(module, name));
  if (function == nullptr)
    throw std::runtime_error(std::string("libcorvisa has no ") + name);
}

const CorVisa &visa() {
  static const CorVisa table = [] {
    std::string error;
    void *module = Platform::loadModule(WAVEMILL_CORVISA_LIBRARY, error);
    if (module == nullptr)
      throw std::runtime_error(error);
    CorVisa t{};
    lookUp(module, "viOpenDefaultRM", t.openDefaultRM), lookUp(module, "viOpen", t.open);
    lookUp(module, "viClose", t.close), lookUp(module, "viClear", t.clear), lookUp(module, "viFindRsrc", t.findRsrc);
    lookUp(module, "viFindNext", t.findNext), lookUp(module, "viSetAttribute", t.setAttribute);
    lookUp(module, "viGetAttribute", t.getAttribute), lookUp(module, "viRead", t.read);
    lookUp(module, "viWrite", t.write), lookUp(module, "viStatusDesc", t.statusDesc);
    lookUp(module, "corvisa_record", t.record), lookUp(module, "corvisa_record_take", t.recordTake);
    return t;
  }();
  return table;
}

// A resource manager and, when the open succeeds, a session; both closed at the end.
struct Opened {
  explicit Opened(const std::string &resource) {
    visa().openDefaultRM(&rm);
    status = visa().open(rm, resource.c_str(), VI_NO_LOCK, 0, &vi);
  }
  ~Opened() { visa().close(rm); }
  ViSession rm = 0, vi = 0;
  ViStatus status;
};

ViStatus writeText(ViSession vi, const std::string &text) {
  ViUInt32 sent = 0;
  const ViStatus status = visa().write(vi, reinterpret_cast<const ViByte *>(text.data()), text.size(), &sent);
  EXPECT_EQ(sent, status == VI_SUCCESS ? text.size() : sent);
  return status;
}

std::string readSome(ViSession vi, ViUInt32 count, ViStatus &status) {
  std::string buffer(count, '\0');
  ViUInt32 received = 0;
  status = visa().read(vi, reinterpret_cast<ViByte *>(&buffer[0]), count, &received);
  return buffer.substr(0, received);
}

} // namespace

TEST(CorVisaTest, OpensSocketAndInstrResourcesAndRejectsWhatItCannotOpen) {
  SimulatedInstrument simulator;
  const std::string port = std::to_string(simulator.getPort());
  ASSERT_TRUE(Platform::setEnvironmentVariable("CORVISA_INSTR_PORT", port));
  const auto listener = Platform::listenTcp("127.0.0.1", 0, 1);
  const std::string closedPort = std::to_string(Platform::localPort(listener));
  Platform::closeSocket(listener);
  const struct {
    std::string resource;
    ViStatus expected;
  } rows[] = {
      {simulator.getAddress(), VI_SUCCESS},
      {"tcpip::127.0.0.1::" + port + "::socket", VI_SUCCESS},
      {"TCPIP0::127.0.0.1::inst0::INSTR", VI_SUCCESS},
      {"TCPIP1::localhost::hislip0::instr", VI_SUCCESS},
      {"TCPIP::127.0.0.1", VI_SUCCESS},
      {"TCPIP0::127.0.0.1::" + closedPort + "::SOCKET", VI_ERROR_RSRC_NFOUND},
      {"TCPIP0::127.0.0.1::65536::SOCKET", VI_ERROR_RSRC_NFOUND},
      {"TCPIP0::127.0.0.1::SOCKET", VI_ERROR_RSRC_NFOUND},
      {"GPIB0::7::INSTR", VI_ERROR_RSRC_NFOUND},
      {"TCPIP0::::INSTR", VI_ERROR_RSRC_NFOUND},
      {"TCPIP0::" + std::string(300, 'a') + "::INSTR", VI_ERROR_INV_RSRC_NAME},
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(row.resource.substr(0, 40));
    Opened opened(row.resource);
    ASSERT_EQ(opened.status, row.expected);
    if (row.expected != VI_SUCCESS)
      continue;
    ASSERT_EQ(writeText(opened.vi, "*IDN?\n"), VI_SUCCESS);
    ViStatus status;
    EXPECT_EQ(readSome(opened.vi, 1024, status), "Corvane,SG200,100123,1.4.2\n");
    EXPECT_EQ(status, VI_SUCCESS);
  }
}

TEST(CorVisaTest, ReadsThatFillTheCountReturnMaxCntAndTheRestFollows) {
  SimulatedInstrument simulator;
  Opened opened(simulator.getAddress());
  ASSERT_EQ(opened.status, VI_SUCCESS);
  std::string block(100000, '\0');
  for (std::size_t i = 0; i < block.size(); ++i)
    block[i] = static_cast<char>(i % 251); // line feeds inside the block too
  ASSERT_EQ(writeText(opened.vi, "MMEM:DATA 'w',#6100000" + block + "\nMMEM:DATA? 'w'\n"), VI_SUCCESS);
  ViStatus status;
  EXPECT_EQ(readSome(opened.vi, 2, status), "#6");
  EXPECT_EQ(status, VI_SUCCESS_MAX_CNT);
  EXPECT_EQ(readSome(opened.vi, 6, status), "100000");
  EXPECT_EQ(readSome(opened.vi, 100000, status), block);
  EXPECT_EQ(status, VI_SUCCESS_MAX_CNT);
  EXPECT_EQ(readSome(opened.vi, 1024, status), "\n");
  EXPECT_EQ(status, VI_SUCCESS);

  // viClear drops what is buffered and waiting, so the next answer is whole.
  ASSERT_EQ(writeText(opened.vi, "*IDN?\n"), VI_SUCCESS);
  EXPECT_EQ(readSome(opened.vi, 4, status), "Corv");
  EXPECT_EQ(visa().clear(opened.vi), VI_SUCCESS);
  ASSERT_EQ(writeText(opened.vi, "*OPT?\n"), VI_SUCCESS);
  EXPECT_EQ(readSome(opened.vi, 1024, status), "B10,B22,K20,K24\n");
}

TEST(CorVisaTest, TimeOutKeepsTheBytesSoFarAndAClosedPeerLosesTheConnection) {
  SimulatedInstrument simulator;
  Opened opened(simulator.getAddress());
  ASSERT_EQ(visa().setAttribute(opened.vi, VI_ATTR_TMO_VALUE, 150), VI_SUCCESS);
  simulator.setFault(SimulatorFault::Stall);
  ASSERT_EQ(writeText(opened.vi, "*IDN?\n"), VI_SUCCESS);
  ViStatus status;
  const auto start = std::chrono::steady_clock::now();
  EXPECT_EQ(readSome(opened.vi, 1024, status), "");
  EXPECT_EQ(status, VI_ERROR_TMO);
  EXPECT_GE(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(140));

  simulator.setFault(SimulatorFault::NoTerminator);
  ASSERT_EQ(writeText(opened.vi, "*IDN?\n"), VI_SUCCESS);
  EXPECT_EQ(readSome(opened.vi, 1024, status), "Corvane,SG200,100123,1.4.2");
  EXPECT_EQ(status, VI_ERROR_TMO);

  simulator.stop();
  EXPECT_EQ(readSome(opened.vi, 1024, status), "");
  EXPECT_EQ(status, VI_ERROR_CONN_LOST);
}

TEST(CorVisaTest, AttributesWriteTheirOwnWidthAndRejectWhatTheyDoNotKnow) {
  SimulatedInstrument simulator;
  Opened opened(simulator.getAddress());
  const auto &v = visa();
  const struct {
    ViAttr attribute;
    std::vector<unsigned char> bytes; // the default, little-endian, in its own width
  } defaults[] = {{VI_ATTR_TMO_VALUE, {0xD0, 0x07, 0, 0}},
                  {VI_ATTR_SEND_END_EN, {1, 0}},
                  {VI_ATTR_TERMCHAR, {0x0A}},
                  {VI_ATTR_TERMCHAR_EN, {0, 0}}};
  for (const auto &row : defaults) {
    SCOPED_TRACE(row.attribute);
    std::vector<unsigned char> value(8, 0xEE);
    ASSERT_EQ(v.getAttribute(opened.vi, row.attribute, value.data()), VI_SUCCESS);
    auto expected = row.bytes;
    expected.resize(8, 0xEE);
    EXPECT_EQ(value, expected);
  }
  EXPECT_EQ(v.setAttribute(opened.vi, 0x3FFF0036, 1), VI_ERROR_NSUP_ATTR);
  EXPECT_EQ(v.setAttribute(opened.vi, VI_ATTR_SEND_END_EN, 2), VI_ERROR_NSUP_ATTR_STATE);
  EXPECT_EQ(v.setAttribute(opened.vi, VI_ATTR_TERMCHAR, 256), VI_ERROR_NSUP_ATTR_STATE);
  EXPECT_EQ(v.setAttribute(opened.vi, VI_ATTR_TMO_VALUE, 0x100000000ull), VI_ERROR_NSUP_ATTR_STATE);
  EXPECT_EQ(v.setAttribute(opened.rm, VI_ATTR_TMO_VALUE, 100), VI_ERROR_NSUP_ATTR);

  // With the termination character on, a read stops at it.
  ASSERT_EQ(v.setAttribute(opened.vi, VI_ATTR_TERMCHAR, ','), VI_SUCCESS);
  ASSERT_EQ(v.setAttribute(opened.vi, VI_ATTR_TERMCHAR_EN, VI_TRUE), VI_SUCCESS);
  ASSERT_EQ(writeText(opened.vi, "*OPT?\n"), VI_SUCCESS);
  ViStatus status;
  EXPECT_EQ(readSome(opened.vi, 1024, status), "B10,");
  EXPECT_EQ(status, VI_SUCCESS_TERM_CHAR);
}

TEST(CorVisaTest, BadHandlesAndNullPointersGiveErrorsNotCrashes) {
  SimulatedInstrument simulator;
  Opened opened(simulator.getAddress());
  const auto &v = visa();
  ViSession handle = 0;
  ViUInt32 count = 0;
  char desc[VI_FIND_BUFLEN];
  ViByte byte = 0;
  const ViSession vi = opened.vi, rm = opened.rm, bad = 0xBAD;
  const struct {
    const char *call;
    std::function<ViStatus()> run;
    ViStatus expected;
  } rows[] = {
      {"close bad", [&] { return v.close(bad); }, VI_ERROR_INV_OBJECT},
      {"read bad", [&] { return v.read(bad, &byte, 1, &count); }, VI_ERROR_INV_OBJECT},
      {"write on manager", [&] { return v.write(rm, &byte, 1, &count); }, VI_ERROR_INV_OBJECT},
      {"open through session", [&] { return v.open(vi, "TCPIP::127.0.0.1::INSTR", 0, 0, &handle); },
       VI_ERROR_INV_OBJECT},
      {"attribute of bad", [&] { return v.getAttribute(bad, VI_ATTR_TMO_VALUE, &count); }, VI_ERROR_INV_OBJECT},
      {"find next of bad", [&] { return v.findNext(bad, desc); }, VI_ERROR_INV_OBJECT},
      {"open manager null", [&] { return v.openDefaultRM(nullptr); }, VI_ERROR_INV_PARAMETER},
      {"open null name", [&] { return v.open(rm, nullptr, 0, 0, &handle); }, VI_ERROR_INV_PARAMETER},
      {"open null session", [&] { return v.open(rm, "TCPIP::127.0.0.1::INSTR", 0, 0, nullptr); },
       VI_ERROR_INV_PARAMETER},
      {"read null buffer", [&] { return v.read(vi, nullptr, 1, &count); }, VI_ERROR_INV_PARAMETER},
      {"write null buffer", [&] { return v.write(vi, nullptr, 1, &count); }, VI_ERROR_INV_PARAMETER},
      {"get null value", [&] { return v.getAttribute(vi, VI_ATTR_TMO_VALUE, nullptr); }, VI_ERROR_INV_PARAMETER},
      {"find null expression", [&] { return v.findRsrc(rm, nullptr, &handle, &count, desc); }, VI_ERROR_INV_PARAMETER},
      {"describe into null", [&] { return v.statusDesc(0, VI_ERROR_TMO, nullptr); }, VI_ERROR_INV_PARAMETER},
      {"close manager", [&] { return v.close(rm); }, VI_SUCCESS},
      {"session of closed manager", [&] { return v.close(vi); }, VI_ERROR_INV_OBJECT},
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(row.call);
    EXPECT_EQ(row.run(), row.expected);
  }
}

TEST(CorVisaTest, FindMatchesPatternsWithoutRegardToCase) {
  const std::string longName = "TCPIP0::" + std::string(300, 'h') + "::INSTR";
  ASSERT_TRUE(Platform::setEnvironmentVariable(
      "CORVISA_RESOURCES", "TCPIP0::10.0.0.1::inst0::INSTR; TCPIP0::10.0.0.2::5025::SOCKET;tcpip::dev3::hislip0::instr;"
                           "GPIB0::7::INSTR;;" +
                               longName));
  const struct {
    const char *pattern;
    std::vector<std::string> found;
  } rows[] = {
      {"?*INSTR",
       {"TCPIP0::10.0.0.1::inst0::INSTR", "tcpip::dev3::hislip0::instr", "GPIB0::7::INSTR", longName.substr(0, 255)}},
      {"TCPIP?*::?*::inst?::INSTR", {"TCPIP0::10.0.0.1::inst0::INSTR"}},
      {"*SOCKET", {"TCPIP0::10.0.0.2::5025::SOCKET"}},
      {"gpib?*", {"GPIB0::7::INSTR"}},
      {"USB?*", {}},
      {"?", {}},
  };
  ViSession rm = 0;
  ASSERT_EQ(visa().openDefaultRM(&rm), VI_SUCCESS);
  for (const auto &row : rows) {
    SCOPED_TRACE(row.pattern);
    ViFindList list = 0xFFFF;
    ViUInt32 count = 99;
    char desc[VI_FIND_BUFLEN + 8];
    const ViStatus status = visa().findRsrc(rm, row.pattern, &list, &count, desc);
    ASSERT_EQ(count, row.found.size());
    if (row.found.empty()) {
      EXPECT_EQ(status, VI_ERROR_RSRC_NFOUND);
      EXPECT_EQ(list, VI_NULL);
      continue;
    }
    std::vector<std::string> found{desc};
    while (visa().findNext(list, desc) == VI_SUCCESS)
      found.push_back(desc);
    EXPECT_EQ(found, row.found);
    EXPECT_EQ(visa().findNext(list, desc), VI_ERROR_RSRC_NFOUND);
  }
  visa().close(rm);
}

TEST(CorVisaTest, RecorderWritesOneLinePerCallAndDescriptionsNameTheirStatus) {
  SimulatedInstrument simulator;
  const auto &v = visa();
  EXPECT_EQ(v.record(1), 0);
  {
    Opened opened(simulator.getAddress());
    v.setAttribute(opened.vi, VI_ATTR_TMO_VALUE, 500);
    ViBoolean end = 0;
    v.getAttribute(opened.vi, VI_ATTR_SEND_END_EN, &end);
    writeText(opened.vi, "*IDN?\n");
    ViStatus status;
    readSome(opened.vi, 1024, status);
    v.clear(opened.vi);
  }
  char desc[VI_FIND_BUFLEN];
  EXPECT_EQ(v.statusDesc(0, VI_ERROR_TMO, desc), VI_SUCCESS);
  EXPECT_STREQ(desc, "VI_ERROR_TMO: Timeout expired before operation completed.");
  EXPECT_EQ(v.statusDesc(0, 0x12345, desc), VI_SUCCESS);
  EXPECT_STREQ(desc, "Unknown status \x01\x7f\xc3\xa9 code");
  EXPECT_EQ(v.record(0), 1);
  v.statusDesc(0, VI_SUCCESS, desc); // not recorded any more

  const std::string expected = "viOpenDefaultRM\nviOpen " + simulator.getAddress() +
                               "\nviSetAttribute 0x3FFF001A 500\nviGetAttribute 0x3FFF0016\nviWrite 6\nviRead 1024\n"
                               "viClear\nviClose\nviStatusDesc 0xBFFF0015\nviStatusDesc 0x00012345\n";
  const int length = v.recordTake(nullptr, 0);
  ASSERT_EQ(length, static_cast<int>(expected.size()));
  std::string taken(expected.size() + 1, '\x7f');
  EXPECT_EQ(v.recordTake(&taken[0], 5), length);
  EXPECT_EQ(taken.substr(0, 6), "viOpe\x7f"); // no zero when it does not fit
  v.recordTake(&taken[0], length + 1);
  EXPECT_EQ(taken, expected + '\0');
}
