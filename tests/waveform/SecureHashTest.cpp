#include "wavemill/waveform/SecureHash.h"

#include "support/WaveformFiles.h"

#include <gtest/gtest.h>
#include <openssl/evp.h>
#include <openssl/hmac.h>

#include <random>
#include <string>

using namespace Corvane::Wavemill;

namespace {

std::string hexOf(const unsigned char *bytes, std::size_t count = 20) {
  static const char digits[] = "0123456789abcdef";
  std::string text;
  for (std::size_t i = 0; i < count; ++i) {
    text += digits[bytes[i] >> 4];
    text += digits[bytes[i] & 15];
  }
  return text;
}

unsigned int wordAt(const unsigned char *p) {
  return static_cast<unsigned int>(p[0]) << 24 | static_cast<unsigned int>(p[1]) << 16 |
         static_cast<unsigned int>(p[2]) << 8 | p[3];
}

} // namespace

// OpenSSL is the reference: lengths around the 64-byte block and its 56-byte
// length field, keys shorter and longer than a block.
TEST(SecureHashTest, DigestsAndMacsMatchOpenSslWholeAndFedInPieces) {
  std::mt19937 random(99);
  for (std::size_t length : {0, 3, 55, 56, 63, 64, 65, 119, 120, 4099}) {
    SCOPED_TRACE("length " + std::to_string(length));
    const Testing::Bytes message = Testing::patternBytes(length, random());
    const unsigned char *data = message.data();
    const auto n = static_cast<unsigned int>(length);
    unsigned char expected[EVP_MAX_MD_SIZE], ours[20];
    EVP_Digest(data, length, expected, nullptr, EVP_sha1(), nullptr);
    SecureHash::SHA1(data, n, ours);
    EXPECT_EQ(hexOf(ours), hexOf(expected));
    // Odd piece sizes put the block boundaries everywhere inside a piece.
    SecureHash hash;
    for (std::size_t at = 0, piece = 1; at < length; at += piece, piece = piece * 3 % 1001 + 1) {
      hash.update(data + at, static_cast<unsigned int>(std::min(piece, length - at)));
    }
    hash.final();
    hash.getHash(ours);
    EXPECT_EQ(hexOf(ours), hexOf(expected));
    unsigned int word = 0, hi = 0, lo = 0;
    SecureHash::SHA1_32(data, n, &word);
    SecureHash::SHA1_64(data, n, &hi, &lo);
    EXPECT_EQ(word, wordAt(expected + 4));
    EXPECT_EQ(hi, wordAt(expected));
    EXPECT_EQ(lo, wordAt(expected + 4));

    for (std::size_t keyLength : {0, 20, 64, 65}) {
      SCOPED_TRACE("key " + std::to_string(keyLength));
      // A byte more than the key, so that OpenSSL gets an address for an empty key.
      const Testing::Bytes key = Testing::patternBytes(keyLength + 1, random());
      HMAC(EVP_sha1(), key.data(), static_cast<int>(keyLength), data, length, expected, nullptr);
      SecureHash::HMACSHA1(data, n, key.data(), static_cast<unsigned int>(keyLength), ours);
      EXPECT_EQ(hexOf(ours), hexOf(expected));
    }
    // The fixed key is the 40 characters and their terminating zero.
    HMAC(EVP_sha1(), SecureHash::hmacFixedKey, 41, data, length, expected, nullptr);
    char text[41];
    SecureHash::HMACSHA1_hex(data, n, text);
    SecureHash::HMACSHA1_64(data, n, &hi, &lo);
    EXPECT_EQ(std::string(text), hexOf(expected));
    EXPECT_EQ(hi, wordAt(expected));
    EXPECT_EQ(lo, wordAt(expected + 4));
  }
}
