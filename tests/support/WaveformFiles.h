#pragma once

#include "wavemill/waveform/EncryptKey.h"
#include "wavemill/waveform/Encryptor.h"

#include <gtest/gtest.h>
#include <openssl/evp.h>
#include <openssl/sha.h>

#include <algorithm>
#include <cstdint>
#include <fstream>
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
  Bytes dataKey(16);
  EncryptKey::generateKey(plain.data(), dataKey.data());
  Bytes out = cipherBlocks<Encryptor>(dataKey.data(), Bytes(plain.begin() + 32, plain.begin() + whole));
  out.insert(out.begin(), head.begin(), head.end());
  out.insert(out.end(), plain.begin() + whole, plain.end());
  return out;
}

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

/// Expects the file at `path` to decrypt to `expected` byte for byte but for
/// the two salts, which it takes from the file: the head under the file key,
/// spelled out here so that the check does not borrow it, and the rest under
/// the first 16 bytes of the SHA-1 of the plain head. Answers the plain file.
inline Bytes expectPlainWaveform(const std::string &path, Bytes expected) {
  static const unsigned char headKey[16] = {0x54, 0x0a, 0x1e, 0x71, 0x2a, 0xba, 0x28, 0x70,
                                            0xe9, 0x7b, 0x16, 0x19, 0x97, 0xe2, 0x99, 0xe0};
  const Bytes raw = readBytes(path);
  EXPECT_EQ(raw.size(), expected.size()) << path;
  if (raw.size() < 32) {
    return raw;
  }
  Bytes plain = opensslDecrypt(headKey, Bytes(raw.begin(), raw.begin() + 32));
  Bytes dataKey(SHA_DIGEST_LENGTH);
  SHA1(plain.data(), 32, dataKey.data());
  const Bytes rest = opensslDecrypt(dataKey.data(), Bytes(raw.begin() + 32, raw.end()));
  plain.insert(plain.end(), rest.begin(), rest.end());
  std::copy(plain.begin() + 8, plain.begin() + 16, expected.begin() + 8);
  std::copy(plain.begin() + 24, plain.begin() + 32, expected.begin() + 24);
  EXPECT_TRUE(plain == expected) << path << " differs from the layout";
  return plain;
}

/// Expects the file at `path` to be laid out as the exporters write it: the
/// head, the header, IQ and (unless `markers` is null) marker packages, each
/// with its length word, whole body and zero padding, and nothing more.
inline Bytes expectWaveform(const std::string &path, const Bytes &header, const Bytes &iq, const Bytes *markers,
                            std::uint32_t iqTag = 2) {
  return expectPlainWaveform(path, plainWaveform(header, iq, markers, iqTag));
}

} // namespace Corvane::Wavemill::Testing
