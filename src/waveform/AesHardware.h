#pragma once

#include <cstddef>

// The AES code paths that use the processor's instructions. Each lives in a
// source file of its own, compiled for its instruction set through function
// attributes, so the rest of the library runs on any x86-64; the caller
// checks the processor first. Round keys are 16-byte blocks in the byte
// order of the standard: the encryption schedule for encryption, the
// equivalent-inverse-cipher schedule (InvMixColumns of the middle keys, as
// aesimc makes them) for decryption. `in` may equal `out`.

namespace Corvane::Wavemill::AesHardware {

#if defined(__x86_64__) || defined(__i386__)
#define WAVEMILL_AES_HARDWARE 1

bool cpuHasAesNi();
bool cpuHasVaes();

void ecbEncryptAesNi(const unsigned char *keys, int rounds, const unsigned char *in, unsigned char *out,
                     std::size_t blocks);
void ecbDecryptAesNi(const unsigned char *keys, int rounds, const unsigned char *in, unsigned char *out,
                     std::size_t blocks);
void cbcEncryptAesNi(const unsigned char *keys, int rounds, const unsigned char *iv, const unsigned char *in,
                     unsigned char *out, std::size_t blocks);
void cbcDecryptAesNi(const unsigned char *keys, int rounds, const unsigned char *iv, const unsigned char *in,
                     unsigned char *out, std::size_t blocks);

void ecbEncryptVaes(const unsigned char *keys, int rounds, const unsigned char *in, unsigned char *out,
                    std::size_t blocks);
void ecbDecryptVaes(const unsigned char *keys, int rounds, const unsigned char *in, unsigned char *out,
                    std::size_t blocks);

#else
inline bool cpuHasAesNi() { return false; }
inline bool cpuHasVaes() { return false; }
#endif

} // namespace Corvane::Wavemill::AesHardware
