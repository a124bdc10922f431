#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/IObject.h"
#include "wavemill/models/Prototype.h"
#include "wavemill/rx/Subject.h"
#include "wavemill/services/ServiceBase.h"

#include <atomic>
#include <memory>
#include <mutex>
#include <string>
#include <unordered_map>

namespace Corvane::Wavemill {

/// One record of a log channel as observers receive it: the channel's name,
/// the level (0 trace, 1 debug, 2 info, 3 warning, 4 error, 5 critical,
/// 6 off), the text, and whether the printed line shows the time.
/// Observers get it by pointer for the length of the call only; one that
/// keeps a message keeps a copy.
class WAVEMILL_API LogMessage : public IObject {
public:
  LogMessage();
  LogMessage(std::string name, int level, std::string text, bool timeStamp);
  ~LogMessage() override;

  /// The printed line: "[" + name + "]" + level text + text, with
  /// "[" + local time + "] " before the text when timeStamp is set. The
  /// time is taken when toString() is called, not when the message was
  /// written. Example: {"Net", 4, "down", false} -> "[Net][ERR]   down".
  std::string toString() const override;

  std::string name;
  int level = 0;
  std::string text;
  bool timeStamp = false;
};

/// A named log channel. It publishes every record as a LogMessage * on its
/// subject, and the application's observers decide where records go. No
/// level is filtered anywhere: a channel passes every level on.
///
/// The process's channels are found with get(name). The channel "Log" is
/// registered when the library loads; an application registers a channel
/// class of its own with one static LogBase::Creator<MyChannel>.
///
/// Any thread may write. A channel takes no lock: observers run
/// synchronously on the writer's thread before write() returns, and an
/// observer's exception reaches the writer. Logging itself never throws.
class WAVEMILL_API LogBase : public ServiceBase {
public:
  /// Registers the channel class `T` (default-constructible, derived from
  /// LogBase): constructing a Creator enters the shared instance of `T` into
  /// the table of channels under that instance's name, replacing an earlier
  /// channel of the name. Meant for one static object per class, so that the
  /// channel is known before main() runs; the table is not guarded against
  /// concurrent readers.
  template <class T> class Creator {
  public:
    Creator() {
      std::shared_ptr<LogBase> channel = Prototype::getInstance<T>();
      addChannel(channel);
    }
  };

  /// The channel "LogBase", which serves every name that get() does not know.
  LogBase();
  explicit LogBase(std::string name);
  ~LogBase() override;

  /// The channel registered under `name`; any other name gets the default
  /// channel, Prototype::getInstance<LogBase>(). Never empty.
  static std::shared_ptr<LogBase> get(const std::string &name);
  /// The padded level text: 0 "[TRACE] ", 1 "[DEBUG] ", 2 "[INFO]  ",
  /// 3 "[WARN]  ", 4 "[ERR]   ", 5 "[CRITICAL] ", 6 "[OFF] "; any other
  /// level gives the empty text.
  static std::string toString(int level);
  /// The channel's name.
  std::string toString() const override;

  /// Publishes a message with this channel's name and time-stamp flag,
  /// `level` and `text`. Without observers nothing happens.
  virtual void write(int level, const std::string &text);
  /// Publishes `message` as it is. A null message is ignored.
  virtual void writeMessage(LogMessage *message);

  /// The subject on which the channel publishes; subscribe to its
  /// get_observable() to receive the channel's records.
  rx::subjects::subject<LogMessage *> &getSubject() { return subject; }
  /// The name under which the channel is registered.
  const std::string &getName() const { return name; }
  /// With true, the lines of this channel show the local time. Off at start.
  void setTimeStamp(bool on) { timeStamp.store(on, std::memory_order_relaxed); }
  bool getTimeStamp() const { return timeStamp.load(std::memory_order_relaxed); }
  /// With true, a channel that prints (such as Log) also writes its lines to
  /// standard output. Off at start.
  void setConsole(bool on) { console.store(on, std::memory_order_relaxed); }
  bool getConsole() const { return console.load(std::memory_order_relaxed); }

protected:
  rx::subjects::subject<LogMessage *> subject;
  const std::string name;
  // Atomic because an application may switch them while other threads log.
  std::atomic<bool> timeStamp{false};
  std::atomic<bool> console{false};

private:
  // Both write operations end here rather than in each other, so that a
  // subclass that overrides one is not entered twice by the other.
  void publish(LogMessage *message);

  static void addChannel(const std::shared_ptr<LogBase> &channel);

  // Used only by the shared instance, as the process's table of channels. A
  // module loaded at run time adds its channels while other threads log, so
  // the table has a lock of its own.
  std::unordered_map<std::string, std::shared_ptr<LogBase>> channels;
  std::mutex channelsMutex;
};

} // namespace Corvane::Wavemill
