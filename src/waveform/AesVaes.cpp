#include "waveform/AesHardware.h"

#if defined(WAVEMILL_AES_HARDWARE)

#include <immintrin.h>

// VAES runs the AES round on both 128-bit halves of a 256-bit register, so
// each instruction does two blocks. Compiled through function attributes
// like the AES-NI path; the caller checks the processor first.
#define WAVEMILL_TARGET_VAES __attribute__((target("vaes,avx2,aes")))

namespace Corvane::Wavemill::AesHardware {

namespace {

// Eight registers of two blocks each: enough independent rounds to keep
// two AES units busy through a latency of 4 cycles.
constexpr std::size_t Lanes = 8;
constexpr std::size_t BlocksPerLoop = 2 * Lanes;

WAVEMILL_TARGET_VAES inline __m256i load2(const unsigned char *p) {
  return _mm256_loadu_si256(reinterpret_cast<const __m256i *>(p));
}

WAVEMILL_TARGET_VAES inline void store2(unsigned char *p, __m256i v) {
  _mm256_storeu_si256(reinterpret_cast<__m256i *>(p), v);
}

WAVEMILL_TARGET_VAES inline void loadKeys(const unsigned char *keys, int rounds, __m256i *k) {
  for (int r = 0; r <= rounds; ++r) {
    k[r] = _mm256_broadcastsi128_si256(_mm_loadu_si128(reinterpret_cast<const __m128i *>(keys + 16 * r)));
  }
}

template <bool Decrypting> WAVEMILL_TARGET_VAES inline __m256i cryptPair(const __m256i *k, int rounds, __m256i x) {
  x = _mm256_xor_si256(x, Decrypting ? k[rounds] : k[0]);
  for (int r = 1; r < rounds; ++r) {
    x = Decrypting ? _mm256_aesdec_epi128(x, k[rounds - r]) : _mm256_aesenc_epi128(x, k[r]);
  }
  return Decrypting ? _mm256_aesdeclast_epi128(x, k[0]) : _mm256_aesenclast_epi128(x, k[rounds]);
}

// The part of a buffer below 16 blocks: pairs of blocks, then one block in
// the low half of a register, reading and writing only its own 16 bytes.
template <bool Decrypting>
WAVEMILL_TARGET_VAES void tail(const __m256i *k, int rounds, const unsigned char *in, unsigned char *out,
                               std::size_t blocks) {
  std::size_t i = 0;
  for (; i + 2 <= blocks; i += 2) {
    store2(out + 16 * i, cryptPair<Decrypting>(k, rounds, load2(in + 16 * i)));
  }
  if (i < blocks) {
    const __m128i x = _mm_loadu_si128(reinterpret_cast<const __m128i *>(in + 16 * i));
    const __m256i y = cryptPair<Decrypting>(k, rounds, _mm256_castsi128_si256(x));
    _mm_storeu_si128(reinterpret_cast<__m128i *>(out + 16 * i), _mm256_castsi256_si128(y));
  }
}

} // namespace

bool cpuHasVaes() {
  __builtin_cpu_init();
  // The AVX test also confirms that the system saves the upper halves.
  return __builtin_cpu_supports("vaes") && __builtin_cpu_supports("avx2") && __builtin_cpu_supports("aes");
}

WAVEMILL_TARGET_VAES void ecbEncryptVaes(const unsigned char *keys, int rounds, const unsigned char *in,
                                         unsigned char *out, std::size_t blocks) {
  __m256i k[15];
  loadKeys(keys, rounds, k);
  std::size_t i = 0;
  for (; i + BlocksPerLoop <= blocks; i += BlocksPerLoop) {
    __m256i b[Lanes];
#pragma GCC unroll 8
    for (std::size_t j = 0; j < Lanes; ++j) {
      b[j] = _mm256_xor_si256(load2(in + 16 * (i + 2 * j)), k[0]);
    }
    for (int r = 1; r < rounds; ++r) {
#pragma GCC unroll 8
      for (std::size_t j = 0; j < Lanes; ++j) {
        b[j] = _mm256_aesenc_epi128(b[j], k[r]);
      }
    }
#pragma GCC unroll 8
    for (std::size_t j = 0; j < Lanes; ++j) {
      store2(out + 16 * (i + 2 * j), _mm256_aesenclast_epi128(b[j], k[rounds]));
    }
  }
  tail<false>(k, rounds, in + 16 * i, out + 16 * i, blocks - i);
}

WAVEMILL_TARGET_VAES void ecbDecryptVaes(const unsigned char *keys, int rounds, const unsigned char *in,
                                         unsigned char *out, std::size_t blocks) {
  __m256i k[15];
  loadKeys(keys, rounds, k);
  std::size_t i = 0;
  for (; i + BlocksPerLoop <= blocks; i += BlocksPerLoop) {
    __m256i b[Lanes];
#pragma GCC unroll 8
    for (std::size_t j = 0; j < Lanes; ++j) {
      b[j] = _mm256_xor_si256(load2(in + 16 * (i + 2 * j)), k[rounds]);
    }
    for (int r = rounds - 1; r > 0; --r) {
#pragma GCC unroll 8
      for (std::size_t j = 0; j < Lanes; ++j) {
        b[j] = _mm256_aesdec_epi128(b[j], k[r]);
      }
    }
#pragma GCC unroll 8
    for (std::size_t j = 0; j < Lanes; ++j) {
      store2(out + 16 * (i + 2 * j), _mm256_aesdeclast_epi128(b[j], k[0]));
    }
  }
  tail<true>(k, rounds, in + 16 * i, out + 16 * i, blocks - i);
}

} // namespace Corvane::Wavemill::AesHardware

#endif
