#pragma once

#include "SampleInput.h"

#include <string>
#include <vector>

namespace Corvane::Wavemill::Cli {

// The commands of the tool. Each returns the exit code (0), or throws
// ToolError for a failed operation (exit 1) and UsageError for a command
// line it cannot act on (exit 2); main() prints the message.

struct InfoOptions {
  std::string file;
  bool json = false;
};
int runInfo(const InfoOptions &options);

struct PackOptions {
  std::string input;
  std::string output;
  SampleFormat format = SampleFormat::Csv;
  /// Scale by the peak of I and Q together to full scale.
  bool normalize = false;
  /// Write floating IQ (float32) instead of 16-bit integers.
  bool floatIq = false;
  /// A text file of marker bits, one value a line.
  std::string markers;
  /// Header fields, "name=value".
  std::vector<std::string> fields;
  bool quiet = false;
};
int runPack(const PackOptions &options);

struct UnpackOptions {
  std::string input;
  std::string output;
  SampleFormat format = SampleFormat::Csv;
  /// Write the marker bits to this text file instead of a CSV column.
  std::string markers;
  bool quiet = false;
};
int runUnpack(const UnpackOptions &options);

struct ScpiOptions {
  std::string address;
  std::vector<std::string> commands;
  int timeoutMs = 10000;
  /// Sent as a definite-length block after the last command that is no
  /// query.
  std::string block;
  /// Where the block that answers the last query goes.
  std::string readBlock;
  bool quiet = false;
};
int runScpi(const ScpiOptions &options);

struct IdentifyOptions {
  std::string address;
  int timeoutMs = 10000;
  bool json = false;
};
int runIdentify(const IdentifyOptions &options);

struct FindOptions {
  std::string expression = "?*INSTR";
};
int runFind(const FindOptions &options);

struct SimOptions {
  int port = 5025;
  std::string identity;
  std::string options;
  std::string fault = "none";
};
int runSim(const SimOptions &options);

} // namespace Corvane::Wavemill::Cli
