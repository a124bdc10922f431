#pragma once

#include <filesystem>
#include <string>
#include <system_error>

namespace Corvane::Wavemill {

// Takes away a file the exporter wrote. Only a regular file goes: a target
// that names a device or a folder (/dev/full, a directory in place of a
// temporary file) is never removed, also not by a process running as root.
inline void removeWrittenFile(const std::string &path) {
  std::error_code error;
  if (!path.empty() && std::filesystem::is_regular_file(path, error))
    std::filesystem::remove(path, error);
}

} // namespace Corvane::Wavemill
