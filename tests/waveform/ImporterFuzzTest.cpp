#include "wavemill/waveform/StreamingImporter2.h"

#include "support/TempDir.h"
#include "support/WaveformFiles.h"

#include <gtest/gtest.h>

#include <random>
#include <string>
#include <vector>

using namespace Corvane::Wavemill;
using namespace Corvane::Wavemill::Testing;

namespace {

// Opens `bytes` as a waveform file and reads everything it claims, checking
// what any file must give: a header no longer than the 1024 bytes Open
// reads, no more data than the file holds, an end that comes. IQ reads
// that run past the end throw the int -1; that ends the IQ, not the test.
void readAndCheck(const TempDir &dir, const Bytes &bytes, bool decoded) {
  const auto path = dir.path("f.wv");
  writeBytes(path, bytes);
  streamingImporter2 importer;
  const bool opened = importer.Open(widePath(path).c_str());
  EXPECT_EQ(opened, !bytes.empty());
  EXPECT_GE(importer.GetIQDataLen(), 0);
  const int headerLength = importer.GetHeaderLength();
  EXPECT_LE(headerLength, 1024 + 16);
  if (headerLength >= 16) {
    Bytes header(static_cast<std::size_t>(headerLength));
    EXPECT_EQ(importer.GetHeader(header.data(), headerLength), headerLength);
  }
  Bytes buffer(4096);
  std::vector<double> i(1024), q(1024);
  std::size_t delivered = 0;
  int reads = 0;
  try {
    for (int got = 1; got > 0 && reads < 1000; ++reads) {
      got = decoded ? 4 * importer.GetIQData(i.data(), q.data(), 1024) : importer.GetRawIQData(buffer.data(), 4096);
      delivered += static_cast<std::size_t>(got);
    }
  } catch (int code) {
    EXPECT_EQ(code, -1);
  }
  for (int got = 1; got > 0 && reads < 2000; ++reads) {
    got = importer.GetMarkers(buffer.data(), 4096);
    delivered += static_cast<std::size_t>(got);
  }
  EXPECT_LT(reads, 2000) << "the reads never came to an end";
  EXPECT_LE(delivered, bytes.size() + 4096);
}

} // namespace

TEST(ImporterFuzzTest, DamagedFilesOpenAndReadWithoutFaultAndWithinTheirSize) {
  TempDir dir;
  const auto header = patternBytes(40, 41);
  const auto iq = patternBytes(4 * 64, 42);
  const auto markers = patternBytes(64, 43);
  const auto plain = plainWaveform(header, iq, &markers);
  const auto file = encryptWaveform(plain);
  std::mt19937 random(20240611);

  // A flipped byte at every offset: the head (a wrong key), the header
  // package, the prefixes, the bodies and the padding.
  for (std::size_t at = 0; at < file.size(); ++at) {
    SCOPED_TRACE("flip at " + std::to_string(at));
    auto damaged = file;
    damaged[at] ^= static_cast<unsigned char>(1 + random() % 255);
    readAndCheck(dir, damaged, at % 3 == 0);
  }
  // Cut at every block boundary, and one byte past each.
  for (std::size_t size = 0; size <= file.size(); size += 16) {
    for (std::size_t cut : {size, size + 1}) {
      SCOPED_TRACE("cut at " + std::to_string(cut));
      readAndCheck(dir, Bytes(file.begin(), file.begin() + static_cast<std::ptrdiff_t>(std::min(cut, file.size()))),
                   false);
    }
  }
  // Length words claiming more (or far more) than the file holds, or less.
  const std::size_t lengthWords[] = {32 + 4, 64 + 4, 336 + 4}; // header, IQ, markers
  for (std::size_t word : lengthWords) {
    for (std::uint32_t claim : {0u, 1u, 17u, 5000u, 0x7fffffffu, 0xffffffffu}) {
      SCOPED_TRACE("length " + std::to_string(claim) + " at " + std::to_string(word));
      auto lying = plain;
      for (int n = 0; n < 4; ++n) {
        lying[word + n] = static_cast<unsigned char>(claim >> (24 - 8 * n));
      }
      readAndCheck(dir, encryptWaveform(lying), claim % 2 == 1);
    }
  }
  // Files of another format: random bytes of sizes around the first read.
  for (std::size_t size : {1, 31, 32, 48, 1023, 1024, 1025, 5000}) {
    SCOPED_TRACE("random bytes: " + std::to_string(size));
    Bytes other(size);
    for (auto &b : other) {
      b = static_cast<unsigned char>(random());
    }
    readAndCheck(dir, other, size % 2 == 0);
  }
}
