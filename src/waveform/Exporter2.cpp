#include "wavemill/waveform/Exporter2.h"

#include "wavemill/waveform/EncryptKey.h"

#include "waveform/RemoveWrittenFile.h"

#include <algorithm>
#include <climits>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <new>
#include <vector>

using Corvane::Wavemill::Buffer_DataReader;
using Corvane::Wavemill::EncryptKey;
using Corvane::Wavemill::Encryptor;
using Corvane::Wavemill::fixedFileKey;
using Corvane::Wavemill::HeaderBuffer_DataReader;
using Corvane::Wavemill::WPL_Packager;

namespace {

constexpr int bufferBytes = 1024;
constexpr int headBytes = 32;
constexpr int blockBytes = 16;
// The most samples whose 4-byte IQ form an int can count.
constexpr int maxSamples = INT_MAX / 4;
// The stdio buffer of the target: the file gets 1024-byte writes, which
// would otherwise become as many system calls as the default buffer allows.
constexpr std::size_t streamBufferBytes = 1 << 18;

// A sample value as stored: +-0.5 unless truncating, then truncated toward
// zero, keeping the low 16 bits. NaN gives 0, and clamping first keeps the
// conversion defined for any magnitude.
inline std::uint16_t quantise(double value, bool truncate) {
  if (std::isnan(value)) {
    return 0;
  }
  if (!truncate) {
    value += value < 0.0 ? -0.5 : 0.5;
  }
  value = std::min(std::max(value, -9.0e18), 9.0e18);
  return static_cast<std::uint16_t>(static_cast<std::int64_t>(value));
}

// `quantise` for values scaled from -1..1, where a 32-bit conversion loses
// nothing and vectorises; others (a derived normalize may give any) take the
// general way.
inline std::uint16_t quantiseScaled(double value, bool truncate) {
  if (!(value > -2.0e9 && value < 2.0e9)) {
    return quantise(value, truncate);
  }
  if (!truncate) {
    value += value < 0.0 ? -0.5 : 0.5;
  }
  return static_cast<std::uint16_t>(static_cast<std::int32_t>(value));
}

struct FreeDeleter {
  void operator()(double *p) const { std::free(p); }
};

// Zeroed doubles; calloc gets large blocks as fresh zero pages, without
// the memset of a value-initialised new[].
std::unique_ptr<double[], FreeDeleter> zeroedDoubles(std::size_t n) {
  auto *p = static_cast<double *>(std::calloc(n == 0 ? 1 : n, sizeof(double)));
  if (p == nullptr) {
    throw std::bad_alloc();
  }
  return std::unique_ptr<double[], FreeDeleter>(p);
}

} // namespace

Exporter2::Exporter2(const std::string &fileName, unsigned char *header, int headerLen)
    : fileName(fileName), fileBuffer(std::make_unique<unsigned char[]>(bufferBytes)),
      headBuffer(std::make_unique<unsigned char[]>(bufferBytes)) {
  const int given = header == nullptr || headerLen < 0 ? 0 : headerLen;
  // The head needs 16 header bytes; a shorter header reads as zero-padded,
  // which keeps the header package's length word at 0 instead of negative.
  this->headerLen = std::max(given, 16);
  headerData = std::make_unique<unsigned char[]>(static_cast<std::size_t>(this->headerLen));
  if (given > 0) {
    std::memcpy(headerData.get(), header, static_cast<std::size_t>(given));
  }
  packageBase(headBuffer.get(), headerData.get());
  unsigned char dataKey[16];
  EncryptKey::generateKey(headBuffer.get(), dataKey);
  encryptor = std::make_unique<Encryptor>();
  encryptor->init(fixedFileKey);
  unsigned char head[headBytes];
  encryptor->process(head, headBuffer.get(), headBytes);
  std::memcpy(headBuffer.get(), head, headBytes);
  encryptor->init(dataKey);
  pkgState = 0;
  std::FILE *file = std::fopen(fileName.c_str(), "wb");
  if (file == nullptr) {
    writeFailed = true;
  } else if (std::fclose(file) != 0) {
    discardOutput();
  }
}

Exporter2::~Exporter2() = default;

bool Exporter2::setData(double *i, double *q, unsigned char *markers, int samples, int markerCount) {
  if (finished || !convertData(i, q, markers, samples, markerCount)) {
    return false;
  }
  getNextPackager();
  appendEncryptedData(fileName);
  return true;
}

int64_t Exporter2::getPkgSize() { return 0; }

int Exporter2::pkgTag() { return static_cast<int>(pkgState); }

void Exporter2::normalize(const double *i, const double *q, double *outI, double *outQ, int n) {
  // Four running maxima break the chain of dependent comparisons; NaN
  // never compares greater, so it is skipped as with one.
  double peaks[4] = {0.0, 0.0, 0.0, 0.0};
  int k = 0;
  for (; k + 2 <= n; k += 2) {
    peaks[0] = std::max(peaks[0], std::fabs(i[k]));
    peaks[1] = std::max(peaks[1], std::fabs(q[k]));
    peaks[2] = std::max(peaks[2], std::fabs(i[k + 1]));
    peaks[3] = std::max(peaks[3], std::fabs(q[k + 1]));
  }
  for (; k < n; ++k) {
    peaks[0] = std::max({peaks[0], std::fabs(i[k]), std::fabs(q[k])});
  }
  const double peak = std::max({peaks[0], peaks[1], peaks[2], peaks[3]});
  if (peak > 0.0) {
    for (k = 0; k < n; ++k) {
      outI[k] = i[k] / peak;
      outQ[k] = q[k] / peak;
    }
  }
}

short Exporter2::round(double value) const { return static_cast<short>(quantise(value, truncateSamples != 0)); }

bool Exporter2::convertData(double *i, double *q, unsigned char *markers, int samples, int markerCount) {
  if (samples < 0 || samples > maxSamples || markerCount < 0 ||
      (samples > 0 && (i == nullptr || q == nullptr || (markerCount > 0 && markers == nullptr)))) {
    return false;
  }
  const auto n = static_cast<std::size_t>(samples);
  // With a peak of 0 normalize leaves its outputs alone. Such input is all
  // zeros (or NaN, which is stored as 0), so zeroed outputs give the
  // samples unscaled.
  const auto outI = zeroedDoubles(n);
  const auto outQ = zeroedDoubles(n);
  normalize(i, q, outI.get(), outQ.get(), samples);
  // Every byte is written below, so the array is not value-initialised.
  std::unique_ptr<unsigned char[]> iq(new unsigned char[n * 4]);
  const bool truncate = truncateSamples != 0;
  for (std::size_t s = 0; s < n; ++s) {
    const std::uint16_t iValue = quantiseScaled(outI[s] * 32767.0, truncate);
    const std::uint16_t qValue = quantiseScaled(outQ[s] * 32767.0, truncate);
    iq[4 * s] = static_cast<unsigned char>(iValue >> 8);
    iq[4 * s + 1] = static_cast<unsigned char>(iValue);
    iq[4 * s + 2] = static_cast<unsigned char>(qValue >> 8);
    iq[4 * s + 3] = static_cast<unsigned char>(qValue);
  }
  auto packed = std::make_unique<unsigned char[]>(n);
  const auto channels = static_cast<std::size_t>(markerCount);
  for (std::size_t s = 0; markerCount > 0 && s < n; ++s) {
    for (std::size_t c = 0; c < channels && c < 4; ++c) {
      if (markers[s * channels + c] != 0) {
        packed[s] = static_cast<unsigned char>(packed[s] | (1u << c));
      }
    }
  }
  iqData = std::move(iq);
  iqSize = samples * 4;
  markerData = std::move(packed);
  markerSize = samples;
  return true;
}

bool Exporter2::convertData(unsigned char *iq, unsigned char *markers, int samples) {
  if (samples < 0 || samples > maxSamples || (samples > 0 && iq == nullptr)) {
    return false;
  }
  const auto n = static_cast<std::size_t>(samples);
  auto iqCopy = std::make_unique<unsigned char[]>(n * 4);
  auto markerCopy = std::make_unique<unsigned char[]>(n);
  if (n > 0) {
    std::memcpy(iqCopy.get(), iq, n * 4);
    if (markers != nullptr) {
      std::memcpy(markerCopy.get(), markers, n);
    }
  }
  iqData = std::move(iqCopy);
  iqSize = samples * 4;
  markerData = std::move(markerCopy);
  markerSize = samples;
  return true;
}

void Exporter2::addSalt(unsigned char *dest, int len) {
  std::srand(static_cast<unsigned int>(std::time(nullptr)));
  for (int k = 0; dest != nullptr && k < len; ++k) {
    dest[k] = static_cast<unsigned char>(std::rand() & 0xff);
  }
}

void Exporter2::packageBase(unsigned char *dest, const unsigned char *header) {
  if (dest != nullptr && header != nullptr) {
    // Each round seeds anew, so the two salts differ only when the clock
    // ticks between them; files made so have always looked like this.
    for (int half = 0; half < 2; ++half) {
      std::memcpy(dest + 16 * half, header + 8 * half, 8);
      addSalt(dest + 16 * half + 8, 8);
    }
  }
  headPos = 0;
  headEnd = headBytes;
}

void Exporter2::startPackager(WPL_Packager *previous) {
  std::unique_ptr<WPL_Packager> old(previous);
  unsigned char leftover[blockBytes];
  int leftoverCount = 0;
  if (old) {
    leftoverCount = old->getLeftoverBytes(leftover);
    if (packager == previous) {
      packager = nullptr;
    }
    old.reset();
  }
  const int64_t pkgSize = getPkgSize();
  const int tag = pkgTag();
  // The length word is 32 bits wide; longer packages wrap, as they always did.
  packager = new WPL_Packager(reader.get(), encryptor.get(), tag, 256, blockBytes, static_cast<unsigned int>(pkgSize),
                              static_cast<unsigned int>(leftoverCount), leftover);
}

void Exporter2::continueChain(std::unique_ptr<WPL_Packager> &chain) {
  startPackager(chain.release());
  chain.reset(packager);
}

void Exporter2::getNextPackager() {
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
    pkgState = 2;
    if (iqData) {
      reader = std::make_unique<Buffer_DataReader>(iqData.get(), iqSize);
    }
    continueChain(iqPackager);
    break;
  case 2:
    pkgState = 3;
    if (markerData) {
      reader = std::make_unique<Buffer_DataReader>(markerData.get(), markerSize);
    }
    continueChain(markerPackager);
    break;
  default:
    finished = true;
    if (pkgState == 3) {
      packager = nullptr;
    }
    break;
  }
}

int Exporter2::readBlocks(unsigned char *dest, int blocks) {
  int delivered = 0;
  while (blocks > 0 && packager != nullptr) {
    const int got = packager->getBlocks(dest, blocks);
    blocks -= got;
    dest += got * blockBytes;
    delivered += got;
    if (blocks > 0) {
      getNextPackager();
      // A finished export has no package left that could deliver more.
      if (finished) {
        break;
      }
    }
  }
  return delivered;
}

uint64_t Exporter2::readEncryptedData(unsigned char *dest, uint64_t size) {
  if (finished || dest == nullptr) {
    return 0;
  }
  uint64_t delivered = 0;
  while (size > 0 && !finished) {
    const uint64_t before = delivered;
    const auto fromHead = std::min<uint64_t>(static_cast<uint64_t>(headEnd - headPos), size);
    std::memcpy(dest, headBuffer.get() + headPos, fromHead);
    headPos += static_cast<int>(fromHead);
    dest += fromHead;
    size -= fromHead;
    delivered += fromHead;
    if (size > blockBytes) {
      const auto blocks = static_cast<int>(std::min<uint64_t>(size / blockBytes, INT_MAX / blockBytes));
      const auto got = static_cast<uint64_t>(readBlocks(dest, blocks)) * blockBytes;
      dest += got;
      size -= got;
      delivered += got;
    }
    if (size > 0 && !finished) {
      headPos = 0;
      headEnd = blockBytes * readBlocks(headBuffer.get(), 1);
    }
    // With no packager left nothing more can come, finished or not.
    if (delivered == before && headPos == headEnd) {
      break;
    }
  }
  return delivered;
}

void Exporter2::appendEncryptedData(const std::string &path) {
  std::FILE *file = writeFailed ? nullptr : std::fopen(path.c_str(), "ab");
  bool written = writeFailed || file != nullptr;
  if (file != nullptr) {
    if (!streamBuffer) {
      streamBuffer = std::make_unique<char[]>(streamBufferBytes);
    }
    std::setvbuf(file, streamBuffer.get(), _IOFBF, streamBufferBytes);
  }
  for (;;) {
    const uint64_t got = readEncryptedData(fileBuffer.get(), bufferBytes);
    if (got == 0) {
      break;
    }
    if (file != nullptr && std::fwrite(fileBuffer.get(), 1, got, file) != got) {
      written = false;
    }
  }
  if (file != nullptr && std::fclose(file) != 0) {
    written = false;
  }
  if (!written) {
    discardOutput();
  }
}

void Exporter2::discardOutput() {
  writeFailed = true;
  Corvane::Wavemill::removeWrittenFile(fileName);
}
