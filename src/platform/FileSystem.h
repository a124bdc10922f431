#pragma once

#include <cstddef>
#include <string>

namespace Corvane::Wavemill::Platform {

// The absolute form of `path`, resolved against the working directory without
// touching the file system: "." and ".." are folded, repeated separators
// collapse, "\" counts as a separator and the result uses "/". A trailing
// separator stays. The path need not exist. Empty when `path` is empty, when
// the working directory is unknown, or when the result with its terminating
// zero would not fit into `capacity` characters.
std::string fullPath(const std::string &path, std::size_t capacity);

// The folder for temporary files with a trailing "/": TMPDIR when it is set,
// otherwise "/tmp". Whether it exists is not checked.
std::string tempPath();

// The working directory of the process; empty when it cannot be found (it
// was removed, say).
std::string currentDirectory();

// The value of the environment variable `name`; empty when it is not set.
std::string environmentVariable(const std::string &name);

} // namespace Corvane::Wavemill::Platform
