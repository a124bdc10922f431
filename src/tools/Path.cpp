#include "wavemill/tools/Path.h"

#include "wavemill/tools/OperationSystem.h"
#include "wavemill/tools/Tools.h"

#include "platform/FileSystem.h"
#include "tools/Slashes.h"

#include <algorithm>
#include <atomic>
#include <cstddef>
#include <cstdint>
#include <filesystem>
#include <iterator>
#include <string>
#include <system_error>

namespace fs = std::filesystem;

namespace Corvane::Wavemill {

namespace {

// The folder of the product family below the per-user and temporary folders;
// a plain array, so that code run before main() finds it ready.
constexpr char productFolder[] = "Corvane/Lumenbay";

// The classic limit of a path, terminating zero included.
constexpr std::size_t maxPath = 260;

// The full path with "/" only and without trailing separators; the root
// keeps its one "/". Empty when the path cannot be resolved.
std::string normalise(const std::string &path) {
  const auto full = forwardSlashes(Platform::fullPath(forwardSlashes(path), maxPath));
  if (full.empty()) {
    return full;
  }
  const auto trimmed = Tools::trimEnd(full, '/');
  return trimmed.empty() ? std::string("/") : trimmed;
}

// The folder that holds a normalised path; empty for the root and for a path
// without any "/".
std::string parentOf(const std::string &normalised) {
  const auto slash = normalised.rfind('/');
  if (slash == std::string::npos || normalised == "/") {
    return {};
  }
  return slash == 0 ? std::string("/") : normalised.substr(0, slash);
}

bool isProtected(const std::string &normalised) {
  static const char *const folders[] = {
      "C:/Windows", "C:/Users", "C:/ProgramData", "C:/Program Files",
      // Kept misspelt: the folder of the real name is meant to be removable.
      "C:/Programe Files(x86)",
      // The folders of a Linux system whose loss breaks the system or all users.
      "/", "/bin", "/boot", "/dev", "/etc", "/home", "/lib", "/lib32", "/lib64", "/libx32", "/media", "/mnt", "/opt",
      "/proc", "/root", "/run", "/sbin", "/snap", "/srv", "/sys", "/tmp", "/usr", "/usr/bin", "/usr/include",
      "/usr/lib", "/usr/local", "/usr/sbin", "/usr/share", "/var", "/var/lib", "/var/log", "/var/tmp"};
  const auto listed = std::any_of(std::begin(folders), std::end(folders),
                                  [&](const char *folder) { return Tools::compareIgnoreCase(normalised, folder); });
  if (listed) {
    return true;
  }
  const auto home = Tools::getenv("HOME");
  return !home.empty() && Tools::compareIgnoreCase(normalised, normalise(home));
}

std::string temporaryFolderOfProcess() {
  return Path::combine(Path::combine(Tools::getTempPath(), productFolder),
                       "p_" + std::to_string(Tools::getCurrentProcessId()));
}

} // namespace

std::string Path::combine(const std::string &a, const std::string &b) {
  if (isLong(a)) {
    // Long paths are not joined: the answer is this fixed text (backslash,
    // slash, backslash, backslash, slash), which callers recognise.
    return "\\/\\\\/";
  }
  const auto left = Tools::trimEnd(forwardSlashes(a), '/');
  const auto right = Tools::trimStart(forwardSlashes(b), '/');
  if (left.empty()) {
    return b;
  }
  if (right.empty()) {
    return a;
  }
  return left + "/" + right;
}

bool Path::createDirectory(const std::string &path) {
  if (path.empty()) {
    return false;
  }
  const auto normalised = normalise(path);
  if (normalised.empty()) {
    return false;
  }
  const auto parent = parentOf(normalised);
  if (!parent.empty() && parent != "/" && !directoryExist(parent) && !createDirectory(parent)) {
    return false;
  }
  if (fileExist(normalised)) {
    return directoryExist(normalised);
  }
  std::error_code error;
  fs::create_directory(normalised, error);
  if (error) {
    throw fs::filesystem_error("create_directory(p): invalid argument", normalised, error);
  }
  return true;
}

bool Path::directoryExist(const std::string &path) {
  std::error_code error;
  return !path.empty() && fs::is_directory(forwardSlashes(path), error);
}

bool Path::fileExist(const std::string &path) { return Tools::exist(path); }

std::string Path::getDataDirectory(const std::string &subPath) {
  const auto &system = Tools::os();
  if (system.isApple()) {
    return combine(combine("~/Library/Application Support/", productFolder), subPath);
  }
  if (system.isLinux()) {
    return combine(combine("~/.appdata/", productFolder), subPath);
  }
  if (system.isWindows()) {
    return combine(combine(Tools::getenv("APPDATA"), productFolder), subPath);
  }
  return Tools::getCurrentDirectory();
}

std::string Path::getDirectoryName(const std::string &path) { return parentOf(normalise(path)); }

std::string Path::getFileName(const std::string &path) {
  const auto separator = path.find_last_of("/\\");
  if (separator == std::string::npos) {
    return path;
  }
  return Tools::trim(path.substr(separator + 1), ' ');
}

std::vector<std::string> Path::getFileNames(const std::string &directory) {
  std::vector<std::string> names;
  if (!directoryExist(directory)) {
    return names;
  }
  for (const auto &entry : fs::directory_iterator(forwardSlashes(directory))) {
    names.push_back(entry.path().filename().string());
  }
  return names;
}

std::string Path::getFullPath(const std::string &path) {
  return forwardSlashes(Platform::fullPath(forwardSlashes(path), maxPath));
}

std::string Path::getTempDirectory(const std::string &subPath) { return combine(Tools::getTempPath(), subPath); }

std::string Path::getTempFileName() {
  // Atomic rather than locked: the thread id in the name already keeps
  // threads apart, the counter only has to be free of data races.
  static std::atomic<std::uint64_t> counter{0};
  const auto number = ++counter;
  return combine(temporaryFolderOfProcess(),
                 "file_" + std::to_string(Tools::getCurrentThreadId()) + "_" + std::to_string(number) + ".tmp");
}

bool Path::isLong(const std::string &path) { return path.compare(0, 4, longPrefix()) == 0; }

std::string Path::longPrefix() { return "\\\\?\\"; }

std::string Path::prepare(const std::string &path) {
  return createDirectory(getDirectoryName(path)) ? path : std::string();
}

bool Path::removeDirectory(const std::string &path) {
  const auto normalised = normalise(path);
  if (normalised.empty() || isProtected(normalised)) {
    return false;
  }
  std::error_code error;
  const auto removed = fs::remove_all(normalised, error);
  if (error) {
    throw fs::filesystem_error("remove_all(p): invalid argument", normalised, error);
  }
  return removed > 0;
}

bool Path::removeTempDirectory() { return removeDirectory(temporaryFolderOfProcess()); }

std::string Path::getParentDirectory(const std::string &path, const std::string &root) {
  const auto full = getFullPath(path);
  const auto stripped = Tools::trimEnd(full, '/');
  const bool atRoot = !root.empty() && stripped == Tools::trimEnd(getFullPath(root), '/');
  const bool isDrive = full.size() == 2 && full[1] == ':';
  // "/" is to this system what a drive is to Windows: it has no parent.
  const bool isFileSystemRoot = !full.empty() && stripped.empty();
  if (atRoot || isDrive || isFileSystemRoot || full.find('/') == std::string::npos) {
    return full;
  }
  return getFullPath(combine(full, "../"));
}

std::pair<std::string, std::string> Path::splitShortName(const std::string &path) {
  const auto separator = path.find_last_of("/\\");
  const auto name = separator == std::string::npos ? path : path.substr(separator + 1);
  const auto dot = name.rfind('.');
  if (dot == std::string::npos) {
    return {name, std::string()};
  }
  return {name.substr(0, dot), name.substr(dot + 1)};
}

} // namespace Corvane::Wavemill
