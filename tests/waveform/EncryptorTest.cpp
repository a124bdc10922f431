#include "wavemill/waveform/Encryptor.h"
#include "wavemill/waveform/EncryptKey.h"
#include "wavemill/waveform/SecureHash.h"

#include <gtest/gtest.h>

#include <cstring>

using namespace Corvane::Wavemill;

TEST(EncryptorTest, ProcessHandlesWholeBlocksAndRoundTripsAfterRekeying) {
  unsigned char plain[48];
  for (int i = 0; i < 48; ++i) {
    plain[i] = static_cast<unsigned char>(i * 7);
  }
  Encryptor encryptor;
  Decryptor decryptor;
  unsigned char cipher[48], back[48];
  EXPECT_EQ(encryptor.process(cipher, plain, 32), -5);
  EXPECT_EQ(decryptor.process(back, cipher, 32), -5);
  EXPECT_EQ(encryptor.init(nullptr), -4);

  const unsigned char otherKey[16] = {1, 2, 3};
  for (const unsigned char *key : {fixedFileKey, otherKey}) {
    SCOPED_TRACE(key == fixedFileKey ? "file key" : "other key");
    std::memset(cipher, 0xee, sizeof cipher);
    ASSERT_EQ(encryptor.init(key), 0);
    ASSERT_EQ(decryptor.init(key), 0);
    EXPECT_EQ(encryptor.process(cipher, plain, 31), 16);
    EXPECT_EQ(cipher[16], 0xee); // the partial block is left alone
    EXPECT_EQ(encryptor.process(cipher, plain, 15), 0);
    EXPECT_EQ(encryptor.process(cipher, plain, 48), 48);
    EXPECT_EQ(decryptor.process(back, cipher, 48), 48);
    EXPECT_EQ(std::memcmp(back, plain, 48), 0);
    EXPECT_NE(std::memcmp(cipher, plain, 16), 0);
  }
  unsigned char firstKeyCipher[16];
  encryptor.init(fixedFileKey);
  encryptor.process(firstKeyCipher, plain, 16);
  EXPECT_NE(std::memcmp(firstKeyCipher, cipher, 16), 0); // the second init took effect
}

TEST(EncryptKeyTest, DataKeyIsDigestPrefixAndMaskIsItsOwnInverse) {
  unsigned char head[32];
  for (int i = 0; i < 32; ++i) {
    head[i] = static_cast<unsigned char>(255 - i);
  }
  unsigned char digest[20], key[16];
  SecureHash::SHA1(head, 32, digest);
  EncryptKey::generateKey(head, key);
  EXPECT_EQ(std::memcmp(key, digest, 16), 0);

  unsigned char mask[4] = {0x78, 0x56, 0x34, 0x12};
  std::memcpy(key, fixedFileKey, 16);
  EncryptKey::getFixedKey(key, mask);
  EXPECT_EQ(key[0], fixedFileKey[0] ^ 0x78);
  EXPECT_EQ(key[13], fixedFileKey[13] ^ 0x56);
  EXPECT_EQ(key[15], fixedFileKey[15] ^ 0x12);
  EncryptKey::getFixedKey(key, mask);
  EXPECT_EQ(std::memcmp(key, fixedFileKey, 16), 0);
}
