#include "wavemill/waveform/Exporter2.h"
#include "wavemill/waveform/StreamingExporter2.h"
#include "wavemill/waveform/StreamingImporter2.h"

#include "support/TempDir.h"
#include "support/WaveformFiles.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstdlib>
#include <ctime>
#include <filesystem>
#include <fstream>
#include <memory>

using namespace Corvane::Wavemill;
using namespace Corvane::Wavemill::Testing;
namespace fs = std::filesystem;

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

enum class Feed { Stream, Pairs, FloatPairs };

std::unique_ptr<Exporter2> exporterFor(bool floating, const std::string &path, Bytes &header, int headerLen) {
  if (floating) {
    return std::make_unique<streamingFloatExporter2>(path, header.data(), headerLen);
  }
  return std::make_unique<streamingExporter2>(path, header.data(), headerLen);
}

} // namespace

TEST(Exporter2Test, FileHoldsHeadHeaderIqAndMarkerPackagesByteForByte) {
  // An odd header, an odd count of samples with the peak in the last, and
  // more marker channels than the 4 a sample keeps.
  TempDir dir;
  const Bytes h = patternBytes(23, 5);
  double i[] = {0.5, 0.0, 1.0}, q[] = {0.0, -0.25, 0.0};
  unsigned char markers[] = {0, 0, 0, 2, 9, 9, 1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 5, 5};
  const std::time_t before = std::time(nullptr);
  WholeExporter exporter(dir.path("w.wv"), const_cast<unsigned char *>(h.data()), 23);
  EXPECT_TRUE(exporter.setData(i, q, markers, 3, 6));
  const std::time_t after = std::time(nullptr);
  const Bytes iq = {0x40, 0x00, 0x00, 0x00, 0x00, 0x00, 0xe0, 0x00, 0x7f, 0xff, 0x00, 0x00}, packed = {0x08, 0x01, 0};
  const Bytes plain = expectWaveform(dir.path("w.wv"), h, iq, &packed);
  ASSERT_GE(plain.size(), 32u);
  EXPECT_TRUE(saltOfTime(&plain[8], before, after));
  EXPECT_TRUE(saltOfTime(&plain[24], before, after));
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
  EXPECT_EQ(fs::file_size(dir.path("w.wv")), 0u);
  // The raw form, which the streaming exporters fill, takes bytes as they are.
  EXPECT_TRUE(exporter.convertData(markers, nullptr, 2));
  EXPECT_FALSE(exporter.convertData(nullptr, markers, 2));
  EXPECT_FALSE(exporter.convertData(markers, markers, -1));
  EXPECT_FALSE(exporter.convertData(markers, markers, 1 << 29));

  EXPECT_TRUE(exporter.setData(i, q, markers, 6, 3));
  const Bytes written = readBytes(dir.path("w.wv"));
  EXPECT_FALSE(exporter.setData(i, q, markers, 6, 3)); // one waveform per exporter
  EXPECT_EQ(readBytes(dir.path("w.wv")), written);
  const Bytes iq = {0x7f, 0xff, 0x00, 0x00, 0x80, 0x01, 0x40, 0x00, 0x40, 0x00, 0xc0, 0x00,
                    0x20, 0x00, 0x00, 0x00, 0x00, 0x00, 0x00, 0x00, 0x00, 0x00, 0x00, 0x00};
  const Bytes packed = {0x05, 0x06, 0x00, 0x00, 0x00, 0x01};
  expectWaveform(dir.path("w.wv"), h, iq, &packed); // 1 -> 32767, -1 -> -32767, 0.5 -> 16384, NaN -> 0

  double zeros[2] = {0.0, 0.0};
  WholeExporter silent(dir.path("zero.wv"), h.data(), 16);
  EXPECT_TRUE(silent.setData(zeros, zeros, nullptr, 2, 0));
  const Bytes noMarkers(2, 0);
  expectWaveform(dir.path("zero.wv"), h, Bytes(8, 0), &noMarkers);
}

TEST(Exporter2Test, AFailedWriteIsReportedAndLeavesNoFileAndShortHeaderIsPadded) {
  TempDir dir;
  Bytes h = patternBytes(16, 5);
  std::vector<double> v(52'500, 1.0);
  // A full device takes the file head but no data. 52500 samples make a
  // file a little over the 256 KiB stdio buffer: one write fails and the
  // closing flush, with nothing left to write, succeeds; 1 sample fails
  // only in the closing flush.
  const std::pair<std::string, int> rows[] = {{dir.root(), 1}, {"/dev/full", 1}, {"/dev/full", 52'500}};
  for (const auto &[target, samples] : rows) {
    SCOPED_TRACE(target + ", samples " + std::to_string(samples));
    WholeExporter exporter(target, h.data(), 16);
    EXPECT_EQ(exporter.failed(), target != "/dev/full");
    EXPECT_TRUE(exporter.setData(v.data(), v.data(), nullptr, samples, 0));
    EXPECT_TRUE(exporter.failed());
  }
  EXPECT_TRUE(fs::is_directory(dir.root()));

  WholeExporter shortHeader(dir.path("s.wv"), h.data(), 5); // and no samples, which need no arrays
  EXPECT_TRUE(shortHeader.setData(nullptr, nullptr, nullptr, 0, 0));
  const Bytes none;
  expectWaveform(dir.path("s.wv"), Bytes({h[0], h[1], h[2], h[3], h[4], 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0}), {}, &none);
}

TEST(StreamingExporterTest, ChunksOfAnySizeJoinIntoOnePackageEachAndReadBack) {
  constexpr int mebi = (1 << 20) / 4; // samples of 1 MiB of 16-bit IQ
  struct Row {
    const char *name;
    Feed feed;
    int samples;
    std::vector<int> chunks;
  } rows[] = {{"one chunk, first and last", Feed::Stream, 5, {5}},
              {"30, 30, 40 hold back 8 bytes once", Feed::Stream, 100, {30, 30, 40}},
              {"chunks of 1 sample", Feed::Stream, 300, {1}},
              {"pairs of 7 samples", Feed::Pairs, 50, {7}},
              {"float pairs of 1 sample", Feed::FloatPairs, 300, {1}},
              {"chunks of 1 MiB", Feed::Stream, 655'360, {mebi}},
              // at least 10^7 samples once, with markers
              {"10^7 samples in chunks of 1 MiB", Feed::Stream, 10'000'000, {mebi}}};
  Bytes header = patternBytes(200, 51);
  // Each row writes its samples in chunks of the sizes given (the last one
  // repeated): through stream(), or streamiq() and streammarker() in pairs
  // and then stop().
  for (const Row &row : rows) {
    SCOPED_TRACE(row.name);
    TempDir dir;
    const auto path = dir.path("w.wv");
    const bool floating = row.feed == Feed::FloatPairs;
    const std::size_t width = floating ? 8 : 4, total = static_cast<std::size_t>(row.samples);
    Bytes sentIq = patternBytes(width * total, 52), sentMarkers = patternBytes(total, 53);
    auto exporter = exporterFor(floating, path, header, 200);
    EXPECT_TRUE(exporter->start(row.samples, true));
    for (std::size_t at = 0, k = 0; at < total; ++k) {
      const auto chunk = static_cast<std::size_t>(row.chunks[std::min(k, row.chunks.size() - 1)]);
      const auto n = std::min(chunk, total - at);
      if (row.feed == Feed::Stream) {
        EXPECT_TRUE(exporter->stream(&sentIq[at * 4], &sentMarkers[at], static_cast<int>(n), at + n == total));
      } else {
        EXPECT_TRUE(exporter->streamiq(&sentIq[at * width], static_cast<int>(n * width)));
        EXPECT_TRUE(exporter->streammarker(&sentMarkers[at], static_cast<int>(n)));
      }
      at += n;
    }
    if (row.feed != Feed::Stream) {
      exporter->stop();
    }
    EXPECT_FALSE(exporter->failed());
    if (row.samples <= 1'000'000) { // the largest file only reads back
      expectWaveform(path, header, sentIq, &sentMarkers, floating ? 4 : 2);
    }
    EXPECT_FALSE(fs::exists(path + "_mkr"));

    streamingImporter2 importer;
    ASSERT_TRUE(importer.Open(widePath(path).c_str()));
    EXPECT_EQ(importer.GetIQDataLen(), row.samples);
    Bytes iq(sentIq.size()), markers(sentMarkers.size());
    EXPECT_EQ(importer.GetRawIQData(iq.data(), static_cast<int>(iq.size())), static_cast<int>(iq.size()));
    EXPECT_EQ(importer.GetMarkers(markers.data(), row.samples), row.samples);
    EXPECT_TRUE(iq == sentIq);
    EXPECT_TRUE(markers == sentMarkers);
  }
}

TEST(StreamingExporterTest, RunsOutOfOrderGiveTheirOwnResultsAndFiles) {
  TempDir dir;
  Bytes h = patternBytes(16, 1), iq = patternBytes(64, 2), m = patternBytes(16, 3);
  const std::string target = dir.path("w.wv");
  {
    streamingExporter2 e(target, h.data(), 16);
    EXPECT_FALSE(e.stream(iq.data(), m.data(), 4, true)); // before start
    EXPECT_TRUE(e.start(16, false));
    EXPECT_FALSE(e.start(16, false));
    EXPECT_FALSE(e.stream(nullptr, m.data(), 4, false));
    EXPECT_FALSE(e.stream(iq.data(), m.data(), -1, false));
    EXPECT_FALSE(e.streamiq(nullptr, 8));
    EXPECT_FALSE(e.streammarker(m.data(), -2));
    EXPECT_EQ(fs::file_size(target), 0u);
    EXPECT_TRUE(e.streamiq(iq.data(), 64)); // IQ alone: no marker package
    EXPECT_TRUE(e.streamiq(nullptr, 0));    // an empty chunk needs no bytes
    e.stop();
    expectWaveform(target, h, iq, nullptr);
  }
  {
    const Bytes empty;
    streamingExporter2 e(target, h.data(), 16); // a zero-length waveform
    EXPECT_TRUE(e.start(0, true));
    EXPECT_TRUE(e.stream(nullptr, nullptr, 0, true));
    expectWaveform(target, h, {}, &empty);
  }
  {
    streamingExporter2 e(target, h.data(), 16); // more markers than samples
    EXPECT_TRUE(e.start(4, true));
    EXPECT_TRUE(e.streamiq(iq.data(), 16));
    EXPECT_TRUE(e.streammarker(m.data(), 10));
    EXPECT_TRUE(e.streammarker(nullptr, 0));
    e.stop();
    Bytes plain = plainWaveform(h, Bytes(iq.begin(), iq.begin() + 16), nullptr);
    appendPackage(plain, 3, Bytes(m.begin(), m.begin() + 10), 4); // as declared; the 10 bytes follow
    expectPlainWaveform(target, plain);
  }
  for (bool isFloat : {false, true}) { // an old marker file of an aborted run
    SCOPED_TRACE(isFloat ? "float" : "integer");
    std::ofstream(target + "_mkr", std::ios::binary) << std::string(16, 'x');
    auto e = exporterFor(isFloat, target, h, 16);
    EXPECT_TRUE(e->start(4, true));
    EXPECT_TRUE(e->stream(iq.data(), m.data(), 4, true));
    EXPECT_EQ(fs::file_size(target), 32u + 16 + 32 + 16 + (isFloat ? 0 : 16));
    EXPECT_FALSE(fs::exists(target + "_mkr"));
  }
  {
    streamingExporter2 e(target, h.data(), 16); // unknown length writes no chunk
    EXPECT_TRUE(e.start(true));
    EXPECT_FALSE(e.start(true));
    EXPECT_TRUE(e.stream(iq.data(), m.data(), 4, false));
    EXPECT_TRUE(e.streammarker(m.data(), 16));
    EXPECT_EQ(fs::file_size(target + "_tmp"), 1u + 16 + 4 + 16); // raw: count text, IQ, markers; more markers
    EXPECT_TRUE(e.stream(iq.data(), m.data(), 4, true));
    EXPECT_EQ(fs::file_size(target), 0u);
    EXPECT_FALSE(fs::exists(target + "_tmp"));
  }
}

TEST(StreamingExporterTest, UnwritableTargetLeavesNoFilesBehind) {
  TempDir dir;
  Bytes h = patternBytes(16, 1), iq = patternBytes(64, 2), m = patternBytes(16, 3);
  // A folder as the target: an unknown-length run writes no raw file beside it.
  fs::create_directory(dir.path("folder"));
  {
    streamingExporter2 e(dir.path("folder"), h.data(), 16);
    EXPECT_TRUE(e.start(true));
    EXPECT_TRUE(e.streamiq(iq.data(), 64));
    EXPECT_TRUE(e.streammarker(m.data(), 16));
    EXPECT_TRUE(e.failed());
    EXPECT_FALSE(fs::exists(dir.path("folder_tmp")));
  }
  // The target can be written but its marker file cannot: the target goes.
  fs::create_directory(dir.path("w.wv_mkr"));
  streamingExporter2 e(dir.path("w.wv"), h.data(), 16);
  EXPECT_TRUE(e.start(8, true));
  EXPECT_TRUE(e.stream(iq.data(), m.data(), 8, true));
  EXPECT_TRUE(e.failed());
  EXPECT_FALSE(fs::exists(dir.path("w.wv")));
}
