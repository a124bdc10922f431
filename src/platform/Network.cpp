#include "platform/Network.h"

#include <arpa/inet.h>
#include <netdb.h>
#include <netinet/in.h>
#include <sys/socket.h>
#include <unistd.h>

#include <atomic>

namespace Corvane::Wavemill::Platform {

namespace {

std::atomic<int> &users() {
  static std::atomic<int> count{0};
  return count;
}

} // namespace

std::string hostName() {
  char buffer[255] = {};
  if (::gethostname(buffer, sizeof buffer) != 0)
    return {};
  // A name that fills the buffer need not be terminated.
  buffer[sizeof buffer - 1] = '\0';
  return buffer;
}

std::string resolveIPv4(const std::string &host) {
  addrinfo hints{};
  hints.ai_family = AF_INET;
  hints.ai_socktype = SOCK_STREAM;
  hints.ai_protocol = IPPROTO_TCP;
  addrinfo *list = nullptr;
  if (host.empty() || ::getaddrinfo(host.c_str(), nullptr, &hints, &list) != 0 || list == nullptr)
    return {};
  std::string result;
  if (list->ai_family == AF_INET && list->ai_addr != nullptr) {
    char text[INET_ADDRSTRLEN] = {};
    const auto *address = reinterpret_cast<const sockaddr_in *>(list->ai_addr);
    if (::inet_ntop(AF_INET, &address->sin_addr, text, sizeof text) != nullptr)
      result = text;
  }
  ::freeaddrinfo(list);
  return result;
}

// POSIX sockets need no start; the count keeps the pairing of starts and stops
// visible and the same on every system.
bool startSockets() {
  users().fetch_add(1, std::memory_order_relaxed);
  return true;
}

void stopSockets() { users().fetch_sub(1, std::memory_order_relaxed); }

int socketUsers() { return users().load(std::memory_order_relaxed); }

} // namespace Corvane::Wavemill::Platform
