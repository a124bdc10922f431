#include "wavemill/waveform/Rijndael.h"

#include <gtest/gtest.h>
#include <openssl/evp.h>

#include <cstring>
#include <functional>
#include <random>
#include <string>
#include <vector>

namespace {

using Bytes = std::vector<unsigned char>;
using Acceleration = Rijndael::Acceleration;

Bytes fromHex(const std::string &hex) {
  Bytes bytes;
  for (std::size_t i = 0; i + 1 < hex.size(); i += 2) {
    bytes.push_back(static_cast<unsigned char>(std::stoi(hex.substr(i, 2), nullptr, 16)));
  }
  return bytes;
}

Bytes randomBytes(std::mt19937 &random, std::size_t count) {
  Bytes bytes(count);
  for (auto &byte : bytes) {
    byte = static_cast<unsigned char>(random());
  }
  return bytes;
}

Rijndael::KeyLength keyLengthOf(std::size_t keyBytes) {
  return keyBytes == 16 ? Rijndael::Key16Bytes : keyBytes == 24 ? Rijndael::Key24Bytes : Rijndael::Key32Bytes;
}

// Runs `check` once per code path this processor has, and restores the
// default afterwards even when an assertion fails.
void forEachPath(const std::function<void()> &check) {
  struct Restore {
    ~Restore() { Rijndael::setAcceleration(Acceleration::Vaes); }
  } restore;
  for (int level = 0; level <= static_cast<int>(Rijndael::getHardwareAcceleration()); ++level) {
    Rijndael::setAcceleration(static_cast<Acceleration>(level));
    ASSERT_EQ(Rijndael::getAcceleration(), static_cast<Acceleration>(level));
    SCOPED_TRACE("path " + std::to_string(level));
    check();
  }
}

// Our cipher over a whole buffer; block operations, or the padded ones.
Bytes ours(Rijndael::Mode mode, Rijndael::Direction dir, const Bytes &key, const Bytes &iv, const Bytes &in,
           bool padded = false) {
  Rijndael aes;
  EXPECT_EQ(aes.init(mode, dir, key.data(), keyLengthOf(key.size()), iv.empty() ? nullptr : iv.data()), 0);
  Bytes out(in.size() + 16);
  int count = 0;
  if (padded) {
    count = dir == Rijndael::Encrypt ? aes.padEncrypt(in.data(), static_cast<int>(in.size()), out.data())
                                     : aes.padDecrypt(in.data(), static_cast<int>(in.size()), out.data());
  } else {
    const int bits = static_cast<int>(in.size() * 8);
    count = (dir == Rijndael::Encrypt ? aes.blockEncrypt(in.data(), bits, out.data())
                                      : aes.blockDecrypt(in.data(), bits, out.data())) /
            8;
  }
  out.resize(static_cast<std::size_t>(count < 0 ? 0 : count));
  return out;
}

Bytes openSsl(const EVP_CIPHER *cipher, bool encrypt, const Bytes &key, const Bytes &iv, const Bytes &in, bool padded) {
  EVP_CIPHER_CTX *ctx = EVP_CIPHER_CTX_new();
  Bytes out(in.size() + 32);
  int length = 0;
  int tail = 0;
  EVP_CipherInit_ex(ctx, cipher, nullptr, key.data(), iv.empty() ? nullptr : iv.data(), encrypt ? 1 : 0);
  EVP_CIPHER_CTX_set_padding(ctx, padded ? 1 : 0);
  EVP_CipherUpdate(ctx, out.data(), &length, in.data(), static_cast<int>(in.size()));
  EVP_CipherFinal_ex(ctx, out.data() + length, &tail);
  EVP_CIPHER_CTX_free(ctx);
  out.resize(static_cast<std::size_t>(length + tail));
  return out;
}

} // namespace

TEST(RijndaelTest, PublishedVectorsHoldForEveryKeyLengthDirectionAndPath) {
  const struct {
    const char *key;
    const char *cipher;
  } rows[] = {
      {"000102030405060708090a0b0c0d0e0f", "69c4e0d86a7b0430d8cdb78070b4c55a"},
      {"000102030405060708090a0b0c0d0e0f1011121314151617", "dda97ca4864cdfe06eaf70a0ec0d7191"},
      {"000102030405060708090a0b0c0d0e0f101112131415161718191a1b1c1d1e1f", "8ea2b7ca516745bfeafc49904b496089"},
  };
  const Bytes plain = fromHex("00112233445566778899aabbccddeeff");
  for (const auto &row : rows) {
    SCOPED_TRACE(row.key);
    const Bytes key = fromHex(row.key);
    // 19 copies run the wide loops and their tails as well as a single block.
    Bytes plainRun, cipherRun;
    for (int i = 0; i < 19; ++i) {
      plainRun.insert(plainRun.end(), plain.begin(), plain.end());
      const Bytes cipher = fromHex(row.cipher);
      cipherRun.insert(cipherRun.end(), cipher.begin(), cipher.end());
    }
    forEachPath([&] {
      EXPECT_EQ(ours(Rijndael::ECB, Rijndael::Encrypt, key, {}, plain), fromHex(row.cipher));
      EXPECT_EQ(ours(Rijndael::ECB, Rijndael::Decrypt, key, {}, fromHex(row.cipher)), plain);
      EXPECT_EQ(ours(Rijndael::ECB, Rijndael::Encrypt, key, {}, plainRun), cipherRun);
      EXPECT_EQ(ours(Rijndael::ECB, Rijndael::Decrypt, key, {}, cipherRun), plainRun);
    });
  }
}

TEST(RijndaelTest, EveryModeMatchesOpenSslOnRandomKeysAndSizesOnEveryPath) {
  std::mt19937 random(20240611);
  const struct {
    std::size_t keyBytes;
    const EVP_CIPHER *ecb;
    const EVP_CIPHER *cbc;
    const EVP_CIPHER *cfb1;
  } keys[] = {{16, EVP_aes_128_ecb(), EVP_aes_128_cbc(), EVP_aes_128_cfb1()},
              {24, EVP_aes_192_ecb(), EVP_aes_192_cbc(), EVP_aes_192_cfb1()},
              {32, EVP_aes_256_ecb(), EVP_aes_256_cbc(), EVP_aes_256_cfb1()}};
  for (const auto &k : keys) {
    for (std::size_t blocks : {1, 2, 7, 8, 9, 15, 16, 17, 33, 255, 1001, 4095, 4096}) {
      SCOPED_TRACE(std::to_string(k.keyBytes) + "-byte key, blocks " + std::to_string(blocks));
      const Bytes key = randomBytes(random, k.keyBytes);
      const Bytes iv = randomBytes(random, 16);
      const Bytes plain = randomBytes(random, 16 * blocks);
      const Bytes ecb = openSsl(k.ecb, true, key, {}, plain, false);
      const Bytes cbc = openSsl(k.cbc, true, key, iv, plain, false);
      // The padded form cuts a random tail so that every pad count occurs.
      const Bytes message(plain.begin(), plain.end() - static_cast<long>(random() % 16));
      const Bytes padded = openSsl(k.cbc, true, key, iv, message, true);
      forEachPath([&] {
        EXPECT_EQ(ours(Rijndael::ECB, Rijndael::Encrypt, key, {}, plain), ecb);
        EXPECT_EQ(ours(Rijndael::ECB, Rijndael::Decrypt, key, {}, ecb), plain);
        EXPECT_EQ(ours(Rijndael::CBC, Rijndael::Encrypt, key, iv, plain), cbc);
        EXPECT_EQ(ours(Rijndael::CBC, Rijndael::Decrypt, key, iv, cbc), plain);
        EXPECT_EQ(ours(Rijndael::CBC, Rijndael::Encrypt, key, iv, message, true), padded);
        EXPECT_EQ(ours(Rijndael::CBC, Rijndael::Decrypt, key, iv, padded, true), message);
      });
      if (blocks <= 17) { // a cipher call per bit: small sizes suffice
        const Bytes cfb1 = openSsl(k.cfb1, true, key, iv, plain, false);
        EXPECT_EQ(ours(Rijndael::CFB1, Rijndael::Encrypt, key, iv, plain), cfb1);
        EXPECT_EQ(ours(Rijndael::CFB1, Rijndael::Decrypt, key, iv, cfb1), plain);
      }
    }
  }
}

TEST(RijndaelTest, DecryptsInPlaceOnEveryPath) {
  std::mt19937 random(7);
  const Bytes key = randomBytes(random, 16);
  const Bytes plain = randomBytes(random, 16 * 37);
  for (auto mode : {Rijndael::ECB, Rijndael::CBC}) {
    SCOPED_TRACE(mode);
    forEachPath([&] {
      Bytes buffer = ours(mode, Rijndael::Encrypt, key, key, plain);
      Rijndael aes;
      aes.init(mode, Rijndael::Decrypt, key.data(), Rijndael::Key16Bytes, key.data());
      EXPECT_EQ(aes.blockDecrypt(buffer.data(), static_cast<int>(buffer.size() * 8), buffer.data()), 37 * 128);
      EXPECT_EQ(buffer, plain);
    });
  }
}

TEST(RijndaelTest, ResultCodesAndLengthsFollowTheTable) {
  const Bytes key(32, 0x11);
  unsigned char in[64] = {};
  unsigned char out[80] = {};
  auto made = [&](Rijndael::Mode mode, Rijndael::Direction dir) {
    Rijndael aes;
    aes.init(mode, dir, key.data(), Rijndael::Key16Bytes);
    return aes;
  };
  const struct {
    const char *name;
    std::function<int()> call;
    int expected;
  } rows[] = {
      {"mode 3",
       [&] { return Rijndael().init(Rijndael::Mode(3), Rijndael::Encrypt, key.data(), Rijndael::Key16Bytes); }, -1},
      {"direction 2",
       [&] { return Rijndael().init(Rijndael::ECB, Rijndael::Direction(2), key.data(), Rijndael::Key16Bytes); }, -2},
      {"key length 3",
       [&] { return Rijndael().init(Rijndael::ECB, Rijndael::Encrypt, key.data(), Rijndael::KeyLength(3)); }, -3},
      {"null key", [&] { return Rijndael().init(Rijndael::CBC, Rijndael::Decrypt, nullptr, Rijndael::Key32Bytes); },
       -4},
      {"never initialized", [&] { return Rijndael().blockEncrypt(in, 128, out); }, -5},
      {"failed init",
       [&] {
         Rijndael aes = made(Rijndael::ECB, Rijndael::Encrypt);
         aes.init(Rijndael::ECB, Rijndael::Encrypt, nullptr, Rijndael::Key16Bytes);
         return aes.padEncrypt(in, 16, out);
       },
       -5},
      {"encrypt on Decrypt", [&] { return made(Rijndael::ECB, Rijndael::Decrypt).blockEncrypt(in, 128, out); }, -6},
      {"decrypt on Encrypt", [&] { return made(Rijndael::CBC, Rijndael::Encrypt).padDecrypt(in, 16, out); }, -6},
      {"padded length 20", [&] { return made(Rijndael::CBC, Rijndael::Decrypt).padDecrypt(in, 20, out); }, -7},
      {"padded CFB1", [&] { return made(Rijndael::CFB1, Rijndael::Encrypt).padEncrypt(in, 16, out); }, -1},
      {"null input", [&] { return made(Rijndael::ECB, Rijndael::Encrypt).blockEncrypt(nullptr, 128, out); }, 0},
      {"length 0", [&] { return made(Rijndael::ECB, Rijndael::Decrypt).blockDecrypt(in, 0, out); }, 0},
      {"negative length", [&] { return made(Rijndael::ECB, Rijndael::Encrypt).padEncrypt(in, -16, out); }, 0},
      {"partial block", [&] { return made(Rijndael::ECB, Rijndael::Encrypt).blockEncrypt(in, 255, out); }, 128},
      {"pad 20 bytes", [&] { return made(Rijndael::ECB, Rijndael::Encrypt).padEncrypt(in, 20, out); }, 32},
      {"pad 32 bytes", [&] { return made(Rijndael::CBC, Rijndael::Encrypt).padEncrypt(in, 32, out); }, 48},
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(row.name);
    EXPECT_EQ(row.call(), row.expected);
  }
}

TEST(RijndaelTest, PadCountRulesDifferByMode) {
  const Bytes key(16, 0x42);
  const struct {
    Rijndael::Mode mode;
    unsigned char last;  // the final byte of the plain last block
    unsigned char other; // the 15 bytes before it
    int expected;
  } rows[] = {
      {Rijndael::ECB, 0, 7, 32},   {Rijndael::ECB, 15, 15, 17}, {Rijndael::ECB, 16, 16, -7},
      {Rijndael::ECB, 3, 2, -7},   {Rijndael::CBC, 0, 7, -7},   {Rijndael::CBC, 16, 16, 16},
      {Rijndael::CBC, 17, 17, -7}, {Rijndael::CBC, 1, 9, 31},   {Rijndael::CBC, 3, 2, -7},
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(std::to_string(row.mode) + " pad byte " + std::to_string(row.last));
    Bytes plain(32, 0x55);
    std::memset(plain.data() + 16, row.other, 15);
    plain[31] = row.last;
    const Bytes cipher = ours(row.mode, Rijndael::Encrypt, key, {}, plain);
    const Bytes back = ours(row.mode, Rijndael::Decrypt, key, {}, cipher, true);
    Rijndael aes;
    aes.init(row.mode, Rijndael::Decrypt, key.data(), Rijndael::Key16Bytes);
    unsigned char out[32];
    EXPECT_EQ(aes.padDecrypt(cipher.data(), 32, out), row.expected);
    if (row.expected > 0) {
      EXPECT_EQ(back, Bytes(plain.begin(), plain.begin() + row.expected));
    }
  }
}
