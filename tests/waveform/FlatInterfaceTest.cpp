#include "wavemill/waveform/FlatInterface.h"

#include "platform/Module.h"
#include "support/TempDir.h"
#include "support/WaveformFiles.h"

#include <gtest/gtest.h>

#include <string>

using namespace Corvane::Wavemill;
using namespace Corvane::Wavemill::Testing;

namespace {

// The flat interface as a program without this library's headers sees it:
// functions looked up by their export names in the loaded library.
struct Flat {
  CBlockExporter *(*createExporter)(const char *, unsigned char *, int);
  void (*disposeExporter)(CBlockExporter *);
  bool (*start)(CBlockExporter *, int64_t, bool);
  void (*stop)(CBlockExporter *);
  bool (*stream)(CBlockExporter *, unsigned char *, unsigned char *, int, bool);
  bool (*streamiq)(CBlockExporter *, unsigned char *, int);
  bool (*streammarker)(CBlockExporter *, unsigned char *, int);
  CBlockImporter *(*createImporter)();
  void (*disposeImporter)(CBlockImporter *);
  int (*getKey)(CBlockImporter *);
  bool (*open)(CBlockImporter *, wchar_t *, unsigned char *);
  int (*getHeaderLen)(CBlockImporter *);
  int (*getHeader)(CBlockImporter *, unsigned char *, unsigned int);
  int64_t (*getDataLen)(CBlockImporter *);
  int (*getData)(CBlockImporter *, unsigned char *, unsigned int);
  int (*getMarkers)(CBlockImporter *, unsigned char *, unsigned int);
  int (*getWavformFormatFlag)(CBlockImporter *);
  void (*close)(CBlockImporter *);

  Flat() {
    std::string error;
    void *module = Platform::loadModule(WAVEMILL_LIBRARY_FILE, error);
    EXPECT_NE(module, nullptr) << error;
    find(module, createExporter, "CreateBlockExporter");
    find(module, disposeExporter, "DisposeExporter");
    find(module, start, "start");
    find(module, stop, "stop");
    find(module, stream, "stream");
    find(module, streamiq, "streamiq");
    find(module, streammarker, "streammarker");
    find(module, createImporter, "_Z19CreateBlockImporterv");
    find(module, disposeImporter, "_Z15DisposeImporterP14CBlockImporter");
    find(module, getKey, "_Z6GetKeyP14CBlockImporter");
    find(module, open, "_Z4OpenP14CBlockImporterPwPh");
    find(module, getHeaderLen, "_Z12GetHeaderLenP14CBlockImporter");
    find(module, getHeader, "_Z9GetHeaderP14CBlockImporterPhj");
    find(module, getDataLen, "_Z10GetDataLenP14CBlockImporter");
    find(module, getData, "_Z7GetDataP14CBlockImporterPhj");
    find(module, getMarkers, "_Z10GetMarkersP14CBlockImporterPhj");
    find(module, getWavformFormatFlag, "_Z20GetWavformFormatFlagP14CBlockImporter");
    find(module, close, "_Z5closeP14CBlockImporter");
  }
  template <class F> static void find(void *module, F &function, const char *name) {
    function = reinterpret_cast<F>(Platform::moduleSymbol(module, name));
    ASSERT_NE(function, nullptr) << name;
  }

  // Reads the file with the call order of a flat caller.
  void read(const std::string &path, Bytes &header, Bytes &iq, Bytes &markers, unsigned int piece) {
    CBlockImporter *importer = createImporter();
    unsigned char key[16];
    FormMaskedFileKey(getKey(importer), key);
    std::wstring wide = widePath(path);
    ASSERT_TRUE(open(importer, wide.data(), key));
    header.resize(static_cast<std::size_t>(getHeaderLen(importer)));
    EXPECT_EQ(getHeader(importer, header.data(), static_cast<unsigned int>(header.size())),
              static_cast<int>(header.size()));
    const auto samples = static_cast<std::size_t>(getDataLen(importer));
    EXPECT_EQ(getWavformFormatFlag(importer), 0);
    Bytes buffer(piece);
    for (iq.clear(); iq.size() < 4 * samples;) {
      const int got = getData(importer, buffer.data(), piece);
      ASSERT_GT(got, 0);
      iq.insert(iq.end(), buffer.begin(), buffer.begin() + got);
    }
    for (markers.clear(); markers.size() < samples;) {
      const int got = getMarkers(importer, buffer.data(), piece);
      ASSERT_GT(got, 0);
      markers.insert(markers.end(), buffer.begin(), buffer.begin() + got);
    }
    close(importer);
    disposeImporter(importer);
  }
};

} // namespace

TEST(FlatInterfaceTest, WaveformsWrittenInChunksReadBackThroughTheExportedNames) {
  TempDir dir;
  Flat flat;
  auto header = patternBytes(100, 31);
  auto iq = patternBytes(4 * 10'000, 32);
  auto markers = patternBytes(10'000, 33);

  // stream(): three chunks, the last one marked.
  CBlockExporter *exporter = flat.createExporter(dir.path("a.wv").c_str(), header.data(), 100);
  ASSERT_NE(exporter, nullptr);
  EXPECT_TRUE(flat.start(exporter, 10'000, true));
  EXPECT_TRUE(flat.stream(exporter, iq.data(), markers.data(), 3'333, false));
  EXPECT_TRUE(flat.stream(exporter, iq.data() + 4 * 3'333, markers.data() + 3'333, 6'000, false));
  EXPECT_TRUE(flat.stream(exporter, iq.data() + 4 * 9'333, markers.data() + 9'333, 667, true));
  flat.disposeExporter(exporter);

  // streamiq() and streammarker() in pairs, then stop().
  exporter = flat.createExporter(dir.path("b.wv").c_str(), header.data(), 100);
  EXPECT_TRUE(flat.start(exporter, 10'000, true));
  for (int at = 0; at < 10'000; at += 2'500) {
    EXPECT_TRUE(flat.streamiq(exporter, iq.data() + 4 * at, 4 * 2'500));
    EXPECT_TRUE(flat.streammarker(exporter, markers.data() + at, 2'500));
  }
  flat.stop(exporter);
  flat.disposeExporter(exporter);

  for (const char *name : {"a.wv", "b.wv"}) {
    SCOPED_TRACE(name);
    Bytes gotHeader, gotIq, gotMarkers;
    flat.read(dir.path(name), gotHeader, gotIq, gotMarkers, 1'000);
    EXPECT_EQ(gotHeader, header);
    EXPECT_EQ(gotIq, iq);
    EXPECT_EQ(gotMarkers, markers);
  }
}

TEST(FlatInterfaceTest, NullHandlesAndUnopenedImportersAnswerAsDocumented) {
  TempDir dir;
  Flat flat;
  unsigned char bytes[64] = {};
  wchar_t missing[] = L"/nonexistent/w.wv";
  EXPECT_EQ(flat.createExporter(nullptr, bytes, 16), nullptr);
  flat.disposeExporter(nullptr);
  flat.stop(nullptr);
  EXPECT_FALSE(flat.start(nullptr, 10, true));
  EXPECT_FALSE(flat.stream(nullptr, bytes, bytes, 1, true));
  EXPECT_FALSE(flat.streamiq(nullptr, bytes, 4));
  EXPECT_FALSE(flat.streammarker(nullptr, bytes, 1));
  flat.disposeImporter(nullptr);
  flat.close(nullptr);
  EXPECT_EQ(flat.getKey(nullptr), 0);
  EXPECT_FALSE(flat.open(nullptr, missing, bytes));
  EXPECT_EQ(flat.getHeaderLen(nullptr), -1);
  EXPECT_EQ(flat.getHeader(nullptr, bytes, 16), -1);
  EXPECT_EQ(flat.getDataLen(nullptr), -1);
  EXPECT_EQ(flat.getData(nullptr, bytes, 16), -1);
  EXPECT_EQ(flat.getMarkers(nullptr, bytes, 16), -1);
  EXPECT_EQ(flat.getWavformFormatFlag(nullptr), -1);

  CBlockImporter *importer = flat.createImporter();
  EXPECT_EQ(flat.getHeaderLen(importer), -1);
  EXPECT_EQ(flat.getDataLen(importer), 0);
  EXPECT_EQ(flat.getData(importer, bytes, 16), 0);
  EXPECT_FALSE(flat.open(importer, missing, bytes));
  // The same handle opens the next file.
  auto header = patternBytes(20, 34);
  writeBytes(dir.path("w.wv"), encryptWaveform(plainWaveform(header, patternBytes(80, 35), nullptr)));
  std::wstring path = widePath(dir.path("w.wv"));
  FormMaskedFileKey(flat.getKey(importer), bytes);
  EXPECT_TRUE(flat.open(importer, path.data(), bytes));
  EXPECT_EQ(flat.getHeaderLen(importer), 20);
  EXPECT_EQ(flat.getDataLen(importer), 20);
  flat.disposeImporter(importer);
}
