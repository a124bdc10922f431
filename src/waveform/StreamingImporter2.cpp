#include "wavemill/waveform/StreamingImporter2.h"

#include "waveform/ImporterImpl.h"
#include "wavemill/waveform/EncryptKey.h"

#include <algorithm>
#include <climits>
#include <cstdlib>
#include <cstring>
#include <ctime>

using Corvane::Wavemill::Decryptor;
using Corvane::Wavemill::Platform::WideFile;

namespace {

// One kind of data read piecewise from its own handle: the IQ body or the
// marker body.
struct Channel {
  WideFile &file;
  std::int64_t packageOffset; // of the package prefix
  std::int64_t &left;         // samples not yet delivered
  unsigned char *spill;       // 16 bytes
  int &spillCount;
  int bytesPerSample;
  bool strict; // IQ: a short read is an error; markers: what is missing reads as zero
};

// Decrypts `bytes` (a multiple of 16) in place, in pieces the cipher takes
// in one call, and answers the bytes decrypted.
std::int64_t decryptInPlace(Decryptor &decryptor, unsigned char *data, std::int64_t bytes) {
  constexpr std::int64_t piece = std::int64_t{1} << 27;
  std::int64_t done = 0;
  while (done < bytes) {
    const auto now = static_cast<unsigned int>(std::min(piece, bytes - done));
    const int result = decryptor.process(data + done, data + done, now);
    if (result <= 0) {
      break;
    }
    done += result;
    if (static_cast<unsigned int>(result) != now) {
      break;
    }
  }
  return done;
}

// Reads the next `size` bytes of a channel. The decrypted stream of one
// read covers the blocks [0, n) from the file position; the bytes wanted
// are its [skip, skip + taken), placed behind the spill in `dest`. Whole
// blocks inside that range are read and decrypted straight in `dest`; only
// the first and the last block pass through small buffers.
int readPiece(Channel c, Decryptor &decryptor, std::int64_t total, unsigned char *dest, int size) {
  if (size < 0 || (dest == nullptr && size > 0)) {
    return 0;
  }
  int skip = 0;
  if (c.left == total) {
    skip = 8;
    c.file.seek(c.packageOffset, 0);
  }
  size = static_cast<int>(std::max<std::int64_t>(0, std::min<std::int64_t>(size, c.bytesPerSample * c.left)));
  std::int64_t n = std::max<std::int64_t>(0, std::int64_t{skip} - c.spillCount + size);
  n = (n + 15) / 16 * 16;
  if (skip + size <= c.spillCount) {
    if (size > 0) {
      std::memcpy(dest, c.spill, static_cast<std::size_t>(size));
    }
    c.left -= size / c.bytesPerSample;
    return 0;
  }

  const int fromSpill = std::min(c.spillCount, size);
  const std::int64_t taken = size - fromSpill;
  const std::int64_t headEnd = skip == 0 ? 0 : 16; // n >= 16 here
  const std::int64_t wholeEnd = std::max(headEnd, (skip + taken) / 16 * 16);
  unsigned char head[16] = {};
  unsigned char tail[16] = {};
  struct Segment {
    std::int64_t begin, end;
    unsigned char *data;
  } segments[3] = {{0, headEnd, head},
                   {headEnd, wholeEnd, wholeEnd > headEnd ? dest + fromSpill + (headEnd - skip) : nullptr},
                   {wholeEnd, n, tail}};

  std::int64_t readTotal = 0;
  std::int64_t decrypted = 0;
  for (auto &segment : segments) {
    const auto length = segment.end - segment.begin;
    if (length <= 0) {
      continue;
    }
    const auto got = static_cast<std::int64_t>(c.file.read(segment.data, static_cast<std::size_t>(length)));
    readTotal += got;
    const auto whole = got / 16 * 16;
    decrypted += decryptInPlace(decryptor, segment.data, whole);
    if (!c.strict) {
      std::memset(segment.data + whole, 0, static_cast<std::size_t>(length - whole));
    }
    if (got != length) {
      break;
    }
  }
  if (readTotal > 0) {
    if (c.strict && decrypted != n) {
      throw -1;
    }
    if (fromSpill > 0) {
      std::memcpy(dest, c.spill, static_cast<std::size_t>(fromSpill));
    }
    // Copies the decrypted range [from, to) to `out`, wherever it lies.
    auto copyRange = [&](std::int64_t from, std::int64_t to, unsigned char *out) {
      for (const auto &segment : segments) {
        const auto low = std::max(from, segment.begin);
        const auto high = std::min(to, segment.end);
        const auto *source = segment.data + (low - segment.begin);
        if (low < high && source != out + (low - from)) {
          std::memmove(out + (low - from), source, static_cast<std::size_t>(high - low));
        }
      }
    };
    copyRange(skip, skip + taken, dest + fromSpill);
    const auto leftover = std::clamp<std::int64_t>(n - skip - taken, 0, 16);
    copyRange(skip + taken, skip + taken + leftover, c.spill);
    c.spillCount = static_cast<int>(leftover);
  }
  c.left -= size / c.bytesPerSample;
  return readTotal > 0 ? size : 0;
}

} // namespace

streamingImporter2::streamingImporter2() = default;

streamingImporter2::~streamingImporter2() = default;

bool streamingImporter2::Open(const wchar_t *path, unsigned char *key) {
  auto &s = *impl;
  s.streaming = true;
  if (!openInit(path)) {
    return false;
  }
  if (key == nullptr) {
    return false;
  }
  unsigned char first[1024];
  const auto got = s.iqFile.read(first, sizeof first);
  if (got == 0) {
    return false;
  }
  runDecrypter(first, static_cast<int>(got), key);
  flush();
  // Only the header is kept: the data are read piecewise from here on.
  s.rawIq.reset();
  s.rawIqSize = 0;
  s.rawMarkers.reset();
  s.rawMarkersSize = 0;
  s.assembly.reset();
  s.iqLeft = s.sampleCount;
  s.markersLeft = s.sampleCount;
  s.markerCount = 4;
  s.iqSpillCount = 0;
  s.markerSpillCount = 0;
  return true;
}

unsigned int streamingImporter2::GetKey() {
  std::srand(static_cast<unsigned int>(std::time(nullptr)));
  // Single precision on purpose: this is how the mask has always been
  // drawn. rand() == 32767 gives exactly 2^32, whose low word, 0, is a
  // valid (if useless) mask.
  const float scaled = static_cast<float>(std::rand()) / 32767.0f * 4294967296.0f;
  impl->keyMask = static_cast<unsigned int>(static_cast<std::uint64_t>(static_cast<std::int64_t>(scaled)));
  return impl->keyMask;
}

bool streamingImporter2::Open(const wchar_t *path) {
  unsigned char key[16];
  GenKey(GetKey(), key);
  return Open(path, key);
}

void streamingImporter2::GenKey(unsigned int maskWord, unsigned char *out) {
  for (int n = 0; n < 16; ++n) {
    out[n] = Corvane::Wavemill::fixedFileKey[n] ^ static_cast<unsigned char>(maskWord >> (8 * (n % 4)));
  }
}

int streamingImporter2::GetRawIQData(unsigned char *dest, int size) {
  auto &s = *impl;
  if (!s.requireValid()) {
    return 0;
  }
  const Channel iq{s.iqFile, s.iqOffset, s.iqLeft, s.iqSpill, s.iqSpillCount, s.formatFlag == 1 ? 8 : 4, true};
  return readPiece(iq, s.decryptor, s.sampleCount, dest, size);
}

int streamingImporter2::GetMarkers(unsigned char *dest, int count) {
  auto &s = *impl;
  if (!s.requireValid()) {
    return 0;
  }
  const Channel markers{s.markerFile, s.markerOffset, s.markersLeft, s.markerSpill, s.markerSpillCount, 1, false};
  return readPiece(markers, s.decryptor, s.sampleCount, dest, count);
}

int streamingImporter2::GetIQData(short *i, short *q, int samples) {
  auto &s = *impl;
  if (i == nullptr || q == nullptr || samples < 0) {
    return 0;
  }
  samples = std::min(samples, INT_MAX / 4);
  s.work.resize(static_cast<std::size_t>(samples) * 4);
  const int bytes = GetRawIQData(s.work.data(), samples * 4);
  const int count = std::min(samples, bytes / 4);
  for (int n = 0; n < count; ++n) {
    const unsigned char *p = s.work.data() + 4 * static_cast<std::size_t>(n);
    i[n] = static_cast<short>(static_cast<std::uint16_t>((p[0] << 8) | p[1]));
    q[n] = static_cast<short>(static_cast<std::uint16_t>((p[2] << 8) | p[3]));
  }
  return bytes / 4;
}

int streamingImporter2::GetIQData(double *i, double *q, int samples) {
  auto &s = *impl;
  if (i == nullptr || q == nullptr || samples < 0) {
    return 0;
  }
  samples = std::min(samples, INT_MAX / 4);
  s.work.resize(static_cast<std::size_t>(samples) * 4);
  const int bytes = GetRawIQData(s.work.data(), samples * 4);
  extractData(s.work.data(), i, q, std::min(samples, bytes / 4));
  return bytes / 4;
}
