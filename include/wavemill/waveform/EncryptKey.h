#pragma once

#include "wavemill/Export.h"

namespace Corvane::Wavemill {

/// The key of the 32-byte head of every waveform file. The exporter
/// encrypts the head under it, and importers get it masked (see
/// `EncryptKey::getFixedKey`). Changing a byte makes every existing file
/// unreadable.
inline constexpr unsigned char fixedFileKey[16] = {0x54, 0x0a, 0x1e, 0x71, 0x2a, 0xba, 0x28, 0x70,
                                                   0xe9, 0x7b, 0x16, 0x19, 0x97, 0xe2, 0x99, 0xe0};

/// The keys of a waveform file, as static operations. Null arguments do
/// nothing. Thread-safe: no state.
class WAVEMILL_API EncryptKey {
public:
  EncryptKey() = delete;

  /// The data key of a file: the first 16 bytes of the SHA-1 digest of
  /// exactly 32 bytes at `plain32` (the plain file head) into `key16`.
  static void generateKey(const unsigned char *plain32, unsigned char *key16);
  /// Masks or unmasks a 16-byte key in place: `key[i]` is XORed with
  /// `mask[i % 4]`, so a second call with the same 4-byte mask restores it.
  static void getFixedKey(unsigned char *key, unsigned char *mask);
};

} // namespace Corvane::Wavemill
