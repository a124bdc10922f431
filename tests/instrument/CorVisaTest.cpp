#include "CorVisa.h"

#include "platform/Environment.h"
#include "wavemill/simulator/SimulatedInstrument.h"

#include <gtest/gtest.h>

#include <string>

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
    return visa().viWrite(vi, reinterpret_cast<const ViByte *>(text.data()), text.size(), &sent);
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

// Reads one byte at a time (VI_SUCCESS_MAX_CNT) and the attributes END and
// time-out, read back in their own widths, go through the VISA session tests;
// the call recorder through every VisaCalls there.
