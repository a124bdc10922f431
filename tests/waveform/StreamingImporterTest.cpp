#include "wavemill/waveform/StreamingImporter2.h"

#include "support/TempDir.h"
#include "support/WaveformFiles.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <string>

using namespace Corvane::Wavemill;
using namespace Corvane::Wavemill::Testing;

namespace {

struct Importer : streamingImporter2 {
  using Importer2::lastError;
  bool openWithFileKey(const std::string &path) {
    unsigned char key[16];
    std::memcpy(key, fixedFileKey, 16); // no GetKey yet: the mask is 0
    return Open(widePath(path).c_str(), key);
  }
};

} // namespace

TEST(StreamingImporterTest, SmallReadsKeepTheSurplusAndAReadServedFromItAnswersZero) {
  TempDir dir;
  const auto iq = patternBytes(4 * 100, 4);
  writeBytes(dir.path("w.wv"), encryptWaveform(plainWaveform(patternBytes(16, 5), iq, nullptr)));
  Importer importer;
  ASSERT_TRUE(importer.openWithFileKey(dir.path("w.wv")));
  unsigned char out[400] = {};

  EXPECT_EQ(importer.GetRawIQData(out, 20), 20); // one block and a half; 4 bytes kept
  EXPECT_TRUE(std::equal(out, out + 20, iq.begin()));
  for (int again = 0; again < 2; ++again) { // served from the surplus: copied, 0, not used up
    std::memset(out, 0, 4);
    EXPECT_EQ(importer.GetRawIQData(out, 4), 0);
    EXPECT_TRUE(std::equal(out, out + 4, iq.begin() + 20));
  }
  EXPECT_EQ(importer.GetRawIQData(out, 16), 16); // surplus first, then the file
  EXPECT_TRUE(std::equal(out, out + 16, iq.begin() + 20));
  // 20 + 4 + 4 + 16 bytes were counted, so a large request is cut to 356.
  EXPECT_EQ(importer.GetRawIQData(out, 400), 356);
  EXPECT_TRUE(std::equal(out, out + 356 - 4, iq.begin() + 36));
  EXPECT_EQ(importer.GetRawIQData(out, 400), 0);

  Importer fresh;
  ASSERT_TRUE(fresh.openWithFileKey(dir.path("w.wv")));
  EXPECT_EQ(fresh.GetRawIQData(out, 3), 3);
  EXPECT_TRUE(std::equal(out, out + 3, iq.begin()));
}

TEST(StreamingImporterTest, FilesOfEveryShapeOpenAsTheirBytesSay) {
  TempDir dir;
  const auto header = patternBytes(40, 6);
  const auto iq = patternBytes(4 * 50, 7);
  const auto longMarkers = patternBytes(90, 8);
  const Bytes none;
  struct Row {
    const char *name;
    Bytes file;
    bool opens;
    long long samples;
    int headerLength;
    int formatFlag;
    long long markerBytes;
  } rows[] = {
      {"plain", encryptWaveform(plainWaveform(header, iq, &longMarkers)), true, 50, 40, 0, 50},
      {"floating IQ", encryptWaveform(plainWaveform(header, iq, &none, 4)), true, 25, 40, 1, 25},
      {"zero samples", encryptWaveform(plainWaveform(patternBytes(16, 9), none, &none)), true, 0, 16, 0, 0},
      {"header past 1024 bytes", encryptWaveform(plainWaveform(patternBytes(1100, 10), iq, &none)), true, 0, -1, 0, 0},
      {"shorter than the head", patternBytes(20, 11), true, 0, -1, 0, 0},
      {"empty", none, false, 0, -1, 0, 0},
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(row.name);
    writeBytes(dir.path("w.wv"), row.file);
    Importer importer;
    EXPECT_EQ(importer.openWithFileKey(dir.path("w.wv")), row.opens);
    EXPECT_EQ(importer.GetIQDataLen(), row.samples);
    EXPECT_EQ(importer.GetHeaderLength(), row.headerLength);
    EXPECT_EQ(importer.GetWavformFormatFlag(), row.formatFlag);
    Bytes buffer(4096);
    EXPECT_EQ(importer.GetMarkers(buffer.data(), 4096), row.markerBytes); // cut to the samples
    EXPECT_EQ(importer.GetRawIQData(buffer.data(), 4096), row.samples * (row.formatFlag == 1 ? 8 : 4));
  }
}

TEST(StreamingImporterTest, KeysMaskedAtRunTimeOpenAndAWrongKeyReadsNoHeader) {
  TempDir dir;
  const auto header = patternBytes(64, 12);
  writeBytes(dir.path("w.wv"), encryptWaveform(plainWaveform(header, patternBytes(400, 13), nullptr)));
  const auto path = widePath(dir.path("w.wv"));

  Importer masked;
  const unsigned int mask = masked.GetKey();
  unsigned char key[16];
  for (int n = 0; n < 16; ++n) {
    key[n] = fixedFileKey[n] ^ static_cast<unsigned char>(mask >> (8 * (n % 4)));
  }
  ASSERT_TRUE(masked.Open(path.c_str(), key));
  EXPECT_EQ(masked.GetIQDataLen(), 100);
  EXPECT_TRUE(std::equal(key, key + 16, fixedFileKey)); // unmasked in place

  Importer wrong;
  unsigned char wrongKey[16] = {};
  EXPECT_TRUE(wrong.Open(path.c_str(), wrongKey));
  EXPECT_EQ(wrong.GetHeaderLength(), -1);
  EXPECT_STREQ(wrong.lastError(), "Error: Invalid Waveform data and waveform information");
}

TEST(StreamingImporterTest, AFileEndingInsideTheIqThrowsMinusOneAndMissingMarkersReadAsZero) {
  TempDir dir;
  const auto markers = patternBytes(1000, 14);
  auto file = encryptWaveform(plainWaveform(patternBytes(16, 15), patternBytes(4000, 16), &markers));
  file.resize(file.size() - 500); // into the marker package
  writeBytes(dir.path("m.wv"), file);
  Importer importer;
  ASSERT_TRUE(importer.openWithFileKey(dir.path("m.wv")));
  Bytes out(1000);
  EXPECT_EQ(importer.GetMarkers(out.data(), 1000), 1000);
  EXPECT_TRUE(std::equal(out.begin(), out.begin() + 488, markers.begin()));
  EXPECT_TRUE(std::all_of(out.begin() + 488, out.end(), [](unsigned char b) { return b == 0; }));

  file.resize(2000); // into the IQ package
  writeBytes(dir.path("i.wv"), file);
  ASSERT_TRUE(importer.openWithFileKey(dir.path("i.wv")));
  Bytes iq(4000);
  EXPECT_THROW(importer.GetRawIQData(iq.data(), 4000), int);
}
