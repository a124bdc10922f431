#pragma once

#include <string>

namespace Corvane::Wavemill::Platform {

// The name of this host; empty on failure.
std::string hostName();

// The first IPv4 address of `host` in dotted form ("localhost" ->
// "127.0.0.1"); empty when the name does not resolve to one.
std::string resolveIPv4(const std::string &host);

// Takes one reference on the system's socket library; true when sockets can
// be used. Every successful start is matched by one stopSockets. Thread-safe.
bool startSockets();
void stopSockets();

// The references taken and not yet given back, for diagnostics.
int socketUsers();

} // namespace Corvane::Wavemill::Platform
