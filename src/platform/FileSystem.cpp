#include "platform/FileSystem.h"

#include <cerrno>
#include <cstdlib>
#include <vector>

#include <unistd.h>

namespace Corvane::Wavemill::Platform {

namespace {

bool isSeparator(char c) { return c == '/' || c == '\\'; }

} // namespace

std::string fullPath(const std::string &path, std::size_t capacity) {
  if (path.empty()) {
    return {};
  }
  std::string input = path;
  if (!isSeparator(path.front())) {
    const auto directory = currentDirectory();
    if (directory.empty()) {
      return {};
    }
    input = directory + "/" + path;
  }

  std::vector<std::string> parts;
  std::size_t position = 0;
  while (position < input.size()) {
    auto end = position;
    while (end < input.size() && !isSeparator(input[end])) {
      ++end;
    }
    const auto part = input.substr(position, end - position);
    if (part == "..") {
      // Above the root there is nothing to go up to; the root stays.
      if (!parts.empty()) {
        parts.pop_back();
      }
    } else if (!part.empty() && part != ".") {
      parts.push_back(part);
    }
    position = end + 1;
  }

  std::string result;
  for (const auto &part : parts) {
    result += "/";
    result += part;
  }
  if (result.empty() || isSeparator(path.back())) {
    result += "/";
  }
  if (result.size() + 1 > capacity) {
    return {};
  }
  return result;
}

std::string tempPath() {
  auto folder = environmentVariable("TMPDIR");
  if (folder.empty()) {
    folder = "/tmp";
  } else if (folder.front() != '/') {
    // A relative TMPDIR would change its meaning with every change of the
    // working directory.
    folder = fullPath(folder, 32767);
    if (folder.empty()) {
      folder = "/tmp";
    }
  }
  if (folder.back() != '/') {
    folder += "/";
  }
  return folder;
}

std::string currentDirectory() {
  std::vector<char> buffer(256);
  for (;;) {
    if (::getcwd(buffer.data(), buffer.size()) != nullptr) {
      return std::string(buffer.data());
    }
    // Only a buffer that is too small is worth another try; beyond 1 MiB no
    // real path lies.
    if (errno != ERANGE || buffer.size() >= (std::size_t{1} << 20)) {
      return {};
    }
    buffer.resize(buffer.size() * 2);
  }
}

std::string environmentVariable(const std::string &name) {
  const char *value = std::getenv(name.c_str());
  return value == nullptr ? std::string() : std::string(value);
}

} // namespace Corvane::Wavemill::Platform
