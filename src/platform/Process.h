#pragma once

#include "wavemill/Export.h"

#include <string>
#include <vector>

namespace Corvane::Wavemill::Platform {

// The id of the calling process.
WAVEMILL_API int currentProcessId();

// The parent of the calling process, as the system keeps it.
WAVEMILL_API int currentParentProcessId();

// The ids of all processes the system shows, in no particular order.
std::vector<int> processIds();

// True while `pid` exists and has not ended. A child that this library
// started and that has ended is reaped here, so it does not linger as a
// zombie; any other process counts as ended once it is a zombie. Ids of 0 and
// below name no single process and yield false.
WAVEMILL_API bool isProcessRunning(int pid);

// Ends `pid` at once with a signal that cannot be caught; false when there is
// no such process or it may not be signalled, and for ids of 0 and below
// (which would name whole process groups). A child of this library is reaped
// before the call returns, so it no longer counts as running.
WAVEMILL_API bool terminateProcess(int pid);

// Starts `commandLine` through the system shell with the handles of this
// process. 0 with `pid` set, or the error number of the failed start.
WAVEMILL_API int spawnProcess(const std::string &commandLine, int &pid);

// Waits up to `timeoutInMS` (negative: without limit) for the end of a child
// started by spawnProcess and reaps it. True when it ended; `exitStatus` then
// holds its exit code, or 128 plus the signal that ended it.
WAVEMILL_API bool waitProcess(int pid, int timeoutInMS, int &exitStatus);

// Gives up waiting for a child of spawnProcess: a later spawnProcess reaps it
// once it has ended.
void abandonProcess(int pid);

// The parent of `pid`, or 0 when the process is not found.
WAVEMILL_API int parentProcessId(int pid);

} // namespace Corvane::Wavemill::Platform
