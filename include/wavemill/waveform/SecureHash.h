#pragma once

#include "wavemill/Export.h"
#include "wavemill/waveform/CSHA1.h"

#include <memory>

namespace Corvane::Wavemill {

/// SHA-1 digests and HMAC-SHA-1 (with a 64-byte block) for the waveform
/// files and their callers: an object hashes a message fed in pieces, the
/// static operations hash one buffer at once.
///
///     unsigned int hi = 0, lo = 0;
///     SecureHash::SHA1_64(data, len, &hi, &lo);  // digest bytes 0-3 and 4-7
///
/// Bad arguments never crash: a null output receives nothing, and null data
/// or a null key counts as empty. Lengths are in bytes.
///
/// Thread safety: the static operations may run on any thread at once; an
/// object belongs to one thread at a time.
class WAVEMILL_API SecureHash {
public:
  /// The text whose 41 bytes, the terminating zero included, are the key of
  /// `HMACSHA1_64` and `HMACSHA1_hex`.
  static constexpr char hmacFixedKey[] = "3e9c07a4d1b25f86c0e47a19f3d28b6540ae17cd";
  /// Bytes of `hmacFixedKey` that go into the HMAC key.
  static constexpr unsigned int hmacFixedKeyLength = 41;

  /// Owns a fresh `CSHA1`. If it cannot be allocated the instance
  /// operations do nothing and `getHash` writes nothing.
  SecureHash();
  ~SecureHash();
  SecureHash(const SecureHash &) = delete;
  SecureHash &operator=(const SecureHash &) = delete;

  /// Starts a new message; see `CSHA1::reset`.
  void reset();
  /// Appends bytes to the message; see `CSHA1::update`.
  void update(const unsigned char *data, unsigned int len);
  /// Closes the message; see `CSHA1::final`.
  void final();
  /// The 20-byte digest of the last `final`; see `CSHA1::getHash`.
  void getHash(unsigned char *out);

  /// The 20-byte SHA-1 digest of `len` bytes at `data`, into `out`.
  static void SHA1(const unsigned char *data, unsigned int len, unsigned char *out);
  /// Digest bytes 4 to 7 as one big-endian word: "abc", whose digest begins
  /// a9 99 3e 36 47 06 81 6a, -> 0x4706816a.
  static void SHA1_32(const unsigned char *data, unsigned int len, unsigned int *word);
  /// Digest bytes 0 to 3 into `hi` and 4 to 7 into `lo`, both big-endian.
  static void SHA1_64(const unsigned char *data, unsigned int len, unsigned int *hi, unsigned int *lo);
  /// HMAC-SHA-1 of `data` under `key` into the 20 bytes at `out`. A key of
  /// 65 bytes or more is replaced by its digest first.
  static void HMACSHA1(const unsigned char *data, unsigned int len, const unsigned char *key, unsigned int keyLen,
                       unsigned char *out);
  /// HMAC-SHA-1 under `hmacFixedKey`, split into two words as in `SHA1_64`.
  static void HMACSHA1_64(const unsigned char *data, unsigned int len, unsigned int *hi, unsigned int *lo);
  /// HMAC-SHA-1 under `hmacFixedKey` as 40 lowercase hex digits and a
  /// terminating zero: `out` must hold 41 characters.
  static void HMACSHA1_hex(const unsigned char *data, unsigned int len, char *out);

private:
  std::unique_ptr<CSHA1> sha;
};

} // namespace Corvane::Wavemill
