#include "Session.h"

#include "platform/Socket.h"

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <climits>
#include <cstring>

namespace Corvane::Wavemill::CorVisa {

namespace {

using Clock = std::chrono::steady_clock;

// Receives go into the session's buffer in pieces of this size; a read that
// still wants at least this much receives straight into the caller's buffer.
constexpr std::size_t chunkSize = 64 * 1024;
// viClear throws away at most this much, so that a peer that never stops
// sending cannot hold it for ever.
constexpr std::size_t maxDiscard = 16 * 1024 * 1024;

// The end of an operation's time-out. An unlimited one still waits in
// bounded steps, so that every single wait of the socket layer has an end.
class Deadline {
public:
  explicit Deadline(ViUInt32 timeoutInMS)
      : limited(timeoutInMS != VI_TMO_INFINITE), at(Clock::now() + std::chrono::milliseconds(timeoutInMS)) {}

  // The milliseconds for the next wait; 0 once the time is up.
  int nextWaitInMS() const {
    if (!limited)
      return 60 * 60 * 1000;
    const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(at - Clock::now()).count();
    return left <= 0 ? 0 : static_cast<int>(std::min<long long>(left, INT_MAX));
  }
  bool expired() const { return limited && Clock::now() >= at; }

private:
  bool limited;
  Clock::time_point at;
};

// 1 when the socket is ready before the deadline, 0 on time-out, -1 on error.
template <typename Wait> int waitUntil(const Deadline &deadline, Wait wait) {
  for (;;) {
    const int ready = wait(deadline.nextWaitInMS());
    if (ready != 0 || deadline.expired())
      return ready;
  }
}

} // namespace

std::shared_ptr<Session> Session::connect(const ResourceAddress &address, int timeoutInMS) {
  std::string ip, ipv6;
  Platform::resolveAddresses(address.host, ip, ipv6);
  if (ip.empty())
    return nullptr;
  const Platform::SocketHandle socket = Platform::openTcpSocket();
  if (socket == Platform::noSocket)
    return nullptr;
  auto session = std::make_shared<Session>(socket);
  // Non-blocking while connecting, so that an unreachable host costs the
  // time-out and not the system's minutes.
  if (!Platform::setNonBlocking(socket, true))
    return nullptr;
  if (Platform::connectIPv4(socket, ip, address.port) != 0) {
    if (Platform::lastSocketError() != EINPROGRESS)
      return nullptr;
    if (Platform::waitWritable(socket, timeoutInMS / 1000, (timeoutInMS % 1000) * 1000L) != 1 ||
        Platform::pendingError(socket) != 0)
      return nullptr;
  }
  if (!Platform::setNonBlocking(socket, false))
    return nullptr;
  session->applyTimeout();
  return session;
}

Session::Session(Platform::SocketHandle socket) : socket(socket) {}

Session::~Session() { Platform::closeSocket(socket); }

void Session::shutdown() { Platform::shutdownBoth(socket); }

void Session::applyTimeout() {
  // The socket layer reads 0 as "no limit"; VISA's 0 means "do not wait".
  int value = 1;
  if (timeoutInMS == VI_TMO_INFINITE)
    value = 0;
  else if (timeoutInMS > 0)
    value = static_cast<int>(std::min<ViUInt32>(timeoutInMS, INT_MAX));
  Platform::setSendTimeout(socket, value);
  Platform::setReceiveTimeout(socket, value);
}

ViStatus Session::write(const ViByte *data, ViUInt32 count, ViUInt32 &sent) {
  std::lock_guard<std::mutex> lock(mutex);
  sent = 0;
  const Deadline deadline(timeoutInMS);
  while (sent < count) {
    // Sent at once while the socket takes the bytes: a block written in
    // 1024-byte pieces then costs one system call a piece, not two.
    long n = Platform::sendBytes(socket, data + sent, count - sent);
    if (n <= 0) {
      const int ready = waitUntil(
          deadline, [this](int ms) { return Platform::waitWritable(socket, ms / 1000, (ms % 1000) * 1000L); });
      if (ready == 0)
        return VI_ERROR_TMO;
      if (ready < 0)
        return VI_ERROR_IO;
      // Writable and still failing: the peer has reset or the session was closed.
      n = Platform::sendBytes(socket, data + sent, count - sent);
      if (n <= 0)
        return VI_ERROR_CONN_LOST;
    }
    sent += static_cast<ViUInt32>(n);
  }
  return VI_SUCCESS;
}

ViStatus Session::takeBuffered(ViByte *buffer, ViUInt32 count, ViUInt32 &received, bool &done) {
  const std::size_t look = std::min<std::size_t>(buffered(), count - received);
  MessageEnd::Stop stop = MessageEnd::Stop::None;
  const std::size_t used = messageEnd.scan(input.data() + inputStart, look, stop);
  if (used > 0)
    std::memcpy(buffer + received, input.data() + inputStart, used);
  inputStart += used;
  received += static_cast<ViUInt32>(used);
  if (inputStart == input.size()) {
    input.clear();
    inputStart = 0;
  }
  done = true;
  if (stop == MessageEnd::Stop::End)
    return VI_SUCCESS;
  if (stop == MessageEnd::Stop::TermChar)
    return VI_SUCCESS_TERM_CHAR;
  if (received == count)
    return VI_SUCCESS_MAX_CNT;
  done = false;
  return VI_SUCCESS;
}

ViStatus Session::read(ViByte *buffer, ViUInt32 count, ViUInt32 &received) {
  std::lock_guard<std::mutex> lock(mutex);
  received = 0;
  const Deadline deadline(timeoutInMS);
  for (;;) {
    bool done = false;
    const ViStatus status = takeBuffered(buffer, count, received, done);
    if (done)
      return status;
    // Nothing is buffered now, and the caller wants more.
    const int ready = waitUntil(deadline, [this](int ms) { return Platform::waitReadable(socket, ms); });
    if (ready == 0)
      return VI_ERROR_TMO;
    if (ready < 0)
      return VI_ERROR_IO;
    const std::size_t wanted = count - received;
    if (wanted >= chunkSize) {
      const long n = Platform::receiveBytes(socket, buffer + received, wanted);
      if (n <= 0)
        return VI_ERROR_CONN_LOST;
      MessageEnd::Stop stop = MessageEnd::Stop::None;
      const std::size_t used = messageEnd.scan(buffer + received, static_cast<std::size_t>(n), stop);
      // Bytes beyond the end of the message wait for the next read.
      input.assign(buffer + received + used, buffer + received + n);
      received += static_cast<ViUInt32>(used);
      if (stop != MessageEnd::Stop::None)
        return stop == MessageEnd::Stop::End ? VI_SUCCESS : VI_SUCCESS_TERM_CHAR;
      if (received == count)
        return VI_SUCCESS_MAX_CNT;
      continue;
    }
    input.resize(chunkSize);
    const long n = Platform::receiveBytes(socket, input.data(), chunkSize);
    input.resize(n > 0 ? static_cast<std::size_t>(n) : 0);
    // The end of the stream, or a reset after the socket said it was readable.
    if (n <= 0)
      return VI_ERROR_CONN_LOST;
  }
}

ViStatus Session::clear() {
  std::lock_guard<std::mutex> lock(mutex);
  input.clear();
  inputStart = 0;
  messageEnd.reset();
  unsigned char scratch[4096];
  for (std::size_t discarded = 0; discarded < maxDiscard;) {
    if (Platform::waitReadable(socket, 0) != 1)
      break;
    const long n = Platform::receiveBytes(socket, scratch, sizeof scratch);
    if (n <= 0)
      break;
    discarded += static_cast<std::size_t>(n);
  }
  return VI_SUCCESS;
}

ViStatus Session::setAttribute(ViAttr attribute, ViAttrState value) {
  std::lock_guard<std::mutex> lock(mutex);
  switch (attribute) {
  case VI_ATTR_TMO_VALUE:
    if (value > 0xFFFFFFFFu)
      return VI_ERROR_NSUP_ATTR_STATE;
    timeoutInMS = static_cast<ViUInt32>(value);
    applyTimeout();
    return VI_SUCCESS;
  case VI_ATTR_SEND_END_EN:
  case VI_ATTR_TERMCHAR_EN:
    if (value > 1)
      return VI_ERROR_NSUP_ATTR_STATE;
    (attribute == VI_ATTR_SEND_END_EN ? sendEnd : termCharEnabled) = value == 1;
    break;
  case VI_ATTR_TERMCHAR:
    if (value > 0xFF)
      return VI_ERROR_NSUP_ATTR_STATE;
    termChar = static_cast<unsigned char>(value);
    break;
  default:
    return VI_ERROR_NSUP_ATTR;
  }
  messageEnd.setTermChar(termChar, termCharEnabled);
  return VI_SUCCESS;
}

ViStatus Session::getAttribute(ViAttr attribute, void *value) {
  std::lock_guard<std::mutex> lock(mutex);
  // Exactly the attribute's own width: callers pass variables of that type.
  switch (attribute) {
  case VI_ATTR_TMO_VALUE:
    std::memcpy(value, &timeoutInMS, sizeof(ViUInt32));
    return VI_SUCCESS;
  case VI_ATTR_SEND_END_EN:
  case VI_ATTR_TERMCHAR_EN: {
    const ViBoolean state = (attribute == VI_ATTR_SEND_END_EN ? sendEnd : termCharEnabled) ? VI_TRUE : VI_FALSE;
    std::memcpy(value, &state, sizeof state);
    return VI_SUCCESS;
  }
  case VI_ATTR_TERMCHAR: {
    const ViUInt8 state = termChar;
    std::memcpy(value, &state, sizeof state);
    return VI_SUCCESS;
  }
  default:
    return VI_ERROR_NSUP_ATTR;
  }
}

} // namespace Corvane::Wavemill::CorVisa
