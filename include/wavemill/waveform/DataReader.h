#pragma once

#include "wavemill/Export.h"

#include <cstdint>

namespace Corvane::Wavemill {

/// A source of bytes that packagers and `FileHeader::read` pull from.
///
/// Implementations decide where the bytes come from; the library has memory
/// forms only. Nothing throws: failures are told by the results below.
class WAVEMILL_API DataReader {
public:
  /// Releases the reader; what it reads from is not the reader's unless the
  /// implementation says so.
  virtual ~DataReader();
  /// Copies up to `size * count` bytes into `dest` and advances. The result
  /// is defined by the implementation: a count of items for file-backed
  /// readers (what `FileHeader::read` expects), a count of bytes for the
  /// memory readers below. 0 means nothing was read.
  virtual int read(void *dest, int size, int count) = 0;
  /// The number of bytes this reader delivers from its start, 0 when it is
  /// not valid.
  virtual int64_t size() = 0;
  /// Goes back to the first byte.
  virtual void reset() = 0;
  /// Whether there is anything to read from at all.
  virtual bool isValid() = 0;
};

/// Reads from memory that it does not own; the memory must outlive the reader.
///
///     unsigned char bytes[3] = {1, 2, 3};
///     Buffer_DataReader r(bytes, 3);
///     r.read(out, 2, 1);  // 2: bytes 1, 2
///     r.read(out, 4, 1);  // 1: byte 3, only what is left
///     r.read(out, 4, 1);  // 0
class WAVEMILL_API Buffer_DataReader : public DataReader {
public:
  /// Reads `len` bytes from `buf`, starting at the first. A null `buf` gives
  /// a reader that is not valid and reads nothing.
  Buffer_DataReader(void *buf, int len);
  /// Copies `size * count` bytes, or what is left if that is less, and
  /// returns the number of BYTES copied (not of items): with `size` 1 both
  /// agree. Returns 0 when `buf` or `dest` is null, at the end, and for a
  /// product that is not positive or does not fit an int.
  int read(void *dest, int size, int count) override;
  /// `len` as given, or 0 when `buf` is null.
  int64_t size() override;
  /// Goes back to byte 0.
  void reset() override;
  /// True when `buf` is not null.
  bool isValid() override;

protected:
  /// `len` as given.
  int get_bufLen();
  /// Moves to byte `pos`; a position that is negative or not below the
  /// length is ignored.
  void set_bufPos(int pos);

  unsigned char *buf;
  int bufLen;
  int bufPos;
};

/// Reads a serialized waveform header without its first 16 bytes.
///
/// Those 16 bytes (the base block) travel in the encrypted file head, not in
/// the header package, so the package's reader starts behind them. A buffer
/// of 16 bytes or fewer is read from byte 0, and `size()` then reports
/// `len - 16`, which is 0 or negative.
class WAVEMILL_API HeaderBuffer_DataReader : public Buffer_DataReader {
public:
  /// Starts at byte 16 when `len` is 17 or more, else at byte 0.
  HeaderBuffer_DataReader(void *buf, int len);
  /// `len - 16` (negative below 16 bytes), or 0 when not valid.
  int64_t size() override;
  /// Goes back to byte 16 when `len` is 17 or more; otherwise, and when not
  /// valid, leaves the position where it is.
  void reset() override;
};

} // namespace Corvane::Wavemill
