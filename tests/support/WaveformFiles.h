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

inline std::size_t pad(std::size_t n) { return (n + 15) / 16 * 16; }

inline Bytes readBytes(const std::string &path) {
  std::ifstream in(path, std::ios::binary);
  return Bytes(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
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

/// AES-128-ECB of the whole blocks of `in` (the rest stays zero) with the
/// library's Encryptor or Decryptor.
template <class Cipher> Bytes cipherBlocks(const unsigned char *key, const Bytes &in) {
  Bytes out(in.size());
  Cipher cipher;
  cipher.init(key);
  cipher.process(out.data(), in.data(), static_cast<unsigned int>(in.size()));
  return out;
}

inline Bytes dataKeyOf(const Bytes &head) {
  Bytes key(16);
  EncryptKey::generateKey(head.data(), key.data());
  return key;
}

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
  plain.resize(pad(plain.size()), 0);
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
  const Bytes head = cipherBlocks<Encryptor>(fixedFileKey, Bytes(plain.begin(), plain.begin() + 32));
  const auto whole = static_cast<std::ptrdiff_t>(32 + (plain.size() - 32) / 16 * 16);
  Bytes out = cipherBlocks<Encryptor>(dataKeyOf(plain).data(), Bytes(plain.begin() + 32, plain.begin() + whole));
  out.insert(out.begin(), head.begin(), head.end());
  out.insert(out.end(), plain.begin() + whole, plain.end());
  return out;
}

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
    const std::size_t end = std::min<std::size_t>(pos + 8 + p.length, plain.size());
    p.body.assign(plain.begin() + static_cast<std::ptrdiff_t>(pos + 8),
                  plain.begin() + static_cast<std::ptrdiff_t>(end));
    const std::size_t next = pad(end);
    p.zeroPadded = true;
    for (std::size_t k = end; k < next && k < plain.size(); ++k) {
      p.zeroPadded = p.zeroPadded && plain[k] == 0;
    }
    file.packages.push_back(std::move(p));
    pos = next;
  }
  return file;
}

/// `openWaveform` with the library's own cipher and key derivation.
inline WaveformFile openWaveform(const std::string &path) {
  return openWaveform(
      path, [](const unsigned char *key, const Bytes &cipher) { return cipherBlocks<Decryptor>(key, cipher); },
      dataKeyOf, fixedFileKey);
}

} // namespace Corvane::Wavemill::Testing
