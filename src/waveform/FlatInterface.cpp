#include "wavemill/waveform/FlatInterface.h"

#include <climits>
#include <new>

namespace {

// Sizes beyond an int would turn negative; they read nothing.
int byteCount(unsigned int size) { return size > INT_MAX ? -1 : static_cast<int>(size); }

streamingImporter2 *importerOf(CBlockImporter *handle) { return handle != nullptr ? handle->importer.get() : nullptr; }

} // namespace

CBlockExporter::CBlockExporter(const std::string &fileName, unsigned char *header, int headerLen)
    : streamingExporter2(fileName, header, headerLen) {}

CBlockImporter::CBlockImporter(unsigned char *, int, unsigned char *)
    : importer(std::make_unique<streamingImporter2>()) {}

CBlockImporter::~CBlockImporter() = default;

extern "C" {

CBlockExporter *CreateBlockExporter(const char *fileName, unsigned char *header, int headerLen) {
  if (fileName == nullptr) {
    return nullptr;
  }
  try {
    return new CBlockExporter(fileName, header, headerLen);
  } catch (const std::bad_alloc &) {
    return nullptr;
  }
}

void DisposeExporter(CBlockExporter *exporter) { delete exporter; }

bool start(CBlockExporter *exporter, int64_t samples, bool hasMarkers) {
  return exporter != nullptr && exporter->start(samples, hasMarkers);
}

void stop(CBlockExporter *exporter) {
  if (exporter != nullptr) {
    exporter->stop();
  }
}

bool stream(CBlockExporter *exporter, unsigned char *iq, unsigned char *markers, int samples, bool last) {
  return exporter != nullptr && exporter->stream(iq, markers, samples, last);
}

bool streamiq(CBlockExporter *exporter, unsigned char *iq, int bytes) {
  return exporter != nullptr && exporter->streamiq(iq, bytes);
}

bool streammarker(CBlockExporter *exporter, unsigned char *markers, int bytes) {
  return exporter != nullptr && exporter->streammarker(markers, bytes);
}

} // extern "C"

CBlockImporter *CreateBlockImporter() {
  try {
    return new CBlockImporter(nullptr, 0, nullptr);
  } catch (const std::bad_alloc &) {
    return nullptr;
  }
}

void DisposeImporter(CBlockImporter *importer) {
  if (importer != nullptr) {
    importer->importer.reset();
    delete importer;
  }
}

int GetKey(CBlockImporter *importer) {
  auto *reader = importerOf(importer);
  return reader != nullptr ? static_cast<int>(reader->GetKey()) : 0;
}

bool Open(CBlockImporter *importer, wchar_t *path, unsigned char *key) {
  auto *reader = importerOf(importer);
  return reader != nullptr && reader->Open(path, key);
}

int GetHeaderLen(CBlockImporter *importer) {
  auto *reader = importerOf(importer);
  return reader != nullptr ? reader->GetHeaderLength() : -1;
}

int GetHeader(CBlockImporter *importer, unsigned char *dest, unsigned int size) {
  auto *reader = importerOf(importer);
  return reader != nullptr ? reader->GetHeader(dest, byteCount(size)) : -1;
}

int64_t GetDataLen(CBlockImporter *importer) {
  auto *reader = importerOf(importer);
  return reader != nullptr ? reader->GetIQDataLen() : -1;
}

int GetData(CBlockImporter *importer, unsigned char *dest, unsigned int size) {
  auto *reader = importerOf(importer);
  return reader != nullptr ? reader->GetRawIQData(dest, byteCount(size)) : -1;
}

int GetMarkers(CBlockImporter *importer, unsigned char *dest, unsigned int size) {
  auto *reader = importerOf(importer);
  return reader != nullptr ? reader->GetMarkers(dest, byteCount(size)) : -1;
}

int GetWavformFormatFlag(CBlockImporter *importer) {
  auto *reader = importerOf(importer);
  return reader != nullptr ? reader->GetWavformFormatFlag() : -1;
}

void close(CBlockImporter *importer) {
  if (auto *reader = importerOf(importer)) {
    reader->close();
  }
}
