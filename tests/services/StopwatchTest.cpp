#include "wavemill/services/Stopwatch.h"
#include "wavemill/services/LogBase.h"

#include <gtest/gtest.h>

#include <chrono>
#include <regex>
#include <thread>

using namespace Corvane::Wavemill;

namespace {

// A channel that records what it is asked to write, as "<level> <text>".
struct WriteProbe : LogBase {
  void write(int level, const std::string &text) override { lines.push_back(std::to_string(level) + " " + text); }
  std::vector<std::string> lines;
};

} // namespace

TEST(StopwatchTest, ReportsStartAndEndAtInfoLevelAndOnlyTheTimeWithoutAName) {
  const auto probe = std::make_shared<WriteProbe>();
  {
    Stopwatch named("load", probe);
    EXPECT_EQ(probe->lines, std::vector<std::string>{"2 load started"});
    named.start();
    Stopwatch::startNew("", probe).reset();
  }
  ASSERT_EQ(probe->lines.size(), 3u);
  EXPECT_TRUE(std::regex_match(probe->lines[1], std::regex("2 \\d+\\.000000 ms"))) << probe->lines[1];
  EXPECT_TRUE(std::regex_match(probe->lines[2], std::regex("2 load stopped\\. \\(\\d+\\.000000 ms\\)")))
      << probe->lines[2];
  // The time with the date shows in stamped log lines (LogTest).
  EXPECT_TRUE(std::regex_match(Stopwatch::now(false), std::regex("\\d{2}:\\d{2}:\\d{2}")));
}

TEST(StopwatchTest, ElapsedGrowsWhileRunningAndStaysAfterStop) {
  const auto running = Stopwatch::startNew("run", nullptr);
  std::this_thread::sleep_for(std::chrono::milliseconds(2));
  const double first = running->elapsedMilliseconds();
  EXPECT_GT(first, 0.0);
  std::this_thread::sleep_for(std::chrono::milliseconds(2));
  running->stop();
  const double stopped = running->elapsedMilliseconds();
  EXPECT_GT(stopped, first);
  std::this_thread::sleep_for(std::chrono::milliseconds(2));
  EXPECT_EQ(running->elapsedMilliseconds(), stopped);
  EXPECT_EQ(running->elapsedSeconds(), stopped / 1000.0);
}
