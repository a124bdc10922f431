#pragma once

#include <chrono>
#include <cstdint>
#include <string>

namespace Corvane::Wavemill::Cli {

/// A progress bar on standard error for transfers that take a while:
/// nothing for the first half second, then one line redrawn about ten
/// times a second with the share done, the bytes, the throughput and the
/// time left, and erased when the transfer ends. Drawn only when `enabled`
/// (the caller passes "standard error is a terminal and not --quiet").
class Progress {
public:
  /// `total` bytes are expected; 0 or less when the total is unknown, which
  /// leaves out the share and the time left.
  Progress(std::string label, std::int64_t total, bool enabled);
  /// Erases the line if one was drawn.
  ~Progress();
  Progress(const Progress &) = delete;
  Progress &operator=(const Progress &) = delete;

  /// Notes that `done` bytes are through; cheap when nothing is drawn.
  void update(std::int64_t done);
  /// Erases the line; later updates draw nothing.
  void finish();

  /// Whether a bar may be drawn: standard error is a terminal and the user
  /// did not ask for --quiet.
  static bool wanted(bool quiet);

private:
  void draw(std::int64_t done, double seconds);

  std::string label;
  std::int64_t total;
  bool enabled;
  bool drawn = false;
  std::chrono::steady_clock::time_point begin;
  std::chrono::steady_clock::time_point lastDraw;
};

} // namespace Corvane::Wavemill::Cli
