#include "wavemill/tools/Tools.h"

#include "platform/Icmp.h"
#include "platform/Network.h"
#include "platform/Process.h"

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
namespace fs = std::filesystem;

namespace {

class TempDir {
public:
  TempDir() : root(fs::temp_directory_path() / ("wavemill-process-" + std::to_string(Tools::getCurrentProcessId()))) {
    fs::create_directories(root);
  }
  ~TempDir() {
    std::error_code ignored;
    fs::remove_all(root, ignored);
  }
  std::string path(const std::string &name) const { return (root / name).string(); }

private:
  fs::path root;
};

bool listed(int pid) {
  const auto ids = Tools::enumProcesses();
  return std::find(ids.begin(), ids.end(), pid) != ids.end();
}

} // namespace

TEST(ToolsTest, StartProcessWaitsForTheCommandAndReportsOnlyFailuresToStart) {
  TempDir dir;
  EXPECT_EQ(Tools::startProcess("echo finished > '" + dir.path("out") + "'", -1), 0);
  std::string line;
  std::getline(std::ifstream(dir.path("out")), line);
  EXPECT_EQ(line, "finished"); // written before startProcess returned

  EXPECT_EQ(Tools::startProcess("exit 3", -1), 0); // an exit code is no start failure
  EXPECT_EQ(Tools::startProcess("wavemill-no-such-program", -1), ENOENT);

  // The command cannot end before the gate exists, so the call returns on its
  // time-out, and still with 0. The command goes on, ending once let through.
  const std::string gate = dir.path("gate"), done = dir.path("done");
  ASSERT_EQ(Tools::startProcess("while [ ! -e '" + gate + "' ]; do sleep 0.01; done; touch '" + done + "'", 20), 0);
  EXPECT_FALSE(fs::exists(done));
  std::ofstream(gate).put('x');
  while (!fs::exists(done)) // no time limit of its own: the test's time-out catches a lost command
    std::this_thread::sleep_for(std::chrono::milliseconds(5));
}

TEST(ToolsTest, KillProcessEndsAChildThatIsRunningListedAndOurs) {
  int pid = 0;
  ASSERT_EQ(Platform::spawnProcess("exec sleep 30", pid), 0);
  EXPECT_TRUE(Tools::isRunning(pid));
  EXPECT_TRUE(listed(pid));
  EXPECT_EQ(Tools::getParentProcessId(pid), Tools::getCurrentProcessId());

  EXPECT_TRUE(Tools::killProcess(pid, 1));
  EXPECT_FALSE(Tools::isRunning(pid));
  EXPECT_FALSE(listed(pid)); // reaped, not left as a zombie
  EXPECT_FALSE(Tools::killProcess(pid, 1));
}

TEST(ToolsTest, ChildThatEndedOnItsOwnIsNotRunningAndIsReaped) {
  int pid = 0;
  ASSERT_EQ(Platform::spawnProcess("exit 0", pid), 0);
  // No time limit of its own: the test's time-out catches a child seen running forever.
  while (Tools::isRunning(pid))
    std::this_thread::yield();
  EXPECT_FALSE(listed(pid));
}

TEST(ToolsTest, ProcessIdsOfNoProcessAreNeitherRunningNorKillableNorParents) {
  for (int pid : {0, -1, INT_MAX})
    EXPECT_FALSE(Tools::isRunning(pid)) << pid;
  EXPECT_FALSE(Tools::killProcess(INT_MAX, 0));
  EXPECT_EQ(Tools::getParentProcessId(INT_MAX), 0);
  EXPECT_EQ(Tools::getParentProcessId(0), 0);
}

TEST(ToolsTest, ThisProcessIsListedRunningAndHasTheParentTheSystemKeeps) {
  const int self = Tools::getCurrentProcessId();
  EXPECT_TRUE(listed(self));
  EXPECT_TRUE(Tools::isRunning(self));
  EXPECT_EQ(Tools::getParentProcessId(-1), Platform::currentParentProcessId());
  EXPECT_EQ(Tools::getParentProcessId(self), Platform::currentParentProcessId());
}

TEST(ToolsTest, ThreadIdIsStableWithinAThreadAndDiffersBetweenThreads) {
  const std::uint64_t mine = Tools::getCurrentThreadId();
  std::uint64_t other = 0;
  std::thread([&other] { other = Tools::getCurrentThreadId(); }).join();
  EXPECT_NE(mine, 0u);
  EXPECT_EQ(Tools::getCurrentThreadId(), mine);
  EXPECT_NE(other, mine);
}

TEST(ToolsTest, HostnameIsTheKernelsHostName) {
  std::string expected;
  std::getline(std::ifstream("/proc/sys/kernel/hostname"), expected);
  EXPECT_FALSE(Tools::getHostname().empty());
  EXPECT_EQ(Tools::getHostname(), expected);
}

TEST(ToolsTest, PingGetsAnEchoFromTheLoopbackByAddressAndByName) {
  if (!Platform::canSendEcho())
    GTEST_SKIP() << "this system lets the process open no ICMP socket";
  const int socketUsers = Platform::socketUsers();
  EXPECT_TRUE(Tools::ping("127.0.0.1", 2000));
  EXPECT_TRUE(Tools::ping("localhost", 2000));
  EXPECT_EQ(Platform::socketUsers(), socketUsers); // the call's start of the socket library has ended

  EXPECT_FALSE(Tools::ping("", 2000));
  // Taken as an address as it stands, which then does not parse.
  EXPECT_FALSE(Tools::ping("127.0 .0.1", 2000));
}
