#pragma once

#include "wavemill/Export.h"

#include <memory>
#include <string>

namespace Corvane::Wavemill {

class LogBase;

/// Measures a stretch of work on a steady clock with a resolution of 100 ns
/// and, given a channel, reports it at the info level (2): "<name> started"
/// when made, though the clock does not start then, and
/// "<name> stopped. (<ms> ms)" when destroyed, such as
/// "load stopped. (12.000000 ms)". The end report covers the time from
/// start() to destruction. Without a name only the end is reported, as
/// "12.000000 ms"; without a channel nothing is reported.
///
/// An object belongs to one thread. It cannot be copied, so that each
/// measurement reports its end once.
class WAVEMILL_API Stopwatch {
public:
  Stopwatch(std::string name, std::shared_ptr<LogBase> log);
  /// Stops the clock and writes the end report. An exception of the
  /// channel's observers is dropped here rather than ending the process.
  virtual ~Stopwatch();

  Stopwatch(const Stopwatch &) = delete;
  Stopwatch &operator=(const Stopwatch &) = delete;

  /// A stopwatch that reported its start and is already running.
  static std::shared_ptr<Stopwatch> startNew(std::string name, std::shared_ptr<LogBase> log);

  /// Starts the clock from zero; also restarts a stopped or running clock.
  void start();
  /// Stops the clock; the elapsed time then stays until the next start().
  void stop();
  /// Whole milliseconds, cut toward zero, from start() to stop(), or to now
  /// while running. 0 for a stopwatch never started nor stopped.
  double elapsedMilliseconds() const;
  /// elapsedMilliseconds() / 1000.
  double elapsedSeconds() const;

  /// The local time now: with the date in the form "%Y-%m-%d.%X"
  /// ("2024-05-17.14:03:59" in the C locale), else "%X" ("14:03:59").
  /// Empty when the local time cannot be found.
  static std::string now(bool withDate);

private:
  struct Impl;

  std::string name;
  std::shared_ptr<LogBase> log;
  std::shared_ptr<Impl> impl;
};

} // namespace Corvane::Wavemill
