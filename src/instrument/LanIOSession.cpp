#include "wavemill/instrument/LanIOSession.h"

#include "platform/Network.h"
#include "platform/Socket.h"
#include "wavemill/services/LogBase.h"
#include "wavemill/tools/Exceptions.h"

#include <climits>
#include <cstdio>

namespace Corvane::Wavemill {

namespace {

constexpr std::size_t receiveBufferSize = 8192;

void logSocketError() { LogBase::get("Log")->write(3, "WSA error " + std::to_string(Platform::lastSocketError())); }

bool isDigit(char c) { return c >= '0' && c <= '9'; }

// Four dot-separated runs of digits, whatever their values.
bool isDottedQuad(const std::string &text) {
  int groups = 0;
  std::size_t i = 0;
  while (i < text.size()) {
    const std::size_t start = i;
    while (i < text.size() && isDigit(text[i]))
      ++i;
    if (i == start)
      return false;
    ++groups;
    if (i == text.size())
      break;
    if (text[i] != '.' || ++i == text.size())
      return false;
  }
  return groups == 4;
}

// "#" + the count of decimal digits + the digits: 1000 -> "#41000".
std::string blockHeader(const std::string &command, long long size) {
  const std::string sizeText = std::to_string(size < 0 ? 0 : size);
  return command + "#" + std::to_string(sizeText.size()) + sizeText;
}

// The decimal value of the length digits of a block; -1 when they are not
// all digits or the value exceeds an int.
long long blockLength(const char *digits, std::size_t count) {
  long long value = 0;
  for (std::size_t i = 0; i < count; ++i) {
    if (!isDigit(digits[i]))
      return -1;
    value = value * 10 + (digits[i] - '0');
    if (value > INT_MAX)
      return -1;
  }
  return value;
}

bool isLineEnd(unsigned char c) { return c == 0x00 || c == '\n' || c == '\r'; }

} // namespace

struct LanIOSession::Impl {
  Impl(std::string address, int port) : address(std::move(address)), port(port) {
    if (!socketsStarted)
      logSocketError();
  }
  ~Impl() {
    close();
    if (socketsStarted)
      Platform::stopSockets();
  }
  Impl(const Impl &) = delete;
  Impl &operator=(const Impl &) = delete;

  // The handle is forgotten as soon as it is closed: on this system a closed
  // number is soon given to another file, which a later close or read of
  // the old value would hit.
  void close() {
    Platform::closeSocket(socket);
    socket = Platform::noSocket;
    connected = false;
  }

  bool doSetTimeout() const {
    return Platform::setSendTimeout(socket, timeoutInMS) && Platform::setReceiveTimeout(socket, timeoutInMS);
  }

  // One send of the whole piece; false, with the connection closed, when it
  // fails.
  bool send(const void *data, std::size_t size) {
    if (Platform::sendAll(socket, data, size) >= 0)
      return true;
    close();
    return false;
  }

  bool connect();
  std::string readLine();
  std::vector<unsigned char> readBlock(const std::string &command);
  void writeLine(const std::string &text);

  std::string address;
  int port;
  std::string blockEnd = "\n\r";
  Platform::SocketHandle socket = Platform::noSocket;
  bool connected = false;
  int timeoutInMS = 6000;
  const bool socketsStarted = Platform::startSockets();
};

bool LanIOSession::Impl::connect() {
  if (address.empty()) {
    close();
    return false;
  }
  if (connected)
    return true;
  const std::string ip = getIPAddress(address);
  if (ip.empty())
    return false;
  socket = Platform::openTcpSocket();
  if (socket == Platform::noSocket)
    return false;
  doSetTimeout();
  const bool limited = timeoutInMS > 0;
  if (limited && !Platform::setNonBlocking(socket, true)) {
    close();
    return false;
  }
  // The outcome shows in the wait below; without a limit it is left to the
  // first transfer.
  Platform::connectIPv4(socket, ip, port);
  if (limited) {
    // Whole seconds only; a handshake that has not finished by then is not
    // a failure: the first transfer tells whether the instrument is there.
    if (Platform::waitWritable(socket, timeoutInMS / 1000, 0) == 1 && Platform::pendingError(socket) != 0) {
      close();
      return false;
    }
    if (!Platform::setNonBlocking(socket, false)) {
      close();
      return false;
    }
  }
  connected = true;
  return true;
}

void LanIOSession::Impl::writeLine(const std::string &text) {
  if (!connected)
    throw InstrumentException("Failed to send SCPI " + text + " to " + address);
  const std::string line = text + blockEnd;
  send(line.data(), line.size());
}

std::string LanIOSession::Impl::readLine() {
  if (!connected)
    throw InstrumentException("An I/O error occurred while attempting to read from TCP/IP connection " + address);
  std::string result;
  char buffer[receiveBufferSize];
  for (;;) {
    const long received = Platform::receiveBytes(socket, buffer, sizeof buffer);
    if (received < 0) {
      logSocketError();
      break;
    }
    if (received == 0)
      break;
    const auto count = static_cast<std::size_t>(received);
    if (isLineEnd(static_cast<unsigned char>(buffer[count - 1]))) {
      result.append(buffer, count - 1);
      break;
    }
    // A full buffer is part of a longer answer; a shorter piece without an
    // end is taken for a stray rest and dropped, since an instrument's
    // answer ends its packet.
    if (count == receiveBufferSize)
      result.append(buffer, count);
  }
  const auto last = result.find_last_not_of("\r\n");
  result.erase(last == std::string::npos ? 0 : last + 1);
  return result;
}

std::vector<unsigned char> LanIOSession::Impl::readBlock(const std::string &command) {
  if (!connected)
    throw InstrumentException("An I/O error occurred while attempting to read from TCP/IP connection " + address);
  writeLine(command);
  char mark = 0;
  if (Platform::receiveBytes(socket, &mark, 1) != 1) {
    close();
    return {};
  }
  if (mark != '#') {
    // Not a block: the rest of the answer is of no use, and the connection
    // is not trusted for the next one.
    char buffer[receiveBufferSize];
    long received = 0;
    while ((received = Platform::receiveBytes(socket, buffer, sizeof buffer)) > 0) {
    }
    if (received < 0)
      close();
    if (!Platform::shutdownReceive(socket))
      close();
    return {};
  }
  char countDigit = 0;
  if (Platform::receiveBytes(socket, &countDigit, 1) != 1) {
    close();
    return {};
  }
  const int digitCount = countDigit - '0';
  char digits[UCHAR_MAX + 1];
  if (digitCount < 0 || Platform::receiveAll(socket, digits, static_cast<std::size_t>(digitCount)) != digitCount) {
    Platform::shutdownReceive(socket);
    close();
    return {};
  }
  const long long length = blockLength(digits, static_cast<std::size_t>(digitCount));
  if (length < 0) {
    Platform::shutdownReceive(socket);
    close();
    return {};
  }
  if (digitCount == 0 || length == 0) {
    readLine();
    return {};
  }
  std::vector<unsigned char> block(static_cast<std::size_t>(length));
  if (Platform::receiveAll(socket, block.data(), block.size()) != length) {
    close();
    return {};
  }
  return block;
}

LanIOSession::LanIOSession(std::string address, int port) : impl(std::make_unique<Impl>(std::move(address), port)) {}

LanIOSession::~LanIOSession() = default;

std::string LanIOSession::getAddress() const { return impl->address; }

int LanIOSession::getPort() const { return impl->port; }

bool LanIOSession::getConnected() const { return impl->connected; }

int LanIOSession::getTimeoutInMS() { return impl->timeoutInMS; }

void LanIOSession::setTimeoutInMS(int timeoutInMS) {
  impl->timeoutInMS = timeoutInMS;
  if (impl->connected)
    impl->doSetTimeout();
}

bool LanIOSession::connect() { return impl->connect(); }

void LanIOSession::clear() {}

void LanIOSession::close() { impl->close(); }

std::string LanIOSession::getBlockEnd() const { return impl->blockEnd; }

void LanIOSession::setBlockEnd(std::string blockEnd) { impl->blockEnd = std::move(blockEnd); }

void LanIOSession::writeLine(const std::string &text) { impl->writeLine(text); }

std::string LanIOSession::readLine() { return impl->readLine(); }

void LanIOSession::writeBlock(const std::string &command, gsl::span<unsigned char> data) {
  if (!impl->connected)
    throw InstrumentException("Connection error.");
  const std::string header = blockHeader(command, static_cast<long long>(data.size()));
  if (Platform::sendAll(impl->socket, header.data(), header.size()) < 0) {
    const std::string report = "Server: send() error " + std::to_string(Platform::lastSocketError()) + ".\n";
    std::fputs(report.c_str(), stdout);
    impl->close();
    return;
  }
  if (impl->send(data.data(), data.size()))
    impl->send(impl->blockEnd.data(), impl->blockEnd.size());
}

void LanIOSession::writeManyBlocksStart(const std::string &command, gsl::span<unsigned char> firstPart,
                                        int totalLength) {
  if (!impl->connected)
    throw InstrumentException("Connection error.");
  const std::string header = blockHeader(command, totalLength);
  if (impl->send(header.data(), header.size()))
    impl->send(firstPart.data(), firstPart.size());
}

void LanIOSession::writeManyBlocks(gsl::span<unsigned char> part) { impl->send(part.data(), part.size()); }

std::vector<unsigned char> LanIOSession::readBlock(const std::string &command) { return impl->readBlock(command); }

void LanIOSession::writeManyBlocksEnd() { impl->send(impl->blockEnd.data(), impl->blockEnd.size()); }

std::string LanIOSession::getIPAddress(const std::string &address) {
  if (address.empty())
    return {};
  if (isDottedQuad(address))
    return address;
  std::string ipv4;
  std::string ipv6;
  Platform::resolveAddresses(address, ipv4, ipv6);
  return ipv4.empty() ? ipv6 : ipv4;
}

} // namespace Corvane::Wavemill
