#pragma once

#include "wavemill/Export.h"

/// The resolution code of a waveform descriptor; any other stored value
/// reads back as `DataResNone`.
enum DataRes { DataResNone = 0, DataRes1 = 1, DataRes2 = 2, DataRes4 = 4 };

/// A waveform descriptor: a text, a resolution code and a frequency, and
/// their 32-byte serialized form (the size of `FileHeader::Tag5`):
///
/// | Offset | Size | Content                                                  |
/// |--------|------|----------------------------------------------------------|
/// | 0      | 22   | the first 22 characters of the text, zero-filled         |
/// | 22     | 1    | 0 when built from a text                                 |
/// | 23     | 1    | `res` + 202, modulo 256                                  |
/// | 24     | 8    | `freq`, big-endian double                                |
///
/// The text holds 23 characters: built from a text it keeps character 22,
/// which the descriptor drops; read from a descriptor it is bytes 0 to 22.
class WAVEMILL_API hdrDescript {
public:
  /// Reads the 32 bytes at `descriptor`; null gives an all-zero descriptor.
  explicit hdrDescript(unsigned char *descriptor);
  /// Builds the descriptor from `text` (up to 23 characters are kept; null
  /// is empty), `res` and `freq`.
  hdrDescript(const char *text, DataRes res, double freq);
  virtual ~hdrDescript();

  /// Copies the 32 descriptor bytes to `dest`; null is ignored.
  void getDescript(unsigned char *dest);
  /// 32, the bytes of a descriptor.
  static int getDescriptSize();
  /// The frequency.
  double getFreq();
  /// The resolution code.
  DataRes getRes();
  /// Copies the 23 text bytes to `dest`, zero-filled behind a shorter text;
  /// a text of 23 characters is not terminated. Null is ignored.
  void getText(char *dest);
  /// 23, the bytes of the text.
  static int getTextSize();

private:
  unsigned char descript[32];
  DataRes res;
  double freq;
  char text[23];
};
