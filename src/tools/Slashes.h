#pragma once

#include <algorithm>
#include <string>

namespace Corvane::Wavemill {

// Paths inside the library use "/" only. Applications hand in Windows-style
// paths too, so every file and path function turns "\\" into "/" first, here.
inline std::string forwardSlashes(std::string path) {
  std::replace(path.begin(), path.end(), '\\', '/');
  return path;
}

} // namespace Corvane::Wavemill
