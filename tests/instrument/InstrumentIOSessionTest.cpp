#include "wavemill/instrument/InstrumentIOSession.h"

#include "support/ExpectThrow.h"
#include "wavemill/instrument/LanIOSession.h"
#include "wavemill/instrument/VisaIOSession.h"

#include <gtest/gtest.h>

using namespace Corvane::Wavemill;

TEST(InstrumentIOSessionTest, CreatePicksTheTransportFromTheFormOfTheAddress) {
  enum class Kind { None, Lan, Visa };
  const struct {
    std::string address;
    Kind kind;
    std::string host; // the LAN session's host, or the VISA session's address
    int port;
  } cases[] = {
      {"", Kind::None, "", 0},
      {"GPIB0", Kind::Lan, "GPIB0", 5025},
      {"TCPIP0:: host :: 6000 ::SOCKET", Kind::Lan, "host", 6000},
      {"TCPIP0::host::0x10::SOCKET", Kind::Lan, "host", 5025},
      {"TCPIP0::1.2.3.4::INSTR", Kind::Lan, "1.2.3.4", 5025},
      {"TCPIP0::host", Kind::Lan, "TCPIP0::host", 5025},
      {"TCPIP0::host::inst0::INSTR", Kind::Visa, "TCPIP0::host::inst0::INSTR", 0},
      {"tcpip0::host::hislip0::instr", Kind::Visa, "tcpip0::host::hislip0::instr", 0},
      {"usb-scope", Kind::Visa, "usb-scope", 0},
      {"ASRL1::INSTR", Kind::Visa, "ASRL1::INSTR", 0},
  };
  for (const auto &row : cases) {
    SCOPED_TRACE(row.address);
    const auto session = InstrumentIOSession::create(row.address);
    const auto lan = std::dynamic_pointer_cast<LanIOSession>(session);
    EXPECT_EQ(session == nullptr, row.kind == Kind::None);
    EXPECT_EQ(lan != nullptr, row.kind == Kind::Lan);
    EXPECT_EQ(std::dynamic_pointer_cast<VisaIOSession>(session) != nullptr, row.kind == Kind::Visa);
    EXPECT_EQ(session ? session->getAddress() : "", row.host);
    EXPECT_EQ(lan ? lan->getPort() : 0, row.port);
  }
  EXPECT_EQ(Testing::thrown([] { InstrumentIOSession::create("TCPIP0::host::123456789012::SOCKET"); }),
            "out_of_range: stoi argument out of range");
}
