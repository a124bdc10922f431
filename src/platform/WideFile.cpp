#include "platform/WideFile.h"

#include <cerrno>
#include <cstdio>
#include <utility>

#include <sys/types.h>

namespace Corvane::Wavemill::Platform {

namespace {

std::FILE *file(void *stream) { return static_cast<std::FILE *>(stream); }

} // namespace

bool wideToUtf8(const wchar_t *path, std::string &out) {
  if (path == nullptr) {
    return false;
  }
  std::string text;
  for (const wchar_t *p = path; *p != L'\0'; ++p) {
    const auto c = static_cast<std::uint32_t>(*p);
    if (c < 0x80) {
      text.push_back(static_cast<char>(c));
    } else if (c < 0x800) {
      text.push_back(static_cast<char>(0xc0 | (c >> 6)));
      text.push_back(static_cast<char>(0x80 | (c & 0x3f)));
    } else if (c >= 0xd800 && c <= 0xdfff) {
      return false;
    } else if (c < 0x10000) {
      text.push_back(static_cast<char>(0xe0 | (c >> 12)));
      text.push_back(static_cast<char>(0x80 | ((c >> 6) & 0x3f)));
      text.push_back(static_cast<char>(0x80 | (c & 0x3f)));
    } else if (c <= 0x10ffff) {
      text.push_back(static_cast<char>(0xf0 | (c >> 18)));
      text.push_back(static_cast<char>(0x80 | ((c >> 12) & 0x3f)));
      text.push_back(static_cast<char>(0x80 | ((c >> 6) & 0x3f)));
      text.push_back(static_cast<char>(0x80 | (c & 0x3f)));
    } else {
      return false;
    }
  }
  out = std::move(text);
  return true;
}

WideFile::~WideFile() { close(); }

WideFile::WideFile(WideFile &&other) noexcept : stream(other.stream) { other.stream = nullptr; }

WideFile &WideFile::operator=(WideFile &&other) noexcept {
  if (this != &other) {
    close();
    stream = other.stream;
    other.stream = nullptr;
  }
  return *this;
}

int WideFile::open(const wchar_t *path, const char *mode) {
  std::string narrow;
  if (!wideToUtf8(path, narrow)) {
    close();
    return EINVAL;
  }
  return open(narrow, mode);
}

int WideFile::open(const std::string &path, const char *mode) {
  close();
  if (mode == nullptr) {
    return EINVAL;
  }
  // fopen retries an interrupted open(2) itself, so EINTR never reaches here.
  stream = std::fopen(path.c_str(), mode);
  return stream != nullptr ? 0 : errno;
}

std::size_t WideFile::read(void *dest, std::size_t bytes) {
  if (stream == nullptr || dest == nullptr || bytes == 0) {
    return 0;
  }
  // Not retried: an interrupted read(2) is restarted by the C library for
  // handlers installed with SA_RESTART, and a short count means the end to
  // every caller, as it does for the stream this class stands in for.
  return std::fread(dest, 1, bytes, file(stream));
}

std::size_t WideFile::write(const void *src, std::size_t bytes) {
  if (stream == nullptr || src == nullptr || bytes == 0) {
    return 0;
  }
  return std::fwrite(src, 1, bytes, file(stream));
}

int WideFile::seek(std::int64_t offset, int origin) {
  if (stream == nullptr) {
    return EBADF;
  }
  const int whence = origin == 1 ? SEEK_CUR : origin == 2 ? SEEK_END : SEEK_SET;
  // off_t is 64 bits wide on every target of this file (LP64 Linux).
  static_assert(sizeof(off_t) >= sizeof(std::int64_t), "64-bit file offsets needed");
  return ::fseeko(file(stream), static_cast<off_t>(offset), whence) == 0 ? 0 : errno;
}

std::int64_t WideFile::tell() {
  if (stream == nullptr) {
    return -1;
  }
  return static_cast<std::int64_t>(::ftello(file(stream)));
}

int WideFile::close() {
  if (stream == nullptr) {
    return 0;
  }
  // fclose releases the stream even when it fails, so it is never retried.
  const int result = std::fclose(file(stream));
  stream = nullptr;
  return result == 0 ? 0 : errno;
}

} // namespace Corvane::Wavemill::Platform
