#include "wavemill/waveform/exportimport/WaveformImporter.h"

#include "support/TempDir.h"
#include "support/WaveformFiles.h"

#include <gtest/gtest.h>

#include <optional>
#include <string>
#include <utility>
#include <vector>

using namespace Corvane::Wavemill::ExportImport;
using namespace Corvane::Wavemill::Testing;

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
