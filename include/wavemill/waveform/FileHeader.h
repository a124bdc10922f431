#pragma once

#include "wavemill/Export.h"
#include "wavemill/waveform/DataReader.h"
#include "wavemill/waveform/DataWriter.h"

#include <cstdint>
#include <cstring>
#include <type_traits>
#include <vector>

/// A waveform file header: tagged fields laid out in numbered byte blocks.
///
/// A derived class registers where each tag stands (block, offset, length)
/// and writes its defaults in `clearHeader()`; this class keeps the blocks,
/// moves bytes in and out by tag, and serializes. Block 0, the base block,
/// always holds tags 0 to 4 in its first 16 bytes:
///
/// | Offset | Size | Tag            |
/// |--------|------|----------------|
/// | 0      | 4    | `TagMagic`     |
/// | 4      | 4    | `TagHeaderId`  |
/// | 8      | 2    | `TagVersion`   |
/// | 10     | 4    | `TagStamp`     |
/// | 14     | 2    | `TagBaseExtra` |
///
/// A header that is not `flexible` serializes block 0 alone, with no prefix
/// and no terminator. A flexible one writes block 0 and then every further
/// block that has content as id byte, size byte, content, in the order of
/// the blocks, followed by two zero bytes. A block holds at most 255 bytes.
///
/// Bytes are moved as they are: numbers must be stored already big-endian,
/// which `writeValue<double>` does for doubles.
///
/// Memory: the header owns its blocks; they are allocated by `clear()`, or
/// by the first `read` or `write`. Failures are told by false results, 0
/// counts and the validity that `write` checks; nothing throws except
/// `std::bad_alloc` from the block list itself. Not copyable; use `copy`.
/// One thread at a time.
class WAVEMILL_API FileHeader {
public:
  /// The tags. 0 to 4 are the base block's; what the others mean is up to
  /// the application.
  enum Tag {
    TagMagic = 0,
    TagHeaderId = 1,
    TagVersion = 2,
    TagStamp = 3,
    TagBaseExtra = 4,
    Tag5,
    Tag6,
    Tag7,
    Tag8,
    Tag9,
    Tag10,
    Tag11,
    Tag12,
    Tag13,
    Tag14,
    Tag15,
    Tag16,
    Tag17,
    Tag18,
    Tag19,
    Tag20,
    Tag21,
    Tag22,
    Tag23,
    Tag24,
    Tag25,
    Tag26,
    Tag27,
    Tag28,
    Tag29,
    Tag30,
    Tag31,
    Tag32,
    Tag33,
    Tag34,
    Tag35,
    Tag36,
    Tag37,
    Tag38,
    Tag39,
    Tag40,
    Tag41,
    Tag42,
    Tag43,
    Tag44,
    Tag45,
    Tag46,
    Tag47,
    Tag48
  };

  /// The numbers of the standard blocks; block 0 is the base block.
  enum HeaderBlockId {
    BlockBase = 0,
    Block1,
    Block2,
    Block3,
    Block4,
    Block5,
    Block6,
    Block7,
    Block8,
    Block9,
    Block10,
    Block11,
    Block12,
    Block13,
    Block14
  };

  /// The standard blocks 0 to 14; blocks read with a higher id are kept behind them.
  static constexpr int StandardBlockCount = 15;
  /// Tags 0 to 48.
  static constexpr int TagCount = 49;

  /// One block: its id, its size in bytes and its memory (owned by the header, may be null).
  struct BlockInfo {
    BlockInfo(unsigned char id, unsigned char size, char *data);
    unsigned char id;
    unsigned char size;
    char *data;
  };

  /// Where a tag stands. `length` 0 is a variable field running to the end
  /// of its block. An unregistered tag reads offset -1, length 0, block 0.
  struct Location {
    int offset;
    int length;
    int block;
  };

  /// One row of a block's layout table: a tag and its length.
  struct FieldPlace {
    Tag tag;
    int length;
  };

  /// A header with the base block registered and no memory yet.
  explicit FileHeader(bool flexible);
  /// Frees every block.
  virtual ~FileHeader();
  FileHeader(const FileHeader &) = delete;
  FileHeader &operator=(const FileHeader &) = delete;

  /// A new non-flexible base header without block memory, or null when it
  /// cannot be allocated. The caller owns it.
  static FileHeader *build();
  /// A new header with `other`'s flexibility and data, or null when it
  /// cannot be allocated. The caller owns it.
  static FileHeader *copy(const FileHeader &other);

  /// Gives every standard block its registered size (allocating what is
  /// missing), drops blocks beyond the standard ones and those without
  /// registrations, and writes the defaults. The magic number is not a
  /// default: it keeps what the block held (zero in fresh memory).
  void clear();
  /// Reads a header from `reader`, which must count items as `fread` does:
  /// block 0 as one item, then (when flexible) id and size bytes and each
  /// block's content as one item, until two zero bytes or the end. Block ids
  /// must rise. Returns whether the bytes were read and carry this class's
  /// header id; a damaged stream leaves the header invalid so that `write`
  /// refuses. Reads no more than the reader gives.
  bool read(Corvane::Wavemill::DataReader *reader);
  /// Writes the header to `writer`, which must count items as `fwrite` does,
  /// and then calls its `close()`. Nothing is written, and the result is
  /// true, when nothing changed since the last `write`. False when the
  /// header is invalid, the writer is null or invalid, or a write fails.
  bool write(Corvane::Wavemill::DataWriter *writer);

  /// Copies up to `len` bytes of `tag` into `dest` and returns how many.
  /// 0 for a tag outside 0 to 49 or unregistered, a block without memory,
  /// a null `dest` or `len` below 1.
  int readBuffer(char *dest, int len, Tag tag) const;
  /// Stores up to `len` bytes from `src` in `tag` and returns how many the
  /// field takes: at most its length, or for a variable field at most what
  /// fits up to byte 255 of its block, whose size it then sets. 0 for a tag
  /// above 49 or unregistered, a null `src` or a negative `len`.
  int writeBuffer(Tag tag, const char *src, int len);
  /// Stores `value` big-endian in `tag`; only `double` is supported. Returns
  /// the bytes stored, as `writeBuffer`.
  template <typename T> int writeValue(Tag tag, T value);

  /// The serialized size: the blocks with memory and content, and when
  /// flexible with two or more of them, two prefix bytes for each block
  /// after the first plus the two terminator bytes.
  int getCurrentHeaderSize() const;
  /// The length of `tag` as it stands: its registered length, or for a
  /// variable field the bytes from its offset to the end of its block. 0
  /// where `readBuffer` gives 0.
  int getTagLengthActual(Tag tag) const;
  /// The registered offset and length of `tag`. False, with the outputs
  /// left alone, for a tag outside 0 to 48; an unregistered tag gives
  /// offset -1 and length 0 and false.
  bool getTagLocation(Tag tag, int &offset, int &length) const;
  /// Whether `tag` is registered; false above 48.
  bool hasTag(Tag tag) const;
  /// The id that tag 1 carries in this kind of header: 1 for the base class.
  virtual unsigned int getHeaderId() const;

protected:
  /// A header of the base registrations carrying `other`'s data as `convert`
  /// moves it; without block memory unless that data brought some.
  FileHeader(const FileHeader &other, bool flexible);
  /// Registers the tags of `places` one after another from the block's
  /// present registered size on. A tag that is not taken still uses its room.
  void registerBlock(HeaderBlockId block, const FieldPlace *places, int count);
  /// Registers one tag; the first registration wins. Ignored for a tag
  /// outside 0 to 48, a block outside 0 to 14, or a field that would end
  /// past byte 255. A block that grows loses its memory until `clear()`.
  void registerLocation(Tag tag, Location location);

  /// Writes the defaults; the base class writes those of block 0 (the magic
  /// number aside). Overrides call it first.
  virtual void clearHeader();
  /// Whether the content is valid for this kind of header; the base class
  /// accepts anything.
  virtual bool verifyHeader();
  /// Takes over `other`'s data: all of it when both have the same header
  /// id, otherwise every tag but tag 1 that both register with equal
  /// lengths (variable fields end up empty).
  virtual void convert(const FileHeader &other);
  /// Copies every block of `other` that has content, reallocating blocks
  /// that are smaller.
  virtual void copyData(const FileHeader &other);

  /// True when tag 1 holds `getHeaderId()`, big-endian.
  bool headerIdMatches() const;

private:
  void doInit();
  bool isRegistered(int tag) const;
  bool resizeBlock(BlockInfo &block, int size, int keep);

  std::vector<BlockInfo> blocks;
  int blockSizes[StandardBlockCount];
  bool modified;
  bool valid;
  int headerSize;
  bool flexible;
  Location locations[TagCount];
  bool tagRegistered[TagCount];
};

template <typename T> int FileHeader::writeValue(Tag tag, T value) {
  static_assert(std::is_same_v<T, double>, "FileHeader::writeValue stores doubles only");
  std::uint64_t bits = 0;
  std::memcpy(&bits, &value, sizeof bits);
  char bytes[8];
  for (int i = 0; i < 8; ++i) {
    bytes[i] = static_cast<char>((bits >> (56 - 8 * i)) & 0xFFu);
  }
  return writeBuffer(tag, bytes, 8);
}
