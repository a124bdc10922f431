#pragma once

#include "wavemill/waveform/EncryptKey.h"
#include "wavemill/waveform/Encryptor.h"

#include <cstdint>
#include <fstream>
#include <functional>
#include <iterator>
#include <string>
#include <vector>

namespace Corvane::Wavemill::Testing {

using Bytes = std::vector<unsigned char>;

/// One package of a decrypted waveform file.
struct Package {
  std::uint32_t tag = 0;
  std::uint32_t length = 0;
  Bytes body;              // `length` bytes, fewer if the file ends first
  bool zeroPadded = false; // the bytes up to the next 16-byte boundary are 0
};

/// A waveform file taken apart: the 32 plain head bytes and the packages.
struct WaveformFile {
  std::size_t size = 0;
  Bytes head;
  std::vector<Package> packages;
};

inline Bytes readBytes(const std::string &path) {
  std::ifstream in(path, std::ios::binary);
  return Bytes(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
}

/// `decrypt(key, cipher)` is AES-128-ECB under the 16-byte key and
/// `dataKey(plainHead)` derives the data key, so the same walk serves the
/// library's cipher and an independent one.
inline WaveformFile openWaveform(const std::string &path,
                                 const std::function<Bytes(const unsigned char *, const Bytes &)> &decrypt,
                                 const std::function<Bytes(const Bytes &)> &dataKey, const unsigned char *fileKey) {
  const Bytes raw = readBytes(path);
  WaveformFile file;
  file.size = raw.size();
  if (raw.size() < 32) {
    return file;
  }
  file.head = decrypt(fileKey, Bytes(raw.begin(), raw.begin() + 32));
  const Bytes plain = decrypt(dataKey(file.head).data(), Bytes(raw.begin() + 32, raw.end()));
  auto word = [&](std::size_t at) {
    return std::uint32_t{plain[at]} << 24 | std::uint32_t{plain[at + 1]} << 16 | std::uint32_t{plain[at + 2]} << 8 |
           plain[at + 3];
  };
  for (std::size_t pos = 0; pos + 8 <= plain.size();) {
    Package p;
    p.tag = word(pos);
    p.length = word(pos + 4);
    const std::size_t end = pos + 8 + p.length < plain.size() ? pos + 8 + p.length : plain.size();
    p.body.assign(plain.begin() + static_cast<std::ptrdiff_t>(pos + 8),
                  plain.begin() + static_cast<std::ptrdiff_t>(end));
    const std::size_t next = (end + 15) / 16 * 16;
    p.zeroPadded = true;
    for (std::size_t k = end; k < next && k < plain.size(); ++k) {
      p.zeroPadded = p.zeroPadded && plain[k] == 0;
    }
    file.packages.push_back(std::move(p));
    pos = next;
  }
  return file;
}

/// `openWaveform` with the library's own Decryptor and key derivation.
inline WaveformFile openWaveform(const std::string &path) {
  auto decrypt = [](const unsigned char *key, const Bytes &cipher) {
    Bytes plain(cipher.size());
    Decryptor decryptor;
    decryptor.init(key);
    decryptor.process(plain.data(), cipher.data(), static_cast<unsigned int>(cipher.size()));
    return plain;
  };
  auto dataKey = [](const Bytes &head) {
    Bytes key(16);
    EncryptKey::generateKey(head.data(), key.data());
    return key;
  };
  return openWaveform(path, decrypt, dataKey, fixedFileKey);
}

} // namespace Corvane::Wavemill::Testing
