#pragma once

#include "wavemill/Export.h"

#include <cstdint>

/// AES, the Rijndael block cipher with 16-byte blocks and keys of 16, 24 or
/// 32 bytes, in the modes ECB, CBC and CFB1 (one-bit cipher feedback).
///
///     Rijndael aes;
///     aes.init(Rijndael::ECB, Rijndael::Encrypt, key, Rijndael::Key16Bytes, nullptr);
///     int bits = aes.blockEncrypt(plain, 4096 * 8, cipher);  // 32768: 256 blocks
///
/// An object serves one direction: `init` fixes the mode, the direction, the
/// key and the initialization vector, and may be called again to change any
/// of them. Every call of `blockEncrypt`, `blockDecrypt`, `padEncrypt` and
/// `padDecrypt` is a message of its own: CBC and CFB1 start each call from
/// the vector given to `init`, and nothing carries over between calls.
///
/// Results: operations return a byte or bit count, or one of the negative
/// codes below; nothing throws. Lengths are signed so that a caller's
/// negative length is a length below 1 (result 0), never a huge one.
///
/// Speed: ECB in both directions and CBC use the processor's AES instructions
/// where it has them (AES-NI, and VAES on 256-bit registers for ECB), chosen
/// at run time; the portable code runs everywhere else. All paths use the
/// same key schedule and give the same bytes.
///
/// Thread safety: an object belongs to one thread at a time; separate
/// objects may be used on separate threads at once. Output may be the input
/// buffer itself but must not otherwise overlap it.
class WAVEMILL_API Rijndael {
public:
  /// The chaining mode. The underlying type is fixed so that any number a
  /// caller passes is a value `init` can reject.
  enum Mode : int { ECB = 0, CBC = 1, CFB1 = 2 };
  /// Which of the block operations the object serves.
  enum Direction : int { Encrypt = 0, Decrypt = 1 };
  /// 16 bytes: 10 rounds; 24 bytes: 12 rounds; 32 bytes: 14 rounds.
  enum KeyLength : int { Key16Bytes = 0, Key24Bytes = 1, Key32Bytes = 2 };
  /// `Valid` after a successful `init`; a new object and one whose last
  /// `init` failed are `Invalid`.
  enum State : int { Valid = 0, Invalid = 1 };

  /// Result of a successful `init`.
  static constexpr int Success = 0;
  /// The mode is none of ECB, CBC, CFB1; also from the padded operations in CFB1.
  static constexpr int UnsupportedMode = -1;
  /// The direction is neither Encrypt nor Decrypt.
  static constexpr int UnsupportedDirection = -2;
  /// The key length is none of the three.
  static constexpr int UnsupportedKeyLength = -3;
  /// The key pointer is null.
  static constexpr int BadKey = -4;
  /// No successful `init` yet.
  static constexpr int NotInitialized = -5;
  /// An encrypting operation on a Decrypt object, or the reverse.
  static constexpr int BadDirection = -6;
  /// Padded input whose length is not a multiple of 16 or whose pad bytes are wrong.
  static constexpr int CorruptedData = -7;

  /// Block size in bytes, the same for every key length.
  static constexpr int BlockBytes = 16;

  /// Which code does the work. `setAcceleration` caps it; the path in use is
  /// the cap or the best the processor has, whichever is lower.
  enum class Acceleration : int {
    Portable = 0, ///< table-driven code, any processor
    AesNi = 1,    ///< AES-NI on 128-bit registers, eight blocks in flight
    Vaes = 2      ///< VAES on 256-bit registers for ECB, AES-NI for the rest
  };

  /// An `Invalid` object; `init` must come first.
  Rijndael();
  virtual ~Rijndael();

  /// Sets up the object. `key` holds 16, 24 or 32 bytes as `keyLen` says;
  /// `initVector` holds 16 bytes, and null means all zero (ECB ignores it).
  /// Returns `Success`, or the first fault found in the order mode (-1),
  /// direction (-2), key length (-3), null key (-4). After a failure the
  /// object is `Invalid` until the next successful `init`.
  int init(Mode mode, Direction dir, const unsigned char *key, KeyLength keyLen,
           const unsigned char *initVector = nullptr);

  /// Encrypts the whole 16-byte blocks of `input`; `inputBits` is the length
  /// in bits, and bits beyond the last whole block are ignored (100 bits: no
  /// block). Returns the bits processed (a multiple of 128), 0 for a null
  /// `input` or `out` or a length below 1, `NotInitialized` (-5) or
  /// `BadDirection` (-6) on a Decrypt object.
  int blockEncrypt(const unsigned char *input, int inputBits, unsigned char *out);
  /// The reverse of `blockEncrypt`, with the same lengths and results; -6 on
  /// an Encrypt object.
  int blockDecrypt(const unsigned char *input, int inputBits, unsigned char *out);

  /// Encrypts `inputBytes` bytes in ECB or CBC and pads the last block with
  /// 1 to 16 copies of the pad count (PKCS#7): 20 bytes -> 32, 32 bytes -> 48.
  /// `out` must hold the input length rounded up to the next multiple of 16
  /// above it. Returns the output byte count, 0 for a null buffer or a length
  /// below 1, -5, -6, or `UnsupportedMode` (-1) in CFB1.
  int padEncrypt(const unsigned char *input, int inputBytes, unsigned char *out);
  /// Decrypts and strips the padding; returns the plain byte count. `out`
  /// must hold `inputBytes` bytes. `CorruptedData` (-7) for a length that is
  /// not a multiple of 16 and for wrong pad bytes; the pad count of the last
  /// byte is judged by mode, and the two rules differ on purpose: in ECB a
  /// count of 16 or more is corrupt and 0 is accepted (nothing is stripped),
  /// in CBC 0 and counts above 16 are corrupt. So a whole-block message
  /// padded in ECB does not come back through ECB `padDecrypt`. Blocks before
  /// the last may already be written when -7 comes back. Other results as in
  /// `padEncrypt`.
  int padDecrypt(const unsigned char *input, int inputBytes, unsigned char *out);

  /// The state after the last `init`.
  State getState() const { return state; }

  /// Caps the code path of every object in the process: `Portable` forces the
  /// table-driven code, `AesNi` keeps VAES out. For tests and benchmarks that
  /// compare the paths; the library itself never calls it. The default is
  /// `Vaes`, that is the best the processor has. Safe from any thread; a call
  /// that is running keeps the path it started with.
  static void setAcceleration(Acceleration maximum);
  /// The path that the next call will take on this processor under the cap.
  static Acceleration getAcceleration();
  /// The best path this processor has, whatever the cap.
  static Acceleration getHardwareAcceleration();

protected:
  /// Encrypts one block with the encryption schedule; `in` may equal `out`.
  void encrypt(const unsigned char in[16], unsigned char out[16]) const;
  /// Decrypts one block with the decryption schedule; `in` may equal `out`.
  void decrypt(const unsigned char in[16], unsigned char out[16]) const;
  /// Expands `key` (4, 6 or 8 columns of 4 bytes, as `rounds` says) into
  /// the encryption schedule.
  void keySched(const unsigned char *key);
  /// Derives the decryption schedule from the encryption schedule: the round
  /// keys of the equivalent inverse cipher, in the same order.
  void keyEncToDec();

private:
  // The blocks of one call in `wanted` direction, or 0 or a negative code
  // when nothing is to be done.
  int blocksToProcess(const unsigned char *input, int inputBits, const unsigned char *out, Direction wanted) const;
  void ecbEncrypt(const unsigned char *in, unsigned char *out, int blocks) const;
  void ecbDecrypt(const unsigned char *in, unsigned char *out, int blocks) const;
  void cbcEncrypt(const unsigned char *in, unsigned char *out, int blocks) const;
  void cbcDecrypt(const unsigned char *in, unsigned char *out, int blocks) const;
  void cfb1(const unsigned char *in, unsigned char *out, int blocks, bool decrypting) const;

  State state = Invalid;
  Mode mode = ECB;
  Direction direction = Encrypt;
  unsigned char initVector[16] = {};
  int rounds = 0;
  // Round key r occupies bytes 16r to 16r + 15, in the byte order of the
  // standard, so the processor's AES instructions load them as they are.
  alignas(16) unsigned char encryptKeys[15 * 16] = {};
  alignas(16) unsigned char decryptKeys[15 * 16] = {};
};
