#pragma once

#include <string>

namespace Corvane::Wavemill::Testing {

/// A fresh, empty folder under the system's temporary folder for one test.
/// The folder and everything in it are removed when the object goes; a
/// failure to remove is ignored, as a destructor must not throw.
class TempDir {
public:
  /// Creates the folder; throws std::filesystem::filesystem_error when the
  /// temporary folder cannot take a new one.
  TempDir();
  ~TempDir();
  TempDir(const TempDir &) = delete;
  TempDir &operator=(const TempDir &) = delete;

  /// The absolute path of the folder, without a trailing "/".
  const std::string &root() const { return folder; }
  /// `name` inside the folder: path("a/b.txt") -> root() + "/a/b.txt".
  /// Nothing is created.
  std::string path(const std::string &name) const;

private:
  std::string folder;
};

} // namespace Corvane::Wavemill::Testing
