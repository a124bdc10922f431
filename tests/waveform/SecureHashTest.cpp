#include "wavemill/waveform/SecureHash.h"

#include <gtest/gtest.h>
#include <openssl/evp.h>
#include <openssl/hmac.h>

#include <random>
#include <string>
#include <vector>

using Corvane::Wavemill::SecureHash;

namespace {

using Bytes = std::vector<unsigned char>;

std::string hexOf(const unsigned char *bytes, std::size_t count) {
  static const char digits[] = "0123456789abcdef";
  std::string text;
  for (std::size_t i = 0; i < count; ++i) {
    text += digits[bytes[i] >> 4];
    text += digits[bytes[i] & 15];
  }
  return text;
}

const unsigned char *bytesOf(const std::string &text) { return reinterpret_cast<const unsigned char *>(text.data()); }

std::string sha1Hex(const std::string &message) {
  unsigned char digest[20];
  SecureHash::SHA1(bytesOf(message), static_cast<unsigned int>(message.size()), digest);
  return hexOf(digest, 20);
}

std::string hmacHex(const std::string &message, const std::string &key) {
  unsigned char mac[20];
  SecureHash::HMACSHA1(bytesOf(message), static_cast<unsigned int>(message.size()), bytesOf(key),
                       static_cast<unsigned int>(key.size()), mac);
  return hexOf(mac, 20);
}

std::string openSslHmacHex(const std::string &message, const void *key, int keyLength) {
  unsigned char mac[20];
  unsigned int length = 0;
  HMAC(EVP_sha1(), key, keyLength, bytesOf(message), message.size(), mac, &length);
  return hexOf(mac, length);
}

} // namespace

TEST(SecureHashTest, PublishedDigestsHoldWholeAndFedInPieces) {
  const struct {
    std::string message;
    const char *digest;
  } rows[] = {
      {"abc", "a9993e364706816aba3e25717850c26c9cd0d89d"},
      {"", "da39a3ee5e6b4b0d3255bfef95601890afd80709"},
      {"abcdbcdecdefdefgefghfghighijhijkijkljklmklmnlmnomnopnopq", "84983e441c3bd26ebaae4aa1f95129e5e54670f1"},
      {std::string(1000000, 'a'), "34aa973cd4c4daa4f61eeb2bdbad27316534016f"},
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(row.message.substr(0, 60));
    EXPECT_EQ(sha1Hex(row.message), row.digest);
    // Odd piece sizes put the block boundaries everywhere inside a piece.
    SecureHash hash;
    for (std::size_t at = 0, piece = 1; at < row.message.size(); at += piece, piece = piece * 3 % 1001 + 1) {
      const std::size_t take = std::min(piece, row.message.size() - at);
      hash.update(bytesOf(row.message) + at, static_cast<unsigned int>(take));
    }
    hash.final();
    unsigned char digest[20];
    hash.getHash(digest);
    EXPECT_EQ(hexOf(digest, 20), row.digest);
  }
  unsigned int word = 0, hi = 0, lo = 0;
  SecureHash::SHA1_32(bytesOf("abc"), 3, &word);
  SecureHash::SHA1_64(bytesOf("abc"), 3, &hi, &lo);
  EXPECT_EQ(word, 0x4706816au);
  EXPECT_EQ(hi, 0xa9993e36u);
  EXPECT_EQ(lo, 0x4706816au);
}

TEST(SecureHashTest, PublishedHmacVectorsHold) {
  std::string counting;
  for (char c = 1; c <= 25; ++c) {
    counting += c;
  }
  const struct {
    std::string key;
    std::string data;
    const char *mac;
  } rows[] = {
      {std::string(20, '\x0b'), "Hi There", "b617318655057264e28bc0b6fb378c8ef146be00"},
      {"Jefe", "what do ya want for nothing?", "effcdf6ae5eb2fa2d27416d5f184df9c259a7c79"},
      {std::string(20, '\xaa'), std::string(50, '\xdd'), "125d7342b9ac11cd91a39af48aa17b4f63f175d3"},
      {counting, std::string(50, '\xcd'), "4c9007f4026250c6bc8414f9bf50c86c2d7235da"},
      {std::string(20, '\x0c'), "Test With Truncation", "4c1a03424b55e07fe7f27be1d58bb9324a9a5a04"},
      {std::string(80, '\xaa'), "Test Using Larger Than Block-Size Key - Hash Key First",
       "aa4ae5e15272d00e95705637ce8a3b55ed402112"},
      {std::string(80, '\xaa'), "Test Using Larger Than Block-Size Key and Larger Than One Block-Size Data",
       "e8e99d0f45237d786d6bbaa7965c7808bbff1a91"},
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(row.data);
    EXPECT_EQ(hmacHex(row.data, row.key), row.mac);
  }
}

TEST(SecureHashTest, RandomInputsMatchOpenSsl) {
  std::mt19937 random(99);
  const std::string fixedKey(SecureHash::hmacFixedKey, SecureHash::hmacFixedKeyLength);
  ASSERT_EQ(fixedKey.size(), 41u);
  ASSERT_EQ(fixedKey.back(), '\0');
  for (std::size_t length : {0, 1, 32, 55, 56, 63, 64, 65, 119, 120, 128, 1000, 4099}) {
    for (std::size_t keyLength : {0, 1, 20, 41, 63, 64, 65, 130}) {
      SCOPED_TRACE("length " + std::to_string(length) + ", key " + std::to_string(keyLength));
      std::string message(length, '\0'), key(keyLength, '\0');
      for (auto &c : message) {
        c = static_cast<char>(random());
      }
      for (auto &c : key) {
        c = static_cast<char>(random());
      }
      unsigned char digest[20];
      unsigned int digestLength = 0;
      EVP_Digest(message.data(), message.size(), digest, &digestLength, EVP_sha1(), nullptr);
      EXPECT_EQ(sha1Hex(message), hexOf(digest, digestLength));
      EXPECT_EQ(hmacHex(message, key), openSslHmacHex(message, key.data(), static_cast<int>(key.size())));
    }
    SCOPED_TRACE("fixed key, length " + std::to_string(length));
    const std::string message(length, 'w');
    const std::string expected = openSslHmacHex(message, fixedKey.data(), 41);
    char text[41];
    unsigned int hi = 0, lo = 0;
    SecureHash::HMACSHA1_hex(bytesOf(message), static_cast<unsigned int>(length), text);
    SecureHash::HMACSHA1_64(bytesOf(message), static_cast<unsigned int>(length), &hi, &lo);
    EXPECT_EQ(std::string(text), expected);
    EXPECT_EQ(hi, std::stoul(expected.substr(0, 8), nullptr, 16));
    EXPECT_EQ(lo, std::stoul(expected.substr(8, 8), nullptr, 16));
  }
}
