#include "simulator/ClientSession.h"

#include "tools/NumberText.h"

#include <algorithm>
#include <chrono>
#include <thread>
#include <utility>

namespace Corvane::Wavemill::Simulator {

namespace {

constexpr std::size_t bufferSize = 64 * 1024;
// A line longer than this is cut; the rest up to its terminator is dropped,
// so a client that never sends a terminator cannot exhaust memory.
constexpr std::size_t maxLineLength = 1024 * 1024;
// Room reserved for a block before its bytes arrive. Larger blocks grow as
// their bytes come, so a header that announces a gigabyte costs nothing
// until the gigabyte is actually sent.
constexpr std::size_t blockReserve = 64 * 1024 * 1024;
constexpr std::size_t blockGrowth = 16 * 1024 * 1024;
// Below this size a block answer goes out as one send: separate small sends
// of header and bytes would meet Nagle's delay on the second one.
constexpr std::size_t singleSendLimit = 64 * 1024;
constexpr std::size_t tricklePiece = 3;
constexpr auto tricklePause = std::chrono::milliseconds(20);

bool isBlank(char c) { return c == ' ' || c == '\t'; }

std::string trim(const std::string &text) {
  std::size_t first = 0;
  std::size_t last = text.size();
  while (first < last && isBlank(text[first]))
    ++first;
  while (last > first && isBlank(text[last - 1]))
    --last;
  return text.substr(first, last - first);
}

// "MMEM:DATA 'a b'" -> {"MMEM:DATA", "'a b'"}; the header upper-cased and
// without the leading colon of an absolute path.
std::pair<std::string, std::string> splitCommand(const std::string &command) {
  const auto blank = std::find_if(command.begin(), command.end(), isBlank);
  std::string header = upperCase(std::string(command.begin(), blank));
  if (!header.empty() && header.front() == ':')
    header.erase(0, 1);
  return {header, trim(std::string(blank, command.end()))};
}

std::string unquote(const std::string &text) {
  if (text.size() >= 2 && (text.front() == '\'' || text.front() == '"') && text.back() == text.front())
    return text.substr(1, text.size() - 2);
  return text;
}

std::string decimal(std::size_t value) {
  char text[24];
  const auto written = std::to_chars(text, text + sizeof text, value);
  return std::string(text, written.ptr);
}

} // namespace

ClientSession::ClientSession(Platform::SocketHandle socket, InstrumentState &state, const std::atomic<bool> &stopping)
    : socket(socket), state(state), stopping(stopping), buffer(bufferSize) {}

void ClientSession::run() {
  std::string line;
  while (!stopping.load()) {
    bool blockFollows = false;
    if (!readLine(line, blockFollows))
      return;
    if (blockFollows) {
      if (!receiveBlock(trim(line)))
        return;
      continue;
    }
    // LF CR and CR LF leave an empty line between two commands.
    const std::string command = trim(line);
    if (command.empty())
      continue;
    state.logCommand(command);
    if (!execute(command))
      return;
  }
}

bool ClientSession::fill() {
  const long received = Platform::receiveBytes(socket, buffer.data(), buffer.size());
  if (received <= 0)
    return false;
  begin = 0;
  end = static_cast<std::size_t>(received);
  if (state.recording())
    state.record(buffer.data(), end);
  return true;
}

bool ClientSession::readLine(std::string &line, bool &blockFollows) {
  line.clear();
  char quote = 0;
  for (;;) {
    if (begin == end && !fill())
      return false;
    const char c = buffer[begin++];
    if (c == '\n' || c == '\r')
      return true;
    if (quote != 0) {
      if (c == quote)
        quote = 0;
    } else if (c == '\'' || c == '"') {
      quote = c;
    } else if (c == '#') {
      // "#1" to "#9" open a definite-length block; "#H1F" and the like are
      // numbers in other bases and stay part of the text.
      if (begin == end && !fill())
        return false;
      if (buffer[begin] >= '1' && buffer[begin] <= '9') {
        blockFollows = true;
        return true;
      }
    }
    if (line.size() < maxLineLength)
      line += c;
  }
}

bool ClientSession::receiveBlock(const std::string &command) {
  state.logCommand(command);
  const auto next = [this](char &c) {
    if (begin == end && !fill())
      return false;
    c = buffer[begin++];
    return true;
  };
  char c = 0;
  if (!next(c))
    return false;
  const int digits = c - '0';
  std::size_t length = 0;
  for (int i = 0; i < digits; ++i) {
    if (!next(c))
      return false;
    if (c < '0' || c > '9') {
      // What follows is read as commands again; a real instrument also
      // loses its footing after a broken header.
      state.pushError("-161,\"Invalid block data\"");
      return true;
    }
    length = length * 10 + static_cast<std::size_t>(c - '0');
  }

  auto block = std::make_shared<Block>();
  block->reserve(std::min(length, blockReserve));
  const std::size_t buffered = std::min(end - begin, length);
  block->insert(block->end(), buffer.begin() + static_cast<std::ptrdiff_t>(begin),
                buffer.begin() + static_cast<std::ptrdiff_t>(begin + buffered));
  begin += buffered;
  // The rest goes straight from the socket into the block, in receives as
  // large as the kernel has bytes.
  std::size_t have = block->size();
  while (have < length) {
    if (have == block->size())
      block->resize(have + std::min(length - have, std::max(blockGrowth, have)));
    const long received = Platform::receiveBytes(socket, block->data() + have, block->size() - have);
    if (received <= 0)
      return false;
    if (state.recording())
      state.record(block->data() + have, static_cast<std::size_t>(received));
    have += static_cast<std::size_t>(received);
  }
  block->resize(length);

  // "MMEM:DATA 'name'," names the block; a bare "SOUR:WAV:DATA " stores it
  // under its header.
  auto [header, parameter] = splitCommand(command);
  if (!parameter.empty() && parameter.back() == ',')
    parameter.pop_back();
  parameter = unquote(trim(parameter));
  state.storeBlock(parameter.empty() ? header : parameter, std::move(block));
  return true;
}

bool ClientSession::execute(const std::string &command) {
  const auto [header, parameter] = splitCommand(command);
  if (header.empty() || header == "?") {
    // A lone ":" or "?" names nothing that could be stored or answered.
    undefinedHeader();
    return true;
  }
  if (header.back() != '?') {
    if (header == "*RST")
      state.reset();
    else if (header == "*CLS")
      state.clearErrors();
    else
      state.storeValue(header, parameter);
    return true;
  }

  const std::string base = header.substr(0, header.size() - 1);
  if (base == "*IDN")
    return answerText(state.identity());
  if (base == "*OPT")
    return answerText(state.options());
  if (base == "*OPC")
    return answerText("1");
  if (base == "SYST:ERR" || base == "SYSTEM:ERROR")
    return answerText(state.popError());

  const std::string limit = upperCase(parameter);
  if (limit == "MIN" || limit == "MAX" || limit == "MINIMUM" || limit == "MAXIMUM") {
    if (const auto range = state.range(base))
      return answerText(NumberText::formatDouble(limit.compare(0, 3, "MIN") == 0 ? range->first : range->second));
  } else if (!parameter.empty()) {
    if (const auto block = state.block(unquote(parameter)))
      return answerBlock(block);
  } else if (const auto value = state.value(base)) {
    return answerText(*value);
  } else if (const auto block = state.block(base)) {
    return answerBlock(block);
  }
  undefinedHeader();
  return true;
}

void ClientSession::undefinedHeader() {
  // No answer goes out: the client learns of the error from its time-out
  // and from the error queue, as with a real instrument.
  state.pushError("-113,\"Undefined header\"");
}

bool ClientSession::answerText(const std::string &text) {
  const SimulatorFault fault = state.fault.load();
  if (muted || fault == SimulatorFault::Stall)
    return true;
  std::string answer = text;
  if (fault != SimulatorFault::NoTerminator)
    answer += '\n';
  return send(answer.data(), answer.size(), fault);
}

bool ClientSession::answerBlock(const std::shared_ptr<const Block> &block) {
  const SimulatorFault fault = state.fault.load();
  if (muted || fault == SimulatorFault::Stall)
    return true;
  if (fault == SimulatorFault::GarbageBlock)
    return send("garbage\n", 8, fault);

  const std::string length = decimal(block->size());
  const std::string header = "#" + decimal(length.size()) + length;
  const bool broken = fault == SimulatorFault::CloseMidBlock || fault == SimulatorFault::ShortBlock;
  const std::size_t count = broken ? block->size() / 2 : block->size();
  const std::string terminator = broken || fault == SimulatorFault::NoTerminator ? "" : "\n";

  bool sent = false;
  if (count < singleSendLimit) {
    std::string answer = header;
    answer.append(block->begin(), block->begin() + static_cast<std::ptrdiff_t>(count));
    answer += terminator;
    sent = send(answer.data(), answer.size(), fault);
  } else {
    sent = send(header.data(), header.size(), fault) && send(block->data(), count, fault) &&
           send(terminator.data(), terminator.size(), fault);
  }
  if (fault == SimulatorFault::CloseMidBlock) {
    Platform::shutdownBoth(socket);
    return false;
  }
  if (fault == SimulatorFault::ShortBlock)
    muted = true;
  return sent;
}

bool ClientSession::send(const void *data, std::size_t size, SimulatorFault fault) {
  const auto *bytes = static_cast<const unsigned char *>(data);
  if (fault != SimulatorFault::Trickle)
    return size == 0 || Platform::sendAll(socket, bytes, size) == static_cast<long>(size);
  for (std::size_t sent = 0; sent < size; sent += tricklePiece) {
    // Checked between pieces, so that stop() does not wait for a trickle of
    // many bytes to end.
    if (stopping.load())
      return false;
    if (sent > 0)
      std::this_thread::sleep_for(tricklePause);
    const std::size_t piece = std::min(tricklePiece, size - sent);
    if (Platform::sendAll(socket, bytes + sent, piece) != static_cast<long>(piece))
      return false;
  }
  return true;
}

} // namespace Corvane::Wavemill::Simulator
