#include "wavemill/services/Log.h"

#include <gtest/gtest.h>

#include <regex>

using namespace Corvane::Wavemill;

namespace {

// Keeps the printed line and the time-stamp flag of every record a channel
// publishes; the record itself is gone once the call returns.
struct LineProbe {
  explicit LineProbe(LogBase &channel)
      : subscription(channel.getSubject().get_observable().subscribe([this](LogMessage *message) {
          lines.push_back(message->toString());
          stamped.push_back(message->timeStamp);
        })) {}
  ~LineProbe() { subscription.unsubscribe(); }
  std::vector<std::string> lines;
  std::vector<bool> stamped;
  Corvane::Wavemill::rx::subscription subscription;
};

struct AuditLog : Log {
  AuditLog() : Log("Audit") {}
};
const LogBase::Creator<AuditLog> auditCreator;

const std::string timePattern = "\\[\\d{4}-\\d{2}-\\d{2}\\.\\d{2}:\\d{2}:\\d{2}\\] ";

} // namespace

TEST(LogTest, LineIsChannelPaddedLevelTextAndTheTimeOnlyWhenStamped) {
  EXPECT_EQ(LogMessage("Net", 42, "odd", false).toString(), "[Net]odd"); // no text for an unknown level
  const std::string stamped = LogMessage("Net", 0, "up", true).toString();
  EXPECT_TRUE(std::regex_match(stamped, std::regex("\\[Net\\]\\[TRACE\\] " + timePattern + "up"))) << stamped;
}

// Only a console channel prints; observers get every record either way.
TEST(LogTest, ConsolePrintsEachLineWithTheTimeOnlyWhereTheFlagAsksAndAQuietChannelNothing) {
  Log quiet("Quiet"), log("Chan");
  log.setConsole(true);
  testing::internal::CaptureStdout();
  LineProbe quietProbe(quiet), probe(log);
  quiet.write(3, "disk low");
  log.write(2, "hello");
  log.setTimeStamp(true);
  log.write(4, "boom");
  // The line shows the flag the message came with; observers get the channel's.
  LogMessage message("Other", 1, "x", false);
  log.writeMessage(&message);
  log.writeMessage(nullptr);
  const std::string printed = testing::internal::GetCapturedStdout();
  EXPECT_TRUE(std::regex_match(printed, std::regex("\\[Chan\\]\\[INFO\\]  hello\n\\[Chan\\]\\[ERR\\]   " + timePattern +
                                                   "boom\n\\[Other\\]\\[DEBUG\\] x\n")))
      << printed;
  EXPECT_EQ(probe.stamped, (std::vector<bool>{false, true, true}));
  EXPECT_EQ(quietProbe.lines, std::vector<std::string>{"[Quiet][WARN]  disk low"});
}

// Also how LogBase::get serves a registered channel and the default channel
// for any other name.
TEST(LogTest, WriteLogTextGoesToTheOneLogWhileSharedAndToNamedChannelsOtherwise) {
  LineProbe toLog(*Prototype::getInstance<Log>());
  LineProbe toAudit(*LogBase::get("Audit"));
  LineProbe toDefault(*Prototype::getInstance<LogBase>());
  ASSERT_TRUE(Log::getShared());
  Log::writeLogText("Audit", 4, "shared");
  Log::setShared(false);
  Log::writeLogText("Audit", 3, "own");
  Log::writeLogText("Nobody", 1, "fallback");
  Log::setShared(true);
  EXPECT_EQ(toLog.lines, std::vector<std::string>{"[Audit][ERR]   shared"});
  EXPECT_EQ(toAudit.lines, std::vector<std::string>{"[Audit][WARN]  own"});
  EXPECT_EQ(toDefault.lines, std::vector<std::string>{"[LogBase][DEBUG] fallback"});
}
