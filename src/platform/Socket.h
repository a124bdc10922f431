#pragma once

#include <cstddef>
#include <string>

namespace Corvane::Wavemill::Platform {

// IPv4 TCP sockets, client and server side. Every call that can be
// interrupted by a signal is retried inside; none raises SIGPIPE. Failures
// leave their reason in lastSocketError().

using SocketHandle = int;
// The handle of no socket: closing it touches nothing.
constexpr SocketHandle noSocket = -1;

// The error number of the last failed socket call on this thread.
int lastSocketError();
// The text of an error number ("Connection refused").
std::string socketErrorText(int error);

// ---- Client side -------------------------------------------------------------

// A new IPv4 stream socket; noSocket on failure.
SocketHandle openTcpSocket();
// The send and the receive time-out in milliseconds; 0 waits without limit.
bool setSendTimeout(SocketHandle socket, int timeoutInMS);
bool setReceiveTimeout(SocketHandle socket, int timeoutInMS);
// Switches non-blocking mode on or off.
bool setNonBlocking(SocketHandle socket, bool on);
// Starts a connection to `ip` (dotted IPv4) and `port`; the result of the
// system's connect: 0, or -1 (also while a non-blocking connect is under way).
int connectIPv4(SocketHandle socket, const std::string &ip, int port);
// Waits for writability at most `seconds` + `microseconds`: 1 when
// writable, 0 on time-out, -1 on error.
int waitWritable(SocketHandle socket, long seconds, long microseconds);
// The pending error of the socket (SO_ERROR); -1 when it cannot be read.
int pendingError(SocketHandle socket);
// The first IPv4 and the first IPv6 address of `host` as text; both empty
// when the name does not resolve.
void resolveAddresses(const std::string &host, std::string &firstIPv4, std::string &firstIPv6);

// ---- Transfer ------------------------------------------------------------------

// One send of up to `size` bytes: the count sent, or -1.
long sendBytes(SocketHandle socket, const void *data, std::size_t size);
// Sends all `size` bytes, looping over short sends: `size`, or -1.
long sendAll(SocketHandle socket, const void *data, std::size_t size);
// One receive of up to `size` bytes: the count, 0 at the end of the stream,
// -1 on error or time-out.
long receiveBytes(SocketHandle socket, void *data, std::size_t size);
// One receive that waits for all `size` bytes within the receive time-out:
// fewer only at the end of the stream, on a time-out or an error (then -1
// when nothing came).
long receiveAll(SocketHandle socket, void *data, std::size_t size);
// Ends the receiving side, the sending side (the peer reads the end of the
// stream), or both sides.
bool shutdownReceive(SocketHandle socket);
bool shutdownSend(SocketHandle socket);
bool shutdownBoth(SocketHandle socket);
void closeSocket(SocketHandle socket);

// ---- Server side -------------------------------------------------------------

// A socket listening on `ip`:`port` (0 picks a free port); noSocket on
// failure.
SocketHandle listenTcp(const std::string &ip, int port, int backlog);
// The port a socket is bound to; 0 when unknown.
int localPort(SocketHandle socket);
// Waits at most `timeoutInMS` for a socket to become readable (for a
// listener: a client is waiting): 1, 0 on time-out, -1 on error.
int waitReadable(SocketHandle socket, int timeoutInMS);
// Accepts one waiting client; noSocket on failure.
SocketHandle acceptClient(SocketHandle listener);

} // namespace Corvane::Wavemill::Platform
