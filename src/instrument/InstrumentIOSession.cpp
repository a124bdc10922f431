#include "wavemill/instrument/InstrumentIOSession.h"

#include "tools/StandardNumbers.h"
#include "wavemill/instrument/LanIOSession.h"
#include "wavemill/instrument/VisaIOSession.h"
#include "wavemill/tools/Tools.h"

#include <algorithm>

namespace Corvane::Wavemill {

namespace {

constexpr int defaultPort = 5025;

bool contains(const std::string &text, const char *part) { return text.find(part) != std::string::npos; }

bool startsWith(const std::string &text, const char *part) { return text.find(part) == 0; }

bool isNumber(const std::string &text) {
  return !text.empty() && std::all_of(text.begin(), text.end(), [](char c) { return c >= '0' && c <= '9'; });
}

// The host and port of a raw-socket address. Only the TCPIP forms with "::"
// carry a host of their own ("TCPIP0::host::6000::SOCKET"); every other text
// is the host itself.
std::shared_ptr<InstrumentIOSession> createLanSession(const std::string &address, bool tcpipWithDoubleColon) {
  std::string host = address;
  int port = defaultPort;
  if (tcpipWithDoubleColon) {
    std::string compact = address;
    compact.erase(std::remove(compact.begin(), compact.end(), ' '), compact.end());
    const auto pieces = Tools::split(Tools::replace(compact, "::", " "), ' ');
    if (pieces.size() >= 3) {
      host = pieces[1];
      // "TCPIP0::host::INSTR" has no port; the default stands.
      if (isNumber(pieces[2]))
        port = StandardNumbers::toInt32(pieces[2]);
    }
  }
  return std::make_shared<LanIOSession>(host, port);
}

} // namespace

InstrumentIOSession::InstrumentIOSession() = default;

InstrumentIOSession::~InstrumentIOSession() = default;

std::string InstrumentIOSession::query(const std::string &command) {
  writeLine(command);
  return readLine();
}

std::string InstrumentIOSession::queryArray(const std::string &command) {
  const std::vector<unsigned char> block = readBlock(command);
  return std::string(block.begin(), block.end());
}

std::shared_ptr<InstrumentIOSession> InstrumentIOSession::create(std::string address) {
  if (address.empty())
    return nullptr;
  const std::string upper = Tools::toUpper(address);
  const bool tcpip = startsWith(upper, "TCPIP");
  const bool doubleColon = contains(upper, "::");
  // "::INSTR" begins with "::INST" too, so a VXI-11 address needs a device
  // element such as "::inst0" before its final "::INSTR".
  const auto inst = upper.find("::INST");
  const auto instr = upper.find("::INSTR");
  const bool visaInst = tcpip && inst != std::string::npos && instr != std::string::npos && inst < instr;
  const bool visaHislip = tcpip && contains(upper, "::HISLIP");
  const bool visaUsb = startsWith(upper, "USB");
  const bool visaGpib = startsWith(upper, "GPIB") && doubleColon;
  // Any other resource text with "::" (ASRL1::INSTR, PXI0::...) is the VISA
  // library's to open.
  if (visaInst || visaHislip || visaUsb || visaGpib || (doubleColon && !tcpip))
    return std::make_shared<VisaIOSession>(address);
  return createLanSession(address, tcpip && doubleColon);
}

} // namespace Corvane::Wavemill
