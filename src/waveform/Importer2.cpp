#include "wavemill/waveform/Importer2.h"

#include "waveform/ImporterImpl.h"
#include "wavemill/waveform/EncryptKey.h"

#include <algorithm>
#include <cstdio>
#include <cstring>
#include <utility>

using Corvane::Wavemill::EncryptKey;

namespace {

constexpr int stagingSize = 1024;

std::uint32_t bigEndianWord(const unsigned char *p) {
  return (std::uint32_t{p[0]} << 24) | (std::uint32_t{p[1]} << 16) | (std::uint32_t{p[2]} << 8) | p[3];
}

std::int64_t roundUp16(std::int64_t value) { return (value + 15) / 16 * 16; }

// Residual values are signed big-endian numbers of `width` bytes.
double residualValue(const unsigned char *p, int width) {
  switch (width) {
  case 1:
    return static_cast<signed char>(p[0]) / 127.0;
  case 2:
    return static_cast<std::int16_t>(static_cast<std::uint16_t>((p[0] << 8) | p[1])) / 32767.0;
  default:
    return static_cast<std::int32_t>(bigEndianWord(p)) / 2147483647.0;
  }
}

} // namespace

bool Importer2::Impl::requireValid() {
  if (dataValid) {
    return true;
  }
  std::snprintf(errorText, sizeof errorText, "Error: Invalid Waveform data and waveform information");
  return false;
}

Importer2::Importer2() : impl(std::make_unique<Impl>()) {}

Importer2::~Importer2() {
  clear();
  close();
}

bool Importer2::Open(const wchar_t *, unsigned char *) { return false; }

int Importer2::GetIQData(double *i, double *q, int samples) {
  auto &s = *impl;
  if (!s.requireValid()) {
    return 0;
  }
  if (samples != s.sampleCount) {
    std::snprintf(s.errorText, sizeof s.errorText,
                  "Error: Incorrect buffer size: need buffer size %lld, input buffer size %d",
                  static_cast<long long>(s.sampleCount), samples);
    return 0;
  }
  if (i == nullptr || q == nullptr || !s.iValues || !s.qValues || samples <= 0) {
    return 0;
  }
  std::copy_n(s.iValues.get(), samples, i);
  std::copy_n(s.qValues.get(), samples, q);
  return samples;
}

int Importer2::GetRawIQData(unsigned char *dest, int size) {
  auto &s = *impl;
  if (!s.requireValid()) {
    return 0;
  }
  if (size != s.sampleCount * 4) {
    std::snprintf(s.errorText, sizeof s.errorText,
                  "Error: Incorrect buffer size: need buffer size %lld, input buffer size %d",
                  static_cast<long long>(s.sampleCount * 4), size);
    return 0;
  }
  if (dest == nullptr || size <= 0) {
    return 0;
  }
  // A body shorter than its length word leaves the rest of `dest` zero.
  const int held = s.rawIq ? std::min(size, s.rawIqSize) : 0;
  std::memcpy(dest, s.rawIq.get(), static_cast<std::size_t>(held));
  std::memset(dest + held, 0, static_cast<std::size_t>(size - held));
  return size;
}

int Importer2::GetMarkers(unsigned char *dest, int count) {
  auto &s = *impl;
  if (!s.requireValid()) {
    return 0;
  }
  if (count != s.sampleCount) {
    std::snprintf(s.errorText, sizeof s.errorText,
                  "Error: Incorrect number of marker samplea: total samples is %lld but requested is %d",
                  static_cast<long long>(s.sampleCount), count);
    return 0;
  }
  if (dest == nullptr || count <= 0) {
    return 0;
  }
  for (int n = 0; n < count; ++n) {
    const unsigned char packed = n < s.rawMarkersSize && s.rawMarkers ? s.rawMarkers[n] : 0;
    for (int bit = 0; bit < 4; ++bit) {
      dest[4 * static_cast<std::int64_t>(n) + bit] = (packed >> bit) & 1;
    }
  }
  return count;
}

int Importer2::GetRawMarkers(unsigned char *dest, int count) {
  auto &s = *impl;
  if (!s.requireValid()) {
    return 0;
  }
  if (count != s.sampleCount) {
    std::snprintf(s.errorText, sizeof s.errorText,
                  "Error: Incorrect number of marker sample: total samples %lld requested %d",
                  static_cast<long long>(s.sampleCount), count);
    return 0;
  }
  if (dest == nullptr || !s.rawMarkers) {
    return 0;
  }
  const int copied = std::min(count, s.rawMarkersSize);
  std::memcpy(dest, s.rawMarkers.get(), static_cast<std::size_t>(copied));
  return copied;
}

int Importer2::GetHeader(unsigned char *dest, int size) {
  auto &s = *impl;
  if (!s.requireValid()) {
    return 0;
  }
  if (!s.headerBody || !s.headerHead) {
    std::snprintf(s.errorText, sizeof s.errorText, "Error: Invalid Waveform header information");
    return 0;
  }
  if (size != s.headerBodyLen + 16) {
    std::snprintf(s.errorText, sizeof s.errorText,
                  "Error: Incorrect size of header data: total size%d size requested %d", s.headerBodyLen, size);
    return 0;
  }
  if (dest == nullptr) {
    return 0;
  }
  std::memcpy(dest, s.headerHead.get(), 16);
  std::memcpy(dest + 16, s.headerBody.get(), static_cast<std::size_t>(s.headerBodyLen));
  return size;
}

int Importer2::GetHeaderLength() { return impl->requireValid() ? impl->headerBodyLen + 16 : -1; }

std::int64_t Importer2::GetIQDataLen() { return impl->requireValid() ? impl->sampleCount : 0; }

bool Importer2::GetNMarker(int &count) {
  if (!impl->requireValid()) {
    return false;
  }
  count = impl->markerCount;
  return true;
}

int Importer2::GetWavformFormatFlag() { return impl->formatFlag; }

int Importer2::GetDataPtr(void *dest, int len) {
  auto &s = *impl;
  if (dest == nullptr || !s.rawIq || len <= 0) {
    return 0;
  }
  const int copied = std::min(len, s.rawIqSize);
  std::memcpy(dest, s.rawIq.get(), static_cast<std::size_t>(copied));
  return copied;
}

void Importer2::close() {
  impl->iqFile.close();
  impl->markerFile.close();
  impl->residualIFile.close();
  impl->residualQFile.close();
}

bool Importer2::openInit(const wchar_t *path) {
  auto &s = *impl;
  close();
  const bool opened = s.iqFile.open(path, "rb") == 0 && s.markerFile.open(path, "rb") == 0;
  if (!opened) {
    close();
    std::snprintf(s.errorText, sizeof s.errorText, "Failed to open the file.");
    return false;
  }
  s.wideFileName = path;
  clear();
  s.sampleCount = 0;
  s.markerCount = 0;
  s.headerBodyLen = 0;
  s.dataValid = false;
  s.keyReady = false;
  s.packageLeft = 0;
  s.currentTag = 0;
  // A walk cut short by a damaged file may have left bytes behind.
  s.stagingPos = 0;
  s.stagingEnd = 0;
  s.assembly.reset();
  return true;
}

int Importer2::runDecrypter(unsigned char *data, int len, unsigned char *key) {
  auto &s = *impl;
  if (data == nullptr || len <= 0) {
    return 0;
  }
  int pos = 0;
  if (!s.keyReady) {
    if (key == nullptr) {
      return 0;
    }
    // A file shorter than its head still gets a (zero-filled) head.
    std::memset(s.staging, 0, 32);
    std::memcpy(s.staging, data, static_cast<std::size_t>(std::min(len, 32)));
    unPackageBaseHeader(key);
    pos = std::min(len, 32);
  }
  while (len - pos >= 16) {
    if (stagingSize - s.stagingEnd < 16 && (flush() < 0 || stagingSize - s.stagingEnd < 16)) {
      break; // a body that cannot be stored: stop rather than spin
    }
    const int blocks = std::min((len - pos) / 16, (stagingSize - s.stagingEnd) / 16);
    s.decryptor.process(s.staging + s.stagingEnd, data + pos, static_cast<unsigned int>(blocks * 16));
    s.stagingEnd += blocks * 16;
    pos += blocks * 16;
    if (stagingSize - s.stagingEnd < 16 && flush() < 0) {
      break;
    }
  }
  return pos;
}

int Importer2::flush() {
  auto &s = *impl;
  while (s.stagingPos != s.stagingEnd) {
    const int available = s.stagingEnd - s.stagingPos;
    if (s.packageLeft > 0) {
      const int take = static_cast<int>(std::min<std::int64_t>(s.packageLeft, available));
      if (s.assembly.append(s.staging + s.stagingPos, take) == 0) {
        s.dataValid = false;
        return -1;
      }
      s.stagingPos += take;
      s.packageLeft -= take;
      if (s.packageLeft == 0) {
        s.stagingPos = static_cast<int>(std::min<std::int64_t>(roundUp16(s.stagingPos), s.stagingEnd));
      }
      continue;
    }
    // Prefixes start on 8-byte bounds inside whole decrypted blocks, so a
    // short rest only comes from a damaged walk; it waits for more bytes.
    if (available < 8) {
      break;
    }
    saveDecryptedData();
    const unsigned int tag = bigEndianWord(s.staging + s.stagingPos);
    const std::uint32_t length = bigEndianWord(s.staging + s.stagingPos + 4);
    s.stagingPos += 8;
    s.currentTag = tag;
    s.packageLeft = length;
    if (tag == 2 || tag == 4) {
      const int bytesPerSample = tag == 2 ? 4 : 8;
      s.sampleCount = length / bytesPerSample;
      s.formatFlag = tag == 2 ? 0 : 1;
      s.iqOffset = roundUp16(std::int64_t{s.headerBodyLen} + 40);
      s.markerOffset = (s.iqOffset + s.sampleCount * bytesPerSample + 23) / 16 * 16;
      if (s.residualWidth != 0) {
        s.residualIOffset = (s.markerOffset + s.sampleCount + 23) / 16 * 16;
        s.residualQOffset = s.residualIOffset + s.residualWidth * s.sampleCount;
        s.residualIFile.open(s.wideFileName.c_str(), "rb");
        s.residualQFile.open(s.wideFileName.c_str(), "rb");
        s.residualIFile.seek(s.residualIOffset, 0);
        s.residualQFile.seek(s.residualQOffset, 0);
      }
    }
    s.assembly.reset();
  }
  const int unread = s.stagingEnd - s.stagingPos;
  std::memmove(s.staging, s.staging + s.stagingPos, static_cast<std::size_t>(unread));
  s.stagingPos = 0;
  s.stagingEnd = unread;
  return 0;
}

void Importer2::saveDecryptedData() {
  auto &s = *impl;
  const int size = s.assembly.size();
  auto take = [&]() {
    std::unique_ptr<unsigned char[]> bytes(new unsigned char[static_cast<std::size_t>(size) + 1]);
    s.assembly.copyTo(bytes.get());
    return bytes;
  };
  switch (s.currentTag) {
  case 1:
    s.headerBody = take();
    s.headerBodyLen = size;
    s.dataValid = true;
    break;
  case 2:
  case 4:
    s.rawIq = take();
    s.rawIqSize = size;
    break;
  case 3:
    s.rawMarkers = take();
    s.rawMarkersSize = size;
    s.markerCount = 4;
    break;
  default:
    break;
  }
}

void Importer2::unPackageBaseHeader(unsigned char *key) {
  auto &s = *impl;
  s.headerHead = std::make_unique<unsigned char[]>(16);
  unsigned char mask[4];
  for (int n = 0; n < 4; ++n) {
    mask[n] = static_cast<unsigned char>(s.keyMask >> (8 * n));
  }
  EncryptKey::getFixedKey(key, mask);
  s.decryptor.init(key);
  unsigned char plain[32] = {};
  s.decryptor.process(plain, s.staging, 32);
  unsigned char dataKey[16];
  EncryptKey::generateKey(plain, dataKey);
  s.keyReady = true;
  s.decryptor.init(dataKey);
  // The salt at bytes 8 to 15 and 24 to 31 is not part of the header.
  std::memcpy(s.headerHead.get(), plain, 8);
  std::memcpy(s.headerHead.get() + 8, plain + 16, 8);
}

void Importer2::extractData(unsigned char *raw, double *i, double *q, int samples) {
  if (raw == nullptr || i == nullptr || q == nullptr || samples <= 0) {
    return;
  }
  for (int n = 0; n < samples; ++n) {
    const unsigned char *p = raw + 4 * static_cast<std::int64_t>(n);
    i[n] = static_cast<std::int16_t>(static_cast<std::uint16_t>((p[0] << 8) | p[1]));
    q[n] = static_cast<std::int16_t>(static_cast<std::uint16_t>((p[2] << 8) | p[3]));
  }
  if (impl->residualWidth != 0) {
    addResBits(i, q, samples);
  }
  for (int n = 0; n < samples; ++n) {
    i[n] /= 32767.0;
    q[n] /= 32767.0;
  }
}

void Importer2::addResBits(double *i, double *q, int samples) {
  auto &s = *impl;
  const int width = s.residualWidth == 1 || s.residualWidth == 2 ? s.residualWidth : 4;
  if (samples <= 0) {
    return;
  }
  const auto bytes = static_cast<std::size_t>(samples) * static_cast<std::size_t>(width);
  // Values missing at the end of the file count as 0.
  std::vector<unsigned char> values(bytes);
  for (auto [file, out] : {std::pair{&s.residualIFile, i}, std::pair{&s.residualQFile, q}}) {
    std::fill(values.begin(), values.end(), 0);
    file->read(values.data(), bytes);
    for (int n = 0; n < samples; ++n) {
      out[n] += residualValue(values.data() + static_cast<std::size_t>(n) * width, width);
    }
  }
}

void Importer2::clear() {
  auto &s = *impl;
  s.rawIq.reset();
  s.rawIqSize = 0;
  s.rawMarkers.reset();
  s.rawMarkersSize = 0;
  s.headerBody.reset();
  s.headerHead.reset();
  s.iValues.reset();
  s.qValues.reset();
}

const char *Importer2::lastError() const { return impl->errorText; }

void Importer2::setResidualWidth(int bytes) { impl->residualWidth = bytes < 0 ? 0 : bytes; }
