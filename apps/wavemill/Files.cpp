#include "Files.h"

#include "ToolError.h"

#include <cerrno>
#include <cstring>
#include <filesystem>
#include <system_error>

namespace Corvane::Wavemill::Cli {

std::string lastErrorText() { return errno != 0 ? std::strerror(errno) : "unknown error"; }

std::int64_t fileSize(const std::string &path) {
  std::error_code error;
  if (!std::filesystem::is_regular_file(path, error))
    return -1;
  const auto size = std::filesystem::file_size(path, error);
  return error ? -1 : static_cast<std::int64_t>(size);
}

void renameFile(const std::string &from, const std::string &to) {
  std::error_code error;
  std::filesystem::rename(from, to, error);
  if (error)
    throw ToolError("cannot write " + to + ": " + error.message());
}

InputFile::InputFile(const std::string &path) : name(path) {
  if (path == "-") {
    file = stdin;
    standardStream = true;
    return;
  }
  std::error_code error;
  if (std::filesystem::is_directory(path, error))
    throw ToolError("cannot open " + path + ": Is a directory");
  errno = 0;
  file = std::fopen(path.c_str(), "rb");
  if (file == nullptr)
    throw ToolError("cannot open " + path + ": " + lastErrorText());
}

InputFile::~InputFile() {
  if (file != nullptr && !standardStream)
    std::fclose(file);
}

std::size_t InputFile::read(void *data, std::size_t size) {
  errno = 0;
  const std::size_t got = std::fread(data, 1, size, file);
  if (got < size && std::ferror(file))
    throw ToolError("cannot read " + (standardStream ? std::string("standard input") : name) + ": " + lastErrorText());
  return got;
}

void InputFile::rewind() {
  if (standardStream || std::fseek(file, 0, SEEK_SET) != 0)
    throw ToolError("cannot read " + name + " twice");
}

std::int64_t InputFile::size() const { return standardStream ? -1 : fileSize(name); }

OutputFile::OutputFile(const std::string &path) : target(path) {
  if (path == "-") {
    file = stdout;
    standardStream = true;
    return;
  }
  partial = path + ".part";
  errno = 0;
  file = std::fopen(partial.c_str(), "wb");
  if (file == nullptr)
    throw ToolError("cannot create " + path + ": " + lastErrorText());
}

OutputFile::~OutputFile() {
  if (standardStream)
    return;
  if (file != nullptr) {
    std::fclose(file);
    std::remove(partial.c_str());
  }
}

void OutputFile::write(const void *data, std::size_t size) {
  errno = 0;
  if (size > 0 && std::fwrite(data, 1, size, file) != size)
    throw ToolError("cannot write " + (standardStream ? std::string("standard output") : target) + ": " +
                    lastErrorText());
}

void OutputFile::commit() {
  if (standardStream) {
    if (std::fflush(stdout) != 0)
      throw ToolError("cannot write standard output: " + lastErrorText());
    return;
  }
  errno = 0;
  const bool closed = std::fclose(file) == 0;
  file = nullptr;
  if (!closed) {
    const std::string reason = lastErrorText();
    std::remove(partial.c_str());
    throw ToolError("cannot write " + target + ": " + reason);
  }
  try {
    renameFile(partial, target);
  } catch (...) {
    std::remove(partial.c_str());
    throw;
  }
}

RemoveOnExit::~RemoveOnExit() {
  if (!path.empty())
    std::remove(path.c_str());
}

} // namespace Corvane::Wavemill::Cli
