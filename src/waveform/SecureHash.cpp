#include "wavemill/waveform/SecureHash.h"

#include <cstring>
#include <new>

namespace Corvane::Wavemill {

namespace {

constexpr unsigned int BlockBytes = 64;

unsigned int wordAt(const unsigned char *p) {
  return (static_cast<unsigned int>(p[0]) << 24) | (static_cast<unsigned int>(p[1]) << 16) |
         (static_cast<unsigned int>(p[2]) << 8) | static_cast<unsigned int>(p[3]);
}

void fixedKeyHmac(const unsigned char *data, unsigned int len, unsigned char *out) {
  SecureHash::HMACSHA1(data, len, reinterpret_cast<const unsigned char *>(SecureHash::hmacFixedKey),
                       SecureHash::hmacFixedKeyLength, out);
}

} // namespace

SecureHash::SecureHash() : sha(new (std::nothrow) CSHA1) {}

SecureHash::~SecureHash() = default;

void SecureHash::reset() {
  if (sha) {
    sha->reset();
  }
}

void SecureHash::update(const unsigned char *data, unsigned int len) {
  if (sha) {
    sha->update(data, len);
  }
}

void SecureHash::final() {
  if (sha) {
    sha->final();
  }
}

void SecureHash::getHash(unsigned char *out) {
  if (sha) {
    sha->getHash(out);
  }
}

void SecureHash::SHA1(const unsigned char *data, unsigned int len, unsigned char *out) {
  CSHA1 sha;
  sha.update(data, len);
  sha.final();
  sha.getHash(out);
}

void SecureHash::SHA1_32(const unsigned char *data, unsigned int len, unsigned int *word) {
  unsigned char digest[CSHA1::HashBytes];
  SHA1(data, len, digest);
  if (word != nullptr) {
    *word = wordAt(digest + 4);
  }
}

void SecureHash::SHA1_64(const unsigned char *data, unsigned int len, unsigned int *hi, unsigned int *lo) {
  unsigned char digest[CSHA1::HashBytes];
  SHA1(data, len, digest);
  if (hi != nullptr) {
    *hi = wordAt(digest);
  }
  if (lo != nullptr) {
    *lo = wordAt(digest + 4);
  }
}

void SecureHash::HMACSHA1(const unsigned char *data, unsigned int len, const unsigned char *key, unsigned int keyLen,
                          unsigned char *out) {
  if (out == nullptr) {
    return;
  }
  unsigned char block[BlockBytes] = {};
  if (key != nullptr && keyLen > BlockBytes) {
    SHA1(key, keyLen, block);
  } else if (key != nullptr) {
    std::memcpy(block, key, keyLen);
  }
  unsigned char inner[CSHA1::HashBytes];
  CSHA1 sha;
  for (unsigned char &byte : block) {
    byte ^= 0x36;
  }
  sha.update(block, BlockBytes);
  sha.update(data, len);
  sha.final();
  sha.getHash(inner);

  // 0x36 ^ 0x5c turns the inner pad into the outer one.
  for (unsigned char &byte : block) {
    byte ^= 0x36 ^ 0x5c;
  }
  sha.reset();
  sha.update(block, BlockBytes);
  sha.update(inner, sizeof inner);
  sha.final();
  sha.getHash(out);
}

void SecureHash::HMACSHA1_64(const unsigned char *data, unsigned int len, unsigned int *hi, unsigned int *lo) {
  unsigned char mac[CSHA1::HashBytes];
  fixedKeyHmac(data, len, mac);
  if (hi != nullptr) {
    *hi = wordAt(mac);
  }
  if (lo != nullptr) {
    *lo = wordAt(mac + 4);
  }
}

void SecureHash::HMACSHA1_hex(const unsigned char *data, unsigned int len, char *out) {
  if (out == nullptr) {
    return;
  }
  unsigned char mac[CSHA1::HashBytes];
  fixedKeyHmac(data, len, mac);
  static const char digits[] = "0123456789abcdef";
  for (int i = 0; i < CSHA1::HashBytes; ++i) {
    out[2 * i] = digits[mac[i] >> 4];
    out[2 * i + 1] = digits[mac[i] & 15];
  }
  out[2 * CSHA1::HashBytes] = '\0';
}

} // namespace Corvane::Wavemill
