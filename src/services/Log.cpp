#include "wavemill/services/Log.h"

#include <iostream>
#include <utility>

namespace Corvane::Wavemill {

namespace {

// One write per line, so that lines of different threads do not interleave.
void printLine(std::string line) {
  line += '\n';
  std::cout.write(line.data(), static_cast<std::streamsize>(line.size()));
  std::cout.flush();
}

} // namespace

std::atomic<bool> Log::s_shared{true};

// Puts the channel "Log" into the table of channels when the library loads.
static const LogBase::Creator<Log> creator;

Log::Log(std::string name) : LogBase(std::move(name)) {}

Log::~Log() = default;

void Log::write(int level, const std::string &text) {
  if (getConsole())
    printLine(LogMessage(name, level, text, getTimeStamp()).toString());
  LogBase::write(level, text);
}

void Log::writeMessage(LogMessage *message) {
  if (message == nullptr)
    return;
  // The line shows the flag the message came with; observers see this
  // channel's flag.
  if (getConsole())
    printLine(message->toString());
  message->timeStamp = getTimeStamp();
  LogBase::writeMessage(message);
}

void Log::writeLogText(const std::string &name, int level, const std::string &text) {
  if (getShared()) {
    LogMessage message(name, level, text, false);
    Prototype::getInstance<Log>()->writeMessage(&message);
  } else {
    LogBase::get(name)->write(level, text);
  }
}

bool Log::getShared() { return s_shared.load(std::memory_order_relaxed); }

void Log::setShared(bool shared) { s_shared.store(shared, std::memory_order_relaxed); }

} // namespace Corvane::Wavemill
