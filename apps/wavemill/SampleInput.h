#pragma once

#include "Files.h"

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace Corvane::Wavemill::Cli {

/// How sample data are written outside a waveform file: text lines
/// "I,Q[,marker bits]", or interleaved I and Q as little-endian float32,
/// float64 or int16.
enum class SampleFormat { Csv, F32, F64, I16 };

/// "csv", "f32", "f64", "i16"; false for another name.
bool parseSampleFormat(std::string_view name, SampleFormat &format);

/// The bytes one IQ pair takes in a raw format (8, 16, 4); 0 for CSV.
std::size_t rawSampleBytes(SampleFormat format);

/// The lines of a text file one by one with their numbers, blank lines and
/// lines that start with "#" skipped.
class LineReader {
public:
  explicit LineReader(InputFile &file);
  /// The next line without its end, or false at the end of the file. The
  /// view lasts until the next call.
  bool next(std::string_view &line, std::int64_t &number);
  /// Starts again at the first line.
  void rewind();
  /// The bytes consumed so far, for progress.
  std::int64_t consumed() const { return consumedBytes; }

private:
  bool fill();

  InputFile &file;
  std::vector<char> buffer;
  std::size_t begin = 0;
  std::size_t end = 0;
  bool atEnd = false;
  std::int64_t lineNumber = 0;
  std::int64_t consumedBytes = 0;
};

/// Samples read from CSV or raw input in chunks, as numbers: full scale is
/// 1.0 for CSV, f32 and f64, and 32767 for i16 (the codes as they stand).
/// Bad data throw ToolError with the place: "wave.csv:12: not a number:
/// 'x'" or "wave.f32: ends inside a sample".
class SampleReader {
public:
  /// `name` is what messages call the input.
  static std::unique_ptr<SampleReader> open(InputFile &file, SampleFormat format, std::string name);
  virtual ~SampleReader();

  /// Up to `capacity` samples into `i`, `q` and, when hasMarkers(),
  /// `markers`; 0 at the end.
  virtual std::size_t read(double *i, double *q, unsigned char *markers, std::size_t capacity) = 0;
  /// Whether the input carries marker bits (a third CSV column). Known
  /// after the first read.
  virtual bool hasMarkers() const { return false; }
  /// Where sample `index` of the last read came from: "wave.csv:12" or
  /// "wave.f32: sample 4097".
  virtual std::string where(std::size_t index) const = 0;
  /// Input bytes consumed, for progress.
  virtual std::int64_t consumed() const = 0;
  /// Starts again at the first sample, for a second pass.
  virtual void rewind() = 0;
};

/// A text file of marker bits, one value from 0 to 15 a line (bit 0 is
/// marker 1); `wv pack --markers` reads it and `wv unpack --markers` writes
/// it.
class MarkerReader {
public:
  MarkerReader(InputFile &file, std::string name);
  /// Up to `capacity` values; 0 at the end. Bad lines throw ToolError with
  /// their line number.
  std::size_t read(unsigned char *markers, std::size_t capacity);
  void rewind() { lines.rewind(); }

private:
  LineReader lines;
  std::string name;
};

/// Reads marker bits from CSV text: an integer from 0 to 15.
bool parseMarkerBits(std::string_view text, unsigned char &bits);

} // namespace Corvane::Wavemill::Cli
