#pragma once

#include "wavemill/waveform/StreamingImporter2.h"

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

namespace Corvane::Wavemill::Cli {

/// A waveform file opened for reading through the streaming importer, with
/// what the tool needs to know before it reads: the header bytes, the
/// sample count, the sample format and whether a marker package follows.
/// Throws ToolError naming the file when it cannot be opened, is no
/// waveform file or is cut short.
class WaveformReader {
public:
  explicit WaveformReader(const std::string &path);

  const std::vector<unsigned char> &headerBytes() const { return header; }
  std::int64_t samples() const { return sampleCount; }
  /// Floating IQ (float32 I and Q, big-endian, 8 bytes a sample) rather
  /// than 16-bit integers (4 bytes a sample).
  bool floatIq() const { return isFloat; }
  std::size_t sampleBytes() const { return isFloat ? 8 : 4; }
  /// Whether the file holds a marker package after the samples.
  bool hasMarkers() const { return markers; }
  /// The file's size in bytes.
  std::int64_t fileSize() const { return size; }

  /// Reads the next `count` samples' IQ bytes (sampleBytes() each) into
  /// `iq`; and, when `markerBytes` is not null, their marker bytes. Throws
  /// when the file ends early.
  void read(unsigned char *iq, unsigned char *markerBytes, std::size_t count);

  /// The largest count read() may be given at once.
  static constexpr std::size_t chunkSamples = 1 << 18;
  /// The count for the next read() of a file with `left` samples to go.
  static std::size_t nextChunk(std::int64_t left);

private:
  std::string path;
  streamingImporter2 importer;
  std::vector<unsigned char> header;
  std::int64_t sampleCount = 0;
  std::int64_t size = 0;
  bool isFloat = false;
  bool markers = false;
};

} // namespace Corvane::Wavemill::Cli
