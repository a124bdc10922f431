#pragma once

#include "wavemill/simulator/SimulatedInstrument.h"

#include <atomic>
#include <cstddef>
#include <deque>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace Corvane::Wavemill::Simulator {

using Block = std::vector<unsigned char>;

// What the simulated instrument remembers, shared by all its connections
// under one mutex. Blocks are held by shared pointer so that an answer is
// sent from the stored bytes without a copy and without holding the lock,
// while another client may replace the block.
class InstrumentState {
public:
  explicit InstrumentState(const SimulatorOptions &options);

  std::string identity() const;
  std::string options() const;
  void setIdentity(const std::string &identity);
  void setOptions(const std::string &options);

  std::atomic<SimulatorFault> fault;

  // The range of `header` (upper case, without "?"), if it has one.
  std::optional<std::pair<double, double>> range(const std::string &header) const;

  void storeValue(const std::string &header, const std::string &value);
  std::optional<std::string> value(const std::string &header) const;
  void storeBlock(const std::string &name, std::shared_ptr<const Block> block);
  std::shared_ptr<const Block> block(const std::string &name) const;
  // "*RST": every value and block is forgotten.
  void reset();

  void pushError(const std::string &entry);
  // The oldest entry, or 0,"No error".
  std::string popError();
  void clearErrors();

  void logCommand(std::string line);
  std::vector<std::string> commands() const;
  void clearCommands();

  void setRecording(bool on);
  bool recording() const { return recordingOn.load(std::memory_order_relaxed); }
  void record(const void *data, std::size_t size);
  std::string recordedBytes() const;

private:
  mutable std::mutex mutex;
  std::string identityText;
  std::string optionsText;
  std::map<std::string, std::pair<double, double>> ranges; // by upper-case header
  std::map<std::string, std::string> values;
  std::map<std::string, std::string> presetValues; // by upper-case header; restored by *RST
  std::map<std::string, std::shared_ptr<const Block>> blocks;
  std::deque<std::string> errors;
  std::deque<std::string> commandLog;
  std::atomic<bool> recordingOn{false};
  std::string recorded;
};

// Upper case in the "C" sense, whatever the locale: SCPI headers are ASCII.
std::string upperCase(std::string text);

} // namespace Corvane::Wavemill::Simulator
