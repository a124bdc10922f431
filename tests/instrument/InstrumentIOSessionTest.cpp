#include "wavemill/instrument/InstrumentIOSession.h"

#include "support/ExpectThrow.h"
#include "wavemill/instrument/LanIOSession.h"
#include "wavemill/instrument/VisaIOSession.h"
#include "wavemill/simulator/SimulatedInstrument.h"

#include <gtest/gtest.h>

#include <stdexcept>

using namespace Corvane::Wavemill;
using Testing::thrownMessage;

namespace {

enum class Kind { None, Lan, Visa };

struct AddressCase {
  std::string address;
  Kind kind;
  std::string host; // the LAN session's host, or the VISA session's address
  int port;
};

} // namespace

TEST(InstrumentIOSessionTest, CreatePicksTheTransportFromTheFormOfTheAddress) {
  const AddressCase cases[] = {
      {"", Kind::None, "", 0},
      {"192.168.0.5", Kind::Lan, "192.168.0.5", 5025},
      {"GPIB0", Kind::Lan, "GPIB0", 5025},
      {"TCPIP0::host::5025::SOCKET", Kind::Lan, "host", 5025},
      {"tcpip0::Host::6000::socket", Kind::Lan, "Host", 6000},
      {"TCPIP0:: host :: 6000 ::SOCKET", Kind::Lan, "host", 6000},
      {"TCPIP0::host::0x10::SOCKET", Kind::Lan, "host", 5025},
      {"TCPIP0::1.2.3.4::INSTR", Kind::Lan, "1.2.3.4", 5025},
      {"TCPIP0::host", Kind::Lan, "TCPIP0::host", 5025},
      {"TCPIP0::host::inst0::INSTR", Kind::Visa, "TCPIP0::host::inst0::INSTR", 0},
      {"tcpip0::host::hislip0::instr", Kind::Visa, "tcpip0::host::hislip0::instr", 0},
      {"USB0::0x0AAD::0x0054::100123::INSTR", Kind::Visa, "USB0::0x0AAD::0x0054::100123::INSTR", 0},
      {"usb-scope", Kind::Visa, "usb-scope", 0},
      {"GPIB0::7::INSTR", Kind::Visa, "GPIB0::7::INSTR", 0},
      {"ASRL1::INSTR", Kind::Visa, "ASRL1::INSTR", 0},
      {"PXI0::2::INSTR", Kind::Visa, "PXI0::2::INSTR", 0},
  };
  for (const auto &row : cases) {
    SCOPED_TRACE(row.address);
    const auto session = InstrumentIOSession::create(row.address);
    const auto lan = std::dynamic_pointer_cast<LanIOSession>(session);
    const auto visa = std::dynamic_pointer_cast<VisaIOSession>(session);
    EXPECT_EQ(session == nullptr, row.kind == Kind::None);
    EXPECT_EQ(lan != nullptr, row.kind == Kind::Lan);
    EXPECT_EQ(visa != nullptr, row.kind == Kind::Visa);
    if (session) {
      EXPECT_EQ(session->getAddress(), row.host);
    }
    if (lan) {
      EXPECT_EQ(lan->getPort(), row.port);
    }
  }
  EXPECT_EQ(thrownMessage<std::out_of_range>([] { InstrumentIOSession::create("TCPIP0::host::123456789012::SOCKET"); }),
            "stoi argument out of range");
}

TEST(InstrumentIOSessionTest, QueryAnswersTheLineAndQueryArrayTheRawBlock) {
  SimulatedInstrument instrument;
  const auto session = InstrumentIOSession::create(instrument.getAddress());
  ASSERT_TRUE(session->connect());
  EXPECT_EQ(session->query("*IDN?"), "Corvane,SG200,100123,1.4.2");
  std::vector<unsigned char> zeros(1000, 0);
  session->writeBlock("MMEM:DATA 'zeros',", zeros);
  // Zero bytes do not end the text.
  EXPECT_EQ(session->queryArray("MMEM:DATA? 'zeros'"), std::string(1000, '\0'));
}

TEST(InstrumentIOSessionTest, VisaSessionWithoutVisaLibraryNeverConnects) {
  VisaIOSession session("GPIB0::7::INSTR");
  EXPECT_FALSE(session.connect());
  EXPECT_FALSE(session.getConnected());
  session.setBlockEnd("x");
  EXPECT_EQ(session.getBlockEnd(), "");
  EXPECT_EQ(thrownMessage<InstrumentException>([&] { session.writeLine("*RST"); }),
            "An I/O error occurred while attempting to write to GPIB connection GPIB0::7::INSTR");
  const std::string readText = "An I/O error occurred while attempting to read from GPIB connection GPIB0::7::INSTR";
  EXPECT_EQ(thrownMessage<InstrumentException>([&] { session.readLine(); }), readText);
  EXPECT_EQ(thrownMessage<InstrumentException>([&] { session.readBlock("MMEM:DATA? 'a'"); }), readText);
  EXPECT_TRUE(VisaIOSession::discover("?*INSTR").empty());
}
