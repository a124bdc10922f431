#include "Progress.h"

#include "Text.h"
#include "platform/Terminal.h"

#include <cstdio>

namespace Corvane::Wavemill::Cli {

namespace {

using Clock = std::chrono::steady_clock;

// A short transfer finishes before the bar would be read; drawing it then
// is only flicker.
constexpr auto quietStart = std::chrono::milliseconds(500);
constexpr auto redrawEvery = std::chrono::milliseconds(100);
constexpr int barWidth = 24;

std::string bytesText(double bytes) {
  static const char *const units[] = {"B", "KiB", "MiB", "GiB", "TiB"};
  int unit = 0;
  while (bytes >= 1024 && unit < 4) {
    bytes /= 1024;
    ++unit;
  }
  return formatFixed(bytes, unit == 0 ? 0 : 1) + " " + units[unit];
}

std::string clockText(double seconds) {
  const auto whole = static_cast<std::int64_t>(seconds + 0.5);
  const std::string secondsText = formatNumber(whole % 60);
  return formatNumber(whole / 60) + ":" + (whole % 60 < 10 ? "0" : "") + secondsText;
}

} // namespace

Progress::Progress(std::string label, std::int64_t total, bool enabled)
    : label(std::move(label)), total(total), enabled(enabled), begin(Clock::now()), lastDraw(begin) {}

Progress::~Progress() { finish(); }

bool Progress::wanted(bool quiet) { return !quiet && Platform::isTerminal(Platform::StandardStream::Error); }

void Progress::update(std::int64_t done) {
  if (!enabled)
    return;
  const auto now = Clock::now();
  if (now - begin < quietStart || now - lastDraw < redrawEvery)
    return;
  lastDraw = now;
  draw(done, std::chrono::duration<double>(now - begin).count());
}

void Progress::draw(std::int64_t done, double seconds) {
  const double rate = seconds > 0 ? static_cast<double>(done) / seconds : 0;
  std::string line = label + "  ";
  if (total > 0) {
    const double share = done >= total ? 1.0 : static_cast<double>(done) / static_cast<double>(total);
    const int filled = static_cast<int>(share * barWidth);
    line += "[" + std::string(static_cast<std::size_t>(filled), '#') +
            std::string(static_cast<std::size_t>(barWidth - filled), '.') + "] " +
            formatNumber(static_cast<int>(share * 100)) + "%  " + bytesText(static_cast<double>(done)) + " of " +
            bytesText(static_cast<double>(total));
  } else {
    line += bytesText(static_cast<double>(done));
  }
  line += "  " + bytesText(rate) + "/s";
  if (total > 0 && rate > 0)
    line += "  " + clockText(static_cast<double>(total - done) / rate) + " left";
  // \r returns to the start of the line and \x1b[K clears what a longer
  // earlier line left behind.
  std::fputs(("\r" + line + "\x1b[K").c_str(), stderr);
  std::fflush(stderr);
  drawn = true;
}

void Progress::finish() {
  if (drawn) {
    std::fputs("\r\x1b[K", stderr);
    std::fflush(stderr);
  }
  drawn = false;
  enabled = false;
}

} // namespace Corvane::Wavemill::Cli
