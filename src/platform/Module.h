#pragma once

#include <cstddef>
#include <string>

namespace Corvane::Wavemill::Platform {

// The answer of the module queries when the path does not fit into the
// buffer the caller named; the tools know this value from the classic
// system calls and ask again with a larger buffer.
constexpr int insufficientBuffer = 122;

// Each query answers 0 and sets `path` to an absolute path that fits, with
// its terminating zero, into `capacity` characters; insufficientBuffer when
// it does not fit; any other value (an errno) when there is nothing to name.
// `path` is left alone unless the answer is 0.

// The file of the loaded module (program or shared object) whose code or data
// holds `address`.
int moduleFileNameOfAddress(const void *address, std::size_t capacity, std::string &path);

// The file of the loaded module called `name`: its full path, its file name
// ("libwavemill.so.0.1"), that name up to ".so" ("libwavemill.so"), or the
// bare library name ("wavemill" for "libwavemill.so"). Case counts.
int moduleFileNameByName(const std::string &name, std::size_t capacity, std::string &path);

// The program file of the process `pid`; a negative `pid` means this process.
int processImagePath(int pid, std::size_t capacity, std::string &path);

// Loads the shared library at `path` (or finds it when it is loaded already)
// and answers its handle, or null with the loader's message in `error`. The
// library stays loaded to process exit: classes it registers must outlive
// every model made from them.
void *loadModule(const std::string &path, std::string &error);

// The address of the function `name` in the loaded library `module`, or null.
void *moduleSymbol(void *module, const char *name);

} // namespace Corvane::Wavemill::Platform
