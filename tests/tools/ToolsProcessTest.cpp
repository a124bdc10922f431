#include "wavemill/tools/Tools.h"

#include "platform/Icmp.h"
#include "platform/Process.h"
#include "support/TempDir.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <climits>
#include <cstdint>
#include <filesystem>
#include <fstream>
#include <string>
#include <thread>

using namespace Corvane::Wavemill;
using Testing::TempDir;
namespace fs = std::filesystem;

namespace {

bool listed(int pid) {
  const auto ids = Tools::enumProcesses();
  return std::find(ids.begin(), ids.end(), pid) != ids.end();
}

// Starts a shell that publishes its process id and then runs `script`; the id
// is read back once the file is complete.
int startShell(const TempDir &dir, const std::string &script, int timeoutInMS) {
  const std::string pid = dir.path("pid");
  EXPECT_EQ(Tools::startProcess("/bin/sh -c 'echo $$ > \"" + pid + ".new\"; mv \"" + pid + ".new\" \"" + pid + "\"; " +
                                    script + "'",
                                timeoutInMS),
            0);
  while (!fs::exists(pid)) // no time limit of its own: the test's time-out catches a lost shell
    std::this_thread::sleep_for(std::chrono::milliseconds(5));
  return std::stoi(Tools::readText(pid));
}

} // namespace

TEST(ToolsTest, StartProcessFailsOnlyWhenTheProgramCannotStart) {
  TempDir dir;
  const std::string script = dir.path("not-executable");
  std::ofstream(script) << "#!/bin/sh\n";
  fs::permissions(script, fs::perms::owner_read | fs::perms::owner_write);
  const struct {
    std::string commandLine;
    int result;
  } rows[] = {
      {"/bin/sh -c 'exit 127'", 0}, // the exit codes a shell gives for its own start failures
      {"/bin/sh -c 'exit 126'", 0},
      {"/bin/sh -c 'kill -9 $$'", 0},
      {"wavemill-no-such-program", ENOENT},
      {"'" + dir.path("absent") + "' argument", ENOENT},
      {"exit 0", ENOENT}, // no shell runs, so its built-in commands are no programs
      {"'" + script + "'", EACCES},
      {"", EINVAL},
      {" \t\n ", EINVAL},
      {"/bin/sh -c 'exit 0", EINVAL},
      {"\"/bin/true", EINVAL},
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(row.commandLine);
    EXPECT_EQ(Tools::startProcess(row.commandLine, -1), row.result);
  }
}

TEST(ToolsTest, StartProcessSplitsWordsLikeAShellAndExpandsNothing) {
  TempDir dir;
  const std::string out = dir.path("words");
  // The shell is only the started program here: it writes each word it was
  // given in brackets, so that blanks and empty words show.
  const std::string printWords = "/bin/sh -c 'printf \"[%s]\" \"$@\" > \"" + out + "\"' sh ";
  const struct {
    const char *words;
    const char *expected;
  } rows[] = {
      {"plain  words\ttab\nline", "[plain][words][tab][line]"},
      {R"('x  y' "p q")", "[x  y][p q]"},
      {R"($HOME * a>b | c;d)", "[$HOME][*][a>b][|][c;d]"},
      {R"("a\"b\\c\$d\`e\xf")", R"([a"b\c$d`e\xf])"},
      {R"(a\ b \'c\" \\ \x)", R"([a b]['c"][\][x])"},
      {R"('a\b "c" $d')", R"([a\b "c" $d])"},
      {R"('' "" x""y'z')", "[][][xyz]"},
      {"a\\\nb \"c\\\nd\"", "[ab][cd]"},
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(row.words);
    fs::remove(out);
    ASSERT_EQ(Tools::startProcess(printWords + row.words, -1), 0);
    EXPECT_EQ(Tools::readText(out), row.expected); // written before startProcess returned
  }
}

TEST(ToolsTest, ProgramThatOutlastsTheWaitCountsAsStartedAndIsReapedOnceEnded) {
  TempDir dir;
  const std::string gate = dir.path("gate");
  // The shell cannot end before the gate exists, so the call returns on its
  // time-out; the shell goes on, ending once let through.
  const int pid = startShell(dir, "while [ ! -e \"" + gate + "\" ]; do sleep 0.01; done", 20);
  EXPECT_TRUE(Tools::isRunning(pid));
  std::ofstream(gate).put('x');
  while (Tools::isRunning(pid)) // no time limit of its own: the test's time-out catches a child seen running forever
    std::this_thread::sleep_for(std::chrono::milliseconds(5));
  EXPECT_FALSE(listed(pid)); // reaped, not left as a zombie
}

TEST(ToolsTest, KillProcessEndsAChildThatIsRunningListedAndOurs) {
  TempDir dir;
  const int pid = startShell(dir, "exec sleep 30", 0);
  EXPECT_TRUE(Tools::isRunning(pid));
  EXPECT_TRUE(listed(pid));
  EXPECT_EQ(Tools::getParentProcessId(pid), Tools::getCurrentProcessId());

  EXPECT_TRUE(Tools::killProcess(pid, 1));
  EXPECT_FALSE(Tools::isRunning(pid));
  EXPECT_FALSE(listed(pid)); // reaped, not left as a zombie
  EXPECT_FALSE(Tools::killProcess(pid, 1));
}

TEST(ToolsTest, ThisProcessIsListedRunningAndHasTheParentTheSystemKeepsButNoProcessIsNot) {
  for (int pid : {0, -1, INT_MAX})
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

TEST(ToolsTest, ThreadIdIsStableWithinAThreadAndDiffersBetweenThreadsAndTheHostNameIsTheKernels) {
  const std::uint64_t mine = Tools::getCurrentThreadId();
  std::uint64_t other = 0;
  std::thread([&other] { other = Tools::getCurrentThreadId(); }).join();
  EXPECT_NE(mine, 0u);
  EXPECT_EQ(Tools::getCurrentThreadId(), mine);
  EXPECT_NE(other, mine);

  std::string expected;
  std::getline(std::ifstream("/proc/sys/kernel/hostname"), expected);
  EXPECT_FALSE(Tools::getHostname().empty());
  EXPECT_EQ(Tools::getHostname(), expected);
}

TEST(ToolsTest, PingGetsAnEchoFromTheLoopbackByAddressAndByName) {
  if (!Platform::canSendEcho())
    GTEST_SKIP() << "this system lets the process open no ICMP socket";
  EXPECT_TRUE(Tools::ping("127.0.0.1", 2000));
  EXPECT_TRUE(Tools::ping("localhost", 2000));

  EXPECT_FALSE(Tools::ping("", 2000));
  // Taken as an address as it stands, which then does not parse.
  EXPECT_FALSE(Tools::ping("127.0 .0.1", 2000));
}
