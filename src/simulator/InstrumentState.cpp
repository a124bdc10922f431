#include "simulator/InstrumentState.h"

namespace Corvane::Wavemill::Simulator {

namespace {
// A small instrument's error queue; a client that never reads it must not
// make the simulator grow.
constexpr std::size_t maxErrors = 32;
constexpr std::size_t maxCommands = 65536;
} // namespace

std::string upperCase(std::string text) {
  for (char &c : text)
    if (c >= 'a' && c <= 'z')
      c = static_cast<char>(c - 'a' + 'A');
  return text;
}

InstrumentState::InstrumentState(const SimulatorOptions &options)
    : fault(options.fault), identityText(options.identity), optionsText(options.options) {
  for (const auto &[header, limits] : options.ranges)
    ranges[upperCase(header)] = limits;
  for (const auto &[header, value] : options.values)
    presetValues[upperCase(header)] = value;
  values = presetValues;
}

std::string InstrumentState::identity() const {
  std::lock_guard<std::mutex> lock(mutex);
  return identityText;
}

std::string InstrumentState::options() const {
  std::lock_guard<std::mutex> lock(mutex);
  return optionsText;
}

void InstrumentState::setIdentity(const std::string &identity) {
  std::lock_guard<std::mutex> lock(mutex);
  identityText = identity;
}

void InstrumentState::setOptions(const std::string &options) {
  std::lock_guard<std::mutex> lock(mutex);
  optionsText = options;
}

std::optional<std::pair<double, double>> InstrumentState::range(const std::string &header) const {
  // Written once in the constructor, so read without the lock.
  const auto it = ranges.find(header);
  if (it == ranges.end())
    return std::nullopt;
  return it->second;
}

void InstrumentState::storeValue(const std::string &header, const std::string &value) {
  std::lock_guard<std::mutex> lock(mutex);
  values[header] = value;
}

std::optional<std::string> InstrumentState::value(const std::string &header) const {
  std::lock_guard<std::mutex> lock(mutex);
  const auto it = values.find(header);
  if (it == values.end())
    return std::nullopt;
  return it->second;
}

void InstrumentState::storeBlock(const std::string &name, std::shared_ptr<const Block> block) {
  std::shared_ptr<const Block> old;
  {
    std::lock_guard<std::mutex> lock(mutex);
    old = std::exchange(blocks[name], std::move(block));
  }
  // A replaced block of many megabytes is freed outside the lock.
}

std::shared_ptr<const Block> InstrumentState::block(const std::string &name) const {
  std::lock_guard<std::mutex> lock(mutex);
  const auto it = blocks.find(name);
  return it == blocks.end() ? nullptr : it->second;
}

void InstrumentState::reset() {
  std::map<std::string, std::shared_ptr<const Block>> old;
  std::lock_guard<std::mutex> lock(mutex);
  values = presetValues;
  old.swap(blocks);
}

void InstrumentState::pushError(const std::string &entry) {
  std::lock_guard<std::mutex> lock(mutex);
  if (errors.size() < maxErrors)
    errors.push_back(entry);
}

std::string InstrumentState::popError() {
  std::lock_guard<std::mutex> lock(mutex);
  if (errors.empty())
    return "0,\"No error\"";
  std::string entry = std::move(errors.front());
  errors.pop_front();
  return entry;
}

void InstrumentState::clearErrors() {
  std::lock_guard<std::mutex> lock(mutex);
  errors.clear();
}

void InstrumentState::logCommand(std::string line) {
  std::lock_guard<std::mutex> lock(mutex);
  if (commandLog.size() == maxCommands)
    commandLog.pop_front();
  commandLog.push_back(std::move(line));
}

std::vector<std::string> InstrumentState::commands() const {
  std::lock_guard<std::mutex> lock(mutex);
  return {commandLog.begin(), commandLog.end()};
}

void InstrumentState::clearCommands() {
  std::lock_guard<std::mutex> lock(mutex);
  commandLog.clear();
}

void InstrumentState::setRecording(bool on) {
  std::lock_guard<std::mutex> lock(mutex);
  if (on && !recordingOn.load(std::memory_order_relaxed))
    recorded.clear();
  recordingOn.store(on, std::memory_order_relaxed);
}

void InstrumentState::record(const void *data, std::size_t size) {
  std::lock_guard<std::mutex> lock(mutex);
  // Checked again under the lock: bytes that arrive just after recording
  // was switched off are not kept.
  if (recordingOn.load(std::memory_order_relaxed))
    recorded.append(static_cast<const char *>(data), size);
}

std::string InstrumentState::recordedBytes() const {
  std::lock_guard<std::mutex> lock(mutex);
  return recorded;
}

} // namespace Corvane::Wavemill::Simulator
