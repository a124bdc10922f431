#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

namespace Corvane::Wavemill::Platform {

// `path` as UTF-8, the file-name encoding of the system. False, with `out`
// left alone, when `path` is null or holds a value that is no Unicode code
// point (a surrogate, or above U+10FFFF).
bool wideToUtf8(const wchar_t *path, std::string &out);

// An open file named by a wide path, read and written in bytes with 64-bit
// offsets: the counterpart of a C stream opened with _wfopen_s and moved with
// _fseeki64. Closed when destroyed; a closed object reads and writes nothing.
// One thread at a time. Two objects may hold the same file open, each with
// a position of its own.
class WideFile {
public:
  WideFile() = default;
  ~WideFile();
  WideFile(WideFile &&other) noexcept;
  WideFile &operator=(WideFile &&other) noexcept;
  WideFile(const WideFile &) = delete;
  WideFile &operator=(const WideFile &) = delete;

  // Closes what is open, then opens `path` with a C stream `mode` ("rb",
  // "wb", "ab", ...). 0, or an errno: EINVAL for a null or unconvertible
  // path or a null mode.
  int open(const wchar_t *path, const char *mode);
  // The same for a path that is already in the system's encoding.
  int open(const std::string &path, const char *mode);
  bool isOpen() const { return stream != nullptr; }

  // Up to `bytes` bytes into `dest`; fewer at the end of the file or on an
  // error, 0 when closed.
  std::size_t read(void *dest, std::size_t bytes);
  // Writes `bytes` bytes from `src` and answers how many went out.
  std::size_t write(const void *src, std::size_t bytes);
  // Moves to `offset` from the start (origin 0), the position (1) or the end
  // (2). 0, or an errno (EBADF when closed).
  int seek(std::int64_t offset, int origin);
  // The position from the start, or -1.
  std::int64_t tell();
  // Closes the file: 0, or the errno of a failed final write. Closing what
  // is not open answers 0.
  int close();

private:
  void *stream = nullptr;
};

} // namespace Corvane::Wavemill::Platform
