#pragma once

#include "wavemill/waveform/EncryptKey.h"
#include "wavemill/waveform/Encryptor.h"

#include <gtest/gtest.h>
#include <openssl/evp.h>
#include <openssl/sha.h>

#include <cstdint>
#include <fstream>
#include <iterator>
#include <string>
#include <utility>
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

/// AES-128-ECB decryption by OpenSSL: the files the library writes are read
/// back by a cipher, and a key derivation, that owe nothing to it.
inline Bytes opensslDecrypt(const unsigned char *key, const Bytes &cipher) {
  Bytes plain(cipher.size());
  EVP_CIPHER_CTX *ctx = EVP_CIPHER_CTX_new();
  EVP_DecryptInit_ex(ctx, EVP_aes_128_ecb(), nullptr, key, nullptr);
  EVP_CIPHER_CTX_set_padding(ctx, 0);
  int length = 0;
  EVP_DecryptUpdate(ctx, plain.data(), &length, cipher.data(), static_cast<int>(cipher.size()));
  EVP_CIPHER_CTX_free(ctx);
  plain.resize(static_cast<std::size_t>(length));
  return plain;
}

/// Takes the file at `path` apart: the head under the file key, spelled out
/// here so that the check does not borrow it, and the rest under the first
/// 16 bytes of the SHA-1 of the plain head.
inline WaveformFile openWaveform(const std::string &path) {
  static const unsigned char headKey[16] = {0x54, 0x0a, 0x1e, 0x71, 0x2a, 0xba, 0x28, 0x70,
                                            0xe9, 0x7b, 0x16, 0x19, 0x97, 0xe2, 0x99, 0xe0};
  const Bytes raw = readBytes(path);
  WaveformFile file;
  file.size = raw.size();
  if (raw.size() < 32) {
    return file;
  }
  file.head = opensslDecrypt(headKey, Bytes(raw.begin(), raw.begin() + 32));
  Bytes dataKey(SHA_DIGEST_LENGTH);
  SHA1(file.head.data(), 32, dataKey.data());
  const Bytes plain = opensslDecrypt(dataKey.data(), Bytes(raw.begin() + 32, raw.end()));
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

/// Expects the file at `path` to be laid out byte for byte as the exporters
/// write it: the first 16 bytes of `header` around two salts in the head,
/// then the header package (tag 1, the rest of `header`), the IQ package and
/// the marker package (tag 3), each with its length word, whole body and zero
/// padding, and nothing more. Answers the file for further checks.
inline WaveformFile expectWaveform(const std::string &path, const Bytes &header, const Bytes &iq, const Bytes &markers,
                                   std::uint32_t iqTag = 2) {
  const WaveformFile file = openWaveform(path);
  EXPECT_EQ(file.size, 32 + pad(8 + header.size() - 16) + pad(8 + iq.size()) + pad(8 + markers.size()));
  if (file.head.size() < 32 || file.packages.size() != 3) {
    ADD_FAILURE() << path << " holds " << file.packages.size() << " packages";
    return file;
  }
  EXPECT_EQ(Bytes(file.head.begin(), file.head.begin() + 8), Bytes(header.begin(), header.begin() + 8));
  EXPECT_EQ(Bytes(file.head.begin() + 16, file.head.begin() + 24), Bytes(header.begin() + 8, header.begin() + 16));
  const Bytes headerBody(header.begin() + 16, header.end());
  const std::pair<std::uint32_t, const Bytes *> expected[] = {{1, &headerBody}, {iqTag, &iq}, {3, &markers}};
  for (std::size_t k = 0; k < 3; ++k) {
    SCOPED_TRACE("package " + std::to_string(k));
    EXPECT_EQ(file.packages[k].tag, expected[k].first);
    EXPECT_EQ(file.packages[k].length, expected[k].second->size());
    EXPECT_TRUE(file.packages[k].body == *expected[k].second);
    EXPECT_TRUE(file.packages[k].zeroPadded);
  }
  return file;
}

} // namespace Corvane::Wavemill::Testing
