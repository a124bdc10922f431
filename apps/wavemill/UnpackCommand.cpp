#include "Commands.h"
#include "Files.h"
#include "Progress.h"
#include "ToolError.h"
#include "WaveformReader.h"
#include "platform/Terminal.h"

#include <charconv>
#include <cmath>
#include <cstdint>
#include <cstring>
#include <memory>
#include <type_traits>
#include <vector>

namespace Corvane::Wavemill::Cli {

namespace {

std::int16_t bigEndian16(const unsigned char *p) {
  return static_cast<std::int16_t>(static_cast<std::uint16_t>(p[0] << 8 | p[1]));
}

float bigEndianFloat(const unsigned char *p) {
  const std::uint32_t word =
      std::uint32_t{p[0]} << 24 | std::uint32_t{p[1]} << 16 | std::uint32_t{p[2]} << 8 | std::uint32_t{p[3]};
  float value;
  std::memcpy(&value, &word, sizeof value);
  return value;
}

template <class T> void putLittleEndian(std::vector<unsigned char> &out, T value) {
  using Word = std::conditional_t<sizeof(T) == 2, std::uint16_t,
                                  std::conditional_t<sizeof(T) == 4, std::uint32_t, std::uint64_t>>;
  Word word;
  std::memcpy(&word, &value, sizeof word);
  for (std::size_t n = 0; n < sizeof(T); ++n)
    out.push_back(static_cast<unsigned char>(word >> (8 * n)));
}

// The value written for one channel of one sample: 16-bit files give their
// codes, float files their values.
struct Channel {
  bool isFloat;
  std::int16_t code;
  float value;

  double unit() const { return isFloat ? value : code / 32767.0; }
  std::int16_t toCode() const {
    if (!isFloat)
      return code;
    const double scaled = std::fmax(-32767.0, std::fmin(32767.0, value * 32767.0));
    return static_cast<std::int16_t>(scaled < 0 ? scaled - 0.5 : scaled + 0.5);
  }
};

void putNumber(std::vector<char> &out, const Channel &channel) {
  char text[32];
  const auto result = channel.isFloat ? std::to_chars(text, text + sizeof text, channel.value)
                                      : std::to_chars(text, text + sizeof text, channel.unit());
  out.insert(out.end(), text, result.ptr);
}

void putInteger(std::vector<char> &out, unsigned value) {
  char text[8];
  const auto result = std::to_chars(text, text + sizeof text, value);
  out.insert(out.end(), text, result.ptr);
}

} // namespace

int runUnpack(const UnpackOptions &options) {
  if (options.input == "-")
    throw UsageError("wv unpack reads a file: FILE cannot be standard input");
  if (options.output == "-" && options.format != SampleFormat::Csv &&
      Platform::isTerminal(Platform::StandardStream::Output))
    throw UsageError("raw samples would garble the terminal: name a file or redirect standard output");
  WaveformReader wave(options.input);
  if (!options.markers.empty() && !wave.hasMarkers())
    throw ToolError(options.input + " holds no markers");
  const bool csv = options.format == SampleFormat::Csv;
  const bool markerColumn = csv && wave.hasMarkers() && options.markers.empty();
  const bool readMarkers = markerColumn || !options.markers.empty();

  OutputFile out(options.output);
  std::unique_ptr<OutputFile> markerOut;
  if (!options.markers.empty())
    markerOut = std::make_unique<OutputFile>(options.markers);
  if (csv)
    out.write(markerColumn ? "I,Q,markers\n" : "I,Q\n");

  std::vector<unsigned char> iq(WaveformReader::chunkSamples * wave.sampleBytes());
  std::vector<unsigned char> bits(WaveformReader::chunkSamples);
  std::vector<char> text;
  std::vector<unsigned char> raw;
  std::vector<char> markerText;
  Progress progress("unpacking", wave.samples() * static_cast<std::int64_t>(wave.sampleBytes()),
                    Progress::wanted(options.quiet));
  for (std::int64_t done = 0; done < wave.samples();) {
    const std::size_t count = WaveformReader::nextChunk(wave.samples() - done);
    wave.read(iq.data(), readMarkers ? bits.data() : nullptr, count);
    text.clear();
    raw.clear();
    markerText.clear();
    for (std::size_t n = 0; n < count; ++n) {
      const unsigned char *p = &iq[n * wave.sampleBytes()];
      const Channel i = wave.floatIq() ? Channel{true, 0, bigEndianFloat(p)} : Channel{false, bigEndian16(p), 0};
      const Channel q =
          wave.floatIq() ? Channel{true, 0, bigEndianFloat(p + 4)} : Channel{false, bigEndian16(p + 2), 0};
      switch (options.format) {
      case SampleFormat::Csv:
        putNumber(text, i);
        text.push_back(',');
        putNumber(text, q);
        if (markerColumn) {
          text.push_back(',');
          putInteger(text, bits[n] & 15u);
        }
        text.push_back('\n');
        break;
      case SampleFormat::F32:
        putLittleEndian(raw, static_cast<float>(i.unit()));
        putLittleEndian(raw, static_cast<float>(q.unit()));
        break;
      case SampleFormat::F64:
        putLittleEndian(raw, i.unit());
        putLittleEndian(raw, q.unit());
        break;
      case SampleFormat::I16:
        putLittleEndian(raw, i.toCode());
        putLittleEndian(raw, q.toCode());
        break;
      }
      if (markerOut != nullptr) {
        putInteger(markerText, bits[n] & 15u);
        markerText.push_back('\n');
      }
    }
    out.write(text.data(), text.size());
    out.write(raw.data(), raw.size());
    if (markerOut != nullptr)
      markerOut->write(markerText.data(), markerText.size());
    done += static_cast<std::int64_t>(count);
    progress.update(done * static_cast<std::int64_t>(wave.sampleBytes()));
  }
  progress.finish();
  out.commit();
  if (markerOut != nullptr)
    markerOut->commit();
  return 0;
}

} // namespace Corvane::Wavemill::Cli
