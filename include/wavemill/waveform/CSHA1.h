#pragma once

#include "wavemill/Export.h"

#include <cstdint>

/// SHA-1, the 160-bit message digest, over a message fed in pieces.
///
///     CSHA1 sha;
///     sha.update(reinterpret_cast<const unsigned char *>("abc"), 3);
///     sha.final();
///     sha.getHash(digest);  // a9 99 3e 36 ... 9c d0 d8 9d
///
/// A new object is ready for a message. `final` closes the message and
/// computes the digest; `reset` starts the next one. Updates after `final`
/// without a `reset` give a meaningless digest, but never undefined
/// behaviour. Lengths are in bytes; messages up to 2^61 - 1 bytes.
///
/// Thread safety: an object belongs to one thread at a time.
class WAVEMILL_API CSHA1 {
public:
  /// Digest size in bytes.
  static constexpr int HashBytes = 20;

  CSHA1();
  virtual ~CSHA1();

  /// Forgets everything fed so far and starts a new message.
  void reset();
  /// Appends `len` bytes of `data` to the message. A null `data` appends nothing.
  void update(const unsigned char *data, unsigned int len);
  /// Pads the message and computes the digest, which `getHash` then returns.
  void final();
  /// Copies the 20-byte digest of the last `final` to `out`; nothing for a
  /// null `out`. Before any `final` the digest is all zero.
  void getHash(unsigned char *out) const;

private:
  /// Runs the compression function over one 64-byte block.
  void transform(std::uint32_t chain[5], const unsigned char block[64]);

  std::uint32_t state[5] = {};
  // Message length in bits: count[0] the low word, count[1] the high word.
  std::uint32_t count[2] = {};
  unsigned char buffer[64] = {};
  unsigned char digest[HashBytes] = {};
};
