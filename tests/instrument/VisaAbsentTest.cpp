// Runs with WAVEMILL_VISA_LIBRARY naming no file, so libwavemill.so finds no
// VISA library when it loads.
#include "wavemill/instrument/VisaIOSession.h"

#include "support/ExpectThrow.h"
#include "support/TestInstrument.h"

#include <gtest/gtest.h>

#include <functional>
#include <stdexcept>

using namespace Corvane::Wavemill;
using Testing::thrownLibraryException;

TEST(VisaIOSessionTest, WithoutAVisaLibraryNothingConnectsAndTransfersThrow) {
  const std::string address = "TCPIP0::127.0.0.1::inst0::INSTR";
  VisaIOSession session(address);
  EXPECT_FALSE(session.connect());
  EXPECT_FALSE(session.getConnected());
  session.setTimeoutInMS(250);
  EXPECT_EQ(session.getTimeoutInMS(), 250);
  session.setBlockEnd("x");
  EXPECT_EQ(session.getBlockEnd(), "");
  session.clear();
  session.close();

  std::vector<unsigned char> data(3000);
  const struct {
    const char *name;
    std::function<void()> action;
    std::string thrown;
  } rows[] = {
      {"writeLine", [&] { session.writeLine("*IDN?"); },
       "InstrumentException: An I/O error occurred while attempting to write to GPIB connection " + address},
      {"readLine", [&] { session.readLine(); },
       "InstrumentException: An I/O error occurred while attempting to read from GPIB connection " + address},
      {"readBlock", [&] { session.readBlock("MMEM:DATA? 'w'"); },
       "InstrumentException: An I/O error occurred while attempting to read from GPIB connection " + address},
      // The block writes do not ask for a connection; the missing VISA
      // layer answers for it.
      {"writeBlock", [&] { session.writeBlock("MMEM:DATA 'w',", data); }, "ApplicationException: Unknown VISA error"},
      {"writeManyBlocksStart", [&] { session.writeManyBlocksStart("MMEM:DATA 'w',", data, 6000); },
       "ApplicationException: Unknown VISA error"},
      {"writeManyBlocks", [&] { session.writeManyBlocks(data); }, "ApplicationException: Unknown VISA error"},
      {"writeManyBlocksEnd", [&] { session.writeManyBlocksEnd(); }, "ApplicationException: Unknown VISA error"},
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(row.name);
    EXPECT_EQ(thrownLibraryException(row.action), row.thrown);
  }

  EXPECT_TRUE(VisaIOSession::discover("?*").empty());
  Testing::TestInstrument instrument(address, 250);
  try {
    instrument.query("*IDN?", -1);
    ADD_FAILURE() << "nothing was thrown";
  } catch (const std::runtime_error &error) {
    EXPECT_STREQ(error.what(), ("Failed to send SCPI *IDN? to " + address).c_str());
  }
}
