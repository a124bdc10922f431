// Runs with WAVEMILL_VISA_LIBRARY naming no file, so libwavemill.so finds no
// VISA library when it loads.
#include "wavemill/instrument/VisaIOSession.h"

#include "support/ExpectThrow.h"

#include <gtest/gtest.h>

using namespace Corvane::Wavemill;

TEST(VisaIOSessionTest, WithoutAVisaLibraryNothingConnectsAndTransfersThrow) {
  const std::string address = "TCPIP0::127.0.0.1::inst0::INSTR";
  VisaIOSession session(address);
  EXPECT_FALSE(session.connect());
  session.setTimeoutInMS(250);
  EXPECT_EQ(session.getTimeoutInMS(), 250);
  session.clear();
  session.close();

  std::vector<unsigned char> data(3000);
  const std::string io = "InstrumentException: An I/O error occurred while attempting to ";
  const std::string readError = io + "read from GPIB connection " + address;
  EXPECT_EQ(Testing::thrown([&] { session.writeLine("*IDN?"); }), io + "write to GPIB connection " + address);
  EXPECT_EQ(Testing::thrown([&] { session.readLine(); }), readError);
  EXPECT_EQ(Testing::thrown([&] { session.readBlock("MMEM:DATA? 'w'"); }), readError);
  // The block writes do not ask for a connection; the missing VISA layer answers
  // the END switch that each of them starts with.
  EXPECT_EQ(Testing::thrown([&] { session.writeBlock("MMEM:DATA 'w',", data); }),
            "ApplicationException: Unknown VISA error");
  EXPECT_TRUE(VisaIOSession::discover("?*").empty());
}
