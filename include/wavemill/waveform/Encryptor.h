#pragma once

#include "wavemill/Export.h"
#include "wavemill/waveform/Rijndael.h"

#include <memory>

namespace Corvane::Wavemill {

/// Encrypts the block stream of a waveform file: AES-128 in ECB, 16-byte
/// blocks, no initialization vector and no padding. The file format relies
/// on ECB: encrypted blocks can be stored apart and joined later, since no
/// block depends on the one before it.
///
///     Encryptor encryptor;
///     encryptor.init(fixedFileKey);
///     encryptor.process(out, head, 32);  // 32
///
/// Owns one `Rijndael`. If it cannot be allocated, `init` and `process` do
/// nothing and return 0. Not thread-safe: one thread at a time.
class WAVEMILL_API Encryptor {
public:
  Encryptor();
  ~Encryptor();
  Encryptor(const Encryptor &) = delete;
  Encryptor &operator=(const Encryptor &) = delete;

  /// Sets the 16-byte key; may be called again to change it. Returns 0, or
  /// `Rijndael::BadKey` (-4) for a null key, after which `process` returns
  /// -5 until a good key comes.
  int init(const unsigned char *key);
  /// Encrypts the whole 16-byte blocks of `bytes` bytes from `in` to `out`
  /// and returns the bytes processed: 31 -> 16, 15 -> 0. A trailing partial
  /// block is left alone. Before `init`: -5 (`Rijndael::NotInitialized`).
  /// At most 268435440 bytes (2^28 - 16) are handled in one call, since
  /// the count in bits must fit an int; the result tells how many were.
  int process(unsigned char *out, const unsigned char *in, unsigned int bytes);

private:
  std::unique_ptr<Rijndael> cipher;
};

/// The reverse of `Encryptor`, with the same keys, lengths and results.
class WAVEMILL_API Decryptor {
public:
  Decryptor();
  ~Decryptor();
  Decryptor(const Decryptor &) = delete;
  Decryptor &operator=(const Decryptor &) = delete;

  /// Sets the 16-byte key; as `Encryptor::init`.
  int init(const unsigned char *key);
  /// Decrypts the whole 16-byte blocks; as `Encryptor::process`.
  int process(unsigned char *out, const unsigned char *in, unsigned int bytes);

private:
  std::unique_ptr<Rijndael> cipher;
};

} // namespace Corvane::Wavemill
