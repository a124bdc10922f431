#include "wavemill/waveform/EncryptKey.h"

#include "wavemill/waveform/SecureHash.h"

#include <cstring>

namespace Corvane::Wavemill {

void EncryptKey::generateKey(const unsigned char *plain32, unsigned char *key16) {
  if (plain32 == nullptr || key16 == nullptr) {
    return;
  }
  unsigned char digest[CSHA1::HashBytes];
  SecureHash::SHA1(plain32, 32, digest);
  std::memcpy(key16, digest, 16);
}

void EncryptKey::getFixedKey(unsigned char *key, unsigned char *mask) {
  if (key == nullptr || mask == nullptr) {
    return;
  }
  for (int i = 0; i < 16; ++i) {
    key[i] ^= mask[i % 4];
  }
}

} // namespace Corvane::Wavemill
