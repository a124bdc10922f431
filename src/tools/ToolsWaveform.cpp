#include "wavemill/tools/Tools.h"

#include "tools/Slashes.h"

#include <algorithm>
#include <cctype>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <fstream>
#include <limits>
#include <stdexcept>
#include <utility>

#if defined(__SSE2__)
#include <emmintrin.h>
#endif

namespace Corvane::Wavemill {

namespace {

constexpr std::size_t shortNameLength = 23;
constexpr std::size_t shortStemLength = 19;
constexpr std::size_t minimumRunLength = 5;
constexpr std::streamsize pulseBlockSize = 0x200000;
const std::string waveformEnding = ".WFM";

// The samples as one array of I, Q, I, Q, ...: std::complex<double> is laid
// out as two doubles, and the standard allows this view of it. The hot loops
// work on this plain pointer, without per-element checks.
const double *components(gsl::span<const std::complex<double>> samples) {
  return reinterpret_cast<const double *>(samples.data());
}

std::size_t componentCount(gsl::span<const std::complex<double>> samples) { return samples.size() * 2; }

gsl::span<const std::complex<double>> asSpan(const std::shared_ptr<std::vector<std::complex<double>>> &samples) {
  if (!samples)
    return {};
  return {samples->data(), samples->size()};
}

double peakOf(const double *values, std::size_t count) {
  // Four independent maxima keep the loop from waiting on one comparison
  // chain. A NaN never wins a comparison, so it does not become the peak.
  double m0 = 0.0, m1 = 0.0, m2 = 0.0, m3 = 0.0;
  std::size_t i = 0;
  for (; i + 4 <= count; i += 4) {
    const double a0 = std::fabs(values[i]), a1 = std::fabs(values[i + 1]);
    const double a2 = std::fabs(values[i + 2]), a3 = std::fabs(values[i + 3]);
    m0 = m0 < a0 ? a0 : m0;
    m1 = m1 < a1 ? a1 : m1;
    m2 = m2 < a2 ? a2 : m2;
    m3 = m3 < a3 ? a3 : m3;
  }
  for (; i < count; ++i) {
    const double a = std::fabs(values[i]);
    m0 = m0 < a ? a : m0;
  }
  return std::max(std::max(m0, m1), std::max(m2, m3));
}

double sumOfSquares(const double *values, std::size_t count) {
  double s0 = 0.0, s1 = 0.0, s2 = 0.0, s3 = 0.0;
  std::size_t i = 0;
  for (; i + 4 <= count; i += 4) {
    s0 += values[i] * values[i];
    s1 += values[i + 1] * values[i + 1];
    s2 += values[i + 2] * values[i + 2];
    s3 += values[i + 3] * values[i + 3];
  }
  for (; i < count; ++i)
    s0 += values[i] * values[i];
  return (s0 + s1) + (s2 + s3);
}

// One component as a big-endian 16-bit value. Clamping first keeps the
// conversion defined for any input: beyond the 16-bit range a value sticks at
// the nearest end, and NaN, which has no integer, becomes 0. lrint rounds in
// the processor's current mode.
inline void storeComponent(double value, unsigned char *out) {
  if (value != value)
    value = 0.0;
  value = value > 32767.0 ? 32767.0 : value;
  value = value < -32768.0 ? -32768.0 : value;
  const auto word = static_cast<std::uint16_t>(static_cast<std::int16_t>(std::lrint(value)));
  out[0] = static_cast<unsigned char>(word >> 8);
  out[1] = static_cast<unsigned char>(word & 0xff);
}

#if defined(__SSE2__)
// Two components scaled, cleaned of NaN and clamped as in storeComponent, then
// converted in the current rounding mode: two 32-bit integers in the low half.
inline __m128i convertPair(const double *values, __m128d factor) {
  const __m128d high = _mm_set1_pd(32767.0);
  const __m128d low = _mm_set1_pd(-32768.0);
  __m128d value = _mm_mul_pd(_mm_loadu_pd(values), factor);
  value = _mm_and_pd(value, _mm_cmpord_pd(value, value));
  value = _mm_max_pd(_mm_min_pd(value, high), low);
  return _mm_cvtpd_epi32(value);
}
#endif

void convert(const double *values, std::size_t count, double factor, unsigned char *out) {
  std::size_t i = 0;
#if defined(__SSE2__)
  // Eight components a step: one 16-byte store of big-endian words. The
  // clamped values fit 16 bits, so the saturating pack changes none of them.
  const __m128d scale = _mm_set1_pd(factor);
  for (; i + 8 <= count; i += 8) {
    const __m128i first = _mm_unpacklo_epi64(convertPair(values + i, scale), convertPair(values + i + 2, scale));
    const __m128i second = _mm_unpacklo_epi64(convertPair(values + i + 4, scale), convertPair(values + i + 6, scale));
    const __m128i words = _mm_packs_epi32(first, second);
    const __m128i swapped = _mm_or_si128(_mm_slli_epi16(words, 8), _mm_srli_epi16(words, 8));
    _mm_storeu_si128(reinterpret_cast<__m128i *>(out + 2 * i), swapped);
  }
#endif
  for (; i < count; ++i)
    storeComponent(factor * values[i], out + 2 * i);
}

} // namespace

std::string Tools::getShortWaveformName(std::string name) {
  name = forwardSlashes(std::move(name));
  if (const auto slash = name.rfind('/'); slash != std::string::npos)
    name.erase(0, slash + 1);
  std::replace(name.begin(), name.end(), ':', '_');
  if (name.size() <= shortNameLength)
    return name;
  const std::string ending = name.substr(name.size() - waveformEnding.size());
  if (compareIgnoreCase(ending, waveformEnding))
    name.erase(name.size() - waveformEnding.size());
  if (name.size() > shortStemLength)
    name.erase(shortStemLength);
  return name + waveformEnding;
}

void Tools::mirrorSpectrum(gsl::span<unsigned char> waveform) {
  if (waveform.size() % 4 != 0)
    throw std::invalid_argument("mirrorSpectrum(waveform): Incorrect waveform length.");
  unsigned char *bytes = waveform.data();
  for (std::size_t i = 0; i < waveform.size(); i += 4) {
    const auto q = static_cast<std::int16_t>(static_cast<std::uint16_t>(bytes[i + 2] << 8 | bytes[i + 3]));
    // -(-32768) has no 16-bit form; the nearest value stands in for it.
    const auto mirrored = static_cast<std::uint16_t>(q == std::numeric_limits<std::int16_t>::min() ? 32767 : -q);
    bytes[i + 2] = static_cast<unsigned char>(mirrored >> 8);
    bytes[i + 3] = static_cast<unsigned char>(mirrored & 0xff);
  }
}

std::vector<double> Tools::parseDoubleArray(const std::string &text, const std::string &delimiters) {
  if (text.empty())
    throw std::invalid_argument("input");
  std::vector<double> values;
  for (const std::string &piece : split(formatString(text, "+-1234567890,. Ee\t"), delimiters)) {
    double value = 0.0;
    if (!piece.empty() && tryParse(piece, value))
      values.push_back(value);
  }
  return values;
}

double Tools::calculatePeak(gsl::span<const std::complex<double>> samples) {
  return peakOf(components(samples), componentCount(samples));
}

double Tools::calculatePeak(const std::shared_ptr<std::vector<std::complex<double>>> &samples) {
  return calculatePeak(asSpan(samples));
}

double Tools::calculateRms(gsl::span<const std::complex<double>> samples) {
  if (samples.empty())
    return std::numeric_limits<double>::quiet_NaN();
  const double rms =
      std::sqrt(sumOfSquares(components(samples), componentCount(samples)) / static_cast<double>(samples.size()));
  // Callers divide by the result; silence must not make that a division by 0.
  return rms == 0.0 ? 1.0 : rms;
}

double Tools::calculateRms(const std::shared_ptr<std::vector<std::complex<double>>> &samples) {
  return calculateRms(asSpan(samples));
}

void Tools::convertToWaveform(gsl::span<const std::complex<double>> samples, gsl::span<unsigned char> bytes,
                              double scale) {
  // Only whole samples that fit into `bytes` are written.
  const std::size_t count = std::min(samples.size(), bytes.size() / 4);
  convert(components(samples), count * 2, scale * 32767.0, bytes.data());
}

std::shared_ptr<std::vector<unsigned char>> Tools::getWaveformBytes(gsl::span<const std::complex<double>> samples,
                                                                    double scale) {
  auto bytes = std::make_shared<std::vector<unsigned char>>(samples.size() * 4);
  const double peak = calculatePeak(samples);
  // Silence has no peak to scale to and stays silence.
  if (peak > 0.0)
    convertToWaveform(samples, *bytes, scale / peak);
  return bytes;
}

std::shared_ptr<std::vector<unsigned char>>
Tools::getWaveformBytes(const std::shared_ptr<std::vector<std::complex<double>>> &samples, double scale) {
  return getWaveformBytes(asSpan(samples), scale);
}

void Tools::buildMarkers(gsl::span<const std::complex<double>> samples, gsl::span<unsigned char> markers, int markerBit,
                         double threshold) {
  // A marker byte has bits 0 to 7 only.
  if (markerBit < 0 || markerBit > 7)
    return;
  const auto mask = static_cast<unsigned char>(1u << markerBit);
  unsigned char *marks = markers.data();
  const std::size_t markCount = markers.size();
  for (std::size_t i = 0; i < markCount; ++i)
    marks[i] |= mask;

  const double *values = components(samples);
  const double limit = threshold * threshold;
  std::size_t run = 0;
  for (std::size_t i = 0; i < samples.size(); ++i) {
    const double power = values[2 * i] * values[2 * i] + values[2 * i + 1] * values[2 * i + 1];
    if (limit > power) {
      ++run;
      continue;
    }
    if (run >= minimumRunLength) {
      for (std::size_t j = i - run; j < std::min(i, markCount); ++j)
        marks[j] &= static_cast<unsigned char>(~mask);
    }
    run = 0;
  }
}

void Tools::setBits(gsl::span<unsigned char> bytes, int bit, int start, int count, int value) {
  if (bit < 0 || bit > 7)
    return;
  // The range is cut to the bytes that exist, at either end.
  const auto size = static_cast<std::int64_t>(bytes.size());
  const std::int64_t end = count < 0 ? size : std::min<std::int64_t>(size, std::int64_t{start} + count);
  const std::int64_t first = std::max<std::int64_t>(0, start);
  const auto mask = static_cast<unsigned char>(1u << bit);
  unsigned char *data = bytes.data();
  for (std::int64_t i = first; i < end; ++i)
    data[i] = static_cast<unsigned char>((value & 1) != 0 ? data[i] | mask : data[i] & ~mask);
}

std::vector<std::int64_t> Tools::getPulse(const std::string &path, std::int64_t length, int bit) {
  std::vector<std::int64_t> edges;
  std::ifstream file(path, std::ios::binary | std::ios::ate);
  if (!file || bit < 0 || bit > 7)
    return edges;
  const std::int64_t size = static_cast<std::int64_t>(file.tellg());
  const std::int64_t total = std::max<std::int64_t>(0, std::min(length, size));
  file.seekg(0);
  const auto mask = static_cast<unsigned char>(1u << bit);
  std::vector<char> block(static_cast<std::size_t>(std::min<std::int64_t>(total, pulseBlockSize)));
  bool high = false;
  std::int64_t offset = 0;
  while (offset < total) {
    const auto wanted = static_cast<std::streamsize>(std::min<std::int64_t>(total - offset, pulseBlockSize));
    file.read(block.data(), wanted);
    const std::streamsize got = file.gcount();
    for (std::streamsize i = 0; i < got; ++i) {
      const bool set = (static_cast<unsigned char>(block[static_cast<std::size_t>(i)]) & mask) != 0;
      if (set != high) {
        edges.push_back(set ? offset + i : offset + i - 1);
        high = set;
      }
    }
    offset += got;
    // A file that shrank while it was read ends where its data ended.
    if (got < wanted)
      break;
  }
  if (high)
    edges.push_back(offset - 1);
  return edges;
}

} // namespace Corvane::Wavemill
