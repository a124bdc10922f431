#include "wavemill/waveform/Encryptor.h"

#include <climits>
#include <new>

namespace Corvane::Wavemill {

namespace {

// The most whole blocks whose length in bits still fits an int.
constexpr unsigned int MaxBytesPerCall = (INT_MAX / 8) & ~15u;

int bitsOf(unsigned int bytes) { return static_cast<int>((bytes < MaxBytesPerCall ? bytes : MaxBytesPerCall) * 8); }

int bytesOf(int result) { return result > 0 ? result / 8 : result; }

} // namespace

Encryptor::Encryptor() : cipher(new (std::nothrow) Rijndael) {}

Encryptor::~Encryptor() = default;

int Encryptor::init(const unsigned char *key) {
  return cipher ? cipher->init(Rijndael::ECB, Rijndael::Encrypt, key, Rijndael::Key16Bytes, nullptr) : 0;
}

int Encryptor::process(unsigned char *out, const unsigned char *in, unsigned int bytes) {
  return cipher ? bytesOf(cipher->blockEncrypt(in, bitsOf(bytes), out)) : 0;
}

Decryptor::Decryptor() : cipher(new (std::nothrow) Rijndael) {}

Decryptor::~Decryptor() = default;

int Decryptor::init(const unsigned char *key) {
  return cipher ? cipher->init(Rijndael::ECB, Rijndael::Decrypt, key, Rijndael::Key16Bytes, nullptr) : 0;
}

int Decryptor::process(unsigned char *out, const unsigned char *in, unsigned int bytes) {
  return cipher ? bytesOf(cipher->blockDecrypt(in, bitsOf(bytes), out)) : 0;
}

} // namespace Corvane::Wavemill
