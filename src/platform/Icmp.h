#pragma once

#include <string>

namespace Corvane::Wavemill::Platform {

// Sends one ICMP echo request with a 32-byte payload to the dotted IPv4
// address `ipv4` and waits up to `timeoutInMS` (negative counts as 0) for the
// matching reply. True when it came; false for an address that does not parse,
// for a system that lets this process open no ICMP socket, and on time-out.
// Thread-safe: concurrent calls tell their replies apart.
bool sendEcho(const std::string &ipv4, int timeoutInMS);

// True when this process may open an ICMP socket at all: an unprivileged
// datagram socket (allowed by the system's ping group range) or a raw socket.
bool canSendEcho();

} // namespace Corvane::Wavemill::Platform
