#include "wavemill/waveform/StreamingImporter2.h"

#include "support/TempDir.h"
#include "support/WaveformFiles.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <functional>
#include <string>

using namespace Corvane::Wavemill;
using namespace Corvane::Wavemill::Testing;

namespace {

// Open(path) masks the file key with GetKey and the decrypter unmasks it.
struct Importer : streamingImporter2 {
  using Importer2::lastError;
  bool open(const std::string &path) { return Open(widePath(path).c_str()); }
};

// Holds the whole file in memory, as a subclass may: one pass of the
// decrypter over all its bytes, after which the base getters serve it.
struct WholeImporter : Importer2 {
  int load(const std::string &path) {
    Bytes file = readBytes(path);
    unsigned char key[16];
    std::memcpy(key, fixedFileKey, 16);
    EXPECT_TRUE(openInit(widePath(path).c_str()));
    const int used = runDecrypter(file.data(), static_cast<int>(file.size()), key);
    flush();
    saveDecryptedData(); // no prefix follows the last package to store it
    return used;
  }
};

// 40 header bytes, 1000 samples and their markers.
struct ImporterTest : testing::Test {
  TempDir dir;
  const Bytes header = patternBytes(40, 22), iq = patternBytes(4000, 23), markers = patternBytes(1000, 24);
  const std::string file = dir.path("w.wv");
  void SetUp() override { writeBytes(file, encryptWaveform(plainWaveform(header, iq, &markers))); }
};

} // namespace

TEST_F(ImporterTest, SamplesReadBackAsBigEndianSixteenBitValuesOverFullScale) {
  Importer importer;
  ASSERT_TRUE(importer.open(file));
  std::vector<double> i(1000), q(1000);
  ASSERT_EQ(importer.GetIQData(i.data(), q.data(), 1000), 1000);
  for (std::size_t n = 0; n < 1000; ++n) {
    ASSERT_EQ(i[n], static_cast<std::int16_t>(iq[4 * n] << 8 | iq[4 * n + 1]) / 32767.0) << n;
    ASSERT_EQ(q[n], static_cast<std::int16_t>(iq[4 * n + 2] << 8 | iq[4 * n + 3]) / 32767.0) << n;
  }
}

TEST_F(ImporterTest, AFileDecryptedInOnePassIsServedFromMemoryWithMarkersUnpackedToBits) {
  WholeImporter importer;
  EXPECT_EQ(importer.load(file), static_cast<int>(readBytes(file).size())); // far more than the staging area
  Bytes got(4004, 0xee);
  EXPECT_EQ(importer.GetHeader(got.data(), 40), 40);
  EXPECT_TRUE(std::equal(header.begin(), header.end(), got.begin()));
  EXPECT_EQ(importer.GetRawIQData(got.data(), 4000), 4000);
  EXPECT_TRUE(std::equal(iq.begin(), iq.end(), got.begin()));
  EXPECT_EQ(importer.GetDataPtr(got.data(), 0), 0);
  EXPECT_EQ(importer.GetDataPtr(got.data(), 5000), 4000);
  EXPECT_EQ(importer.GetRawMarkers(got.data(), 1000), 1000);
  EXPECT_TRUE(std::equal(markers.begin(), markers.end(), got.begin()));
  std::fill(got.begin(), got.end(), 0xee);
  EXPECT_EQ(importer.GetMarkers(got.data(), 1000), 1000);
  for (std::size_t n = 0; n < 4000; ++n) {
    ASSERT_EQ(got[n], (markers[n / 4] >> (n % 4)) & 1) << n;
  }
  EXPECT_EQ(Bytes(got.begin() + 4000, got.end()), Bytes(4, 0xee)); // nothing past the 4 bytes a sample
}

TEST_F(ImporterTest, EveryRefusalAnswersItsResultAndMessage) {
  const auto path = widePath(file);
  const std::string invalid = "Error: Invalid Waveform data and waveform information";
  unsigned char buffer[4096];
  double values[1000];
  auto markersPerSample = [](Importer &m) {
    int count = -5;
    return m.GetNMarker(count) ? count : -5;
  };
  struct Row {
    const char *name;
    bool open;
    std::function<long long(Importer &)> call;
    long long result;
    std::string message;
  };
#define CALL(...) [&](Importer &m) -> long long { return __VA_ARGS__; }
  const Row rows[] = {
      {"header length before Open", false, CALL(m.GetHeaderLength()), -1, invalid},
      {"samples before Open", false, CALL(m.GetIQDataLen()), 0, invalid},
      {"markers per sample before Open", false, markersPerSample, -5, invalid},
      {"IQ before Open", false, CALL(m.GetRawIQData(buffer, 16)), 0, invalid},
      {"header before Open", false, CALL(m.GetHeader(buffer, 40)), 0, invalid},
      {"the base class opens nothing", false, CALL(m.Importer2::Open(path.c_str(), buffer)), 0, ""},
      {"a missing file", false, CALL(m.Open((path + L"x").c_str())), 0, "Failed to open the file."},
      {"header of the wrong size", true, CALL(m.GetHeader(buffer, 30)), 0,
       "Error: Incorrect size of header data: total size24 size requested 30"},
      {"whole IQ of the wrong size", true, CALL(m.Importer2::GetRawIQData(buffer, 3996)), 0,
       "Error: Incorrect buffer size: need buffer size 4000, input buffer size 3996"},
      {"decoded IQ of the wrong count", true, CALL(m.Importer2::GetIQData(values, values, 999)), 0,
       "Error: Incorrect buffer size: need buffer size 1000, input buffer size 999"},
      {"decoded IQ of the right count, none held", true, CALL(m.Importer2::GetIQData(values, values, 1000)), 0, ""},
      {"unpacked markers of the wrong count", true, CALL(m.Importer2::GetMarkers(buffer, 1001)), 0,
       "Error: Incorrect number of marker samplea: total samples is 1000 but requested is 1001"},
      {"packed markers of the wrong count", true, CALL(m.GetRawMarkers(buffer, 7)), 0,
       "Error: Incorrect number of marker sample: total samples 1000 requested 7"},
      {"packed markers freed by Open", true, CALL(m.GetRawMarkers(buffer, 1000)), 0, ""},
      {"markers per sample once open", true, markersPerSample, 4, ""},
  };
#undef CALL
  for (const auto &row : rows) {
    SCOPED_TRACE(row.name);
    Importer importer;
    if (row.open) {
      ASSERT_TRUE(importer.Open(path.c_str()));
    }
    EXPECT_EQ(row.call(importer), row.result);
    EXPECT_EQ(importer.lastError(), row.message);
  }
}

TEST(StreamingImporterTest, SmallReadsKeepTheSurplusAndAReadServedFromItAnswersZero) {
  TempDir dir;
  const auto iq = patternBytes(4 * 100, 4);
  writeBytes(dir.path("w.wv"), encryptWaveform(plainWaveform(patternBytes(16, 5), iq, nullptr)));
  Importer importer;
  ASSERT_TRUE(importer.open(dir.path("w.wv")));
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
  ASSERT_TRUE(fresh.open(dir.path("w.wv")));
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
    EXPECT_EQ(importer.open(dir.path("w.wv")), row.opens);
    EXPECT_EQ(importer.GetIQDataLen(), row.samples);
    EXPECT_EQ(importer.GetHeaderLength(), row.headerLength);
    EXPECT_EQ(importer.GetWavformFormatFlag(), row.formatFlag);
    Bytes buffer(4096);
    EXPECT_EQ(importer.GetMarkers(buffer.data(), 4096), row.markerBytes); // cut to the samples
    EXPECT_EQ(importer.GetRawIQData(buffer.data(), 4096), row.samples * (row.formatFlag == 1 ? 8 : 4));
  }
}

TEST_F(ImporterTest, AFileEndingInsideTheIqThrowsMinusOneAndMissingMarkersReadAsZero) {
  auto bytes = readBytes(file);
  bytes.resize(bytes.size() - 500); // into the marker package
  writeBytes(dir.path("m.wv"), bytes);
  Importer importer;
  ASSERT_TRUE(importer.open(dir.path("m.wv")));
  Bytes out(1000);
  EXPECT_EQ(importer.GetMarkers(out.data(), 1000), 1000);
  EXPECT_TRUE(std::equal(out.begin(), out.begin() + 488, markers.begin()));
  EXPECT_TRUE(std::all_of(out.begin() + 488, out.end(), [](unsigned char b) { return b == 0; }));

  bytes.resize(2000); // into the IQ package
  writeBytes(dir.path("i.wv"), bytes);
  ASSERT_TRUE(importer.open(dir.path("i.wv")));
  Bytes iq(4000);
  EXPECT_THROW(importer.GetRawIQData(iq.data(), 4000), int);
}
