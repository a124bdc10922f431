#include "wavemill/waveform/StreamingExporter2.h"

#include "waveform/RemoveWrittenFile.h"

#include <charconv>
#include <climits>
#include <cstdio>
#include <cstring>
#include <vector>

using Corvane::Wavemill::Buffer_DataReader;
using Corvane::Wavemill::HeaderBuffer_DataReader;

namespace {

constexpr int blockBytes = 16;
constexpr int maxSamples = INT_MAX / 4;
// The replay of raw records reads this many bytes a record. It is 0, so the
// first record ends the replay: an unknown-length export writes no chunk.
constexpr std::size_t replayBytes = 0;

std::unique_ptr<unsigned char[]> copyOf(const unsigned char *src, int bytes) {
  // Not value-initialised: every byte is overwritten at once.
  std::unique_ptr<unsigned char[]> copy(new unsigned char[static_cast<std::size_t>(bytes)]);
  if (bytes > 0) {
    std::memcpy(copy.get(), src, static_cast<std::size_t>(bytes));
  }
  return copy;
}

bool badBytes(const unsigned char *data, int bytes) { return bytes < 0 || (bytes > 0 && data == nullptr); }

// Creates `path` or empties it; false when it cannot be opened or closed.
bool truncateFile(const std::string &path) {
  std::FILE *file = std::fopen(path.c_str(), "wb");
  return file != nullptr && std::fclose(file) == 0;
}

// Appends the pieces to `path`; a null piece with a size is written as
// zeros. False when anything fails.
bool appendPieces(const std::string &path,
                  std::initializer_list<std::pair<const unsigned char *, std::size_t>> pieces) {
  std::FILE *file = std::fopen(path.c_str(), "ab");
  if (file == nullptr) {
    return false;
  }
  bool ok = true;
  for (const auto &[data, size] : pieces) {
    if (data != nullptr) {
      ok = ok && std::fwrite(data, 1, size, file) == size;
    } else {
      const std::vector<unsigned char> zeros(size);
      ok = ok && std::fwrite(zeros.data(), 1, size, file) == size;
    }
  }
  return std::fclose(file) == 0 && ok;
}

// The decimal text of a record's count, independent of the locale.
std::string countText(int64_t count) {
  char text[24];
  const auto end = std::to_chars(text, text + sizeof text, count).ptr;
  return std::string(text, end);
}

// Reads a decimal count after optional white space; 0 when there is none.
int64_t readCount(std::FILE *file) {
  int c = std::fgetc(file);
  while (c == ' ' || (c >= '\t' && c <= '\r')) {
    c = std::fgetc(file);
  }
  int64_t count = 0;
  for (; c >= '0' && c <= '9' && count < INT64_MAX / 10 - 9; c = std::fgetc(file)) {
    count = count * 10 + (c - '0');
  }
  return count;
}

} // namespace

StreamingExporterBase::StreamingExporterBase(const std::string &fileName, unsigned char *header, int headerLen,
                                             bool floatIq)
    : Exporter2(fileName, header, headerLen), floatIq(floatIq) {}

StreamingExporterBase::~StreamingExporterBase() = default;

streamingExporter2::streamingExporter2(const std::string &fileName, unsigned char *header, int headerLen)
    : StreamingExporterBase(fileName, header, headerLen, false) {}

streamingFloatExporter2::streamingFloatExporter2(const std::string &fileName, unsigned char *header, int headerLen)
    : StreamingExporterBase(fileName, header, headerLen, true) {}

bool StreamingExporterBase::start(int64_t samples, bool withMarkers) {
  if (finished || started || unknownLength || samples < 0 || samples > INT64_MAX / 8) {
    return false;
  }
  started = true;
  totalSamples = samples;
  iqRemaining = samples;
  markerRemaining = withMarkers ? samples : 0;
  hasMarkers = withMarkers;
  markerTempName = fileName + "_mkr";
  // The integer exporter empties the raw file, which has no name yet in a
  // direct start, and so leaves an old marker file in place; the float
  // exporter empties the marker file. Files of both have been made so.
  if (!writeFailed) {
    truncateFile(floatIq ? markerTempName : rawTempName);
  }
  return true;
}

bool StreamingExporterBase::start(bool withMarkers) {
  if (unknownLength) {
    return false;
  }
  unknownLength = true;
  totalSamples = 0;
  hasMarkers = withMarkers;
  rawTempName = fileName + "_tmp";
  if (!writeFailed && !truncateFile(rawTempName)) {
    discardOutput();
  }
  return true;
}

void StreamingExporterBase::stop() {
  if (unknownLength) {
    streamRawKnownWave();
  } else {
    appendMarkerFile();
  }
}

bool StreamingExporterBase::stream(unsigned char *iq, unsigned char *markers, int samples, bool last) {
  if (samples < 0 || samples > maxSamples || (samples > 0 && iq == nullptr)) {
    return false;
  }
  if (unknownLength) {
    streamUnknown(iq, markers, samples);
    if (last) {
      streamRawKnownWave();
    }
    return true;
  }
  if (!started) {
    return false;
  }
  convertData(iq, markers, samples);
  lastChunk = last;
  // The first chunk's pass delivers the file head and the header package
  // before the IQ chunk; later passes deliver the IQ chunk alone.
  finished = false;
  getNextPackager();
  appendEncryptedData(fileName);
  finished = false;
  getNextPackager();
  appendEncryptedData(markerTempName);
  if (!last) {
    pkgState = 1;
    return true;
  }
  appendMarkerFile();
  return true;
}

bool StreamingExporterBase::streamiq(unsigned char *iq, int bytes) {
  if (badBytes(iq, bytes)) {
    return false;
  }
  if (unknownLength) {
    streamUnknown(iq, bytes);
    return true;
  }
  if (!started) {
    return false;
  }
  iqRemaining -= bytes / (floatIq ? 8 : 4);
  lastChunk = iqRemaining < 1;
  iqData = copyOf(iq, bytes);
  iqSize = bytes;
  finished = false;
  getNextPackager();
  appendEncryptedData(fileName);
  pkgState = 1;
  lastChunk = false;
  return true;
}

bool StreamingExporterBase::streammarker(unsigned char *markers, int bytes) {
  if (badBytes(markers, bytes)) {
    return false;
  }
  if (unknownLength) {
    streamUnknownMarker(markers, bytes);
    return true;
  }
  markerRemaining -= bytes;
  lastChunk = markerRemaining < 1;
  markerData = copyOf(markers, bytes);
  markerSize = bytes;
  pkgState = iqState();
  finished = false;
  getNextPackager();
  appendEncryptedData(markerTempName);
  pkgState = 1;
  lastChunk = false;
  return true;
}

int64_t StreamingExporterBase::getPkgSize() {
  if (pkgState == iqState()) {
    return totalSamples * (floatIq ? 8 : 4);
  }
  return pkgState == 3 ? totalSamples : 0;
}

int StreamingExporterBase::pkgTag() {
  const int state = static_cast<int>(pkgState);
  if (pkgState >= sizeof tagWritten) {
    return state;
  }
  if (tagWritten[pkgState]) {
    return lastChunk ? 32 : 16;
  }
  tagWritten[pkgState] = true;
  return state + (lastChunk ? 32 : 0);
}

int StreamingExporterBase::readBlocks(unsigned char *dest, int blocks) {
  int delivered = 0;
  while (blocks > 0 && packager != nullptr) {
    const int got = packager->getBlocks(dest, blocks);
    blocks -= got;
    dest += got * blockBytes;
    delivered += got;
    if (blocks > 0) {
      if (pkgState == 1) {
        getNextPackager();
      } else {
        finished = true;
        packager = nullptr;
      }
    }
  }
  return delivered;
}

void StreamingExporterBase::getNextPackager() {
  if (!floatIq) {
    Exporter2::getNextPackager();
    return;
  }
  reader.reset();
  if (finished) {
    return;
  }
  switch (pkgState) {
  case 0:
    pkgState = 1;
    reader = std::make_unique<HeaderBuffer_DataReader>(headerData.get(), headerLen);
    continueChain(iqPackager);
    break;
  case 1:
    pkgState = 4;
    if (iqData) {
      reader = std::make_unique<Buffer_DataReader>(iqData.get(), iqSize);
    }
    continueChain(iqPackager);
    break;
  case 4:
    pkgState = 3;
    if (markerData) {
      reader = std::make_unique<Buffer_DataReader>(markerData.get(), markerSize);
    }
    continueChain(markerPackager);
    break;
  case 3:
    packager = nullptr;
    break;
  default:
    finished = true;
    break;
  }
}

void StreamingExporterBase::discardOutput() {
  Exporter2::discardOutput();
  for (const std::string *name : {&markerTempName, &rawTempName}) {
    if (!name->empty()) {
      Corvane::Wavemill::removeWrittenFile(*name);
    }
  }
}

void StreamingExporterBase::appendMarkerFile() {
  std::FILE *markers = markerTempName.empty() ? nullptr : std::fopen(markerTempName.c_str(), "rb");
  if (markers == nullptr) {
    return;
  }
  bool ok = true;
  if (!writeFailed) {
    std::FILE *target = std::fopen(fileName.c_str(), "ab");
    ok = target != nullptr;
    std::vector<unsigned char> piece(1 << 16);
    for (std::size_t got = 1; ok && got > 0;) {
      got = std::fread(piece.data(), 1, piece.size(), markers);
      ok = std::fwrite(piece.data(), 1, got, target) == got;
    }
    ok = ok && !std::ferror(markers);
    if (target != nullptr && std::fclose(target) != 0) {
      ok = false;
    }
  }
  std::fclose(markers);
  Corvane::Wavemill::removeWrittenFile(markerTempName);
  if (!ok) {
    discardOutput();
  }
}

void StreamingExporterBase::streamUnknown(unsigned char *iq, unsigned char *markers, int samples) {
  totalSamples += samples;
  const auto n = static_cast<std::size_t>(samples);
  const std::string count = countText(samples);
  if (!writeFailed && !appendPieces(rawTempName, {{reinterpret_cast<const unsigned char *>(count.data()), count.size()},
                                                  {iq, n * 4},
                                                  {markers, n}})) {
    discardOutput();
  }
}

void StreamingExporterBase::streamUnknown(unsigned char *iq, int bytes) {
  totalSamples += bytes / 4;
  const std::string count = countText(bytes / 4);
  if (!writeFailed && !appendPieces(rawTempName, {{reinterpret_cast<const unsigned char *>(count.data()), count.size()},
                                                  {iq, static_cast<std::size_t>(bytes)}})) {
    discardOutput();
  }
}

void StreamingExporterBase::streamUnknownMarker(unsigned char *markers, int bytes) const {
  // Changes no state; a failed write only loses bytes that the replay
  // would not read anyway.
  if (!writeFailed) {
    appendPieces(rawTempName, {{markers, static_cast<std::size_t>(bytes)}});
  }
}

void StreamingExporterBase::streamRawKnownWave() {
  unknownLength = false;
  start(totalSamples, hasMarkers);
  std::FILE *raw = std::fopen(rawTempName.c_str(), "rb");
  if (raw != nullptr) {
    for (;;) {
      const int64_t count = readCount(raw);
      if (count == 0) {
        break;
      }
      std::vector<unsigned char> chunk(replayBytes);
      if (std::fread(chunk.data(), 1, chunk.size(), raw) == replayBytes) {
        break;
      }
    }
    std::fclose(raw);
  }
  Corvane::Wavemill::removeWrittenFile(rawTempName);
}
