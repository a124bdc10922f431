#include "wavemill/waveform/Rijndael.h"

#include "waveform/AesHardware.h"

#include <array>
#include <atomic>
#include <cstring>

namespace {

using Corvane::Wavemill::AesHardware::cpuHasAesNi;
using Corvane::Wavemill::AesHardware::cpuHasVaes;
using Word = std::uint32_t;

// Multiplication in GF(2^8) modulo x^8 + x^4 + x^3 + x + 1.
constexpr std::uint8_t xtime(std::uint8_t a) {
  return static_cast<std::uint8_t>((a << 1) ^ ((a & 0x80) != 0 ? 0x1b : 0));
}

constexpr std::uint8_t gmul(std::uint8_t a, std::uint8_t b) {
  std::uint8_t product = 0;
  while (b != 0) {
    if ((b & 1) != 0) {
      product ^= a;
    }
    a = xtime(a);
    b >>= 1;
  }
  return product;
}

constexpr std::uint8_t rotl8(std::uint8_t x, int n) { return static_cast<std::uint8_t>((x << n) | (x >> (8 - n))); }

// The S-box from its definition: the multiplicative inverse followed by the
// affine map, so no table is typed in by hand.
constexpr std::array<std::uint8_t, 256> makeSbox() {
  std::array<std::uint8_t, 256> box{};
  for (int x = 0; x < 256; ++x) {
    std::uint8_t inverse = 0;
    for (int y = 1; y < 256 && x != 0; ++y) {
      if (gmul(static_cast<std::uint8_t>(x), static_cast<std::uint8_t>(y)) == 1) {
        inverse = static_cast<std::uint8_t>(y);
        break;
      }
    }
    box[x] = static_cast<std::uint8_t>(inverse ^ rotl8(inverse, 1) ^ rotl8(inverse, 2) ^ rotl8(inverse, 3) ^
                                       rotl8(inverse, 4) ^ 0x63);
  }
  return box;
}

constexpr std::array<std::uint8_t, 256> Sbox = makeSbox();

constexpr std::array<std::uint8_t, 256> makeInverseSbox() {
  std::array<std::uint8_t, 256> box{};
  for (int x = 0; x < 256; ++x) {
    box[Sbox[x]] = static_cast<std::uint8_t>(x);
  }
  return box;
}

constexpr std::array<std::uint8_t, 256> InverseSbox = makeInverseSbox();

constexpr Word pack(std::uint8_t a, std::uint8_t b, std::uint8_t c, std::uint8_t d) {
  return (Word{a} << 24) | (Word{b} << 16) | (Word{c} << 8) | Word{d};
}

constexpr Word rotr(Word x, int n) { return n == 0 ? x : (x >> n) | (x << (32 - n)); }

// Round tables: entry x of table i is one column of SubBytes + MixColumns
// (InvSubBytes + InvMixColumns) for a byte x in row i, as a big-endian word.
struct Tables {
  std::array<std::array<Word, 256>, 4> enc{};
  std::array<std::array<Word, 256>, 4> dec{};
};

constexpr Tables makeTables() {
  Tables t{};
  for (int x = 0; x < 256; ++x) {
    const std::uint8_t s = Sbox[x];
    const std::uint8_t si = InverseSbox[x];
    const Word e = pack(gmul(s, 2), s, s, gmul(s, 3));
    const Word d = pack(gmul(si, 14), gmul(si, 9), gmul(si, 13), gmul(si, 11));
    for (int i = 0; i < 4; ++i) {
      t.enc[i][x] = rotr(e, 8 * i);
      t.dec[i][x] = rotr(d, 8 * i);
    }
  }
  return t;
}

constexpr Tables T = makeTables();

Word loadWord(const unsigned char *p) { return pack(p[0], p[1], p[2], p[3]); }

void storeWord(unsigned char *p, Word w) {
  p[0] = static_cast<unsigned char>(w >> 24);
  p[1] = static_cast<unsigned char>(w >> 16);
  p[2] = static_cast<unsigned char>(w >> 8);
  p[3] = static_cast<unsigned char>(w);
}

std::uint8_t byteOf(Word w, int i) { return static_cast<std::uint8_t>(w >> (24 - 8 * i)); }

Word subWord(Word w) { return pack(Sbox[byteOf(w, 0)], Sbox[byteOf(w, 1)], Sbox[byteOf(w, 2)], Sbox[byteOf(w, 3)]); }

Word invMixColumn(Word w) {
  const std::uint8_t a0 = byteOf(w, 0), a1 = byteOf(w, 1), a2 = byteOf(w, 2), a3 = byteOf(w, 3);
  return pack(gmul(a0, 14) ^ gmul(a1, 11) ^ gmul(a2, 13) ^ gmul(a3, 9),
              gmul(a0, 9) ^ gmul(a1, 14) ^ gmul(a2, 11) ^ gmul(a3, 13),
              gmul(a0, 13) ^ gmul(a1, 9) ^ gmul(a2, 14) ^ gmul(a3, 11),
              gmul(a0, 11) ^ gmul(a1, 13) ^ gmul(a2, 9) ^ gmul(a3, 14));
}

void xorBlock(unsigned char *target, const unsigned char *source) {
  for (int i = 0; i < 16; ++i) {
    target[i] ^= source[i];
  }
}

using Acceleration = Rijndael::Acceleration;

Acceleration detectHardware() {
  if (cpuHasVaes()) {
    return Acceleration::Vaes;
  }
  return cpuHasAesNi() ? Acceleration::AesNi : Acceleration::Portable;
}

const Acceleration hardware = detectHardware();
// Relaxed is enough: the cap is a plain setting, and each call reads it once.
std::atomic<int> cap{static_cast<int>(Acceleration::Vaes)};

} // namespace

Rijndael::Rijndael() = default;
Rijndael::~Rijndael() = default;

void Rijndael::setAcceleration(Acceleration maximum) {
  cap.store(static_cast<int>(maximum), std::memory_order_relaxed);
}

Rijndael::Acceleration Rijndael::getHardwareAcceleration() { return hardware; }

Rijndael::Acceleration Rijndael::getAcceleration() {
  const int allowed = cap.load(std::memory_order_relaxed);
  return allowed < static_cast<int>(hardware) ? static_cast<Acceleration>(allowed) : hardware;
}

int Rijndael::init(Mode newMode, Direction dir, const unsigned char *key, KeyLength keyLen, const unsigned char *iv) {
  state = Invalid;
  if (newMode != ECB && newMode != CBC && newMode != CFB1) {
    return UnsupportedMode;
  }
  if (dir != Encrypt && dir != Decrypt) {
    return UnsupportedDirection;
  }
  int newRounds = 0;
  switch (keyLen) {
  case Key16Bytes:
    newRounds = 10;
    break;
  case Key24Bytes:
    newRounds = 12;
    break;
  case Key32Bytes:
    newRounds = 14;
    break;
  default:
    return UnsupportedKeyLength;
  }
  if (key == nullptr) {
    return BadKey;
  }
  mode = newMode;
  direction = dir;
  rounds = newRounds;
  if (iv != nullptr) {
    std::memcpy(initVector, iv, sizeof initVector);
  } else {
    std::memset(initVector, 0, sizeof initVector);
  }
  keySched(key);
  if (direction == Decrypt) {
    keyEncToDec();
  }
  state = Valid;
  return Success;
}

void Rijndael::keySched(const unsigned char *key) {
  const int columns = rounds - 6; // 4, 6 or 8 words of key
  const int total = 4 * (rounds + 1);
  Word w[4 * 15];
  for (int i = 0; i < columns; ++i) {
    w[i] = loadWord(key + 4 * i);
  }
  Word rcon = 0x01000000;
  for (int i = columns; i < total; ++i) {
    Word temp = w[i - 1];
    if (i % columns == 0) {
      temp = subWord(rotr(temp, 24)) ^ rcon;
      rcon = Word{xtime(static_cast<std::uint8_t>(rcon >> 24))} << 24;
    } else if (columns > 6 && i % columns == 4) {
      temp = subWord(temp);
    }
    w[i] = w[i - columns] ^ temp;
  }
  for (int i = 0; i < total; ++i) {
    storeWord(encryptKeys + 4 * i, w[i]);
  }
}

void Rijndael::keyEncToDec() {
  // The equivalent inverse cipher: the first and last round keys as they
  // are, InvMixColumns on those between, which is what aesimc computes.
  std::memcpy(decryptKeys, encryptKeys, sizeof decryptKeys);
  for (int i = 4; i < 4 * rounds; ++i) {
    storeWord(decryptKeys + 4 * i, invMixColumn(loadWord(encryptKeys + 4 * i)));
  }
}

void Rijndael::encrypt(const unsigned char in[16], unsigned char out[16]) const {
  const unsigned char *rk = encryptKeys;
  Word s0 = loadWord(in) ^ loadWord(rk), s1 = loadWord(in + 4) ^ loadWord(rk + 4);
  Word s2 = loadWord(in + 8) ^ loadWord(rk + 8), s3 = loadWord(in + 12) ^ loadWord(rk + 12);
  const auto &t = T.enc;
  for (int r = 1; r < rounds; ++r) {
    rk += 16;
    const Word t0 = t[0][s0 >> 24] ^ t[1][(s1 >> 16) & 0xff] ^ t[2][(s2 >> 8) & 0xff] ^ t[3][s3 & 0xff] ^ loadWord(rk);
    const Word t1 =
        t[0][s1 >> 24] ^ t[1][(s2 >> 16) & 0xff] ^ t[2][(s3 >> 8) & 0xff] ^ t[3][s0 & 0xff] ^ loadWord(rk + 4);
    const Word t2 =
        t[0][s2 >> 24] ^ t[1][(s3 >> 16) & 0xff] ^ t[2][(s0 >> 8) & 0xff] ^ t[3][s1 & 0xff] ^ loadWord(rk + 8);
    const Word t3 =
        t[0][s3 >> 24] ^ t[1][(s0 >> 16) & 0xff] ^ t[2][(s1 >> 8) & 0xff] ^ t[3][s2 & 0xff] ^ loadWord(rk + 12);
    s0 = t0, s1 = t1, s2 = t2, s3 = t3;
  }
  rk += 16;
  auto last = [&](Word a, Word b, Word c, Word d, int offset) {
    storeWord(out + offset, pack(Sbox[a >> 24], Sbox[(b >> 16) & 0xff], Sbox[(c >> 8) & 0xff], Sbox[d & 0xff]) ^
                                loadWord(rk + offset));
  };
  last(s0, s1, s2, s3, 0);
  last(s1, s2, s3, s0, 4);
  last(s2, s3, s0, s1, 8);
  last(s3, s0, s1, s2, 12);
}

void Rijndael::decrypt(const unsigned char in[16], unsigned char out[16]) const {
  const unsigned char *rk = decryptKeys + 16 * rounds;
  Word s0 = loadWord(in) ^ loadWord(rk), s1 = loadWord(in + 4) ^ loadWord(rk + 4);
  Word s2 = loadWord(in + 8) ^ loadWord(rk + 8), s3 = loadWord(in + 12) ^ loadWord(rk + 12);
  const auto &t = T.dec;
  for (int r = rounds - 1; r > 0; --r) {
    rk -= 16;
    const Word t0 = t[0][s0 >> 24] ^ t[1][(s3 >> 16) & 0xff] ^ t[2][(s2 >> 8) & 0xff] ^ t[3][s1 & 0xff] ^ loadWord(rk);
    const Word t1 =
        t[0][s1 >> 24] ^ t[1][(s0 >> 16) & 0xff] ^ t[2][(s3 >> 8) & 0xff] ^ t[3][s2 & 0xff] ^ loadWord(rk + 4);
    const Word t2 =
        t[0][s2 >> 24] ^ t[1][(s1 >> 16) & 0xff] ^ t[2][(s0 >> 8) & 0xff] ^ t[3][s3 & 0xff] ^ loadWord(rk + 8);
    const Word t3 =
        t[0][s3 >> 24] ^ t[1][(s2 >> 16) & 0xff] ^ t[2][(s1 >> 8) & 0xff] ^ t[3][s0 & 0xff] ^ loadWord(rk + 12);
    s0 = t0, s1 = t1, s2 = t2, s3 = t3;
  }
  rk -= 16;
  auto last = [&](Word a, Word b, Word c, Word d, int offset) {
    storeWord(out + offset, pack(InverseSbox[a >> 24], InverseSbox[(b >> 16) & 0xff], InverseSbox[(c >> 8) & 0xff],
                                 InverseSbox[d & 0xff]) ^
                                loadWord(rk + offset));
  };
  last(s0, s3, s2, s1, 0);
  last(s1, s0, s3, s2, 4);
  last(s2, s1, s0, s3, 8);
  last(s3, s2, s1, s0, 12);
}

void Rijndael::ecbEncrypt(const unsigned char *in, unsigned char *out, int blocks) const {
#if defined(WAVEMILL_AES_HARDWARE)
  switch (getAcceleration()) {
  case Acceleration::Vaes:
    Corvane::Wavemill::AesHardware::ecbEncryptVaes(encryptKeys, rounds, in, out, static_cast<std::size_t>(blocks));
    return;
  case Acceleration::AesNi:
    Corvane::Wavemill::AesHardware::ecbEncryptAesNi(encryptKeys, rounds, in, out, static_cast<std::size_t>(blocks));
    return;
  case Acceleration::Portable:
    break;
  }
#endif
  for (int i = 0; i < blocks; ++i) {
    encrypt(in + 16 * i, out + 16 * i);
  }
}

void Rijndael::ecbDecrypt(const unsigned char *in, unsigned char *out, int blocks) const {
#if defined(WAVEMILL_AES_HARDWARE)
  switch (getAcceleration()) {
  case Acceleration::Vaes:
    Corvane::Wavemill::AesHardware::ecbDecryptVaes(decryptKeys, rounds, in, out, static_cast<std::size_t>(blocks));
    return;
  case Acceleration::AesNi:
    Corvane::Wavemill::AesHardware::ecbDecryptAesNi(decryptKeys, rounds, in, out, static_cast<std::size_t>(blocks));
    return;
  case Acceleration::Portable:
    break;
  }
#endif
  for (int i = 0; i < blocks; ++i) {
    decrypt(in + 16 * i, out + 16 * i);
  }
}

void Rijndael::cbcEncrypt(const unsigned char *in, unsigned char *out, int blocks) const {
#if defined(WAVEMILL_AES_HARDWARE)
  if (getAcceleration() != Acceleration::Portable) {
    Corvane::Wavemill::AesHardware::cbcEncryptAesNi(encryptKeys, rounds, initVector, in, out,
                                                    static_cast<std::size_t>(blocks));
    return;
  }
#endif
  const unsigned char *chain = initVector;
  unsigned char block[16];
  for (int i = 0; i < blocks; ++i) {
    std::memcpy(block, in + 16 * i, 16);
    xorBlock(block, chain);
    encrypt(block, out + 16 * i);
    chain = out + 16 * i;
  }
}

void Rijndael::cbcDecrypt(const unsigned char *in, unsigned char *out, int blocks) const {
#if defined(WAVEMILL_AES_HARDWARE)
  if (getAcceleration() != Acceleration::Portable) {
    Corvane::Wavemill::AesHardware::cbcDecryptAesNi(decryptKeys, rounds, initVector, in, out,
                                                    static_cast<std::size_t>(blocks));
    return;
  }
#endif
  unsigned char chain[16];
  unsigned char cipher[16];
  std::memcpy(chain, initVector, 16);
  for (int i = 0; i < blocks; ++i) {
    // Keep the ciphertext before the output may overwrite it.
    std::memcpy(cipher, in + 16 * i, 16);
    decrypt(cipher, out + 16 * i);
    xorBlock(out + 16 * i, chain);
    std::memcpy(chain, cipher, 16);
  }
}

void Rijndael::cfb1(const unsigned char *in, unsigned char *out, int blocks, bool decrypting) const {
  // One cipher call per bit: the register shifts left by one bit and takes
  // in the ciphertext bit, most significant bit of each byte first. Both
  // directions run the forward cipher.
  unsigned char shift[16];
  unsigned char keystream[16];
  std::memcpy(shift, initVector, 16);
  for (int i = 0; i < blocks; ++i) {
    unsigned char block[16];
    std::memcpy(block, in + 16 * i, 16);
    for (int k = 0; k < 128; ++k) {
      encrypt(shift, keystream);
      const int byte = k >> 3;
      const int bit = 7 - (k & 7);
      const int inputBit = (block[byte] >> bit) & 1;
      block[byte] = static_cast<unsigned char>(block[byte] ^ ((keystream[0] & 0x80) >> (k & 7)));
      const int cipherBit = decrypting ? inputBit : (block[byte] >> bit) & 1;
      for (int t = 0; t < 15; ++t) {
        shift[t] = static_cast<unsigned char>((shift[t] << 1) | (shift[t + 1] >> 7));
      }
      shift[15] = static_cast<unsigned char>((shift[15] << 1) | cipherBit);
    }
    std::memcpy(out + 16 * i, block, 16);
  }
}

int Rijndael::blocksToProcess(const unsigned char *input, int inputBits, const unsigned char *out,
                              Direction wanted) const {
  if (state != Valid) {
    return NotInitialized;
  }
  if (direction != wanted) {
    return BadDirection;
  }
  if (input == nullptr || out == nullptr || inputBits <= 0) {
    return 0;
  }
  return inputBits / 128;
}

int Rijndael::blockEncrypt(const unsigned char *input, int inputBits, unsigned char *out) {
  const int blocks = blocksToProcess(input, inputBits, out, Encrypt);
  if (blocks <= 0) {
    return blocks;
  }
  switch (mode) {
  case ECB:
    ecbEncrypt(input, out, blocks);
    break;
  case CBC:
    cbcEncrypt(input, out, blocks);
    break;
  case CFB1:
    cfb1(input, out, blocks, false);
    break;
  }
  return 128 * blocks;
}

int Rijndael::blockDecrypt(const unsigned char *input, int inputBits, unsigned char *out) {
  const int blocks = blocksToProcess(input, inputBits, out, Decrypt);
  if (blocks <= 0) {
    return blocks;
  }
  switch (mode) {
  case ECB:
    ecbDecrypt(input, out, blocks);
    break;
  case CBC:
    cbcDecrypt(input, out, blocks);
    break;
  case CFB1:
    cfb1(input, out, blocks, true);
    break;
  }
  return 128 * blocks;
}

int Rijndael::padEncrypt(const unsigned char *input, int inputBytes, unsigned char *out) {
  if (state != Valid) {
    return NotInitialized;
  }
  if (direction != Encrypt) {
    return BadDirection;
  }
  if (input == nullptr || out == nullptr || inputBytes <= 0) {
    return 0;
  }
  if (mode != ECB && mode != CBC) {
    return UnsupportedMode;
  }
  const int blocks = inputBytes / 16;
  const int rest = inputBytes - 16 * blocks;
  const int padCount = 16 - rest;
  unsigned char last[16];
  std::memcpy(last, input + 16 * blocks, static_cast<std::size_t>(rest));
  std::memset(last + rest, padCount, static_cast<std::size_t>(padCount));
  if (mode == ECB) {
    ecbEncrypt(input, out, blocks);
    encrypt(last, out + 16 * blocks);
  } else {
    cbcEncrypt(input, out, blocks);
    xorBlock(last, blocks > 0 ? out + 16 * (blocks - 1) : initVector);
    encrypt(last, out + 16 * blocks);
  }
  return 16 * (blocks + 1);
}

int Rijndael::padDecrypt(const unsigned char *input, int inputBytes, unsigned char *out) {
  if (state != Valid) {
    return NotInitialized;
  }
  if (direction != Decrypt) {
    return BadDirection;
  }
  if (input == nullptr || out == nullptr || inputBytes <= 0) {
    return 0;
  }
  if (inputBytes % 16 != 0) {
    return CorruptedData;
  }
  if (mode != ECB && mode != CBC) {
    return UnsupportedMode;
  }
  const int blocks = inputBytes / 16 - 1;
  unsigned char last[16];
  decrypt(input + 16 * blocks, last);
  int padCount = 0;
  if (mode == ECB) {
    ecbDecrypt(input, out, blocks);
    padCount = last[15];
    if (padCount >= 16) {
      return CorruptedData;
    }
  } else {
    xorBlock(last, blocks > 0 ? input + 16 * (blocks - 1) : initVector);
    cbcDecrypt(input, out, blocks);
    padCount = last[15];
    if (padCount == 0 || padCount > 16) {
      return CorruptedData;
    }
  }
  for (int i = 16 - padCount; i < 16; ++i) {
    if (last[i] != padCount) {
      return CorruptedData;
    }
  }
  std::memcpy(out + 16 * blocks, last, static_cast<std::size_t>(16 - padCount));
  return 16 * (blocks + 1) - padCount;
}
