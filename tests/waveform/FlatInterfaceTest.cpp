#include "wavemill/waveform/FlatInterface.h"

#include "platform/Module.h"
#include "support/TempDir.h"
#include "support/WaveformFiles.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

using namespace Corvane::Wavemill;
using namespace Corvane::Wavemill::Testing;

namespace {

// The flat interface as a program without this library's headers sees it:
// functions looked up by their export names in the loaded library. The
// members carry the names, and the types, of the header's declarations.
struct Flat {
  template <class F> F find(const char *name) {
    std::string error;
    static void *module = Platform::loadModule(WAVEMILL_LIBRARY_FILE, error);
    auto function = reinterpret_cast<F>(Platform::moduleSymbol(module, name));
    EXPECT_NE(function, nullptr) << name << error;
    return function;
  }
#define WAVEMILL_FLAT(function, name) decltype(&::function) function = find<decltype(&::function)>(name)
  WAVEMILL_FLAT(CreateBlockExporter, "CreateBlockExporter");
  WAVEMILL_FLAT(DisposeExporter, "DisposeExporter");
  WAVEMILL_FLAT(start, "start");
  WAVEMILL_FLAT(stop, "stop");
  WAVEMILL_FLAT(stream, "stream");
  WAVEMILL_FLAT(streamiq, "streamiq");
  WAVEMILL_FLAT(streammarker, "streammarker");
  WAVEMILL_FLAT(CreateBlockImporter, "_Z19CreateBlockImporterv");
  WAVEMILL_FLAT(DisposeImporter, "_Z15DisposeImporterP14CBlockImporter");
  WAVEMILL_FLAT(GetKey, "_Z6GetKeyP14CBlockImporter");
  WAVEMILL_FLAT(Open, "_Z4OpenP14CBlockImporterPwPh");
  WAVEMILL_FLAT(GetHeaderLen, "_Z12GetHeaderLenP14CBlockImporter");
  WAVEMILL_FLAT(GetHeader, "_Z9GetHeaderP14CBlockImporterPhj");
  WAVEMILL_FLAT(GetDataLen, "_Z10GetDataLenP14CBlockImporter");
  WAVEMILL_FLAT(GetData, "_Z7GetDataP14CBlockImporterPhj");
  WAVEMILL_FLAT(GetMarkers, "_Z10GetMarkersP14CBlockImporterPhj");
  WAVEMILL_FLAT(GetWavformFormatFlag, "_Z20GetWavformFormatFlagP14CBlockImporter");
#undef WAVEMILL_FLAT
  // ::close may also name the system call.
  void (*close)(CBlockImporter *) = find<void (*)(CBlockImporter *)>("_Z5closeP14CBlockImporter");

  // Reads the file with the call order of a flat caller.
  void expectReadsBack(const std::string &path, const Bytes &header, const Bytes &iq, const Bytes &markers) {
    CBlockImporter *importer = CreateBlockImporter();
    unsigned char key[16];
    FormMaskedFileKey(GetKey(importer), key);
    std::wstring wide = widePath(path);
    ASSERT_TRUE(Open(importer, wide.data(), key));
    Bytes got(static_cast<std::size_t>(GetHeaderLen(importer)));
    EXPECT_EQ(GetHeader(importer, got.data(), static_cast<unsigned int>(got.size())), static_cast<int>(got.size()));
    EXPECT_EQ(got, header);
    EXPECT_EQ(static_cast<std::size_t>(GetDataLen(importer)), markers.size());
    EXPECT_EQ(GetWavformFormatFlag(importer), 0);
    for (auto [read, want] : {std::pair{GetData, &iq}, std::pair{GetMarkers, &markers}}) {
      got.assign(want->size(), 0);
      EXPECT_EQ(read(importer, got.data(), static_cast<unsigned int>(got.size())), static_cast<int>(got.size()));
      EXPECT_EQ(got, *want);
    }
    close(importer);
    DisposeImporter(importer);
  }
};

} // namespace

TEST(FlatInterfaceTest, WaveformsWrittenThroughTheExportedNamesReadBackThroughThem) {
  TempDir dir;
  Flat flat;
  auto header = patternBytes(100, 31);
  auto iq = patternBytes(4 * 10'000, 32);
  auto markers = patternBytes(10'000, 33);

  // Chunking is the streaming exporter's own; here each call is made once.
  CBlockExporter *exporter = flat.CreateBlockExporter(dir.path("a.wv").c_str(), header.data(), 100);
  ASSERT_NE(exporter, nullptr);
  EXPECT_TRUE(flat.start(exporter, 10'000, true));
  EXPECT_TRUE(flat.stream(exporter, iq.data(), markers.data(), 10'000, true));
  flat.DisposeExporter(exporter);

  exporter = flat.CreateBlockExporter(dir.path("b.wv").c_str(), header.data(), 100);
  EXPECT_TRUE(flat.start(exporter, 10'000, true));
  EXPECT_TRUE(flat.streamiq(exporter, iq.data(), 4 * 10'000));
  EXPECT_TRUE(flat.streammarker(exporter, markers.data(), 10'000));
  flat.stop(exporter);
  flat.DisposeExporter(exporter);

  for (const char *name : {"a.wv", "b.wv"}) {
    SCOPED_TRACE(name);
    flat.expectReadsBack(dir.path(name), header, iq, markers);
  }
}

// An unopened importer answers as the streaming importer does (its own
// tests); through the flat names only a null handle has answers of its own.
TEST(FlatInterfaceTest, NullHandlesAnswerAsDocumented) {
  Flat flat;
  unsigned char bytes[64] = {};
  wchar_t missing[] = L"/nonexistent/w.wv";
  EXPECT_EQ(flat.CreateBlockExporter(nullptr, bytes, 16), nullptr);
  flat.DisposeExporter(nullptr);
  flat.stop(nullptr);
  flat.DisposeImporter(nullptr);
  flat.close(nullptr);
  const std::vector<bool> refused = {flat.start(nullptr, 10, true), flat.stream(nullptr, bytes, bytes, 1, true),
                                     flat.streamiq(nullptr, bytes, 4), flat.streammarker(nullptr, bytes, 1),
                                     flat.Open(nullptr, missing, bytes)};
  EXPECT_EQ(refused, std::vector<bool>(5, false));
  EXPECT_EQ(flat.GetKey(nullptr), 0);
  const std::vector<long long> minusOne = {
      flat.GetHeaderLen(nullptr),       flat.GetHeader(nullptr, bytes, 16),  flat.GetDataLen(nullptr),
      flat.GetData(nullptr, bytes, 16), flat.GetMarkers(nullptr, bytes, 16), flat.GetWavformFormatFlag(nullptr)};
  EXPECT_EQ(minusOne, std::vector<long long>(6, -1));
}
