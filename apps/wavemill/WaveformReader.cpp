#include "WaveformReader.h"

#include "Files.h"
#include "Text.h"
#include "ToolError.h"

#include "wavemill/tools/Tools.h"

namespace Corvane::Wavemill::Cli {

namespace {

std::int64_t padded(std::int64_t bytes) { return (bytes + 15) / 16 * 16; }

} // namespace

WaveformReader::WaveformReader(const std::string &path) : path(path) {
  InputFile probe(path); // names a missing or unreadable file the way every command does
  size = probe.size();
  const std::wstring widePath = Tools::toWString(path);
  if (size < 32 || !importer.Open(widePath.c_str()))
    throw ToolError(path + " is not a waveform file");
  const int headerLength = importer.GetHeaderLength();
  if (headerLength < 16)
    throw ToolError(path + " is not a waveform file");
  header.resize(static_cast<std::size_t>(headerLength));
  importer.GetHeader(header.data(), headerLength);
  sampleCount = importer.GetIQDataLen();
  isFloat = importer.GetWavformFormatFlag() == 1;
  // The packages follow one another, each padded to 16 bytes: the head and
  // the header package, the IQ package, then the marker package if any.
  const std::int64_t iqPackage = padded(headerLength + 24);
  const std::int64_t iqEnd = iqPackage + padded(8 + sampleCount * static_cast<std::int64_t>(sampleBytes()));
  if (sampleCount < 0 || size < iqEnd)
    throw ToolError(path + " is cut short: it holds less than its " + formatNumber(sampleCount) + " samples");
  markers = size >= iqEnd + padded(8 + sampleCount);
}

std::size_t WaveformReader::nextChunk(std::int64_t left) {
  if (left <= static_cast<std::int64_t>(chunkSamples))
    return static_cast<std::size_t>(left);
  // The importer serves a read of fewer than 16 bytes from what it kept of
  // the last block without counting it as read, so the final read is kept
  // at 16 samples or more.
  return left - static_cast<std::int64_t>(chunkSamples) < 16 ? chunkSamples - 16 : chunkSamples;
}

void WaveformReader::read(unsigned char *iq, unsigned char *markerBytes, std::size_t count) {
  const int iqBytes = static_cast<int>(count * sampleBytes());
  bool complete = false;
  try {
    complete = importer.GetRawIQData(iq, iqBytes) == iqBytes &&
               (markerBytes == nullptr ||
                importer.GetMarkers(markerBytes, static_cast<int>(count)) == static_cast<int>(count));
  } catch (int) {
    // The importer throws an int when the file ends inside a block.
  }
  if (!complete)
    throw ToolError("cannot read " + path + ": the file ends before its last sample");
}

} // namespace Corvane::Wavemill::Cli
