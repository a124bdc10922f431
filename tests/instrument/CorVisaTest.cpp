#include "CorVisa.h"

#include "platform/Environment.h"
#include "wavemill/simulator/SimulatedInstrument.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

using namespace Corvane::Wavemill;
using Testing::visa;

namespace {

// A resource manager and, when the open succeeds, a session; both closed at the end.
struct Opened {
  explicit Opened(const std::string &resource) {
    visa().viOpenDefaultRM(&rm);
    status = visa().viOpen(rm, resource.c_str(), VI_NO_LOCK, 0, &vi);
  }
  ~Opened() { visa().viClose(rm); }
  ViSession rm = 0, vi = 0;
  ViStatus status;

  ViStatus write(const std::string &text) {
    ViUInt32 sent = 0;
    const ViStatus result = visa().viWrite(vi, reinterpret_cast<const ViByte *>(text.data()), text.size(), &sent);
    EXPECT_EQ(sent, result == VI_SUCCESS ? text.size() : sent);
    return result;
  }
  // Up to `count` bytes; the status of the read goes to `readStatus`.
  std::string read(ViUInt32 count) {
    std::string buffer(count, '\0');
    ViUInt32 received = 0;
    readStatus = visa().viRead(vi, reinterpret_cast<ViByte *>(&buffer[0]), count, &received);
    return buffer.substr(0, received);
  }
  ViStatus readStatus = VI_SUCCESS;
};

// A simulated instrument and a session on its socket resource.
class CorVisaTest : public ::testing::Test {
protected:
  SimulatedInstrument simulator;
  Opened opened{simulator.getAddress()};
};

} // namespace

// Socket resources that open and one whose port refuses are in the VISA session tests.
TEST_F(CorVisaTest, OpensInstrResourcesOnTheConfiguredPortAndRejectsWhatItCannotOpen) {
  const std::string port = std::to_string(simulator.getPort());
  ASSERT_TRUE(Platform::setEnvironmentVariable("CORVISA_INSTR_PORT", port));
  const struct {
    std::string resource;
    ViStatus expected;
  } rows[] = {
      {"TCPIP0::127.0.0.1::inst0::INSTR", VI_SUCCESS},
      {"TCPIP0::127.0.0.1::65536::SOCKET", VI_ERROR_RSRC_NFOUND},
      {"GPIB0::7::INSTR", VI_ERROR_RSRC_NFOUND},
      {"TCPIP0::" + std::string(300, 'a') + "::INSTR", VI_ERROR_INV_RSRC_NAME},
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(row.resource.substr(0, 40));
    // The instrument's answers through a session are checked by the VISA session tests.
    EXPECT_EQ(Opened(row.resource).status, row.expected);
  }
}

// A trickled answer comes in pieces, which a read collects up to the line end.
TEST_F(CorVisaTest, ReadsThatFillTheCountReturnMaxCntAndTheRestFollows) {
  simulator.setFault(SimulatorFault::Trickle);
  ASSERT_EQ(opened.write("*IDN?\n"), VI_SUCCESS);
  EXPECT_EQ(opened.read(2), "Co");
  EXPECT_EQ(opened.readStatus, VI_SUCCESS_MAX_CNT);
  EXPECT_EQ(opened.read(1024), "rvane,SG200,100123,1.4.2\n");
  EXPECT_EQ(opened.readStatus, VI_SUCCESS);
}

// A time-out without bytes is checked through the VISA session's error texts.
TEST_F(CorVisaTest, TimeOutKeepsTheBytesSoFarAndAClosedPeerLosesTheConnection) {
  ASSERT_EQ(visa().viSetAttribute(opened.vi, VI_ATTR_TMO_VALUE, 150), VI_SUCCESS);
  simulator.setFault(SimulatorFault::NoTerminator);
  ASSERT_EQ(opened.write("*IDN?\n"), VI_SUCCESS);
  EXPECT_EQ(opened.read(1024), "Corvane,SG200,100123,1.4.2");
  EXPECT_EQ(opened.readStatus, VI_ERROR_TMO);

  simulator.stop();
  EXPECT_EQ(opened.read(1024), "");
  EXPECT_EQ(opened.readStatus, VI_ERROR_CONN_LOST);
}

TEST_F(CorVisaTest, AttributesWriteTheirOwnWidthAndRejectWhatTheyDoNotKnow) {
  const auto &v = visa();
  const struct {
    ViAttr attribute;
    std::vector<unsigned char> bytes; // the default, little-endian, in its own width
  } defaults[] = {{VI_ATTR_TMO_VALUE, {0xD0, 0x07, 0, 0}}, {VI_ATTR_SEND_END_EN, {1, 0}}, {VI_ATTR_TERMCHAR, {0x0A}}};
  for (const auto &row : defaults) {
    SCOPED_TRACE(row.attribute);
    std::vector<unsigned char> value(8, 0xEE);
    ASSERT_EQ(v.viGetAttribute(opened.vi, row.attribute, value.data()), VI_SUCCESS);
    auto expected = row.bytes;
    expected.resize(8, 0xEE);
    EXPECT_EQ(value, expected);
  }
  EXPECT_EQ(v.viSetAttribute(opened.vi, 0x3FFF0036, 1), VI_ERROR_NSUP_ATTR);
  EXPECT_EQ(v.viSetAttribute(opened.vi, VI_ATTR_SEND_END_EN, 2), VI_ERROR_NSUP_ATTR_STATE);
  EXPECT_EQ(v.viSetAttribute(opened.rm, VI_ATTR_TMO_VALUE, 100), VI_ERROR_NSUP_ATTR);

  // With the termination character on, a read stops at it.
  ASSERT_EQ(v.viSetAttribute(opened.vi, VI_ATTR_TERMCHAR, ','), VI_SUCCESS);
  ASSERT_EQ(v.viSetAttribute(opened.vi, VI_ATTR_TERMCHAR_EN, VI_TRUE), VI_SUCCESS);
  ASSERT_EQ(opened.write("*OPT?\n"), VI_SUCCESS);
  EXPECT_EQ(opened.read(1024), "B10,");
  EXPECT_EQ(opened.readStatus, VI_SUCCESS_TERM_CHAR);
}

TEST_F(CorVisaTest, BadHandlesAndNullPointersGiveErrorsNotCrashes) {
  const auto &v = visa();
  ViUInt32 count = 0;
  ViByte byte = 0;
  EXPECT_EQ(v.viClose(0xBAD), VI_ERROR_INV_OBJECT);
  EXPECT_EQ(v.viWrite(opened.rm, &byte, 1, &count), VI_ERROR_INV_OBJECT);
  EXPECT_EQ(v.viOpenDefaultRM(nullptr), VI_ERROR_INV_PARAMETER);
  EXPECT_EQ(v.viRead(opened.vi, nullptr, 1, &count), VI_ERROR_INV_PARAMETER);
  EXPECT_EQ(v.viClose(opened.rm), VI_SUCCESS);
  EXPECT_EQ(v.viClose(opened.vi), VI_ERROR_INV_OBJECT); // closed with its manager
}

// Finding resources by pattern is checked through VisaIOSession::discover,
// what viStatusDesc writes through the VISA session's error texts, and the
// recorded calls through every VisaCalls there.
TEST(CorVisaRecorderTest, RecorderAnswersItsFormerStateAndTakesWhatFits) {
  const auto &v = visa();
  EXPECT_EQ(v.corvisa_record(1), 0);
  ViSession rm = 0;
  v.viOpenDefaultRM(&rm);
  v.viClose(rm);
  EXPECT_EQ(v.corvisa_record(0), 1);
  v.viClose(rm); // not recorded
  std::string taken(7, '\x7f');
  EXPECT_EQ(v.corvisa_record_take(&taken[0], 5), 24);
  EXPECT_EQ(taken, "viOpe\x7f\x7f"); // no zero when it does not fit
}
