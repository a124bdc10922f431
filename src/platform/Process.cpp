#include "platform/Process.h"

#include <dirent.h>
#include <signal.h>
#include <spawn.h>
#include <sys/types.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstdlib>
#include <fstream>
#include <iterator>
#include <map>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

extern char **environ;

namespace Corvane::Wavemill::Platform {

namespace {

enum class ChildState { Running, Ended, NotAChild };

ChildState pollChild(pid_t pid, int &status) {
  for (;;) {
    const pid_t result = ::waitpid(pid, &status, WNOHANG);
    if (result == pid)
      return ChildState::Ended;
    if (result == 0)
      return ChildState::Running;
    // A signal handler of the application may interrupt even a polling wait.
    if (errno != EINTR)
      return ChildState::NotAChild;
  }
}

// The children this library started and has not reaped yet, each with the
// mark of whether anyone still waits for it. Only these are ever reaped:
// reaping a child that other code of the process started would steal the
// exit status it waits for.
class Children {
public:
  void add(pid_t pid) {
    std::lock_guard<std::mutex> lock(mutex);
    pids[pid] = false;
  }
  void abandon(pid_t pid) {
    std::lock_guard<std::mutex> lock(mutex);
    if (auto it = pids.find(pid); it != pids.end())
      it->second = true;
  }
  void remove(pid_t pid) {
    std::lock_guard<std::mutex> lock(mutex);
    pids.erase(pid);
  }
  bool contains(pid_t pid) {
    std::lock_guard<std::mutex> lock(mutex);
    return pids.count(pid) != 0;
  }
  // Abandoned children are collected once they have ended, so that they do
  // not stay zombies for the life of the process.
  void reapAbandoned() {
    std::lock_guard<std::mutex> lock(mutex);
    for (auto it = pids.begin(); it != pids.end();) {
      int status = 0;
      const bool keep = !it->second || pollChild(it->first, status) == ChildState::Running;
      it = keep ? std::next(it) : pids.erase(it);
    }
  }

private:
  std::mutex mutex;
  std::map<pid_t, bool> pids;
};

Children &children() {
  static Children instance;
  return instance;
}

int toExitStatus(int status) {
  if (WIFEXITED(status))
    return WEXITSTATUS(status);
  if (WIFSIGNALED(status))
    return 128 + WTERMSIG(status);
  return -1;
}

// The fields of /proc/<pid>/stat after the command name, which may itself
// hold blanks and parentheses: "S 1234 ..." (state, parent, ...).
bool readStatFields(int pid, char &state, int &parent) {
  std::ifstream file("/proc/" + std::to_string(pid) + "/stat");
  const std::string text((std::istreambuf_iterator<char>(file)), std::istreambuf_iterator<char>());
  const auto nameEnd = text.rfind(')');
  if (nameEnd == std::string::npos || nameEnd + 2 >= text.size())
    return false;
  state = text[nameEnd + 2];
  char *end = nullptr;
  const long value = std::strtol(text.c_str() + nameEnd + 3, &end, 10);
  if (end == text.c_str() + nameEnd + 3)
    return false;
  parent = static_cast<int>(value);
  return true;
}

bool isBlank(char c) { return c == ' ' || c == '\t' || c == '\n'; }

// The characters that a backslash escapes inside double quotes; before any
// other the backslash stands for itself.
bool escapableInDoubleQuotes(char c) { return c == '\\' || c == '"' || c == '$' || c == '`' || c == '\n'; }

// Splits `line` into words the way a POSIX shell does before it expands
// anything: blanks separate words, single quotes keep everything literal,
// double quotes keep everything but the escapes above, a backslash outside
// quotes takes the next character literally, and a backslash before a line
// end joins the lines. Nothing is expanded: "$HOME", "*", ">" and "|" are
// words or parts of words like any other. False when a quote is left open.
bool splitCommandLine(const std::string &line, std::vector<std::string> &words) {
  std::string word;
  // '' and "" make a word of their own, empty as it is.
  bool inWord = false;
  for (std::size_t i = 0; i < line.size(); ++i) {
    const char c = line[i];
    if (isBlank(c)) {
      if (inWord)
        words.push_back(std::move(word));
      word.clear();
      inWord = false;
    } else if (c == '\'') {
      const auto end = line.find('\'', i + 1);
      if (end == std::string::npos)
        return false;
      word.append(line, i + 1, end - i - 1);
      i = end;
      inWord = true;
    } else if (c == '"') {
      inWord = true;
      for (++i; i < line.size() && line[i] != '"'; ++i) {
        if (line[i] == '\\' && i + 1 < line.size() && escapableInDoubleQuotes(line[i + 1])) {
          ++i;
          if (line[i] == '\n')
            continue; // a continued line leaves nothing behind
        }
        word += line[i];
      }
      if (i == line.size())
        return false;
    } else if (c == '\\' && i + 1 < line.size()) {
      ++i;
      if (line[i] != '\n') {
        word += line[i];
        inWord = true;
      }
    } else {
      word += c;
      inWord = true;
    }
  }
  if (inWord)
    words.push_back(std::move(word));
  return true;
}

} // namespace

int currentProcessId() { return static_cast<int>(::getpid()); }

int currentParentProcessId() { return static_cast<int>(::getppid()); }

std::vector<int> processIds() {
  std::vector<int> ids;
  DIR *directory = ::opendir("/proc");
  if (directory == nullptr)
    return ids;
  while (const dirent *entry = ::readdir(directory)) {
    const std::string name = entry->d_name;
    if (!name.empty() && name.size() < 10 &&
        std::all_of(name.begin(), name.end(), [](char c) { return c >= '0' && c <= '9'; }))
      ids.push_back(std::stoi(name));
  }
  ::closedir(directory);
  return ids;
}

bool isProcessRunning(int pid) {
  if (pid <= 0)
    return false;
  if (children().contains(pid)) {
    int status = 0;
    const ChildState state = pollChild(pid, status);
    if (state != ChildState::Running)
      children().remove(pid);
    if (state != ChildState::NotAChild)
      return state == ChildState::Running;
  }
  char state = 0;
  int parent = 0;
  // A zombie has ended; only its parent has not collected it yet.
  return readStatFields(pid, state, parent) && state != 'Z' && state != 'X' && state != 'x';
}

bool terminateProcess(int pid) {
  if (pid <= 0 || ::kill(pid, SIGKILL) != 0)
    return false;
  if (children().contains(pid)) {
    int status = 0;
    // SIGKILL cannot be caught, so this wait is short; EINTR comes only from
    // a signal handler of the application and does not end the child.
    while (::waitpid(pid, &status, 0) == -1 && errno == EINTR) {
    }
    children().remove(pid);
  }
  return true;
}

int spawnProcess(const std::string &commandLine, int &pid) {
  std::vector<std::string> words;
  if (!splitCommandLine(commandLine, words) || words.empty())
    return EINVAL;
  std::vector<char *> arguments;
  for (auto &word : words)
    arguments.push_back(word.data());
  arguments.push_back(nullptr);

  children().reapAbandoned();

  // The child starts with default signal handling and nothing blocked, whatever
  // this process has set up for itself (an ignored SIGPIPE breaks pipelines).
  posix_spawnattr_t attributes;
  if (const int error = ::posix_spawnattr_init(&attributes); error != 0)
    return error;
  sigset_t all;
  sigset_t none;
  sigfillset(&all);
  sigemptyset(&none);
  ::posix_spawnattr_setsigdefault(&attributes, &all);
  ::posix_spawnattr_setsigmask(&attributes, &none);
  ::posix_spawnattr_setflags(&attributes, POSIX_SPAWN_SETSIGDEF | POSIX_SPAWN_SETSIGMASK);

  // glibc hands the errno of a failed exec back from the child and reaps that
  // child itself, so a program that cannot start is told apart from one that
  // starts and fails, whatever its exit code.
  pid_t child = 0;
  const int error = ::posix_spawnp(&child, arguments.front(), nullptr, &attributes, arguments.data(), environ);
  ::posix_spawnattr_destroy(&attributes);
  if (error != 0)
    return error;
  children().add(child);
  pid = static_cast<int>(child);
  return 0;
}

bool waitProcess(int pid, int timeoutInMS, int &exitStatus) {
  if (pid <= 0)
    return false;
  int status = 0;
  bool ended = false;
  if (timeoutInMS < 0) {
    pid_t result = 0;
    // A signal handler of the application interrupts the wait, not the child.
    while ((result = ::waitpid(pid, &status, 0)) == -1 && errno == EINTR) {
    }
    ended = result == pid;
    if (result == -1)
      children().remove(pid);
  } else {
    // Polling keeps the wait free of process-wide signal handling, which
    // belongs to the application.
    const auto deadline = std::chrono::steady_clock::now() + std::chrono::milliseconds(timeoutInMS);
    auto pause = std::chrono::milliseconds(1);
    for (;;) {
      const ChildState state = pollChild(pid, status);
      if (state == ChildState::NotAChild) {
        children().remove(pid);
        return false;
      }
      if (state == ChildState::Ended) {
        ended = true;
        break;
      }
      const auto now = std::chrono::steady_clock::now();
      if (now >= deadline)
        return false;
      std::this_thread::sleep_for(std::min<std::chrono::steady_clock::duration>(pause, deadline - now));
      pause = std::min(pause * 2, std::chrono::milliseconds(50));
    }
  }
  if (ended) {
    children().remove(pid);
    exitStatus = toExitStatus(status);
  }
  return ended;
}

void abandonProcess(int pid) { children().abandon(pid); }

int parentProcessId(int pid) {
  char state = 0;
  int parent = 0;
  if (pid < 0)
    pid = currentProcessId();
  if (pid == 0 || !readStatFields(pid, state, parent))
    return 0;
  return parent;
}

} // namespace Corvane::Wavemill::Platform
