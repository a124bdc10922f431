#include "Commands.h"
#include "Files.h"
#include "HeaderFields.h"
#include "Progress.h"
#include "Text.h"
#include "ToolError.h"

#include "wavemill/waveform/StreamingExporter2.h"
#include "wavemill/waveform/exportimport/WaveformHeader.h"

#include <algorithm>
#include <cerrno>
#include <cmath>
#include <cstdint>
#include <cstring>
#include <memory>

namespace Corvane::Wavemill::Cli {

namespace {

using ExportImport::WaveformHeader;

constexpr std::size_t chunkSamples = 1 << 18;
// The straight int16 path only swaps bytes, so it takes larger chunks: the
// exporter opens and closes its files once a chunk.
constexpr std::size_t rawChunkSamples = 1 << 20;
// The IQ package states its length in a 32-bit word.
constexpr std::uint64_t largestPackage = 0xFFFFFFFFu;

void applyFields(WaveformHeader &header, const std::vector<std::string> &assignments) {
  for (const auto &assignment : assignments) {
    const auto equals = assignment.find('=');
    if (equals == std::string::npos)
      throw UsageError("--set " + assignment + ": expected name=value");
    const std::string name = assignment.substr(0, equals);
    const HeaderField *field = findHeaderField(name);
    if (field == nullptr)
      throw UsageError("--set: no header field called '" + name + "' (wavemill wv info lists them)");
    if (!setField(header, *field, std::string_view(assignment).substr(equals + 1)))
      throw UsageError("--set " + name + ": expected " + describeField(*field) + ", got '" +
                       assignment.substr(equals + 1) + "'");
  }
}

void putBigEndian16(unsigned char *p, std::int16_t value) {
  const auto word = static_cast<std::uint16_t>(value);
  p[0] = static_cast<unsigned char>(word >> 8);
  p[1] = static_cast<unsigned char>(word);
}

void putBigEndianFloat(unsigned char *p, float value) {
  std::uint32_t word;
  std::memcpy(&word, &value, sizeof word);
  for (int n = 0; n < 4; ++n)
    p[n] = static_cast<unsigned char>(word >> (24 - 8 * n));
}

// Rounds half away from zero, as the library quantises full-scale values.
std::int16_t toCode(double unit) {
  const double scaled = unit * 32767.0;
  return static_cast<std::int16_t>(static_cast<int>(scaled < 0 ? scaled - 0.5 : scaled + 0.5));
}

// Copies standard input to `path` so that it can be read twice: once to
// count the samples the file head must state, once to write them.
void spoolStandardInput(const std::string &path, bool quiet) {
  InputFile in("-");
  std::FILE *out = std::fopen(path.c_str(), "wb");
  if (out == nullptr)
    throw ToolError("cannot create " + path + ": " + lastErrorText());
  std::vector<unsigned char> buffer(1 << 20);
  Progress progress("reading", 0, Progress::wanted(quiet));
  std::int64_t total = 0;
  bool written = true;
  while (const std::size_t got = in.read(buffer.data(), buffer.size())) {
    written = written && std::fwrite(buffer.data(), 1, got, out) == got;
    total += static_cast<std::int64_t>(got);
    progress.update(total);
  }
  const std::string reason = lastErrorText();
  written = std::fclose(out) == 0 && written;
  if (!written)
    throw ToolError("cannot write " + path + ": " + reason);
}

class Packer {
public:
  Packer(const PackOptions &options, InputFile &input, std::string inputName)
      : options(options), input(input), inputName(std::move(inputName)),
        reader(SampleReader::open(input, options.format, this->inputName)) {}

  void run() {
    WaveformHeader header;
    applyFields(header, options.fields);
    std::unique_ptr<InputFile> markerFile;
    if (!options.markers.empty())
      markerFile = std::make_unique<InputFile>(options.markers);

    const bool straight = options.format == SampleFormat::I16 && !options.normalize && !options.floatIq;
    if (options.format == SampleFormat::Csv || options.normalize)
      scan();
    else
      countRawSamples();
    if (samples == 0)
      throw ToolError(inputName + " holds no samples");
    const std::size_t iqBytes = options.floatIq ? 8 : 4;
    if (static_cast<std::uint64_t>(samples) * iqBytes > largestPackage)
      throw ToolError(inputName + " holds more samples than a waveform file takes (at most " +
                      formatNumber(static_cast<std::uint64_t>(largestPackage / iqBytes)) + ")");
    if (markerFile != nullptr && reader->hasMarkers())
      throw UsageError("markers come from the third CSV column or from --markers, not both");
    hasMarkers = markerFile != nullptr || reader->hasMarkers();
    if (markerFile != nullptr)
      markers = std::make_unique<MarkerReader>(*markerFile, options.markers);

    const std::string partial = options.output + ".part";
    RemoveOnExit removePartial(partial);
    RemoveOnExit removeMarkers(partial + "_mkr");
    // The exporter reports only that it failed; a first open of our own
    // finds the reason a user can act on.
    errno = 0;
    std::FILE *probe = std::fopen(partial.c_str(), "wb");
    if (probe == nullptr)
      throw ToolError("cannot create " + options.output + ": " + lastErrorText());
    std::fclose(probe);

    auto bytes = header.getHeaderBytes();
    const int headerLength = static_cast<int>(bytes.size());
    if (options.floatIq)
      exporter = std::make_unique<streamingFloatExporter2>(partial, bytes.data(), headerLength);
    else
      exporter = std::make_unique<streamingExporter2>(partial, bytes.data(), headerLength);
    exporter->start(samples, hasMarkers);
    checkExporter();

    if (straight)
      writeStraight();
    else
      writeConverted();
    if (markers != nullptr) {
      unsigned char extra = 0;
      if (markers->read(&extra, 1) != 0)
        throw ToolError(options.markers + " holds more marker values than " + inputName + " has samples (" +
                        formatNumber(samples) + ")");
    }
    exporter->stop();
    checkExporter();
    exporter.reset();
    // Renaming over an existing file makes ext4 write the new one to disk
    // before rename returns (its guard for replace-by-rename), which takes
    // longer than the whole pack; without an old file there is nothing to
    // guard.
    std::remove(options.output.c_str());
    renameFile(partial, options.output);
    removePartial.release();
  }

private:
  // Counts the samples and finds the peak; CSV errors show here, before
  // anything is written.
  void scan() {
    std::vector<double> i(chunkSamples), q(chunkSamples);
    std::vector<unsigned char> bits(chunkSamples);
    Progress progress("reading", input.size(), Progress::wanted(options.quiet));
    while (const std::size_t count = reader->read(i.data(), q.data(), bits.data(), chunkSamples)) {
      for (std::size_t n = 0; n < count; ++n) {
        peak = std::max({peak, std::fabs(i[n]), std::fabs(q[n])});
        if (!options.normalize)
          checkRange(i[n], q[n], n);
      }
      samples += static_cast<std::int64_t>(count);
      progress.update(reader->consumed());
    }
    reader->rewind();
  }

  void countRawSamples() {
    const std::int64_t size = input.size();
    const auto sampleBytes = static_cast<std::int64_t>(rawSampleBytes(options.format));
    if (size % sampleBytes != 0)
      throw ToolError(inputName + ": ends inside a sample (its size is no multiple of " + formatNumber(sampleBytes) +
                      " bytes)");
    samples = size / sampleBytes;
  }

  double fullScale() const { return options.format == SampleFormat::I16 ? 32767.0 : 1.0; }

  void checkRange(double i, double q, std::size_t index) const {
    if (options.floatIq)
      return;
    const double limit = fullScale() * (options.format == SampleFormat::I16 ? 32768.0 / 32767.0 : 1.0);
    if (std::fabs(i) > limit || std::fabs(q) > limit)
      throw ToolError(reader->where(index) + ": value outside -1..1 (use --normalize to scale by the peak)");
  }

  void readMarkers(unsigned char *bits, std::size_t count) {
    if (markers == nullptr)
      return;
    if (markers->read(bits, count) != count)
      throw ToolError(options.markers + " holds fewer marker values than " + inputName + " has samples (" +
                      formatNumber(samples) + ")");
  }

  // int16 in, int16 out, values as they are: only the byte order changes.
  void writeStraight() {
    std::vector<unsigned char> iq(rawChunkSamples * 4);
    std::vector<unsigned char> bits(rawChunkSamples);
    Progress progress("packing", input.size(), Progress::wanted(options.quiet));
    std::int64_t done = 0;
    while (const std::size_t got = input.read(iq.data(), iq.size())) {
      swapBytePairs(iq.data(), got);
      const std::size_t count = got / 4;
      readMarkers(bits.data(), count);
      stream(iq.data(), bits.data(), count);
      done += static_cast<std::int64_t>(got);
      progress.update(done);
    }
  }

  // Eight bytes at a time: the loop over single bytes costs a third of the
  // time the exporter takes for the same data.
  static void swapBytePairs(unsigned char *data, std::size_t size) {
    constexpr std::uint64_t low = 0x00FF00FF00FF00FFu;
    std::size_t n = 0;
    for (; n + 8 <= size; n += 8) {
      std::uint64_t word;
      std::memcpy(&word, data + n, 8);
      word = (word & low) << 8 | (word >> 8 & low);
      std::memcpy(data + n, &word, 8);
    }
    for (; n + 1 < size; n += 2)
      std::swap(data[n], data[n + 1]);
  }

  void writeConverted() {
    std::vector<double> i(chunkSamples), q(chunkSamples);
    std::vector<unsigned char> bits(chunkSamples);
    const std::size_t iqBytes = options.floatIq ? 8 : 4;
    std::vector<unsigned char> iq(chunkSamples * iqBytes);
    // Scaling by the peak keeps I and Q on one scale; a silent waveform
    // stays silent.
    const double divisor = options.normalize && peak > 0 ? peak : fullScale();
    Progress progress("packing", input.size(), Progress::wanted(options.quiet));
    while (const std::size_t count = reader->read(i.data(), q.data(), bits.data(), chunkSamples)) {
      readMarkers(bits.data(), count);
      for (std::size_t n = 0; n < count; ++n) {
        if (!options.normalize)
          checkRange(i[n], q[n], n);
        const double unitI = i[n] / divisor;
        const double unitQ = q[n] / divisor;
        if (options.floatIq) {
          putBigEndianFloat(&iq[n * 8], static_cast<float>(unitI));
          putBigEndianFloat(&iq[n * 8 + 4], static_cast<float>(unitQ));
        } else {
          putBigEndian16(&iq[n * 4], toCode(std::clamp(unitI, -1.0, 1.0)));
          putBigEndian16(&iq[n * 4 + 2], toCode(std::clamp(unitQ, -1.0, 1.0)));
        }
      }
      stream(iq.data(), bits.data(), count);
      progress.update(reader->consumed());
    }
  }

  void stream(unsigned char *iq, unsigned char *bits, std::size_t count) {
    exporter->streamiq(iq, static_cast<int>(count * (options.floatIq ? 8 : 4)));
    if (hasMarkers)
      exporter->streammarker(bits, static_cast<int>(count));
    checkExporter();
  }

  void checkExporter() const {
    if (exporter->failed())
      throw ToolError("cannot write " + options.output + " (is the disk full?)");
  }

  const PackOptions &options;
  InputFile &input;
  std::string inputName;
  std::unique_ptr<SampleReader> reader;
  std::unique_ptr<MarkerReader> markers;
  std::unique_ptr<StreamingExporterBase> exporter;
  std::int64_t samples = 0;
  double peak = 0;
  bool hasMarkers = false;
};

} // namespace

int runPack(const PackOptions &options) {
  if (options.output == "-")
    throw UsageError("wv pack writes a file: OUT cannot be standard output");
  const bool fromStandardInput = options.input == "-";
  const std::string inputPath = fromStandardInput ? options.output + ".stdin.part" : options.input;
  RemoveOnExit removeSpool(fromStandardInput ? inputPath : std::string());
  if (fromStandardInput)
    spoolStandardInput(inputPath, options.quiet);
  InputFile input(inputPath);
  Packer(options, input, fromStandardInput ? "standard input" : options.input).run();
  return 0;
}

} // namespace Corvane::Wavemill::Cli
