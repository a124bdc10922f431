#include "wavemill/waveform/exportimport/WaveformPackage.h"
#include "wavemill/waveform/exportimport/WaveformImporter.h"

#include "wavemill/tools/Tools.h"

#include "support/TempDir.h"
#include "support/WaveformFiles.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <optional>
#include <string>
#include <utility>
#include <vector>

using namespace Corvane::Wavemill;
using namespace Corvane::Wavemill::ExportImport;
using namespace Corvane::Wavemill::Testing;

TEST(WaveformPackageTest, MillionSamplesInChunksComeBackWithTheWholeHeaderAndTheirMarkers) {
  TempDir dir;
  const std::string file = dir.path("wave.wv");
  auto iq = patternBytes(4'000'000, 7);
  auto markers = patternBytes(1'000'000, 8);
  WaveformPackage package;
  package.setFileName(file);
  auto header = package.getWaveformHeader();
  header->tag5 = "sine 1 MHz, 8 periods, -3 dBFS  "; // all 32 bytes: zero fill reads back as blanks
  ASSERT_TRUE(package.begin(1'000'000, true));
  EXPECT_TRUE(package.beginFloat(1'000'000, true)); // the exporter refuses a second start; the package does not say
  // IQ and markers in chunks of an odd size, so that leftovers cross every chunk.
  for (std::size_t at = 0, chunk = 65'537; at < markers.size(); at += chunk) {
    const std::size_t n = std::min(chunk, markers.size() - at);
    EXPECT_TRUE(package.append(gsl::span<unsigned char>(iq.data() + 4 * at, 4 * n)));
    EXPECT_TRUE(package.appendMarker(std::make_shared<Bytes>(markers.begin() + at, markers.begin() + at + n)));
  }
  package.end();
  EXPECT_FALSE(Tools::exist(file + "_mkr"));

  WaveformImporter importer(file);
  EXPECT_EQ(importer.getHeaderBytes(), header->getHeaderBytes());
  auto readBack = importer.getWaveformHeader();
  ASSERT_NE(readBack, nullptr);
  EXPECT_EQ(readBack->tag5, header->tag5);
  EXPECT_EQ(importer.getDataLength(), 1'000'000);
  Bytes untouched(1'000'000, 0xaa);
  EXPECT_EQ(importer.getMarker(untouched), 0); // an open importer keeps no markers
  EXPECT_EQ(untouched, Bytes(1'000'000, 0xaa));

  expectWaveform(file, header->getHeaderBytes(), iq, &markers);
}

TEST(WaveformPackageTest, BeforeBeginEveryWriteIsRefusedAndNoFileAppears) {
  TempDir dir;
  Bytes chunk(64, 1);
  WaveformPackage package;
  package.setFileName(dir.path("w.wv"));
  EXPECT_FALSE(package.append(chunk));
  EXPECT_FALSE(package.appendMarker(chunk));
  EXPECT_FALSE(package.beginFloat(16, true));
  package.end();
  package.setFileName("");
  EXPECT_FALSE(package.begin(16, true)); // without a name
  EXPECT_FALSE(package.append(chunk));
  package.end();
  EXPECT_TRUE(std::filesystem::is_empty(dir.root()));
}

TEST(WaveformImporterTest, MissingEmptyCutOrDamagedFilesAnswerEmptyAndNeverReadOutsideTheirBytes) {
  TempDir dir;
  const Bytes markers = patternBytes(100, 2);
  const Bytes good = encryptWaveform(plainWaveform(WaveformHeader().getHeaderBytes(), patternBytes(400, 1), &markers));
  std::vector<std::pair<std::string, std::optional<Bytes>>> rows{{"missing", std::nullopt}, {"empty", Bytes{}}};
  for (std::size_t cut : {20u, 40u, 64u}) {
    rows.emplace_back("cut at " + std::to_string(cut), Bytes(good.begin(), good.begin() + cut));
  }
  for (std::size_t at = 0; at < 320; ++at) { // the head, the header package and the IQ prefix
    rows.emplace_back("byte " + std::to_string(at) + " flipped", good);
    (*rows.back().second)[at] ^= 0x5a;
  }
  for (const auto &[name, bytes] : rows) {
    SCOPED_TRACE(name);
    const std::string file = dir.path(name + ".wv");
    if (bytes) {
      writeBytes(file, *bytes);
    }
    WaveformImporter importer(file);
    const auto header = importer.getHeaderBytes();
    EXPECT_TRUE(bytes && bytes->size() > 64 ? header.size() <= 1024 : header.empty()); // cut inside the header
    EXPECT_EQ(importer.getWaveformHeader() == nullptr, header.empty());
    if (header.empty()) {
      EXPECT_EQ(importer.getDataLength(), -1); // a file without a header stays closed
    }
    Bytes buffer(100);
    EXPECT_EQ(importer.getData(buffer), -1);
    EXPECT_LE(importer.getMarker(buffer), 0);
  }
}
