// Runs with WAVEMILL_VISA_LIBRARY naming no file, so libwavemill.so finds no
// VISA library when it loads.
#include "wavemill/instrument/VisaIOSession.h"

#include "support/ExpectThrow.h"

#include <gtest/gtest.h>

#include <functional>

using namespace Corvane::Wavemill;

TEST(VisaIOSessionTest, WithoutAVisaLibraryNothingConnectsAndTransfersThrow) {
  const std::string address = "TCPIP0::127.0.0.1::inst0::INSTR";
  VisaIOSession session(address);
  EXPECT_FALSE(session.connect());
  EXPECT_FALSE(session.getConnected());
  session.setTimeoutInMS(250);
  EXPECT_EQ(session.getTimeoutInMS(), 250);
  session.clear();
  session.close();

  std::vector<unsigned char> data(3000);
  const std::string io = "InstrumentException: An I/O error occurred while attempting to ";
  const std::string writeError = io + "write to GPIB connection " + address;
  const std::string readError = io + "read from GPIB connection " + address;
  // The block writes do not ask for a connection; the missing VISA layer answers
  // the END switch that each of them starts with.
  const std::string noVisa = "ApplicationException: Unknown VISA error";
  const struct {
    const char *name;
    std::function<void()> action;
    std::string thrown;
  } rows[] = {
      {"writeLine", [&] { session.writeLine("*IDN?"); }, writeError},
      {"readLine", [&] { session.readLine(); }, readError},
      {"readBlock", [&] { session.readBlock("MMEM:DATA? 'w'"); }, readError},
      {"writeBlock", [&] { session.writeBlock("MMEM:DATA 'w',", data); }, noVisa},
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(row.name);
    EXPECT_EQ(Testing::thrown(row.action), row.thrown);
  }
  EXPECT_TRUE(VisaIOSession::discover("?*").empty());
}
