#include "wavemill/tools/OperationSystem.h"
#include "wavemill/tools/Tools.h"

#include "platform/FileSystem.h"
#include "tools/Slashes.h"

#include <filesystem>
#include <fstream>
#include <set>
#include <string>
#include <system_error>
#include <vector>

namespace fs = std::filesystem;

namespace Corvane::Wavemill {

namespace {

// A folder opens for reading on this system but not on Windows; it never
// counts as a file here.
bool isFolder(const std::string &path) {
  std::error_code error;
  return fs::is_directory(path, error);
}

// The entries of one folder for which `wanted` holds, as the directory
// iterator names them. A folder that is not there has none; other errors of
// the iterator pass through.
template <typename Predicate> std::vector<std::string> entriesOf(const std::string &directory, Predicate wanted) {
  std::vector<std::string> paths;
  const auto folder = forwardSlashes(directory);
  if (folder.empty() || !isFolder(folder)) {
    return paths;
  }
  for (const auto &entry : fs::directory_iterator(folder)) {
    std::error_code error;
    if (wanted(entry, error)) {
      paths.push_back(entry.path().string());
    }
  }
  return paths;
}

std::string searchKey(const std::string &path) { return Tools::toUpper(forwardSlashes(path)); }

bool endsWith(const std::string &text, const std::string &end) {
  return text.size() >= end.size() && text.compare(text.size() - end.size(), end.size(), end) == 0;
}

} // namespace

OperationSystem &Tools::os() {
#if defined(_WIN32)
  static WindowsOperationSystem system;
#elif defined(__APPLE__)
  static AppleOperationSystem system;
#else
  static LinuxOperationSystem system;
#endif
  return system;
}

bool Tools::exist(const std::string &path) {
  const auto file = forwardSlashes(path);
  return !file.empty() && !isFolder(file) && std::ifstream(file).is_open();
}

std::int64_t Tools::fileSize(const std::string &path) {
  const auto file = forwardSlashes(path);
  if (file.empty() || isFolder(file)) {
    return -1;
  }
  std::ifstream stream(file, std::ios::binary | std::ios::ate);
  if (!stream.is_open()) {
    return -1;
  }
  return static_cast<std::int64_t>(stream.tellg());
}

std::string Tools::getCurrentDirectory() { return Platform::currentDirectory(); }

std::string Tools::getTempPath() { return trimEnd(Platform::tempPath(), "/\\"); }

std::string Tools::getenv(const std::string &name) { return Platform::environmentVariable(name); }

std::vector<std::string> Tools::getFiles(const std::string &directory) {
  return entriesOf(
      directory, [](const fs::directory_entry &entry, std::error_code &error) { return entry.is_regular_file(error); });
}

std::vector<std::string> Tools::getSubDirectories(const std::string &directory) {
  return entriesOf(directory,
                   [](const fs::directory_entry &entry, std::error_code &error) { return entry.is_directory(error); });
}

std::string Tools::findFile(const std::string &directory, const std::string &fileName) {
  const auto key = searchKey(fileName);
  // Depth first, each folder's files before its subfolders, without the
  // recursion a deep tree would need. A link back up the tree would make the
  // search endless, so every real folder is searched once.
  std::vector<std::string> pending{directory};
  std::set<fs::path> searched;
  while (!pending.empty()) {
    const auto folder = pending.back();
    pending.pop_back();
    std::error_code error;
    const auto real = fs::canonical(forwardSlashes(folder), error);
    if (error || !searched.insert(real).second) {
      continue;
    }
    for (const auto &file : getFiles(folder)) {
      if (endsWith(searchKey(file), key)) {
        return file;
      }
    }
    const auto subfolders = getSubDirectories(folder);
    pending.insert(pending.end(), subfolders.rbegin(), subfolders.rend());
  }
  return {};
}

} // namespace Corvane::Wavemill
