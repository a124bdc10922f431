#include "SampleInput.h"

#include "Text.h"
#include "ToolError.h"

#include <algorithm>
#include <cstring>

namespace Corvane::Wavemill::Cli {

namespace {

constexpr std::size_t lineBufferBytes = 1 << 20;
// Bounds the memory a file without line ends can take.
constexpr std::size_t longestLine = 16 << 20;

std::string quoted(std::string_view text) { return "'" + std::string(text.substr(0, 40)) + "'"; }

// Splits "a,b,c" into at most `capacity` fields; the count of fields found,
// which may be larger.
std::size_t splitFields(std::string_view line, std::string_view *fields, std::size_t capacity) {
  std::size_t count = 0;
  while (true) {
    const auto comma = line.find(',');
    if (count < capacity)
      fields[count] = trim(line.substr(0, comma));
    ++count;
    if (comma == std::string_view::npos)
      return count;
    line.remove_prefix(comma + 1);
  }
}

class CsvReader : public SampleReader {
public:
  CsvReader(InputFile &file, std::string name) : lines(file), name(std::move(name)) {}

  std::size_t read(double *i, double *q, unsigned char *markers, std::size_t capacity) override {
    lineNumbers.clear();
    std::size_t count = 0;
    std::string_view line;
    std::int64_t number = 0;
    while (count < capacity && lines.next(line, number)) {
      std::string_view fields[3];
      const std::size_t found = splitFields(line, fields, 3);
      if (!sawHeading) {
        sawHeading = true;
        if (isHeading(fields, found))
          continue;
      }
      if (columns == 0) {
        if (found != 2 && found != 3)
          fail(number, "expected I,Q or I,Q,markers but found " + formatNumber(static_cast<int>(found)) + " fields");
        columns = found;
      } else if (found != columns) {
        fail(number, "expected " + formatNumber(static_cast<int>(columns)) + " fields as on the lines before, found " +
                         formatNumber(static_cast<int>(found)));
      }
      if (!parseNumber(fields[0], i[count]))
        fail(number, "not a number: " + quoted(fields[0]));
      if (!parseNumber(fields[1], q[count]))
        fail(number, "not a number: " + quoted(fields[1]));
      if (columns == 3 && !parseMarkerBits(fields[2], markers[count]))
        fail(number, "marker bits must be an integer from 0 to 15: " + quoted(fields[2]));
      lineNumbers.push_back(number);
      ++count;
    }
    return count;
  }

  bool hasMarkers() const override { return columns == 3; }
  std::string where(std::size_t index) const override {
    return name + ":" + formatNumber(index < lineNumbers.size() ? lineNumbers[index] : 0);
  }
  std::int64_t consumed() const override { return lines.consumed(); }
  // The column count stays: the second pass reads the same lines.
  void rewind() override {
    lines.rewind();
    sawHeading = false;
  }

private:
  // A first line without a single number names the columns ("I,Q,markers",
  // as `wv unpack` writes) and is skipped.
  static bool isHeading(const std::string_view *fields, std::size_t found) {
    double unused = 0;
    for (std::size_t n = 0; n < std::min<std::size_t>(found, 3); ++n)
      if (fields[n].empty() || parseNumber(fields[n], unused))
        return false;
    return true;
  }

  [[noreturn]] void fail(std::int64_t line, const std::string &what) const {
    throw ToolError(name + ":" + formatNumber(line) + ": " + what);
  }

  LineReader lines;
  std::string name;
  std::size_t columns = 0;
  bool sawHeading = false;
  std::vector<std::int64_t> lineNumbers;
};

class RawReader : public SampleReader {
public:
  RawReader(InputFile &file, SampleFormat format, std::string name)
      : file(file), format(format), name(std::move(name)), sampleBytes(rawSampleBytes(format)) {}

  std::size_t read(double *i, double *q, unsigned char *, std::size_t capacity) override {
    bytes.resize(capacity * sampleBytes);
    const std::size_t got = file.read(bytes.data(), bytes.size());
    consumedBytes += static_cast<std::int64_t>(got);
    if (got % sampleBytes != 0)
      throw ToolError(name + ": ends inside a sample (its size is no multiple of " +
                      formatNumber(static_cast<int>(sampleBytes)) + " bytes)");
    const std::size_t count = got / sampleBytes;
    const unsigned char *p = bytes.data();
    for (std::size_t n = 0; n < count; ++n, p += sampleBytes) {
      i[n] = value(p);
      q[n] = value(p + sampleBytes / 2);
    }
    firstIndex = nextIndex;
    nextIndex += count;
    return count;
  }

  std::string where(std::size_t index) const override {
    return name + ": sample " + formatNumber(static_cast<std::uint64_t>(firstIndex + index + 1));
  }
  std::int64_t consumed() const override { return consumedBytes; }
  void rewind() override {
    file.rewind();
    consumedBytes = 0;
    firstIndex = nextIndex = 0;
  }

private:
  // Little-endian whatever the machine: the bytes are put together by hand.
  double value(const unsigned char *p) const {
    switch (format) {
    case SampleFormat::I16:
      return static_cast<std::int16_t>(static_cast<std::uint16_t>(p[0] | p[1] << 8));
    case SampleFormat::F32: {
      const std::uint32_t word =
          std::uint32_t{p[0]} | std::uint32_t{p[1]} << 8 | std::uint32_t{p[2]} << 16 | std::uint32_t{p[3]} << 24;
      float f;
      std::memcpy(&f, &word, sizeof f);
      return f;
    }
    default: {
      std::uint64_t word = 0;
      for (int n = 7; n >= 0; --n)
        word = word << 8 | p[n];
      double d;
      std::memcpy(&d, &word, sizeof d);
      return d;
    }
    }
  }

  InputFile &file;
  SampleFormat format;
  std::string name;
  std::size_t sampleBytes;
  std::vector<unsigned char> bytes;
  std::int64_t consumedBytes = 0;
  std::size_t firstIndex = 0;
  std::size_t nextIndex = 0;
};

} // namespace

bool parseSampleFormat(std::string_view name, SampleFormat &format) {
  static const std::pair<const char *, SampleFormat> names[] = {
      {"csv", SampleFormat::Csv}, {"f32", SampleFormat::F32}, {"f64", SampleFormat::F64}, {"i16", SampleFormat::I16}};
  for (const auto &[text, value] : names)
    if (name == text) {
      format = value;
      return true;
    }
  return false;
}

std::size_t rawSampleBytes(SampleFormat format) {
  switch (format) {
  case SampleFormat::F32:
    return 8;
  case SampleFormat::F64:
    return 16;
  case SampleFormat::I16:
    return 4;
  default:
    return 0;
  }
}

bool parseMarkerBits(std::string_view text, unsigned char &bits) {
  std::int64_t value = 0;
  if (!parseInteger(text, value) || value < 0 || value > 15)
    return false;
  bits = static_cast<unsigned char>(value);
  return true;
}

LineReader::LineReader(InputFile &file) : file(file), buffer(lineBufferBytes) {}

bool LineReader::fill() {
  if (atEnd)
    return false;
  if (begin > 0) {
    std::memmove(buffer.data(), buffer.data() + begin, end - begin);
    end -= begin;
    begin = 0;
  }
  if (end == buffer.size()) {
    if (buffer.size() >= longestLine)
      throw ToolError(file.path() + ":" + formatNumber(lineNumber + 1) + ": line too long");
    buffer.resize(buffer.size() * 2);
  }
  const std::size_t got = file.read(buffer.data() + end, buffer.size() - end);
  end += got;
  atEnd = got == 0;
  return true;
}

bool LineReader::next(std::string_view &line, std::int64_t &number) {
  while (true) {
    const char *start = buffer.data() + begin;
    const auto *newline = static_cast<const char *>(std::memchr(start, '\n', end - begin));
    std::size_t length = 0;
    if (newline != nullptr) {
      length = static_cast<std::size_t>(newline - start);
    } else if (fill()) {
      continue;
    } else if (begin < end) {
      length = end - begin; // the last line has no line end
    } else {
      return false;
    }
    const std::size_t used = newline != nullptr ? length + 1 : length;
    begin += used;
    consumedBytes += static_cast<std::int64_t>(used);
    ++lineNumber;
    line = trim(std::string_view(start, length));
    if (!line.empty() && line.front() != '#') {
      number = lineNumber;
      return true;
    }
  }
}

void LineReader::rewind() {
  file.rewind();
  begin = end = 0;
  atEnd = false;
  lineNumber = consumedBytes = 0;
}

SampleReader::~SampleReader() = default;

std::unique_ptr<SampleReader> SampleReader::open(InputFile &file, SampleFormat format, std::string name) {
  if (format == SampleFormat::Csv)
    return std::make_unique<CsvReader>(file, std::move(name));
  return std::make_unique<RawReader>(file, format, std::move(name));
}

MarkerReader::MarkerReader(InputFile &file, std::string name) : lines(file), name(std::move(name)) {}

std::size_t MarkerReader::read(unsigned char *markers, std::size_t capacity) {
  std::size_t count = 0;
  std::string_view line;
  std::int64_t number = 0;
  while (count < capacity && lines.next(line, number)) {
    if (!parseMarkerBits(line, markers[count]))
      throw ToolError(name + ":" + formatNumber(number) + ": marker bits must be an integer from 0 to 15: '" +
                      std::string(line.substr(0, 40)) + "'");
    ++count;
  }
  return count;
}

} // namespace Corvane::Wavemill::Cli
