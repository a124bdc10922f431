#include "platform/Icmp.h"

#include <arpa/inet.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <cerrno>
#include <chrono>
#include <cstdint>
#include <cstring>

namespace Corvane::Wavemill::Platform {

namespace {

constexpr std::uint8_t echoReply = 0;
constexpr std::uint8_t echoRequest = 8;
constexpr std::size_t headerSize = 8;
constexpr std::size_t payloadSize = 32;

class IcmpSocket {
public:
  // The kernel itself applies /proc/sys/net/ipv4/ping_group_range when a
  // datagram socket is asked for, so trying it is the check. A raw socket
  // needs CAP_NET_RAW and sees every ICMP packet of the host.
  IcmpSocket() {
    fd = ::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, IPPROTO_ICMP);
    if (fd < 0) {
      fd = ::socket(AF_INET, SOCK_RAW | SOCK_CLOEXEC, IPPROTO_ICMP);
      raw = true;
    }
  }
  ~IcmpSocket() {
    // Not retried on EINTR: Linux frees the descriptor even then, and a retry
    // could close one that another thread has just been given.
    if (fd >= 0)
      ::close(fd);
  }
  IcmpSocket(const IcmpSocket &) = delete;
  IcmpSocket &operator=(const IcmpSocket &) = delete;

  int fd = -1;
  bool raw = false;
};

std::uint16_t checksum(const std::uint8_t *data, std::size_t size) {
  std::uint32_t sum = 0;
  for (std::size_t i = 0; i + 1 < size; i += 2)
    sum += static_cast<std::uint32_t>(data[i] << 8 | data[i + 1]);
  if (size % 2 != 0)
    sum += static_cast<std::uint32_t>(data[size - 1] << 8);
  while (sum >> 16 != 0)
    sum = (sum & 0xffff) + (sum >> 16);
  return static_cast<std::uint16_t>(~sum);
}

std::uint16_t nextSequence() {
  static std::atomic<std::uint16_t> sequence{0};
  return sequence.fetch_add(1, std::memory_order_relaxed);
}

// Whether `packet` is the reply to our request. A datagram socket gets the
// ICMP message alone, and only replies to its own identifier; a raw socket
// gets every ICMP packet with its IP header in front, our request included.
bool isOurReply(const std::uint8_t *packet, std::size_t size, bool raw, std::uint16_t identifier,
                std::uint16_t sequence) {
  if (raw) {
    if (size < 20)
      return false;
    const std::size_t ipHeader = static_cast<std::size_t>(packet[0] & 0x0f) * 4;
    if (ipHeader < 20 || size < ipHeader + headerSize)
      return false;
    packet += ipHeader;
    if ((packet[4] << 8 | packet[5]) != identifier)
      return false;
  } else if (size < headerSize) {
    return false;
  }
  return packet[0] == echoReply && packet[1] == 0 && (packet[6] << 8 | packet[7]) == sequence;
}

} // namespace

bool sendEcho(const std::string &ipv4, int timeoutInMS) {
  sockaddr_in target{};
  target.sin_family = AF_INET;
  if (::inet_pton(AF_INET, ipv4.c_str(), &target.sin_addr) != 1)
    return false;
  IcmpSocket socket;
  if (socket.fd < 0)
    return false;

  const std::uint16_t identifier = static_cast<std::uint16_t>(::getpid());
  const std::uint16_t sequence = nextSequence();
  std::array<std::uint8_t, headerSize + payloadSize> request{};
  request[0] = echoRequest;
  request[4] = static_cast<std::uint8_t>(identifier >> 8);
  request[5] = static_cast<std::uint8_t>(identifier);
  request[6] = static_cast<std::uint8_t>(sequence >> 8);
  request[7] = static_cast<std::uint8_t>(sequence);
  for (std::size_t i = 0; i < payloadSize; ++i)
    request[headerSize + i] = static_cast<std::uint8_t>('a' + i % 23);
  const std::uint16_t sum = checksum(request.data(), request.size());
  request[2] = static_cast<std::uint8_t>(sum >> 8);
  request[3] = static_cast<std::uint8_t>(sum);

  ssize_t sent = 0;
  // Interrupted by a signal handler of the application before anything went.
  while ((sent = ::sendto(socket.fd, request.data(), request.size(), 0, reinterpret_cast<const sockaddr *>(&target),
                          sizeof target)) < 0 &&
         errno == EINTR) {
  }
  if (sent != static_cast<ssize_t>(request.size()))
    return false;

  const auto deadline = std::chrono::steady_clock::now() + std::chrono::milliseconds(std::max(timeoutInMS, 0));
  std::array<std::uint8_t, 1500> reply{};
  for (;;) {
    const auto left = std::chrono::ceil<std::chrono::milliseconds>(deadline - std::chrono::steady_clock::now());
    pollfd entry{socket.fd, POLLIN, 0};
    const int ready = ::poll(&entry, 1, static_cast<int>(std::max<std::chrono::milliseconds::rep>(left.count(), 0)));
    if (ready < 0 && errno == EINTR)
      continue; // a signal handler ran; the time left is worked out again
    if (ready <= 0)
      return false;
    sockaddr_in from{};
    socklen_t fromSize = sizeof from;
    const ssize_t received =
        ::recvfrom(socket.fd, reply.data(), reply.size(), MSG_DONTWAIT, reinterpret_cast<sockaddr *>(&from), &fromSize);
    // An interrupted or emptied read goes back to the wait with the time left.
    if (received < 0 && errno != EINTR && errno != EAGAIN && errno != EWOULDBLOCK)
      return false;
    if (received > 0 && from.sin_addr.s_addr == target.sin_addr.s_addr &&
        isOurReply(reply.data(), static_cast<std::size_t>(received), socket.raw, identifier, sequence))
      return true;
  }
}

bool canSendEcho() { return IcmpSocket().fd >= 0; }

} // namespace Corvane::Wavemill::Platform
