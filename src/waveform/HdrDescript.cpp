#include "wavemill/waveform/HdrDescript.h"

#include <cstdint>
#include <cstring>

namespace {

constexpr int DescriptorBytes = 32;
constexpr int TextBytes = 23;
// The descriptor holds 22 characters of the text; byte 22 is 0 when built.
constexpr int DescriptorTextBytes = 22;
constexpr int ResOffset = 23;
constexpr int FreqOffset = 24;
// Stored resolution codes are offset by 202.
constexpr unsigned char ResBias = 202;

} // namespace

hdrDescript::hdrDescript(unsigned char *descriptor) : descript{}, res(DataResNone), freq(0.0), text{} {
  if (descriptor != nullptr) {
    std::memcpy(descript, descriptor, sizeof descript);
  }
  std::memcpy(text, descript, TextBytes);
  const auto code = static_cast<unsigned char>(descript[ResOffset] - ResBias);
  res = code == DataRes1 || code == DataRes2 || code == DataRes4 ? static_cast<DataRes>(code) : DataResNone;
  std::uint64_t bits = 0;
  for (int i = 0; i < 8; ++i) {
    bits = (bits << 8) | descript[FreqOffset + i];
  }
  std::memcpy(&freq, &bits, sizeof freq);
}

hdrDescript::hdrDescript(const char *source, DataRes res, double freq) : descript{}, res(res), freq(freq), text{} {
  if (source != nullptr) {
    // Bounded: the text need not be terminated within 23 characters.
    std::size_t length = 0;
    while (length < TextBytes && source[length] != '\0') {
      ++length;
    }
    std::memcpy(text, source, length);
  }
  std::memcpy(descript, text, DescriptorTextBytes);
  descript[ResOffset] = static_cast<unsigned char>(static_cast<unsigned int>(res) + ResBias);
  std::uint64_t bits = 0;
  std::memcpy(&bits, &freq, sizeof bits);
  for (int i = 0; i < 8; ++i) {
    descript[FreqOffset + i] = static_cast<unsigned char>(bits >> (56 - 8 * i));
  }
}

hdrDescript::~hdrDescript() = default;

void hdrDescript::getDescript(unsigned char *dest) {
  if (dest != nullptr) {
    std::memcpy(dest, descript, sizeof descript);
  }
}

int hdrDescript::getDescriptSize() { return DescriptorBytes; }

double hdrDescript::getFreq() { return freq; }

DataRes hdrDescript::getRes() { return res; }

void hdrDescript::getText(char *dest) {
  if (dest != nullptr) {
    std::memcpy(dest, text, sizeof text);
  }
}

int hdrDescript::getTextSize() { return TextBytes; }
