#include "wavemill/waveform/CSHA1.h"

#include <cstring>

namespace {

using Word = std::uint32_t;

Word rotl(Word x, int n) { return (x << n) | (x >> (32 - n)); }

Word loadBig(const unsigned char *p) {
  return (Word{p[0]} << 24) | (Word{p[1]} << 16) | (Word{p[2]} << 8) | Word{p[3]};
}

void storeBig(unsigned char *p, Word w) {
  p[0] = static_cast<unsigned char>(w >> 24);
  p[1] = static_cast<unsigned char>(w >> 16);
  p[2] = static_cast<unsigned char>(w >> 8);
  p[3] = static_cast<unsigned char>(w);
}

} // namespace

CSHA1::CSHA1() { reset(); }

CSHA1::~CSHA1() = default;

void CSHA1::reset() {
  state[0] = 0x67452301;
  state[1] = 0xefcdab89;
  state[2] = 0x98badcfe;
  state[3] = 0x10325476;
  state[4] = 0xc3d2e1f0;
  count[0] = 0;
  count[1] = 0;
}

void CSHA1::transform(std::uint32_t chain[5], const unsigned char block[64]) {
  Word w[80];
  for (int t = 0; t < 16; ++t) {
    w[t] = loadBig(block + 4 * t);
  }
  for (int t = 16; t < 80; ++t) {
    w[t] = rotl(w[t - 3] ^ w[t - 8] ^ w[t - 14] ^ w[t - 16], 1);
  }
  Word a = chain[0], b = chain[1], c = chain[2], d = chain[3], e = chain[4];
  // One loop per round function, so no round decides which function it runs.
  auto round = [&](Word f, Word k, Word word) {
    const Word temp = rotl(a, 5) + f + e + k + word;
    e = d;
    d = c;
    c = rotl(b, 30);
    b = a;
    a = temp;
  };
  for (int t = 0; t < 20; ++t) {
    round(d ^ (b & (c ^ d)), 0x5a827999, w[t]);
  }
  for (int t = 20; t < 40; ++t) {
    round(b ^ c ^ d, 0x6ed9eba1, w[t]);
  }
  for (int t = 40; t < 60; ++t) {
    round((b & c) | (d & (b | c)), 0x8f1bbcdc, w[t]);
  }
  for (int t = 60; t < 80; ++t) {
    round(b ^ c ^ d, 0xca62c1d6, w[t]);
  }
  chain[0] += a;
  chain[1] += b;
  chain[2] += c;
  chain[3] += d;
  chain[4] += e;
}

void CSHA1::update(const unsigned char *data, unsigned int len) {
  if (data == nullptr) {
    return;
  }
  unsigned int used = (count[0] >> 3) & 63;
  const Word bits = static_cast<Word>(len) << 3;
  count[0] += bits;
  if (count[0] < bits) {
    ++count[1];
  }
  count[1] += static_cast<Word>(len) >> 29;

  unsigned int i = 0;
  if (len >= 64 - used) {
    i = 64 - used;
    std::memcpy(buffer + used, data, i);
    transform(state, buffer);
    for (; len - i >= 64; i += 64) {
      transform(state, data + i);
    }
    used = 0;
  }
  std::memcpy(buffer + used, data + i, len - i);
}

void CSHA1::final() {
  unsigned char length[8];
  storeBig(length, count[1]);
  storeBig(length + 4, count[0]);
  static const unsigned char padding[64] = {0x80};
  const unsigned int used = (count[0] >> 3) & 63;
  update(padding, used < 56 ? 56 - used : 120 - used);
  update(length, 8);
  for (int i = 0; i < 5; ++i) {
    storeBig(digest + 4 * i, state[i]);
  }
  // The message stays in the object only as long as needed.
  std::memset(buffer, 0, sizeof buffer);
}

void CSHA1::getHash(unsigned char *out) const {
  if (out != nullptr) {
    std::memcpy(out, digest, sizeof digest);
  }
}
