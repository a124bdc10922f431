#pragma once

#include <string>

namespace Corvane::Wavemill::CorVisa {

// Where a TCP/IP resource name leads.
struct ResourceAddress {
  std::string host;
  int port = 0;
};

// The longest resource name accepted, without the terminating zero.
constexpr std::size_t maxResourceNameLength = 255;

// Reads "TCPIP[board]::host::port::SOCKET" and
// "TCPIP[board]::host[::device][::INSTR]" without regard to case. An INSTR
// resource leads to `instrPort`. False for every other form.
bool parseResourceName(const std::string &name, int instrPort, ResourceAddress &address);

// A port number "1" to "65535"; 0 for anything else.
int parsePort(const std::string &text);

// Whether `text` matches the pattern: "?" is any one character, "*" any run
// of characters (also none); the rest compares without regard to case.
bool matchesPattern(const std::string &pattern, const std::string &text);

} // namespace Corvane::Wavemill::CorVisa
