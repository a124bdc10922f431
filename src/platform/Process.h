#pragma once

#include <string>
#include <vector>

namespace Corvane::Wavemill::Platform {

// The id of the calling process.
int currentProcessId();

// The parent of the calling process, as the system keeps it.
int currentParentProcessId();

// The ids of all processes the system shows, in no particular order.
std::vector<int> processIds();

// True while `pid` exists and has not ended. A child that this library
// started and that has ended is reaped here, so it does not linger as a
// zombie; any other process counts as ended once it is a zombie. Ids of 0 and
// below name no single process and yield false.
bool isProcessRunning(int pid);

// Ends `pid` at once with a signal that cannot be caught; false when there is
// no such process or it may not be signalled, and for ids of 0 and below
// (which would name whole process groups). A child of this library is reaped
// before the call returns, so it no longer counts as running.
bool terminateProcess(int pid);

// Starts the program that the first word of `commandLine` names, found
// through PATH when the word holds no "/", with the other words as its
// arguments and the handles of this process. Words are split as a POSIX shell
// splits them, quotes and backslashes included, but nothing is expanded and
// no shell runs: 'a "b c"' -> {"a", "b c"}, '$HOME > x' -> {"$HOME", ">",
// "x"}. 0 with `pid` set once the program runs, whatever it does then;
// EINVAL for a line without a word or with a quote left open; otherwise the
// error number of the failed start (ENOENT, EACCES, ENOEXEC, ...).
int spawnProcess(const std::string &commandLine, int &pid);

// Waits up to `timeoutInMS` (negative: without limit) for the end of a child
// started by spawnProcess and reaps it. True when it ended; `exitStatus` then
// holds its exit code, or 128 plus the signal that ended it.
bool waitProcess(int pid, int timeoutInMS, int &exitStatus);

// Gives up waiting for a child of spawnProcess: a later spawnProcess reaps it
// once it has ended.
void abandonProcess(int pid);

// The parent of `pid`, or 0 when the process is not found.
int parentProcessId(int pid);

} // namespace Corvane::Wavemill::Platform
