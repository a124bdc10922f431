#pragma once

#include <stdexcept>
#include <string>

namespace Corvane::Wavemill::Cli {

/// An operation that failed: the tool prints the message as one line on
/// standard error and exits with 1. The message names what failed and with
/// which file or address: "cannot open wave.csv: No such file or directory".
class ToolError : public std::runtime_error {
public:
  explicit ToolError(const std::string &message) : std::runtime_error(message) {}
};

/// A command line the tool cannot act on: printed like a ToolError, with a
/// hint to --help, and the tool exits with 2.
class UsageError : public std::runtime_error {
public:
  explicit UsageError(const std::string &message) : std::runtime_error(message) {}
};

} // namespace Corvane::Wavemill::Cli
