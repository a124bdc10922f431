#include "wavemill/waveform/Exporter2.h"

#include "support/TempDir.h"
#include "support/WaveformFiles.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstdlib>
#include <ctime>
#include <filesystem>

using namespace Corvane::Wavemill;
using namespace Corvane::Wavemill::Testing;

namespace {

// Exporter2 writes whole waveforms through setData; the streaming half
// belongs to its subclasses.
struct WholeExporter : Exporter2 {
  using Exporter2::convertData;
  using Exporter2::Exporter2;
  bool start(int64_t, bool) override { return false; }
  bool start(bool) override { return false; }
  void stop() override {}
  bool stream(unsigned char *, unsigned char *, int, bool) override { return false; }
  bool streamiq(unsigned char *, int) override { return false; }
  bool streammarker(unsigned char *, int) override { return false; }
};

// The salt: the low bytes of rand() after srand(t), for a t in [from, to].
bool saltOfTime(const unsigned char *salt, std::time_t from, std::time_t to) {
  for (std::time_t t = from; t <= to; ++t) {
    std::srand(static_cast<unsigned int>(t));
    bool same = true;
    for (int k = 0; k < 8; ++k) {
      same = (salt[k] == static_cast<unsigned char>(std::rand() & 0xff)) && same;
    }
    if (same) {
      return true;
    }
  }
  return false;
}

} // namespace

TEST(Exporter2Test, FileHoldsHeadHeaderIqAndMarkerPackagesByteForByte) {
  struct Row {
    int headerLen, samples, markerCount;
  } rows[] = {{16, 0, 0}, {23, 17, 6}, {100, 1000, 4}};
  for (const Row &row : rows) {
    SCOPED_TRACE("header " + std::to_string(row.headerLen) + ", samples " + std::to_string(row.samples));
    TempDir dir;
    const Bytes h = patternBytes(static_cast<std::size_t>(row.headerLen), 5);
    const auto n = static_cast<std::size_t>(row.samples), channels = static_cast<std::size_t>(row.markerCount);
    std::vector<double> i(n), q(n);
    Bytes markers(n * channels), iq, packed(n);
    double peak = 0;
    for (std::size_t s = 0; s < n; ++s) {
      i[s] = std::sin(0.1 * static_cast<double>(s)) * 0.3;
      q[s] = std::cos(0.1 * static_cast<double>(s)) * 0.2;
      peak = std::max({peak, std::fabs(i[s]), std::fabs(q[s])});
    }
    for (std::size_t k = 0; k < markers.size(); ++k) {
      markers[k] = static_cast<unsigned char>(k % 3 == 0 ? 0 : k);
    }
    for (std::size_t s = 0; s < n; ++s) {
      for (double v : {i[s] / peak, q[s] / peak}) {
        const auto word = static_cast<std::uint16_t>(static_cast<std::int16_t>(std::lround(v * 32767.0)));
        iq.insert(iq.end(), {static_cast<unsigned char>(word >> 8), static_cast<unsigned char>(word)});
      }
      for (std::size_t c = 0; c < 4 && c < channels; ++c) {
        packed[s] |= markers[s * channels + c] != 0 ? 1 << c : 0;
      }
    }
    const std::time_t before = std::time(nullptr);
    WholeExporter exporter(dir.path("w.wv"), const_cast<unsigned char *>(h.data()), row.headerLen);
    EXPECT_TRUE(exporter.setData(i.data(), q.data(), markers.data(), row.samples, row.markerCount));
    const std::time_t after = std::time(nullptr);
    const WaveformFile file = expectWaveform(dir.path("w.wv"), h, iq, packed);
    ASSERT_EQ(file.head.size(), 32u);
    EXPECT_TRUE(saltOfTime(&file.head[8], before, after));
    EXPECT_TRUE(saltOfTime(&file.head[24], before, after));
  }
}

TEST(Exporter2Test, SamplesRoundToSixteenBitsAndBadInputIsRefused) {
  TempDir dir;
  Bytes h = patternBytes(16, 5);
  WholeExporter exporter(dir.path("w.wv"), h.data(), 16);
  double i[] = {2.0, -2.0, 1.0, 0.5, NAN, 0.0};
  double q[] = {0.0, 1.0, -1.0, 0.00001, 0.0, -0.0};
  unsigned char markers[] = {1, 0, 1, 0, 9, 9, 0, 0, 0, 0, 0, 0, 0, 0, 0, 1, 0, 0};
  EXPECT_FALSE(exporter.setData(nullptr, q, nullptr, 6, 0));
  EXPECT_FALSE(exporter.setData(i, q, nullptr, 6, 3));
  EXPECT_FALSE(exporter.setData(i, q, nullptr, -1, 0));
  EXPECT_FALSE(exporter.setData(i, q, nullptr, 1 << 29, 0));
  EXPECT_EQ(std::filesystem::file_size(dir.path("w.wv")), 0u);
  // The raw form, which the streaming exporters fill, takes bytes as they are.
  EXPECT_TRUE(exporter.convertData(markers, nullptr, 2));
  EXPECT_FALSE(exporter.convertData(nullptr, markers, 2));
  EXPECT_FALSE(exporter.convertData(markers, markers, -1));
  EXPECT_FALSE(exporter.convertData(markers, markers, 1 << 29));

  EXPECT_TRUE(exporter.setData(i, q, markers, 6, 3));
  const Bytes written = readBytes(dir.path("w.wv"));
  EXPECT_FALSE(exporter.setData(i, q, markers, 6, 3)); // one waveform per exporter
  EXPECT_EQ(readBytes(dir.path("w.wv")), written);
  const WaveformFile file = openWaveform(dir.path("w.wv"));
  ASSERT_EQ(file.packages.size(), 3u);
  const Bytes iq = {0x7f, 0xff, 0x00, 0x00, 0x80, 0x01, 0x40, 0x00, 0x40, 0x00, 0xc0, 0x00,
                    0x20, 0x00, 0x00, 0x00, 0x00, 0x00, 0x00, 0x00, 0x00, 0x00, 0x00, 0x00};
  EXPECT_EQ(file.packages[1].body, iq); // 1 -> 32767, -1 -> -32767, 0.5 -> 16384, NaN -> 0
  EXPECT_EQ(file.packages[2].body, Bytes({0x05, 0x06, 0x00, 0x00, 0x00, 0x01}));

  double zeros[2] = {0.0, 0.0};
  WholeExporter silent(dir.path("zero.wv"), h.data(), 16);
  EXPECT_TRUE(silent.setData(zeros, zeros, nullptr, 2, 0));
  EXPECT_EQ(openWaveform(dir.path("zero.wv")).packages[1].body, Bytes(8, 0));
}

TEST(Exporter2Test, AFailedWriteIsReportedAndLeavesNoFileAndShortHeaderIsPadded) {
  TempDir dir;
  Bytes h = patternBytes(16, 5);
  std::vector<double> v(52'500, 1.0);
  // A full device takes the file head but no data. 52500 samples make a
  // file a little over the 256 KiB stdio buffer: one write fails and the
  // closing flush, with nothing left to write, succeeds; 1 sample fails
  // only in the closing flush.
  const std::pair<std::string, int> rows[] = {
      {dir.path("missing/w.wv"), 1}, {dir.root(), 1}, {"/dev/full", 1}, {"/dev/full", 52'500}};
  for (const auto &[target, samples] : rows) {
    SCOPED_TRACE(target + ", samples " + std::to_string(samples));
    WholeExporter exporter(target, h.data(), 16);
    EXPECT_EQ(exporter.failed(), target != "/dev/full");
    EXPECT_TRUE(exporter.setData(v.data(), v.data(), nullptr, samples, 0));
    EXPECT_TRUE(exporter.failed());
    EXPECT_FALSE(std::filesystem::exists(dir.path("missing")));
  }
  EXPECT_TRUE(std::filesystem::is_directory(dir.root()));

  WholeExporter shortHeader(dir.path("s.wv"), h.data(), 5);
  EXPECT_TRUE(shortHeader.setData(v.data(), v.data(), nullptr, 1, 0));
  const WaveformFile file = openWaveform(dir.path("s.wv"));
  EXPECT_EQ(Bytes(file.head.begin(), file.head.begin() + 8), Bytes({h[0], h[1], h[2], h[3], h[4], 0, 0, 0}));
  ASSERT_EQ(file.packages.size(), 3u);
  EXPECT_EQ(file.packages[0].length, 0u);
}
