#pragma once

#include "wavemill/Export.h"
#include "wavemill/waveform/DataReader.h"
#include "wavemill/waveform/Encryptor.h"

#include <memory>

namespace Corvane::Wavemill {

/// Turns the bytes of one `DataReader` into encrypted 16-byte blocks of a
/// waveform file, handed out on demand, so that no encrypted file is ever
/// held whole. A package stands in the block stream as
///
/// | Offset | Size    | Content                                       |
/// |--------|---------|-----------------------------------------------|
/// | 0      | 4       | package tag, big-endian                       |
/// | 4      | 4       | body length in bytes, big-endian              |
/// | 8      | n       | body                                          |
/// | 8 + n  | 0 to 15 | zero bytes up to a multiple of 16 bytes       |
///
/// One packager handles one chunk of a package. `tag` says which:
///
/// | `tag`    | Prefix written              | Chunk                               |
/// |----------|-----------------------------|-------------------------------------|
/// | 1 to 4   | tag, then the length        | first of a package, more may follow |
/// | 33 to 36 | `tag - 32`, then the length | first and last                      |
/// | 16       | none                        | a following one, more may follow    |
/// | 32       | none                        | the last one                        |
///
/// With a declared package length (`pkgSize` not 0) and bit value 32 clear
/// in `tag`, more chunks are to come, so the end of this one is not padded:
/// the bytes behind its last whole block are held back, and the packager of
/// the next chunk (tag 16 or 32) takes them over through `leftoverBytes`.
///
///     // a whole package of 20 body bytes: 2 blocks, the last 4 bytes zero
///     Buffer_DataReader body(bytes, 20);
///     WPL_Packager p(&body, &encryptor, 2, 256, 16, 0, 0, nullptr);
///     p.getBlocks(out, 8);  // 2
///
/// Memory: one buffer of `blocks * blockSize` bytes (4096 as the exporters
/// use it) however long the package is; blocks are encrypted as they are
/// taken, straight into the caller's buffer. The reader and the encryptor
/// are not owned and must outlive the packager; the encryptor must have its
/// key. One thread at a time. Nothing throws.
class WAVEMILL_API WPL_Packager {
public:
  /// Prepares the chunk and reads the first buffer from `reader`.
  /// `pkgSize` is the declared length of the whole package; 0 means "the
  /// reader's size", and then nothing is held back. `leftoverCount` bytes
  /// at `leftoverBytes` (the previous chunk's held-back bytes) open the
  /// chunk when `tag` is 16 or 32 and are ignored otherwise.
  /// A packager that delivers nothing results from: a null reader or
  /// encryptor, `blockSize` or `blocks` below 1, a buffer that does not fit
  /// an int, too small for the 8-byte prefix or for the leftovers, and
  /// leftovers given as a null pointer.
  /// A reader that delivers fewer bytes than asked is taken to have ended.
  WPL_Packager(DataReader *reader, Encryptor *encryptor, int tag, int blocks, int blockSize, unsigned int pkgSize,
               unsigned int leftoverCount, unsigned char *leftoverBytes);
  virtual ~WPL_Packager();
  WPL_Packager(const WPL_Packager &) = delete;
  WPL_Packager &operator=(const WPL_Packager &) = delete;

  /// Encrypts up to `blocks` blocks into `out`, which must have room for
  /// `blocks * blockSize` bytes, and returns how many were delivered; fewer
  /// than asked means the chunk is done. 0 for `blocks` below 1 or a null
  /// `out`. The blocks are only whole when `blockSize` is 16, the cipher's.
  int getBlocks(unsigned char *out, int blocks);
  /// Copies the held-back bytes, in their order, to `dest` (room for
  /// `blockSize - 1` bytes) and returns their count, 0 to `blockSize - 1`.
  /// They are only complete once the chunk's last block has been taken or
  /// the whole chunk fitted the first buffer. A null `dest` copies nothing.
  int getLeftoverBytes(unsigned char *dest);

protected:
  /// Moves the unread bytes to the front and reads behind them; at the end
  /// of the reader pads to a whole block or holds the partial block back.
  void fillBuffer();
  /// Bytes still to deliver: unread ones in the buffer and the reader's.
  int getBytesLeft();
  /// Moves unread bytes to the front, or empties the buffer when there are
  /// none to move.
  void resetBuffer();

  DataReader *reader;
  Encryptor *encryptor;
  std::unique_ptr<unsigned char[]> buffer;
  int blockSize;
  int bufferSize;
  int readPos;
  int writePos;
  int bytesLeft;
  int leftoverCount;
  std::unique_ptr<unsigned char[]> leftover;
  bool holdBack;

private:
  void readMore();
};

/// The forerunner of `WPL_Packager`, kept for applications that made files
/// with it; no exporter of this library uses it. It always writes the
/// prefix, tag first and in the host's byte order (the length word is
/// big-endian, as in `WPL_Packager`), pads the end with zeros and never
/// holds bytes back. Same ownership, failure results and thread rules as
/// `WPL_Packager`.
class WAVEMILL_API Packager {
public:
  /// Writes the prefix `tag`, `reader->size()` and reads the first buffer;
  /// `blocks * blockSize` bytes of buffer, at least 8.
  Packager(DataReader *reader, Encryptor *encryptor, int tag, int blocks, int blockSize);
  virtual ~Packager();
  Packager(const Packager &) = delete;
  Packager &operator=(const Packager &) = delete;

  /// As `WPL_Packager::getBlocks`.
  int getBlocks(unsigned char *out, int blocks);

protected:
  /// As `WPL_Packager::fillBuffer`, always padding with zeros.
  void fillBuffer();
  /// As `WPL_Packager::getBytesLeft`.
  int getBytesLeft();
  /// As `WPL_Packager::resetBuffer`.
  void resetBuffer();

  DataReader *reader;
  Encryptor *encryptor;
  std::unique_ptr<unsigned char[]> buffer;
  int blockSize;
  int bufferSize;
  int readPos;
  int writePos;
  int bytesLeft;

private:
  void readMore();
};

} // namespace Corvane::Wavemill
