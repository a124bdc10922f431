#include "wavemill/services/Stopwatch.h"

#include "platform/LocalTime.h"
#include "wavemill/services/LogBase.h"

#include <chrono>
#include <cstdint>
#include <ctime>
#include <ratio>
#include <utility>

namespace Corvane::Wavemill {

namespace {

using Ticks = std::chrono::duration<std::int64_t, std::ratio<1, 10'000'000>>;
constexpr std::int64_t ticksPerMillisecond = 10'000;
constexpr int infoLevel = 2;

std::int64_t ticksNow() {
  return std::chrono::duration_cast<Ticks>(std::chrono::steady_clock::now().time_since_epoch()).count();
}

} // namespace

struct Stopwatch::Impl {
  std::int64_t startTicks = 0;
  std::int64_t stopTicks = 0;
  bool running = false;
};

Stopwatch::Stopwatch(std::string name, std::shared_ptr<LogBase> log)
    : name(std::move(name)), log(std::move(log)), impl(std::make_shared<Impl>()) {
  if (this->log && !this->name.empty())
    this->log->write(infoLevel, this->name + " started");
}

Stopwatch::~Stopwatch() {
  impl->stopTicks = ticksNow();
  impl->running = false;
  if (!log)
    return;
  const std::string elapsed = std::to_string(elapsedMilliseconds()) + " ms";
  try {
    log->write(infoLevel, name.empty() ? elapsed : name + " stopped. (" + elapsed + ")");
  } catch (...) {
    // An observer that throws must not end the process from a destructor;
    // the report is lost, the measured work is not.
  }
}

std::shared_ptr<Stopwatch> Stopwatch::startNew(std::string name, std::shared_ptr<LogBase> log) {
  auto stopwatch = std::make_shared<Stopwatch>(std::move(name), std::move(log));
  stopwatch->start();
  return stopwatch;
}

void Stopwatch::start() {
  impl->startTicks = ticksNow();
  impl->running = true;
}

void Stopwatch::stop() {
  impl->stopTicks = ticksNow();
  impl->running = false;
}

double Stopwatch::elapsedMilliseconds() const {
  const std::int64_t end = impl->running ? ticksNow() : impl->stopTicks;
  return static_cast<double>((end - impl->startTicks) / ticksPerMillisecond);
}

double Stopwatch::elapsedSeconds() const { return elapsedMilliseconds() / 1000.0; }

std::string Stopwatch::now(bool withDate) {
  std::tm local{};
  if (!Platform::toLocalTime(std::chrono::system_clock::to_time_t(std::chrono::system_clock::now()), local))
    return std::string();
  char text[80];
  const std::size_t length = std::strftime(text, sizeof text, withDate ? "%Y-%m-%d.%X" : "%X", &local);
  return std::string(text, length);
}

} // namespace Corvane::Wavemill
