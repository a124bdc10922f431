#include "wavemill/services/LogBase.h"

#include "wavemill/services/Stopwatch.h"

#include <utility>

namespace Corvane::Wavemill {

LogMessage::LogMessage() = default;

LogMessage::LogMessage(std::string name, int level, std::string text, bool timeStamp)
    : name(std::move(name)), level(level), text(std::move(text)), timeStamp(timeStamp) {}

LogMessage::~LogMessage() = default;

std::string LogMessage::toString() const {
  std::string line = "[" + name + "]" + LogBase::toString(level);
  if (timeStamp)
    line += "[" + Stopwatch::now(true) + "] ";
  return line + text;
}

LogBase::LogBase() : LogBase("LogBase") {}

LogBase::LogBase(std::string name) : name(std::move(name)) {}

LogBase::~LogBase() = default;

std::shared_ptr<LogBase> LogBase::get(const std::string &name) {
  static const std::shared_ptr<LogBase> root = Prototype::getInstance<LogBase>();
  std::lock_guard<std::mutex> lock(root->channelsMutex);
  const auto found = root->channels.find(name);
  return found == root->channels.end() ? root : found->second;
}

void LogBase::addChannel(const std::shared_ptr<LogBase> &channel) {
  auto root = Prototype::getInstance<LogBase>();
  std::lock_guard<std::mutex> lock(root->channelsMutex);
  root->channels[channel->getName()] = channel;
}

std::string LogBase::toString(int level) {
  static const std::unordered_map<int, std::string> texts{
      {0, "[TRACE] "}, {1, "[DEBUG] "},    {2, "[INFO]  "}, {3, "[WARN]  "},
      {4, "[ERR]   "}, {5, "[CRITICAL] "}, {6, "[OFF] "},
  };
  const auto found = texts.find(level);
  return found == texts.end() ? std::string() : found->second;
}

std::string LogBase::toString() const { return name; }

void LogBase::write(int level, const std::string &text) {
  LogMessage message(name, level, text, getTimeStamp());
  publish(&message);
}

void LogBase::writeMessage(LogMessage *message) {
  if (message != nullptr)
    publish(message);
}

void LogBase::publish(LogMessage *message) {
  const auto subscriber = subject.get_subscriber();
  if (subscriber.is_subscribed())
    subscriber.on_next(message);
}

} // namespace Corvane::Wavemill
