#pragma once

#include "wavemill/Export.h"
#include "wavemill/waveform/FileHeader.h"

/// The extensible arbitrary-waveform header, header id 0xFFFF0001: the base
/// block of 16 bytes, then blocks that each carry an id and a size byte, and
/// two zero bytes at the end. A reader skips what it does not know, so
/// writers may add fields at the end of a block or add blocks.
///
/// | Block | Tags in order, with sizes                                         | Size      |
/// |-------|-------------------------------------------------------------------|-----------|
/// | 1     | 5 (32), 6 (8), 7 to 13 (1 each), 15 (8), 16 (8), 17 (4), 22 (2),  | 118       |
/// |       | 25 (8), 26 (1), 27 (4), 28 (8), 29 (8), 30 (8), 31 (2), 32 (1),   |           |
/// |       | 33 (8), 34 (1)                                                    |           |
/// | 2     | 39 (variable)                                                     | variable  |
/// | 3     | 20 (4), 35 (1), 36 (8), 37 (8), 38 (4)                            | 25        |
/// | 10    | 41 (1), 42 (4), 43 (1), 44 (variable)                             | 6 or more |
/// | 11    | 45 (variable)                                                     | variable  |
/// | 12    | 46 (variable)                                                     | variable  |
///
/// Defaults: tag 5 zero; doubles -1.0 (tags 6, 15, 16, 28, 29, 30, 33, 36,
/// 37); FF (7 to 13, 26, 32, 34, 35, 41); float -1.0 (17, 20, 42); FF 00
/// (22); double 9e99 (25); 7C F0 BD C2, a float near 1e37 (27, 38); FF FF
/// (31); 00 (43); tag 44 empty. Tags 39, 45 and 46 have no default, so
/// blocks 2, 11 and 12 are not written until they are set. A new header
/// thus serializes to 173 bytes: 16 + (2 + 118) + (2 + 25) + (2 + 6) + 2.
class WAVEMILL_API FlexibleArbFileHeader : public FileHeader {
public:
  /// A registered header without block memory.
  FlexibleArbFileHeader();
  ~FlexibleArbFileHeader() override;

  /// A new registered header without block memory, or null when it cannot be
  /// allocated. The caller owns it.
  static FileHeader *build();
  /// A new header holding `other`'s data (see `convert`) over the defaults,
  /// or null when it cannot be allocated. The caller owns it.
  static FileHeader *copy(const FileHeader &other);

  /// 0xFFFF0001.
  unsigned int getHeaderId() const override;

protected:
  /// Registers, clears and takes over `other`'s data.
  explicit FlexibleArbFileHeader(const FileHeader &other);

  void clearHeader() override;
  bool verifyHeader() override;

private:
  void doInit();
};
