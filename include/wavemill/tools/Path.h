#pragma once

#include "wavemill/Export.h"

#include <string>
#include <utility>
#include <vector>

namespace Corvane::Wavemill {

/// Path texts and the file system: static functions only. Inside, "/" is the
/// separator; a "\" in an input becomes "/" first, so results use forward
/// slashes. The per-user and temporary folders of the product family
/// ("Corvane/Lumenbay") are decided here.
class WAVEMILL_API Path {
public:
  Path() = delete;

  /// `a` + "/" + `b` without doubled separators: ("a\", "/b") -> "a/b"; an
  /// empty side gives the other as it was given.
  static std::string combine(const std::string &a, const std::string &b);
  /// Creates the folder and its missing parents; true when it exists after.
  static bool createDirectory(const std::string &path);
  static bool directoryExist(const std::string &path);
  /// True when the file opens for reading.
  static bool fileExist(const std::string &path);
  /// The per-user data folder of the product family joined with `subPath`.
  static std::string getDataDirectory(const std::string &subPath);
  /// The full path up to its last "/"; empty when there is none.
  static std::string getDirectoryName(const std::string &path);
  /// The text after the last separator, trimmed of blanks.
  static std::string getFileName(const std::string &path);
  /// The entries of a folder.
  static std::vector<std::string> getFileNames(const std::string &directory);
  /// The absolute form of `path`.
  static std::string getFullPath(const std::string &path);
  /// The temporary folder joined with `subPath`.
  static std::string getTempDirectory(const std::string &subPath);
  /// A new name in this process's temporary folder; neither the file nor
  /// the folder is made.
  static std::string getTempFileName();
  /// True when `path` starts with longPrefix().
  static bool isLong(const std::string &path);
  /// The long-path prefix: backslash, backslash, question mark, backslash.
  static std::string longPrefix();
  /// Creates the folder of the file `path`; `path` on success, else empty.
  static std::string prepare(const std::string &path);
  /// Removes the tree at `path`; false for system folders and for nothing
  /// removed.
  static bool removeDirectory(const std::string &path);
  /// Removes this process's temporary folder.
  static bool removeTempDirectory();
  /// The parent folder of `path`; `path` itself at `root`, at a drive or
  /// without separator.
  static std::string getParentDirectory(const std::string &path, const std::string &root = std::string());
  /// The file name split at its last dot into stem and extension.
  static std::pair<std::string, std::string> splitShortName(const std::string &path);
};

} // namespace Corvane::Wavemill
