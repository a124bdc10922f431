#pragma once

#include "wavemill/Export.h"
#include "wavemill/waveform/FileHeader.h"

/// The fixed arbitrary-waveform header: one block of 104 bytes, serialized
/// with no prefix and no terminator, header id 0.
///
/// Behind the base block stand, big-endian, with their defaults:
///
/// | Offset    | Size   | Tags     | Default        |
/// |-----------|--------|----------|----------------|
/// | 16        | 32     | 5        | zero           |
/// | 48        | 8      | 6        | double -1.0    |
/// | 56 to 63  | 1 each | 7 to 14  | FF             |
/// | 64, 72    | 8      | 15, 16   | double -1.0    |
/// | 80 to 92  | 4 each | 17 to 20 | float -1.0     |
/// | 96        | 2      | 21       | FF FF          |
/// | 98        | 2      | 22       | FF 00          |
/// | 100       | 2      | 23       | FF FF          |
/// | 102       | 2      | 24       | 00 00          |
///
/// Tag 5 has the size of an `hdrDescript` descriptor. The header is valid
/// when tag 1 holds 0.
class WAVEMILL_API ArbFileHeader : public FileHeader {
public:
  /// A registered header without block memory.
  ArbFileHeader();
  ~ArbFileHeader() override;

  /// A new registered header without block memory, or null when it cannot be
  /// allocated. The caller owns it.
  static FileHeader *build();
  /// A new header holding `other`'s data (see `convert`) over the defaults,
  /// or null when it cannot be allocated. The caller owns it.
  static FileHeader *copy(const FileHeader &other);

  /// 0.
  unsigned int getHeaderId() const override;

protected:
  /// Registers, clears and takes over `other`'s data.
  explicit ArbFileHeader(const FileHeader &other);

  void clearHeader() override;
  bool verifyHeader() override;

private:
  void doInit();
};
