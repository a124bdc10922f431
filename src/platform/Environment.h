#pragma once

#include <string>

namespace Corvane::Wavemill::Platform {

// The environment of the process. The system's environment is one table for
// the whole process and is not guarded: set variables before other threads
// read them (a test sets them before it opens what reads them).

// The value of the environment variable `name`; empty when it is not set or
// `name` is null.
std::string environmentVariable(const char *name);

// Sets the environment variable `name` to `value`, replacing an earlier
// value. False when `name` is null, empty or holds "=", or when the system
// refuses (out of memory).
bool setEnvironmentVariable(const char *name, const std::string &value);

} // namespace Corvane::Wavemill::Platform
