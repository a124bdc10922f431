#include "wavemill/waveform/exportimport/WaveformImporter.h"

#include "wavemill/tools/Tools.h"
#include "wavemill/waveform/StreamingImporter2.h"

#include <climits>
#include <cstddef>

namespace Corvane::Wavemill::ExportImport {

namespace {

// The importer learns the header from the first 1024 bytes of the file, so
// no header it reports can be longer.
constexpr int maxHeaderLength = 1024;

} // namespace

struct WaveformImporter::Impl {
  explicit Impl(const std::string &name) : fileName(name), importer(std::make_unique<streamingImporter2>()) {}
  virtual ~Impl() = default;

  std::vector<unsigned char> getHeaderBytes() {
    int length = -1;
    if (opened) {
      length = importer->GetHeaderLength();
      opened = length > 0;
    }
    if (length <= 0 || length > maxHeaderLength) {
      return {};
    }
    std::vector<unsigned char> buffer(maxHeaderLength);
    if (importer->GetHeader(buffer.data(), length) != length) {
      return {};
    }
    buffer.resize(static_cast<std::size_t>(length));
    return buffer;
  }

  std::string fileName;
  std::unique_ptr<streamingImporter2> importer;
  bool opened = false;
};

WaveformImporter::WaveformImporter(const std::string &fileName) : impl(std::make_unique<Impl>(fileName)) {
  const std::wstring widePath = Tools::toWString(fileName);
  // A missing file is not tried, so the importer keeps no message about it.
  if (Tools::exist(fileName)) {
    impl->opened = impl->importer->Open(widePath.c_str());
  }
}

WaveformImporter::~WaveformImporter() = default;

std::shared_ptr<WaveformHeader> WaveformImporter::getWaveformHeader() {
  auto bytes = impl->getHeaderBytes();
  if (bytes.empty()) {
    return nullptr;
  }
  auto header = std::make_shared<WaveformHeader>();
  header->setHeaderBytes(bytes);
  return header;
}

std::vector<unsigned char> WaveformImporter::getHeaderBytes() { return impl->getHeaderBytes(); }

int64_t WaveformImporter::getDataLength() { return impl->opened ? impl->importer->GetIQDataLen() : -1; }

int WaveformImporter::getData(gsl::span<unsigned char> /*data*/) { return -1; }

int WaveformImporter::getMarker(gsl::span<unsigned char> markers) {
  if (!impl->opened) {
    return -1;
  }
  // No sample count of a file is that large; the importer would refuse it.
  if (markers.size() > static_cast<std::size_t>(INT_MAX)) {
    return 0;
  }
  return impl->importer->GetRawMarkers(markers.data(), static_cast<int>(markers.size()));
}

} // namespace Corvane::Wavemill::ExportImport
