#pragma once

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <string>

namespace Corvane::Wavemill::Cli {

/// A file read from the start in pieces; "-" is standard input. Failures
/// throw ToolError naming the file.
class InputFile {
public:
  /// Opens `path` for reading: "cannot open <path>: <reason>".
  explicit InputFile(const std::string &path);
  ~InputFile();
  InputFile(const InputFile &) = delete;
  InputFile &operator=(const InputFile &) = delete;

  /// Up to `size` bytes; fewer only at the end. A read error throws
  /// "cannot read <path>: <reason>".
  std::size_t read(void *data, std::size_t size);
  /// Back to the first byte, for a second pass; not for standard input.
  void rewind();
  /// The size of a regular file, or -1 (standard input, a pipe).
  std::int64_t size() const;
  const std::string &path() const { return name; }

private:
  std::string name;
  std::FILE *file = nullptr;
  bool standardStream = false;
};

/// A file written under a temporary name beside its target and renamed to
/// it by commit(), so a failed run leaves no partial target behind (and an
/// existing one untouched); "-" writes straight to standard output.
class OutputFile {
public:
  /// Creates `<path>.part`: "cannot create <path>: <reason>".
  explicit OutputFile(const std::string &path);
  /// Without a commit() the partial file is removed.
  ~OutputFile();
  OutputFile(const OutputFile &) = delete;
  OutputFile &operator=(const OutputFile &) = delete;

  /// Writes all `size` bytes: "cannot write <path>: <reason>".
  void write(const void *data, std::size_t size);
  void write(const std::string &text) { write(text.data(), text.size()); }
  /// Flushes, closes and renames the file to its target.
  void commit();

private:
  std::string target;
  std::string partial;
  std::FILE *file = nullptr;
  bool standardStream = false;
};

/// A file name that is removed when the object goes, for temporary files.
class RemoveOnExit {
public:
  explicit RemoveOnExit(std::string path) : path(std::move(path)) {}
  ~RemoveOnExit();
  RemoveOnExit(const RemoveOnExit &) = delete;
  RemoveOnExit &operator=(const RemoveOnExit &) = delete;
  /// Keeps the file.
  void release() { path.clear(); }

private:
  std::string path;
};

/// The size of the regular file `path`, or -1.
std::int64_t fileSize(const std::string &path);
/// Renames `from` to `to`, replacing `to`: "cannot write <to>: <reason>".
void renameFile(const std::string &from, const std::string &to);
/// The text of the last failed C library call ("No such file or directory").
std::string lastErrorText();

} // namespace Corvane::Wavemill::Cli
