#pragma once

#include "wavemill/Export.h"

#include <gsl/span>

#include <memory>
#include <string>
#include <vector>

namespace Corvane::Wavemill::ExportImport {

/// Makes an earlier optional part present when a later one is: sets `a`
/// true when `b` is true and leaves it alone otherwise. The block 1
/// extensions are written in order, so `hasExtension2` implies
/// `hasExtension1`.
WAVEMILL_API void updateEnabled(bool &a, bool &b);

/// The in-memory record of a waveform's header and its serialized form, the
/// header bytes that an exporter writes and an importer gives back.
///
/// The application sets the public fields directly; the record attaches no
/// meaning to them, so most are named by where they stand. The serialized
/// form is that of `FlexibleArbFileHeader` with more blocks: the same header
/// id, and in blocks 1, 3 and 10 the same fields at the same offsets, so that
/// a field called `tagN` is `FileHeader::TagN` there.
///
/// Layout, all numbers big-endian:
///
/// | Part     | Content                                                        | Size         |
/// |----------|----------------------------------------------------------------|--------------|
/// | base     | `magic`, `headerId`, `version`, `stamp`, `baseExtra`, no prefix | 16           |
/// | block 1  | `tag5` to `tag34`, then `extension1`, `extension2` if enabled  | 118/126/134  |
/// | block 2  | `block2Value`, `reservedText`                                  | 1 + text     |
/// | block 3  | `tag20`, `tag35`, `tag36`, `tag37`, `tag38`                    | 25           |
/// | block 4  | `block4A`, `block4B`                                           | 8            |
/// | block 5  | `block5Value`, `block5Text`                                    | 8 + text     |
/// | block 6  | `block6A`, `block6B`, `block6C`                                | 7            |
/// | block 7  | `block7A`, `block7B`                                           | 6            |
/// | block 8  | `block8Value`                                                  | 8            |
/// | block 9  | `block9Value`                                                  | 4            |
/// | block 10 | `tag41`, `tag42`, `tag43`, `tag44`                             | 6 + text     |
/// | block 11 | `tag45`, only with `hasTextBlocks`                             | text         |
/// | block 12 | `tag46`, only with `hasTextBlocks`                             | text         |
/// | block 14 | `block14Value`, only with `hasBlock14`                         | 8            |
/// | end      | two zero bytes                                                 | 2            |
///
/// Every block after the base is its id byte, its content size byte and its
/// content; texts carry no length of their own and run to the end of their
/// block. A block holds at most 255 bytes: texts that make it longer are
/// written with a size byte truncated to 8 bits, so keep them short enough.
/// Block 13 is not defined. A default record serializes to 229 bytes.
///
/// Not thread-safe: one thread at a time, also through a shared pointer.
class WAVEMILL_API WaveformHeader {
public:
  /// The shared byte array that the serialized forms travel in.
  using Bytes = std::shared_ptr<std::vector<unsigned char>>;

  /// A record with every field at its default and `stamp` taken from the
  /// system clock.
  WaveformHeader();

  /// The serialized header: base block, block 1, blocks 2 to 10, blocks 11
  /// and 12 with `hasTextBlocks`, block 14 with `hasBlock14`, two zero
  /// bytes. `stamp` is written as it stands, so two calls give equal bytes.
  /// Sets `hasExtension1` when `hasExtension2` is set. Never null.
  Bytes getHeader();
  /// The same bytes as `getHeader()`, as a plain vector.
  std::vector<unsigned char> getHeaderBytes();
  /// The size of the serialized header as the flags stand now: 229 (237
  /// with `hasExtension1`), plus 8 with `hasExtension2`, plus the lengths
  /// of `reservedText`, `block5Text` and `tag44`; with `hasTextBlocks` plus
  /// 4 and the lengths of `tag45` and `tag46`; with `hasBlock14` plus 10.
  /// With `hasExtension2` alone it reports 8 less than `getHeader()` then
  /// delivers, since only serializing makes the first extension present.
  int getHeaderLength() const;
  /// Block 1 with its id and size bytes: `tag5` cut or zero-filled to 32
  /// bytes, the fields through `tag34`, then `extension1` and `extension2`
  /// when enabled (content 118, 126 or 134 bytes). Sets `hasExtension1`
  /// when `hasExtension2` is set. Never null.
  Bytes getPlatformBlock();

  /// Fills the record from serialized header bytes; a null pointer is
  /// ignored.
  ///
  /// Fewer than 4 bytes change nothing. Otherwise the base block is read
  /// field by field, each only if it fits, and then the blocks follow until
  /// two zero bytes, an id of 13 or above 14, or the end of the bytes. Each
  /// block is read from its own content: fields that do not fit keep their
  /// values, bytes behind the known fields are skipped, and the texts
  /// `reservedText`, `block5Text` and `tag44` are emptied and then take the
  /// rest of their block. `tag45` and `tag46` are not emptied: an empty one
  /// takes its whole block, one that holds L characters takes L bytes only
  /// when the block is longer than L. Zero bytes in `tag5` (and in the other
  /// fixed-length texts) read as spaces.
  ///
  /// Block 1 sets `hasExtension1` and `hasExtension2` from its content
  /// size (at least 126 and 134 bytes); blocks 11 and 12 set
  /// `hasTextBlocks`, block 14 sets `hasBlock14`. Fields and flags of
  /// blocks that are absent keep their values.
  ///
  /// Damaged bytes never read outside the array: a block whose size byte
  /// claims more than is left is not read, and reading ends there, so a cut
  /// header gives the blocks it holds whole. Only the first 2^31 - 1 bytes
  /// are looked at. Nothing throws but `std::bad_alloc`.
  void setHeader(Bytes bytes);
  /// Copies `bytes` and reads them as `setHeader` does.
  void setHeaderBytes(gsl::span<unsigned char> bytes);

  /// The bytes of `text`, without a terminator: "ab" -> 61 62.
  static Bytes toByteArray(const std::string &text);
  /// `length` bytes: the first characters of `text`, then zero bytes:
  /// ("ab", 4) -> 61 62 00 00, ("abc", 2) -> 61 62. A negative length
  /// gives an empty array.
  static Bytes toByteArray(const std::string &text, int length);

  /// @name Base block
  /// Serialized without prefix; the 16 bytes that travel in a waveform
  /// file's encrypted head.
  /// @{
  unsigned int magic = 0x87868584u;    ///< Offset 0.
  unsigned int headerId = 0xFFFF0001u; ///< Offset 4; that of `FlexibleArbFileHeader`.
  unsigned short version = 2;          ///< Offset 8.
  unsigned int stamp;                  ///< Offset 10; the low 32 bits of the system clock's ticks at construction.
  unsigned short baseExtra = 96;       ///< Offset 14.
  /// @}

  /// @name Block 1, the platform block
  /// Offsets inside the block's content.
  /// @{
  std::string tag5 = std::string(32, ' '); ///< Offset 0, 32 bytes: cut or zero-filled when written.
  double tag6 = -1.0;                      ///< Offset 32.
  unsigned char tag7 = 255;                ///< Offset 40.
  unsigned char tag8 = 255;                ///< Offset 41.
  unsigned char tag9 = 255;                ///< Offset 42.
  unsigned char tag10 = 255;               ///< Offset 43.
  unsigned char tag11 = 255;               ///< Offset 44.
  unsigned char tag12 = 255;               ///< Offset 45.
  unsigned char tag13 = 255;               ///< Offset 46.
  double tag15 = -1.0;                     ///< Offset 47.
  double tag16 = -1.0;                     ///< Offset 55.
  float tag17 = -1.0f;                     ///< Offset 63.
  unsigned short tag22 = 128;              ///< Offset 67.
  double tag25 = 9e99;                     ///< Offset 69.
  unsigned char tag26 = 255;               ///< Offset 77.
  float tag27 = 1e37f;                     ///< Offset 78; the default's bytes are 7C F0 BD C2.
  double tag28 = -1.0;                     ///< Offset 82.
  double tag29 = -1.0;                     ///< Offset 90.
  double tag30 = -1.0;                     ///< Offset 98.
  unsigned short tag31 = 65535;            ///< Offset 106.
  unsigned char tag32 = 255;               ///< Offset 108.
  double tag33 = -1.0;                     ///< Offset 109.
  unsigned char tag34 = 255;               ///< Offset 117.
  double extension1 = -1.0;                ///< Offset 118, written only with `hasExtension1`.
  double extension2 = -1.0;                ///< Offset 126, written only with `hasExtension2`.
  /// @}

  /// @name Blocks 2 to 14
  /// In the order of the fields inside each block.
  /// @{
  unsigned char block2Value = 1;  ///< Block 2.
  std::string reservedText;       ///< Block 2, to its end; an opaque value that the record passes on unchanged.
  float tag20 = -1.0f;            ///< Block 3.
  char tag35 = '\xFF';            ///< Block 3.
  double tag36 = -1.0;            ///< Block 3.
  double tag37 = -1.0;            ///< Block 3.
  float tag38 = 1e37f;            ///< Block 3; the default's bytes are 7C F0 BD C2.
  float block4A = -1.0f;          ///< Block 4.
  float block4B = -1.0f;          ///< Block 4.
  double block5Value = 0.0;       ///< Block 5.
  std::string block5Text;         ///< Block 5, to its end.
  unsigned char block6A = 255;    ///< Block 6.
  float block6B = -1.0f;          ///< Block 6.
  unsigned short block6C = 65535; ///< Block 6.
  float block7A = -1.0f;          ///< Block 7.
  unsigned short block7B = 65535; ///< Block 7.
  double block8Value = 9e99;      ///< Block 8.
  unsigned int block9Value = 0;   ///< Block 9.
  unsigned char tag41 = 255;      ///< Block 10.
  float tag42 = -1.0f;            ///< Block 10.
  unsigned char tag43 = 255;      ///< Block 10.
  std::string tag44;              ///< Block 10, to its end.
  std::string tag45;              ///< Block 11, the whole block.
  std::string tag46;              ///< Block 12, the whole block.
  double block14Value = 0.0;      ///< Block 14.
  /// @}

  /// @name Optional parts
  /// Whether they are serialized; not stored as such in the bytes, but set
  /// again from them by `setHeader`.
  /// @{
  bool hasExtension1 = false; ///< `extension1` at the end of block 1.
  bool hasExtension2 = false; ///< `extension2` behind it; implies `hasExtension1`.
  bool hasTextBlocks = false; ///< Blocks 11 and 12.
  bool hasBlock14 = false;    ///< Block 14.
  /// @}
};

} // namespace Corvane::Wavemill::ExportImport
