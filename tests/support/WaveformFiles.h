#pragma once

#include "wavemill/waveform/EncryptKey.h"
#include "wavemill/waveform/Encryptor.h"

#include <cstdint>
#include <fstream>
#include <string>
#include <vector>

namespace Corvane::Wavemill::Testing {

using Bytes = std::vector<unsigned char>;

/// The plain form of a waveform file, laid out by hand: the 32-byte head
/// (header bytes 0-7, salt, header bytes 8-15, salt) and then each package
/// as tag, length, body and zeros to a whole block. Tests change it (a
/// length word, say) before `encryptWaveform`.
inline void appendPackage(Bytes &plain, std::uint32_t tag, const Bytes &body, std::uint32_t lengthWord) {
  for (auto word : {tag, lengthWord}) {
    for (int shift = 24; shift >= 0; shift -= 8) {
      plain.push_back(static_cast<unsigned char>(word >> shift));
    }
  }
  plain.insert(plain.end(), body.begin(), body.end());
  plain.resize((plain.size() + 15) / 16 * 16, 0);
}

/// `header` needs 16 bytes or more; `iqTag` is 2 (16-bit) or 4 (floating).
/// No marker package when `markers` is null.
inline Bytes plainWaveform(const Bytes &header, const Bytes &iq, const Bytes *markers, std::uint32_t iqTag = 2) {
  Bytes plain(header.begin(), header.begin() + 8);
  plain.insert(plain.end(), 8, 0x5a);
  plain.insert(plain.end(), header.begin() + 8, header.begin() + 16);
  plain.insert(plain.end(), 8, 0x5a);
  appendPackage(plain, 1, Bytes(header.begin() + 16, header.end()), static_cast<std::uint32_t>(header.size() - 16));
  appendPackage(plain, iqTag, iq, static_cast<std::uint32_t>(iq.size()));
  if (markers != nullptr) {
    appendPackage(plain, 3, *markers, static_cast<std::uint32_t>(markers->size()));
  }
  return plain;
}

/// Encrypts a plain file: the head under `fixedFileKey`, the rest under the
/// data key of the head. A trailing partial block stays as it is.
inline Bytes encryptWaveform(const Bytes &plain) {
  Bytes out(plain);
  unsigned char dataKey[16];
  EncryptKey::generateKey(plain.data(), dataKey);
  Encryptor encryptor;
  encryptor.init(fixedFileKey);
  encryptor.process(out.data(), plain.data(), 32);
  encryptor.init(dataKey);
  encryptor.process(out.data() + 32, plain.data() + 32, static_cast<unsigned int>(plain.size() - 32));
  return out;
}

inline void writeBytes(const std::string &path, const Bytes &bytes) {
  std::ofstream(path, std::ios::binary)
      .write(reinterpret_cast<const char *>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
}

/// A wide path for the importers; the paths of the tests are ASCII.
inline std::wstring widePath(const std::string &path) { return std::wstring(path.begin(), path.end()); }

/// `count` bytes of a fixed pseudo-random sequence.
inline Bytes patternBytes(std::size_t count, std::uint32_t seed) {
  Bytes bytes(count);
  for (auto &b : bytes) {
    seed = seed * 1664525u + 1013904223u;
    b = static_cast<unsigned char>(seed >> 24);
  }
  return bytes;
}

} // namespace Corvane::Wavemill::Testing
