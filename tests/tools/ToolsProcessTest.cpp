#include "wavemill/tools/Tools.h"

#include "platform/Icmp.h"
#include "platform/Process.h"
#include "support/TempDir.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <climits>
#include <filesystem>
#include <fstream>
#include <string>
#include <thread>
#include <utility>

using namespace Corvane::Wavemill;
using Testing::TempDir;
namespace fs = std::filesystem;

namespace {

bool listed(int pid) {
  const auto ids = Tools::enumProcesses();
  return std::find(ids.begin(), ids.end(), pid) != ids.end();
}

// A folder for the files the started programs write.
class StartProcessTest : public ::testing::Test {
protected:
  // Starts a shell that publishes its process id and then runs `script`; the
  // id is read back once the file is complete.
  int startShell(const std::string &script, int timeoutInMS) {
    const std::string pid = dir.path("pid");
    EXPECT_EQ(Tools::startProcess("/bin/sh -c 'echo $$ > \"" + pid + ".new\"; mv \"" + pid + ".new\" \"" + pid +
                                      "\"; " + script + "'",
                                  timeoutInMS),
              0);
    while (!fs::exists(pid)) // no time limit of its own: the test's time-out catches a lost shell
      std::this_thread::sleep_for(std::chrono::milliseconds(5));
    return std::stoi(Tools::readText(pid));
  }
  TempDir dir;
};

} // namespace

TEST_F(StartProcessTest, FailsOnlyWhenTheProgramCannotStart) {
  // Exit code 127 is what a shell gives for its own start failures; "exit 0"
  // fails as no shell runs, so its built-in commands are no programs.
  const std::pair<std::string, int> rows[] = {{"/bin/sh -c 'exit 127'", 0},
                                              {"exit 0", ENOENT},
                                              {"", EINVAL},
                                              {"/bin/sh -c 'exit 0", EINVAL},
                                              {"\"/bin/true", EINVAL}};
  for (const auto &[commandLine, result] : rows)
    EXPECT_EQ(Tools::startProcess(commandLine, -1), result) << commandLine;
}

TEST_F(StartProcessTest, SplitsWordsLikeAShellAndExpandsNothing) {
  const std::string out = dir.path("words");
  // The shell is only the started program here: it writes each word it was
  // given in brackets, so that blanks and empty words show.
  const std::string printWords = "/bin/sh -c 'printf \"[%s]\" \"$@\" > \"" + out + "\"' sh ";
  const std::pair<const char *, const char *> rows[] = {{"plain  words\ttab\nline", "[plain][words][tab][line]"},
                                                        {R"('x  y' "p q")", "[x  y][p q]"},
                                                        {R"("a\"b\\c\$d\`e\xf")", R"([a"b\c$d`e\xf])"},
                                                        {R"(a\ b \'c\" \\ \x)", R"([a b]['c"][\][x])"},
                                                        {R"('' "" x""y'z')", "[][][xyz]"},
                                                        {"a\\\nb \"c\\\nd\"", "[ab][cd]"}};
  for (const auto &[words, expected] : rows) {
    fs::remove(out);
    ASSERT_EQ(Tools::startProcess(printWords + words, -1), 0) << words;
    EXPECT_EQ(Tools::readText(out), expected) << words; // written before startProcess returned
  }
}

TEST_F(StartProcessTest, AProgramThatOutlastsTheWaitCountsAsStartedAndIsReapedOnceEnded) {
  const std::string gate = dir.path("gate");
  // The shell cannot end before the gate exists, so the call returns on its
  // time-out; the shell goes on, ending once let through.
  const int pid = startShell("while [ ! -e \"" + gate + "\" ]; do sleep 0.01; done", 20);
  EXPECT_TRUE(Tools::isRunning(pid));
  Tools::writeText(gate, "x");
  while (Tools::isRunning(pid)) // no time limit of its own: the test's time-out catches a child seen running forever
    std::this_thread::sleep_for(std::chrono::milliseconds(5));
  EXPECT_FALSE(listed(pid)); // reaped, not left as a zombie
}

TEST_F(StartProcessTest, KillProcessEndsAndReapsARunningChild) {
  const int pid = startShell("exec sleep 30", 0);
  EXPECT_TRUE(Tools::isRunning(pid));
  EXPECT_TRUE(Tools::killProcess(pid, 1));
  EXPECT_FALSE(Tools::isRunning(pid));
  EXPECT_FALSE(listed(pid)); // reaped, not left as a zombie
  EXPECT_FALSE(Tools::killProcess(pid, 1));
}

TEST(ToolsTest, ThisProcessIsListedRunningAndHasTheParentTheSystemKeepsButNoProcessIsNot) {
  for (int pid : {0, INT_MAX})
    EXPECT_FALSE(Tools::isRunning(pid)) << pid;
  EXPECT_FALSE(Tools::killProcess(INT_MAX, 0));
  EXPECT_EQ(Tools::getParentProcessId(INT_MAX), 0);
  EXPECT_EQ(Tools::getParentProcessId(0), 0);

  const int self = Tools::getCurrentProcessId();
  EXPECT_TRUE(listed(self));
  EXPECT_TRUE(Tools::isRunning(self));
  EXPECT_EQ(Tools::getParentProcessId(-1), Platform::currentParentProcessId());
  EXPECT_EQ(Tools::getParentProcessId(self), Platform::currentParentProcessId());
}

TEST(ToolsTest, HostNameIsTheKernels) {
  std::string expected;
  std::getline(std::ifstream("/proc/sys/kernel/hostname"), expected);
  EXPECT_EQ(Tools::getHostname(), expected);
}

TEST(ToolsTest, PingGetsAnEchoFromTheLoopbackThroughTheLookUp) {
  if (!Platform::canSendEcho())
    GTEST_SKIP() << "this system lets the process open no ICMP socket";
  EXPECT_TRUE(Tools::ping("127.0.0.1", 2000));

  EXPECT_FALSE(Tools::ping("", 2000));
  // Taken as an address as it stands, which then does not parse.
  EXPECT_FALSE(Tools::ping("127.0 .0.1", 2000));
}
