#include "wavemill/waveform/Rijndael.h"
#include "wavemill/waveform/EncryptKey.h"
#include "wavemill/waveform/Encryptor.h"

#include "support/WaveformFiles.h"

#include <gtest/gtest.h>
#include <openssl/evp.h>

#include <cstring>
#include <functional>
#include <random>
#include <string>
#include <vector>

using namespace Corvane::Wavemill;

namespace {

using Corvane::Wavemill::Testing::Bytes;
using R = Rijndael;

// Runs `check` once per code path this processor has, and restores the
// default afterwards even when an assertion fails.
void forEachPath(const std::function<void()> &check) {
  struct Restore {
    ~Restore() { R::setAcceleration(R::Acceleration::Vaes); }
  } restore;
  for (int level = 0; level <= static_cast<int>(R::getHardwareAcceleration()); ++level) {
    R::setAcceleration(static_cast<R::Acceleration>(level));
    ASSERT_EQ(R::getAcceleration(), static_cast<R::Acceleration>(level));
    SCOPED_TRACE("path " + std::to_string(level));
    check();
  }
}

// Our cipher over a whole buffer, with the block operations or the padded
// ones. Decryption runs in place, so the output overwrites the input.
Bytes ours(R::Mode mode, R::Direction dir, const Bytes &key, const Bytes &iv, const Bytes &in, bool padded = false) {
  R aes;
  const auto keyLength = key.size() == 16 ? R::Key16Bytes : key.size() == 24 ? R::Key24Bytes : R::Key32Bytes;
  EXPECT_EQ(aes.init(mode, dir, key.data(), keyLength, iv.empty() ? nullptr : iv.data()), 0);
  Bytes out(in.size() + 16);
  const unsigned char *from = in.data();
  if (dir == R::Decrypt) {
    std::copy(in.begin(), in.end(), out.begin());
    from = out.data();
  }
  const int n = static_cast<int>(in.size());
  const int count =
      padded ? (dir == R::Encrypt ? aes.padEncrypt(from, n, out.data()) : aes.padDecrypt(from, n, out.data()))
             : (dir == R::Encrypt ? aes.blockEncrypt(from, 8 * n, out.data())
                                  : aes.blockDecrypt(from, 8 * n, out.data())) /
                   8;
  out.resize(static_cast<std::size_t>(count < 0 ? 0 : count));
  return out;
}

Bytes openSsl(const EVP_CIPHER *cipher, const Bytes &key, const Bytes &iv, const Bytes &in, bool padded = false) {
  EVP_CIPHER_CTX *ctx = EVP_CIPHER_CTX_new();
  Bytes out(in.size() + 32);
  int length = 0;
  int tail = 0;
  EVP_CipherInit_ex(ctx, cipher, nullptr, key.data(), iv.empty() ? nullptr : iv.data(), 1);
  EVP_CIPHER_CTX_set_padding(ctx, padded ? 1 : 0);
  EVP_CipherUpdate(ctx, out.data(), &length, in.data(), static_cast<int>(in.size()));
  EVP_CipherFinal_ex(ctx, out.data() + length, &tail);
  EVP_CIPHER_CTX_free(ctx);
  out.resize(static_cast<std::size_t>(length + tail));
  return out;
}

} // namespace

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
    // One block, pairs, and either side of the 8-block AES-NI and 16-block
    // VAES loops run the wide loops and their tails; 1001 runs them many times.
    for (std::size_t blocks : {1, 2, 7, 8, 9, 15, 16, 17, 1001}) {
      SCOPED_TRACE(std::to_string(k.keyBytes) + "-byte key, blocks " + std::to_string(blocks));
      const Bytes key = Testing::patternBytes(k.keyBytes, random());
      const Bytes iv = Testing::patternBytes(16, random());
      const Bytes plain = Testing::patternBytes(16 * blocks, random());
      const Bytes ecb = openSsl(k.ecb, key, {}, plain);
      const Bytes cbc = openSsl(k.cbc, key, iv, plain);
      // The padded form cuts a random tail so that every pad count occurs.
      const Bytes message(plain.begin(), plain.end() - static_cast<long>(random() % 16));
      const Bytes padded = openSsl(k.cbc, key, iv, message, true);
      forEachPath([&] {
        EXPECT_EQ(ours(R::ECB, R::Encrypt, key, {}, plain), ecb);
        EXPECT_EQ(ours(R::ECB, R::Decrypt, key, {}, ecb), plain);
        EXPECT_EQ(ours(R::CBC, R::Encrypt, key, iv, plain), cbc);
        EXPECT_EQ(ours(R::CBC, R::Decrypt, key, iv, cbc), plain);
        EXPECT_EQ(ours(R::CBC, R::Encrypt, key, iv, message, true), padded);
        EXPECT_EQ(ours(R::CBC, R::Decrypt, key, iv, padded, true), message);
      });
      if (blocks <= 2) { // a cipher call per bit: the shift register crossing one block boundary suffices
        const Bytes cfb1 = openSsl(k.cfb1, key, iv, plain);
        EXPECT_EQ(ours(R::CFB1, R::Encrypt, key, iv, plain), cfb1);
        EXPECT_EQ(ours(R::CFB1, R::Decrypt, key, iv, cfb1), plain);
      }
    }
  }
}

TEST(RijndaelTest, ResultCodesAndLengthsFollowTheTable) {
  const Bytes key(32, 0x11);
  unsigned char in[64] = {};
  unsigned char out[80] = {};
  // A cipher initialized successfully, then again with these arguments; the
  // result of that init ('i') or of a call: e/d blockEncrypt/blockDecrypt
  // (length in bits), E/D padEncrypt/padDecrypt (in bytes), n blockEncrypt of
  // no input.
  const auto run = [&](R::Mode mode, R::Direction dir, R::KeyLength keyLength, bool withKey, char op, int length) {
    R aes;
    EXPECT_EQ(aes.init(R::ECB, R::Encrypt, key.data(), R::Key16Bytes), 0);
    const int init = aes.init(mode, dir, withKey ? key.data() : nullptr, keyLength);
    return op == 'i'   ? init
           : op == 'e' ? aes.blockEncrypt(in, length, out)
           : op == 'n' ? aes.blockEncrypt(nullptr, length, out)
           : op == 'd' ? aes.blockDecrypt(in, length, out)
           : op == 'E' ? aes.padEncrypt(in, length, out)
                       : aes.padDecrypt(in, length, out);
  };
  const auto E = R::Encrypt, D = R::Decrypt;
  const auto K16 = R::Key16Bytes;
  EXPECT_EQ(run(R::Mode(3), E, K16, true, 'i', 0), -1);
  EXPECT_EQ(run(R::ECB, R::Direction(2), K16, true, 'i', 0), -2);
  EXPECT_EQ(run(R::ECB, E, R::KeyLength(3), true, 'i', 0), -3);
  EXPECT_EQ(run(R::CBC, D, R::Key32Bytes, false, 'i', 0), -4);
  EXPECT_EQ(run(R::ECB, E, K16, false, 'E', 16), -5) << "a failed init leaves the cipher unusable";
  EXPECT_EQ(run(R::ECB, D, K16, true, 'e', 128), -6);
  EXPECT_EQ(run(R::CBC, E, K16, true, 'D', 16), -6);
  EXPECT_EQ(run(R::CBC, D, K16, true, 'D', 20), -7) << "padded length not a whole block";
  EXPECT_EQ(run(R::CFB1, E, K16, true, 'E', 16), -1) << "padding in CFB1";
  EXPECT_EQ(run(R::ECB, E, K16, true, 'n', 128), 0);
  EXPECT_EQ(run(R::ECB, D, K16, true, 'd', 0), 0);
  EXPECT_EQ(run(R::ECB, E, K16, true, 'E', -16), 0);
  EXPECT_EQ(run(R::ECB, E, K16, true, 'e', 255), 128) << "only whole blocks";
}

TEST(RijndaelTest, PadCountRulesDifferByMode) {
  const Bytes key(16, 0x42);
  const struct {
    R::Mode mode;
    unsigned char last;  // the final byte of the plain last block
    unsigned char other; // the 15 bytes before it
    int expected;
  } rows[] = {
      {R::ECB, 0, 7, 32}, {R::ECB, 15, 15, 17}, {R::ECB, 16, 16, -7}, {R::ECB, 3, 2, -7},
      {R::CBC, 0, 7, -7}, {R::CBC, 16, 16, 16}, {R::CBC, 17, 17, -7},
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(std::to_string(row.mode) + " pad byte " + std::to_string(row.last));
    Bytes plain(32, 0x55);
    std::memset(plain.data() + 16, row.other, 15);
    plain[31] = row.last;
    const Bytes cipher = ours(row.mode, R::Encrypt, key, {}, plain);
    R aes;
    aes.init(row.mode, R::Decrypt, key.data(), R::Key16Bytes);
    unsigned char out[32];
    EXPECT_EQ(aes.padDecrypt(cipher.data(), 32, out), row.expected);
    if (row.expected > 0) {
      EXPECT_EQ(ours(row.mode, R::Decrypt, key, {}, cipher, true), Bytes(plain.begin(), plain.begin() + row.expected));
    }
  }
}

// The exporters and importers run both ciphers on every file, which is read
// back with OpenSSL; before init only the cipher's error comes through.
TEST(EncryptorTest, ProcessBeforeInitAnswersTheCipherError) {
  unsigned char in[32] = {}, out[32];
  EXPECT_EQ(Encryptor().process(out, in, 32), -5);
  EXPECT_EQ(Decryptor().process(out, in, 32), -5);
}
