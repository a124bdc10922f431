#include "wavemill/waveform/Exporter2.h"
#include "wavemill/waveform/StreamingImporter2.h"

#include "support/TempDir.h"
#include "support/WaveformFiles.h"

#include <gtest/gtest.h>

#include <cmath>
#include <functional>
#include <string>

using namespace Corvane::Wavemill;
using namespace Corvane::Wavemill::Testing;

namespace {

// The whole-file form of the exporter: `setData` writes head, header, IQ
// and markers. The streaming operations are not used here.
struct WholeFileExporter : Exporter2 {
  using Exporter2::Exporter2;
  bool start(int64_t, bool) override { return false; }
  bool start(bool) override { return false; }
  void stop() override {}
  bool stream(unsigned char *, unsigned char *, int, bool) override { return false; }
  bool streamiq(unsigned char *, int) override { return false; }
  bool streammarker(unsigned char *, int) override { return false; }
};

struct Importer : streamingImporter2 {
  using Importer2::lastError;
};

} // namespace

TEST(ImporterTest, SamplesAndMarkersOfTheWholeFileExporterReadBackScaledAndPacked) {
  TempDir dir;
  auto header = patternBytes(40, 21);
  const int samples = 1000;
  std::vector<double> i(samples), q(samples);
  std::vector<unsigned char> markers(2 * samples);
  for (int n = 0; n < samples; ++n) {
    i[n] = 0.25 * std::sin(n * 0.01);
    q[n] = 0.5 * std::cos(n * 0.013); // peak 0.5 at n = 0: full scale for both
    markers[2 * n] = n % 3 == 0;
    markers[2 * n + 1] = n % 5 == 0 ? 7 : 0;
  }
  WholeFileExporter exporter(dir.path("w.wv"), header.data(), 40);
  ASSERT_TRUE(exporter.setData(i.data(), q.data(), markers.data(), samples, 2));

  Importer importer;
  ASSERT_TRUE(importer.Open(widePath(dir.path("w.wv")).c_str()));
  Bytes head(40);
  ASSERT_EQ(importer.GetHeader(head.data(), 40), 40);
  EXPECT_EQ(head, header);
  ASSERT_EQ(importer.GetIQDataLen(), samples);
  std::vector<double> gotI(samples), gotQ(samples);
  for (int at = 0; at < samples;) { // 7 samples are 28 bytes: whole reads
    const int got = importer.GetIQData(gotI.data() + at, gotQ.data() + at, std::min(7, samples - at));
    ASSERT_GT(got, 0);
    at += got;
  }
  for (int n = 0; n < samples; ++n) {
    ASSERT_NEAR(gotI[n], i[n] / 0.5, 0.5 / 32767 + 1e-12) << n;
    ASSERT_NEAR(gotQ[n], q[n] / 0.5, 0.5 / 32767 + 1e-12) << n;
  }
  EXPECT_EQ(gotQ[0], 1.0);
  Bytes packed(samples);
  ASSERT_EQ(importer.GetMarkers(packed.data(), samples), samples);
  for (int n = 0; n < samples; ++n) {
    ASSERT_EQ(packed[n], (n % 3 == 0 ? 1 : 0) | (n % 5 == 0 ? 2 : 0)) << n;
  }
}

TEST(ImporterTest, EveryRefusalAnswersItsResultAndMessage) {
  TempDir dir;
  auto header = patternBytes(40, 22);
  const auto iq = patternBytes(4000, 23);
  const auto markers = patternBytes(1000, 24);
  writeBytes(dir.path("w.wv"), encryptWaveform(plainWaveform(header, iq, &markers)));
  const auto path = widePath(dir.path("w.wv"));
  const std::string invalid = "Error: Invalid Waveform data and waveform information";
  unsigned char buffer[4096];
  double values[1000];

  struct Row {
    const char *name;
    bool open;
    std::function<long long(Importer &)> call;
    long long result;
    std::string message;
  } rows[] = {
      {"header length before Open", false, [](Importer &m) { return m.GetHeaderLength(); }, -1, invalid},
      {"samples before Open", false, [](Importer &m) { return m.GetIQDataLen(); }, 0, invalid},
      {"markers per sample before Open", false,
       [](Importer &m) {
         int count = -5;
         return m.GetNMarker(count) ? count : -5;
       },
       -5, invalid},
      {"IQ before Open", false, [&](Importer &m) { return m.GetRawIQData(buffer, 16); }, 0, invalid},
      {"header before Open", false, [&](Importer &m) { return m.GetHeader(buffer, 40); }, 0, invalid},
      {"the base class opens nothing", false, [&](Importer &m) { return m.Importer2::Open(path.c_str(), buffer); }, 0,
       ""},
      {"a missing file", false, [&](Importer &m) { return m.Open((path + L"x").c_str()); }, 0,
       "Failed to open the file."},
      {"header of the wrong size", true, [&](Importer &m) { return m.GetHeader(buffer, 30); }, 0,
       "Error: Incorrect size of header data: total size24 size requested 30"},
      {"whole IQ of the wrong size", true, [&](Importer &m) { return m.Importer2::GetRawIQData(buffer, 3996); }, 0,
       "Error: Incorrect buffer size: need buffer size 4000, input buffer size 3996"},
      {"decoded IQ of the wrong count", true, [&](Importer &m) { return m.Importer2::GetIQData(values, values, 999); },
       0, "Error: Incorrect buffer size: need buffer size 1000, input buffer size 999"},
      {"unpacked markers of the wrong count", true, [&](Importer &m) { return m.Importer2::GetMarkers(buffer, 1001); },
       0, "Error: Incorrect number of marker samplea: total samples is 1000 but requested is 1001"},
      {"packed markers of the wrong count", true, [&](Importer &m) { return m.GetRawMarkers(buffer, 7); }, 0,
       "Error: Incorrect number of marker sample: total samples 1000 requested 7"},
      {"packed markers freed by Open", true, [&](Importer &m) { return m.GetRawMarkers(buffer, 1000); }, 0, ""},
      {"markers per sample once open", true,
       [](Importer &m) {
         int count = 0;
         return m.GetNMarker(count) ? count : -5;
       },
       4, ""},
  };
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
