#include "platform/Socket.h"

#include <arpa/inet.h>
#include <fcntl.h>
#include <netdb.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <sys/time.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <cstdint>
#include <cstring>
#include <limits>

namespace Corvane::Wavemill::Platform {

namespace {

thread_local int lastError = 0;

// Keeps the reason of a failure before later calls (logging, allocation) can
// overwrite errno.
template <typename T> T fail(T result) {
  lastError = errno;
  return result;
}

// strerror_r comes in two forms; glibc picks the GNU one under _GNU_SOURCE.
[[maybe_unused]] std::string errorText(int result, const char *buffer) {
  return result == 0 ? std::string(buffer) : std::string();
}
[[maybe_unused]] std::string errorText(const char *result, const char *) {
  return result != nullptr ? std::string(result) : std::string();
}

bool setTimeout(SocketHandle socket, int option, int timeoutInMS) {
  timeval value{};
  if (timeoutInMS > 0) {
    value.tv_sec = timeoutInMS / 1000;
    value.tv_usec = static_cast<suseconds_t>((timeoutInMS % 1000) * 1000);
  }
  if (::setsockopt(socket, SOL_SOCKET, option, &value, sizeof value) != 0)
    return fail(false);
  return true;
}

int clampToInt(long long value) {
  if (value > std::numeric_limits<int>::max())
    return std::numeric_limits<int>::max();
  return value < 0 ? 0 : static_cast<int>(value);
}

// Waits for `events` at most `timeoutInMS`: 1 when one of them (or an error
// or hang-up) is reported, 0 on time-out, -1 on error.
int waitFor(SocketHandle socket, short events, int timeoutInMS) {
  using Clock = std::chrono::steady_clock;
  const auto deadline = Clock::now() + std::chrono::milliseconds(timeoutInMS);
  pollfd entry{socket, events, 0};
  int left = timeoutInMS;
  for (;;) {
    const int ready = ::poll(&entry, 1, left);
    if (ready >= 0)
      return ready > 0 ? 1 : 0;
    if (errno != EINTR)
      return fail(-1);
    // A signal handler of the application ran; wait for the time that is left.
    const auto rest = std::chrono::duration_cast<std::chrono::milliseconds>(deadline - Clock::now());
    left = clampToInt(rest.count());
  }
}

// A time-out option of a socket in milliseconds, 0 when it has none.
int timeoutOf(SocketHandle socket, int option) {
  timeval value{};
  socklen_t length = sizeof value;
  if (::getsockopt(socket, SOL_SOCKET, option, &value, &length) != 0)
    return 0;
  return clampToInt(static_cast<long long>(value.tv_sec) * 1000 + value.tv_usec / 1000);
}
int sendTimeoutOf(SocketHandle socket) { return timeoutOf(socket, SO_SNDTIMEO); }
int receiveTimeoutOf(SocketHandle socket) { return timeoutOf(socket, SO_RCVTIMEO); }

} // namespace

int lastSocketError() { return lastError; }

std::string socketErrorText(int error) {
  char buffer[256] = {};
  return errorText(::strerror_r(error, buffer, sizeof buffer), buffer);
}

// ---- Client side -------------------------------------------------------------

SocketHandle openTcpSocket() {
  // Close-on-exec: a program the application starts must not inherit the
  // connection to an instrument.
  const SocketHandle socket = ::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, IPPROTO_TCP);
  return socket < 0 ? fail(noSocket) : socket;
}

bool setSendTimeout(SocketHandle socket, int timeoutInMS) { return setTimeout(socket, SO_SNDTIMEO, timeoutInMS); }

bool setReceiveTimeout(SocketHandle socket, int timeoutInMS) { return setTimeout(socket, SO_RCVTIMEO, timeoutInMS); }

bool setNonBlocking(SocketHandle socket, bool on) {
  const int flags = ::fcntl(socket, F_GETFL);
  if (flags < 0)
    return fail(false);
  const int wanted = on ? flags | O_NONBLOCK : flags & ~O_NONBLOCK;
  if (wanted != flags && ::fcntl(socket, F_SETFL, wanted) != 0)
    return fail(false);
  return true;
}

int connectIPv4(SocketHandle socket, const std::string &ip, int port) {
  sockaddr_in address{};
  address.sin_family = AF_INET;
  address.sin_port = htons(static_cast<std::uint16_t>(port));
  if (::inet_pton(AF_INET, ip.c_str(), &address.sin_addr) != 1) {
    // Not connecting at all: the zero address would reach this very host.
    lastError = EAFNOSUPPORT;
    return -1;
  }
  if (::connect(socket, reinterpret_cast<const sockaddr *>(&address), sizeof address) == 0)
    return 0;
  if (errno != EINTR)
    return fail(-1);
  // An interrupted connect goes on in the background and must not be
  // started again; wait for its end within the send time-out instead.
  const int timeoutInMS = sendTimeoutOf(socket);
  if (waitFor(socket, POLLOUT, timeoutInMS > 0 ? timeoutInMS : std::numeric_limits<int>::max()) != 1) {
    lastError = ETIMEDOUT;
    return -1;
  }
  const int error = pendingError(socket);
  if (error > 0)
    lastError = error;
  return error == 0 ? 0 : -1;
}

int waitWritable(SocketHandle socket, long seconds, long microseconds) {
  const long long limit = static_cast<long long>(seconds) * 1000 + microseconds / 1000;
  return waitFor(socket, POLLOUT, clampToInt(limit));
}

int pendingError(SocketHandle socket) {
  int error = 0;
  socklen_t length = sizeof error;
  if (::getsockopt(socket, SOL_SOCKET, SO_ERROR, &error, &length) != 0)
    return fail(-1);
  return error;
}

void resolveAddresses(const std::string &host, std::string &firstIPv4, std::string &firstIPv6) {
  firstIPv4.clear();
  firstIPv6.clear();
  addrinfo hints{};
  hints.ai_family = AF_UNSPEC;
  hints.ai_socktype = SOCK_STREAM;
  hints.ai_protocol = IPPROTO_TCP;
  addrinfo *list = nullptr;
  const int result = ::getaddrinfo(host.c_str(), "0", &hints, &list);
  if (result != 0) {
    lastError = result == EAI_SYSTEM ? errno : EHOSTUNREACH;
    return;
  }
  for (const addrinfo *entry = list; entry != nullptr; entry = entry->ai_next) {
    if (entry->ai_addr == nullptr)
      continue;
    char text[INET6_ADDRSTRLEN] = {};
    if (entry->ai_family == AF_INET && firstIPv4.empty()) {
      const auto *address = reinterpret_cast<const sockaddr_in *>(entry->ai_addr);
      if (::inet_ntop(AF_INET, &address->sin_addr, text, sizeof text) != nullptr)
        firstIPv4 = text;
    } else if (entry->ai_family == AF_INET6 && firstIPv6.empty()) {
      const auto *address = reinterpret_cast<const sockaddr_in6 *>(entry->ai_addr);
      if (::inet_ntop(AF_INET6, &address->sin6_addr, text, sizeof text) != nullptr)
        firstIPv6 = text;
    }
  }
  ::freeaddrinfo(list);
}

// ---- Transfer ------------------------------------------------------------------

long sendBytes(SocketHandle socket, const void *data, std::size_t size) {
  for (;;) {
    // MSG_NOSIGNAL: a peer that has gone makes send fail, not kill the process.
    const ssize_t sent = ::send(socket, data, size, MSG_NOSIGNAL);
    if (sent >= 0)
      return static_cast<long>(sent);
    // Interrupted before anything was sent (otherwise the count comes back):
    // a signal handler of the application ran, so the send is simply made again.
    if (errno != EINTR)
      return fail(-1L);
  }
}

long sendAll(SocketHandle socket, const void *data, std::size_t size) {
  const auto *bytes = static_cast<const unsigned char *>(data);
  std::size_t done = 0;
  while (done < size) {
    // A short send (a time-out or a signal after some bytes went) is followed
    // by another; a time-out with nothing sent comes back as -1.
    const long sent = sendBytes(socket, bytes + done, size - done);
    if (sent <= 0)
      return -1;
    done += static_cast<std::size_t>(sent);
  }
  return static_cast<long>(size);
}

long receiveBytes(SocketHandle socket, void *data, std::size_t size) {
  for (;;) {
    const ssize_t received = ::recv(socket, data, size, 0);
    if (received >= 0)
      return static_cast<long>(received);
    // Interrupted before any byte came: a signal handler ran, receive again.
    if (errno != EINTR)
      return fail(-1L);
  }
}

long receiveAll(SocketHandle socket, void *data, std::size_t size) {
  using Clock = std::chrono::steady_clock;
  const int timeoutInMS = receiveTimeoutOf(socket);
  const auto deadline = Clock::now() + std::chrono::milliseconds(timeoutInMS);
  auto *bytes = static_cast<unsigned char *>(data);
  std::size_t done = 0;
  while (done < size) {
    // MSG_WAITALL lets the system collect a large answer over many TCP
    // segments in one call, bounded by the receive time-out.
    const ssize_t received = ::recv(socket, bytes + done, size - done, MSG_WAITALL);
    if (received == 0)
      break;
    if (received < 0) {
      // Interrupted before any byte came: a signal handler ran, receive again.
      if (errno == EINTR)
        continue;
      lastError = errno;
      return done == 0 ? -1 : static_cast<long>(done);
    }
    done += static_cast<std::size_t>(received);
    if (done == size)
      break;
    // A short count is the end of the stream, the time-out or a signal. Only
    // a signal leaves time and bytes to come; the others end here.
    const auto rest = std::chrono::duration_cast<std::chrono::milliseconds>(deadline - Clock::now()).count();
    if (timeoutInMS > 0 && (rest <= 0 || waitFor(socket, POLLIN, clampToInt(rest)) != 1))
      break;
  }
  return static_cast<long>(done);
}

bool shutdownReceive(SocketHandle socket) { return ::shutdown(socket, SHUT_RD) == 0 || fail(false); }

bool shutdownSend(SocketHandle socket) { return ::shutdown(socket, SHUT_WR) == 0 || fail(false); }

bool shutdownBoth(SocketHandle socket) { return ::shutdown(socket, SHUT_RDWR) == 0 || fail(false); }

void closeSocket(SocketHandle socket) {
  if (socket < 0)
    return;
  // Not retried on EINTR: Linux frees the descriptor even then, and a retry
  // could close one that another thread has just been given.
  ::close(socket);
}

// ---- Server side -------------------------------------------------------------

SocketHandle listenTcp(const std::string &ip, int port, int backlog) {
  sockaddr_in address{};
  address.sin_family = AF_INET;
  address.sin_port = htons(static_cast<std::uint16_t>(port));
  if (port < 0 || port > 65535 || ::inet_pton(AF_INET, ip.c_str(), &address.sin_addr) != 1) {
    lastError = EINVAL;
    return noSocket;
  }
  const SocketHandle socket = openTcpSocket();
  if (socket == noSocket)
    return noSocket;
  // A port that a test or a restarted server used a moment ago is still in
  // TIME_WAIT; taking it again is safe for a listener.
  const int on = 1;
  if (::setsockopt(socket, SOL_SOCKET, SO_REUSEADDR, &on, sizeof on) != 0 ||
      ::bind(socket, reinterpret_cast<const sockaddr *>(&address), sizeof address) != 0 ||
      ::listen(socket, backlog) != 0) {
    lastError = errno;
    ::close(socket);
    return noSocket;
  }
  return socket;
}

int localPort(SocketHandle socket) {
  sockaddr_in address{};
  socklen_t length = sizeof address;
  if (::getsockname(socket, reinterpret_cast<sockaddr *>(&address), &length) != 0)
    return fail(0);
  return address.sin_family == AF_INET ? ntohs(address.sin_port) : 0;
}

int waitReadable(SocketHandle socket, int timeoutInMS) {
  // A negative limit would wait for ever; every wait here has an end.
  return waitFor(socket, POLLIN, timeoutInMS < 0 ? 0 : timeoutInMS);
}

SocketHandle acceptClient(SocketHandle listener) {
  for (;;) {
    const SocketHandle client = ::accept4(listener, nullptr, nullptr, SOCK_CLOEXEC);
    if (client >= 0)
      return client;
    // A signal handler ran while waiting; the client is still in the queue.
    if (errno != EINTR)
      return fail(noSocket);
  }
}

} // namespace Corvane::Wavemill::Platform
