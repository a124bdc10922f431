#include "wavemill/waveform/StreamingExporter2.h"

#include "support/TempDir.h"
#include "support/WaveformFile.h"

#include <gtest/gtest.h>
#include <openssl/evp.h>
#include <openssl/sha.h>

#include <filesystem>
#include <fstream>
#include <memory>

using namespace Corvane::Wavemill;
using namespace Corvane::Wavemill::Testing;
namespace fs = std::filesystem;

namespace {

Bytes noise(std::size_t n, unsigned seed) {
  Bytes b(n);
  for (auto &x : b) {
    seed = seed * 1103515245u + 12345u;
    x = static_cast<unsigned char>(seed >> 16);
  }
  return b;
}

std::size_t pad(std::size_t n) { return (n + 15) / 16 * 16; }

enum class Feed { Stream, Pairs, FloatPairs };

// Writes `samples` samples of IQ and markers in the chunk sizes given (the
// last repeated), and returns the IQ and marker bytes sent.
std::pair<Bytes, Bytes> exportInChunks(const std::string &path, Feed feed, int samples, std::vector<int> chunks) {
  Bytes h = noise(40, 1);
  std::unique_ptr<Exporter2> exporter;
  if (feed == Feed::FloatPairs) {
    exporter = std::make_unique<streamingFloatExporter2>(path, h.data(), 40);
  } else {
    exporter = std::make_unique<streamingExporter2>(path, h.data(), 40);
  }
  const std::size_t width = feed == Feed::FloatPairs ? 8 : 4;
  Bytes iq = noise(width * static_cast<std::size_t>(samples), 2);
  Bytes markers = noise(static_cast<std::size_t>(samples), 3);
  EXPECT_TRUE(exporter->start(samples, true));
  for (std::size_t at = 0, k = 0; at < markers.size(); ++k) {
    const auto n =
        std::min<std::size_t>(static_cast<std::size_t>(chunks[std::min(k, chunks.size() - 1)]), markers.size() - at);
    const bool last = at + n == markers.size();
    if (feed == Feed::Stream) {
      EXPECT_TRUE(exporter->stream(&iq[at * 4], &markers[at], static_cast<int>(n), last));
    } else {
      EXPECT_TRUE(exporter->streamiq(&iq[at * width], static_cast<int>(n * width)));
      EXPECT_TRUE(exporter->streammarker(&markers[at], static_cast<int>(n)));
    }
    at += n;
  }
  if (feed != Feed::Stream) {
    exporter->stop();
  }
  EXPECT_FALSE(exporter->failed());
  return {iq, markers};
}

void expectPackages(const WaveformFile &file, std::uint32_t iqTag, const Bytes &iq, const Bytes &markers) {
  const Bytes h = noise(40, 1);
  ASSERT_EQ(file.size, 32 + pad(8 + 24) + pad(8 + iq.size()) + pad(8 + markers.size()));
  ASSERT_EQ(file.packages.size(), 3u);
  const std::uint32_t tags[] = {1, iqTag, 3};
  const Bytes bodies[] = {Bytes(h.begin() + 16, h.end()), iq, markers};
  for (int k = 0; k < 3; ++k) {
    EXPECT_EQ(file.packages[k].tag, tags[k]);
    EXPECT_EQ(file.packages[k].length, bodies[k].size());
    EXPECT_TRUE(file.packages[k].body == bodies[k]);
    EXPECT_TRUE(file.packages[k].zeroPadded);
  }
}

} // namespace

TEST(StreamingExporterTest, ChunksOfAnySizeJoinIntoOnePackageEach) {
  struct Row {
    const char *name;
    Feed feed;
    int samples;
    std::vector<int> chunks;
  } rows[] = {{"one chunk, first and last", Feed::Stream, 5, {5}},
              {"30, 30, 40 hold back 8 bytes once", Feed::Stream, 100, {30, 30, 40}},
              {"chunks of 1 sample", Feed::Stream, 13, {1}},
              {"pairs of 7 samples", Feed::Pairs, 50, {7}},
              {"chunks of 1 MiB", Feed::Stream, 655360, {262144}},
              {"float pairs of 7 samples", Feed::FloatPairs, 20, {7}},
              {"float pairs of 1 sample", Feed::FloatPairs, 3, {1}}};
  for (const Row &row : rows) {
    SCOPED_TRACE(row.name);
    TempDir dir;
    const auto [iq, markers] = exportInChunks(dir.path("w.wv"), row.feed, row.samples, row.chunks);
    expectPackages(openWaveform(dir.path("w.wv")), row.feed == Feed::FloatPairs ? 4 : 2, iq, markers);
    EXPECT_FALSE(fs::exists(dir.path("w.wv_mkr")));
  }
}

TEST(StreamingExporterTest, RunsOutOfOrderGiveTheirOwnResultsAndFiles) {
  TempDir dir;
  Bytes h = noise(16, 1), iq = noise(64, 2), m = noise(16, 3);
  const std::string target = dir.path("w.wv");
  auto packagesOf = [&] {
    std::vector<std::pair<std::uint32_t, std::uint32_t>> tagsAndLengths;
    for (const Package &p : openWaveform(target).packages) {
      tagsAndLengths.emplace_back(p.tag, p.length);
    }
    return tagsAndLengths;
  };
  using Frames = std::vector<std::pair<std::uint32_t, std::uint32_t>>;
  {
    streamingExporter2 e(target, h.data(), 16);
    EXPECT_FALSE(e.stream(iq.data(), m.data(), 4, true)); // before start
    EXPECT_EQ(fs::file_size(target), 0u);
    EXPECT_TRUE(e.start(16, false));
    EXPECT_FALSE(e.start(16, false));
    EXPECT_FALSE(e.stream(nullptr, m.data(), 4, false));
    EXPECT_FALSE(e.stream(iq.data(), m.data(), -1, false));
    EXPECT_FALSE(e.streamiq(nullptr, 8));
    EXPECT_FALSE(e.streammarker(m.data(), -2));
    EXPECT_EQ(fs::file_size(target), 0u);
    EXPECT_TRUE(e.streamiq(iq.data(), 64)); // IQ alone: no marker package
    e.stop();
    EXPECT_EQ(packagesOf(), (Frames{{1, 0}, {2, 64}}));
  }
  {
    streamingExporter2 e(target, h.data(), 16); // a zero-length waveform
    EXPECT_TRUE(e.start(0, true));
    EXPECT_TRUE(e.stream(nullptr, nullptr, 0, true));
    EXPECT_EQ(packagesOf(), (Frames{{1, 0}, {2, 0}, {3, 0}}));
  }
  {
    streamingExporter2 e(target, h.data(), 16); // more markers than samples
    EXPECT_TRUE(e.start(4, true));
    EXPECT_TRUE(e.streamiq(iq.data(), 16));
    EXPECT_TRUE(e.streammarker(m.data(), 10));
    e.stop();
    const WaveformFile file = openWaveform(target);
    ASSERT_GE(file.packages.size(), 3u);
    EXPECT_EQ(file.packages[2].length, 4u); // as declared; the 10 bytes follow
    EXPECT_EQ(file.size, 32u + 16 + 32 + 32);
  }
  for (bool isFloat : {false, true}) { // an old marker file of an aborted run
    SCOPED_TRACE(isFloat ? "float" : "integer");
    std::ofstream(target + "_mkr", std::ios::binary) << std::string(16, 'x');
    std::unique_ptr<Exporter2> e;
    e = isFloat ? std::unique_ptr<Exporter2>(new streamingFloatExporter2(target, h.data(), 16))
                : std::unique_ptr<Exporter2>(new streamingExporter2(target, h.data(), 16));
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
    EXPECT_TRUE(e.stream(iq.data(), m.data(), 4, true));
    EXPECT_EQ(fs::file_size(target), 0u);
    EXPECT_FALSE(fs::exists(target + "_tmp"));
  }
}

TEST(StreamingExporterTest, UnwritableTargetLeavesNoFilesBehind) {
  TempDir dir;
  Bytes h = noise(16, 1), iq = noise(64, 2), m = noise(16, 3);
  {
    streamingExporter2 e(dir.path("missing/w.wv"), h.data(), 16);
    EXPECT_TRUE(e.start(8, true));
    EXPECT_TRUE(e.stream(iq.data(), m.data(), 4, false));
    EXPECT_TRUE(e.stream(iq.data(), m.data(), 4, true));
    EXPECT_TRUE(e.failed());
    EXPECT_TRUE(fs::is_empty(dir.root()));
  }
  // The target can be written but its marker file cannot: the target goes.
  fs::create_directory(dir.path("w.wv_mkr"));
  streamingExporter2 e(dir.path("w.wv"), h.data(), 16);
  EXPECT_TRUE(e.start(8, true));
  EXPECT_TRUE(e.stream(iq.data(), m.data(), 8, true));
  EXPECT_TRUE(e.failed());
  EXPECT_FALSE(fs::exists(dir.path("w.wv")));
}

TEST(StreamingExporterTest, OpenSslDecryptsTheFileToTheBodiesWritten) {
  TempDir dir;
  const auto [iq, markers] = exportInChunks(dir.path("w.wv"), Feed::Stream, 300, {7});
  auto decrypt = [](const unsigned char *key, const Bytes &cipher) {
    Bytes plain(cipher.size());
    EVP_CIPHER_CTX *ctx = EVP_CIPHER_CTX_new();
    EVP_DecryptInit_ex(ctx, EVP_aes_128_ecb(), nullptr, key, nullptr);
    EVP_CIPHER_CTX_set_padding(ctx, 0);
    int length = 0;
    EVP_DecryptUpdate(ctx, plain.data(), &length, cipher.data(), static_cast<int>(cipher.size()));
    EVP_CIPHER_CTX_free(ctx);
    plain.resize(static_cast<std::size_t>(length));
    return plain;
  };
  auto dataKey = [](const Bytes &head) {
    Bytes digest(SHA_DIGEST_LENGTH);
    SHA1(head.data(), 32, digest.data());
    digest.resize(16);
    return digest;
  };
  // The head key, spelled out here so that the check does not borrow it.
  const unsigned char headKey[16] = {0x54, 0x0a, 0x1e, 0x71, 0x2a, 0xba, 0x28, 0x70,
                                     0xe9, 0x7b, 0x16, 0x19, 0x97, 0xe2, 0x99, 0xe0};
  expectPackages(openWaveform(dir.path("w.wv"), decrypt, dataKey, headKey), 2, iq, markers);
}
