#include "waveform/AesHardware.h"

#if defined(WAVEMILL_AES_HARDWARE)

#include <immintrin.h>

// Compiled for AES-NI through function attributes rather than a flag on the
// whole file or library, so nothing here runs unless the caller has checked
// the processor.
#define WAVEMILL_TARGET_AESNI __attribute__((target("aes,sse4.1")))

namespace Corvane::Wavemill::AesHardware {

namespace {

constexpr std::size_t Lanes = 8; // aesenc has a latency of about 4 cycles and a throughput of 1-2 per cycle

WAVEMILL_TARGET_AESNI inline void loadKeys(const unsigned char *keys, int rounds, __m128i *k) {
  for (int r = 0; r <= rounds; ++r) {
    k[r] = _mm_loadu_si128(reinterpret_cast<const __m128i *>(keys + 16 * r));
  }
}

WAVEMILL_TARGET_AESNI inline __m128i load(const unsigned char *p) {
  return _mm_loadu_si128(reinterpret_cast<const __m128i *>(p));
}

WAVEMILL_TARGET_AESNI inline void store(unsigned char *p, __m128i v) {
  _mm_storeu_si128(reinterpret_cast<__m128i *>(p), v);
}

WAVEMILL_TARGET_AESNI inline __m128i encryptOne(const __m128i *k, int rounds, __m128i x) {
  x = _mm_xor_si128(x, k[0]);
  for (int r = 1; r < rounds; ++r) {
    x = _mm_aesenc_si128(x, k[r]);
  }
  return _mm_aesenclast_si128(x, k[rounds]);
}

WAVEMILL_TARGET_AESNI inline __m128i decryptOne(const __m128i *k, int rounds, __m128i x) {
  x = _mm_xor_si128(x, k[rounds]);
  for (int r = rounds - 1; r > 0; --r) {
    x = _mm_aesdec_si128(x, k[r]);
  }
  return _mm_aesdeclast_si128(x, k[0]);
}

} // namespace

bool cpuHasAesNi() {
  __builtin_cpu_init();
  return __builtin_cpu_supports("aes") && __builtin_cpu_supports("sse4.1");
}

WAVEMILL_TARGET_AESNI void ecbEncryptAesNi(const unsigned char *keys, int rounds, const unsigned char *in,
                                           unsigned char *out, std::size_t blocks) {
  __m128i k[15];
  loadKeys(keys, rounds, k);
  std::size_t i = 0;
  for (; i + Lanes <= blocks; i += Lanes) {
    __m128i b[Lanes];
#pragma GCC unroll 8
    for (std::size_t j = 0; j < Lanes; ++j) {
      b[j] = _mm_xor_si128(load(in + 16 * (i + j)), k[0]);
    }
    for (int r = 1; r < rounds; ++r) {
#pragma GCC unroll 8
      for (std::size_t j = 0; j < Lanes; ++j) {
        b[j] = _mm_aesenc_si128(b[j], k[r]);
      }
    }
#pragma GCC unroll 8
    for (std::size_t j = 0; j < Lanes; ++j) {
      store(out + 16 * (i + j), _mm_aesenclast_si128(b[j], k[rounds]));
    }
  }
  for (; i < blocks; ++i) {
    store(out + 16 * i, encryptOne(k, rounds, load(in + 16 * i)));
  }
}

WAVEMILL_TARGET_AESNI void ecbDecryptAesNi(const unsigned char *keys, int rounds, const unsigned char *in,
                                           unsigned char *out, std::size_t blocks) {
  __m128i k[15];
  loadKeys(keys, rounds, k);
  std::size_t i = 0;
  for (; i + Lanes <= blocks; i += Lanes) {
    __m128i b[Lanes];
#pragma GCC unroll 8
    for (std::size_t j = 0; j < Lanes; ++j) {
      b[j] = _mm_xor_si128(load(in + 16 * (i + j)), k[rounds]);
    }
    for (int r = rounds - 1; r > 0; --r) {
#pragma GCC unroll 8
      for (std::size_t j = 0; j < Lanes; ++j) {
        b[j] = _mm_aesdec_si128(b[j], k[r]);
      }
    }
#pragma GCC unroll 8
    for (std::size_t j = 0; j < Lanes; ++j) {
      store(out + 16 * (i + j), _mm_aesdeclast_si128(b[j], k[0]));
    }
  }
  for (; i < blocks; ++i) {
    store(out + 16 * i, decryptOne(k, rounds, load(in + 16 * i)));
  }
}

WAVEMILL_TARGET_AESNI void cbcEncryptAesNi(const unsigned char *keys, int rounds, const unsigned char *iv,
                                           const unsigned char *in, unsigned char *out, std::size_t blocks) {
  __m128i k[15];
  loadKeys(keys, rounds, k);
  // Each block needs the one before it, so encryption is serial.
  __m128i chain = load(iv);
  for (std::size_t i = 0; i < blocks; ++i) {
    chain = encryptOne(k, rounds, _mm_xor_si128(load(in + 16 * i), chain));
    store(out + 16 * i, chain);
  }
}

WAVEMILL_TARGET_AESNI void cbcDecryptAesNi(const unsigned char *keys, int rounds, const unsigned char *iv,
                                           const unsigned char *in, unsigned char *out, std::size_t blocks) {
  __m128i k[15];
  loadKeys(keys, rounds, k);
  __m128i previous = load(iv);
  std::size_t i = 0;
  for (; i + Lanes <= blocks; i += Lanes) {
    // All ciphertext is read before any output is stored, so decrypting in place works.
    __m128i c[Lanes];
    __m128i b[Lanes];
#pragma GCC unroll 8
    for (std::size_t j = 0; j < Lanes; ++j) {
      c[j] = load(in + 16 * (i + j));
      b[j] = _mm_xor_si128(c[j], k[rounds]);
    }
    for (int r = rounds - 1; r > 0; --r) {
#pragma GCC unroll 8
      for (std::size_t j = 0; j < Lanes; ++j) {
        b[j] = _mm_aesdec_si128(b[j], k[r]);
      }
    }
#pragma GCC unroll 8
    for (std::size_t j = 0; j < Lanes; ++j) {
      b[j] = _mm_aesdeclast_si128(b[j], k[0]);
      store(out + 16 * (i + j), _mm_xor_si128(b[j], j == 0 ? previous : c[j - 1]));
    }
    previous = c[Lanes - 1];
  }
  for (; i < blocks; ++i) {
    const __m128i c = load(in + 16 * i);
    store(out + 16 * i, _mm_xor_si128(decryptOne(k, rounds, c), previous));
    previous = c;
  }
}

} // namespace Corvane::Wavemill::AesHardware

#endif
