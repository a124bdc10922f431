#include "wavemill/waveform/exportimport/WaveformPackage.h"

#include "wavemill/waveform/StreamingExporter2.h"

#include <algorithm>
#include <climits>
#include <cstddef>

namespace Corvane::Wavemill::ExportImport {

namespace {

// The exporters take int byte counts. A larger span goes out in pieces of
// whole blocks; the packagers carry leftovers from chunk to chunk, so the
// file is the same as from one call.
constexpr std::size_t maxPiece = std::size_t{1} << 30;

template <typename Write> void writeInPieces(gsl::span<unsigned char> bytes, Write write) {
  std::size_t done = 0;
  do {
    const std::size_t piece = std::min(bytes.size() - done, maxPiece);
    write(bytes.data() + done, static_cast<int>(piece));
    done += piece;
  } while (done < bytes.size());
}

gsl::span<unsigned char> spanOf(const std::shared_ptr<std::vector<unsigned char>> &bytes) {
  return bytes ? gsl::span<unsigned char>(*bytes) : gsl::span<unsigned char>();
}

} // namespace

struct WaveformPackage::Impl {
  std::string fileName;
  std::string unusedName;
  std::unique_ptr<streamingExporter2> exporter;
  std::string activeFileName;
  std::shared_ptr<WaveformHeader> header;

  std::shared_ptr<WaveformHeader> getWaveformHeader() {
    if (!header) {
      header = std::make_shared<WaveformHeader>();
    }
    return header;
  }

  bool begin(int64_t samples, bool hasMarkers) {
    if (fileName.empty()) {
      return false;
    }
    activeFileName = fileName;
    // A caller who never asked for the record gets a default header rather
    // than a crash.
    const auto bytes = getWaveformHeader()->getHeader();
    const auto length = static_cast<int>(std::min<std::size_t>(bytes->size(), INT_MAX));
    exporter = std::make_unique<streamingExporter2>(activeFileName, bytes->data(), length);
    // The package answers whether a file was begun; a run the exporter
    // refuses (negative samples) shows in the file instead.
    exporter->start(samples, hasMarkers);
    return true;
  }

  bool appendIq(gsl::span<unsigned char> iq) {
    if (!exporter) {
      return false;
    }
    writeInPieces(iq, [this](unsigned char *data, int bytes) { exporter->streamiq(data, bytes); });
    return true;
  }

  bool appendMarker(gsl::span<unsigned char> markers) {
    if (!exporter) {
      return false;
    }
    writeInPieces(markers, [this](unsigned char *data, int bytes) { exporter->streammarker(data, bytes); });
    return true;
  }
};

WaveformPackage::WaveformPackage() : impl(std::make_unique<Impl>()) {}

WaveformPackage::~WaveformPackage() = default;

const std::string &WaveformPackage::getFileName() const { return impl->fileName; }

void WaveformPackage::setFileName(const std::string &fileName) { impl->fileName = fileName; }

std::shared_ptr<WaveformHeader> WaveformPackage::getWaveformHeader() { return impl->getWaveformHeader(); }

bool WaveformPackage::begin(int64_t samples, bool hasMarkers) { return impl->begin(samples, hasMarkers); }

bool WaveformPackage::append(std::shared_ptr<std::vector<unsigned char>> iq) { return impl->appendIq(spanOf(iq)); }

bool WaveformPackage::append(gsl::span<unsigned char> iq) { return impl->appendIq(iq); }

bool WaveformPackage::appendMarker(std::shared_ptr<std::vector<unsigned char>> markers) {
  return impl->appendMarker(spanOf(markers));
}

bool WaveformPackage::appendMarker(gsl::span<unsigned char> markers) { return impl->appendMarker(markers); }

bool WaveformPackage::beginFloat(int64_t samples, bool hasMarkers) {
  if (!impl->exporter) {
    return false;
  }
  impl->exporter->start(samples, hasMarkers);
  return true;
}

bool WaveformPackage::appendFloat(std::shared_ptr<std::vector<unsigned char>> iq) { return impl->appendIq(spanOf(iq)); }

bool WaveformPackage::appendFloat(gsl::span<unsigned char> iq) { return impl->appendIq(iq); }

bool WaveformPackage::appendFloatMarker(std::shared_ptr<std::vector<unsigned char>> markers) {
  return impl->appendMarker(spanOf(markers));
}

bool WaveformPackage::appendFloatMarker(gsl::span<unsigned char> markers) { return impl->appendMarker(markers); }

void WaveformPackage::end() {
  if (impl->exporter) {
    impl->exporter->stop();
  }
}

} // namespace Corvane::Wavemill::ExportImport
