#pragma once

#include "wavemill/Export.h"
#include "wavemill/services/LogBase.h"

#include <atomic>
#include <string>

namespace Corvane::Wavemill {

/// The library's standard channel. Like every channel it publishes to its
/// observers; with console set it also prints each line to standard output,
/// flushed, in the form "[" + name + "]" + level text + text, with
/// "[" + local time + "] " before the text when the time stamp is on:
/// write(2, "ready") on "Log" prints "[Log][INFO]  ready".
///
/// Prototype::getInstance<Log>() is the channel "Log", registered when the
/// library loads. Thread safety as for LogBase; one line is printed with one
/// write, so lines of different threads do not mix.
class WAVEMILL_API Log : public LogBase {
public:
  explicit Log(std::string name = "Log");
  ~Log() override;

  /// Prints the line when console is set, then publishes like LogBase.
  void write(int level, const std::string &text) override;
  /// Prints message->toString() when console is set, under the message's
  /// own time-stamp flag; then gives the message this channel's flag and
  /// publishes it. A null message is ignored.
  void writeMessage(LogMessage *message) override;

  /// Writes `text` at `level` to the channel `name`. While shared (the
  /// default) every name goes to the one Log channel, even a name that has a
  /// channel of its own; each message keeps `name` as its channel. Otherwise
  /// it goes to LogBase::get(name).
  static void writeLogText(const std::string &name, int level, const std::string &text);
  /// True while writeLogText sends every channel name to the one Log channel.
  static bool getShared();
  static void setShared(bool shared);

private:
  static std::atomic<bool> s_shared;
};

} // namespace Corvane::Wavemill
