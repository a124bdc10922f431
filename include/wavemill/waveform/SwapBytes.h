#pragma once

#include "wavemill/Export.h"

namespace Corvane::Wavemill {

/// Reverses the bytes of a number.
///
/// On a little-endian host one call turns a native value into the
/// big-endian order of a waveform file, and a second call turns it back:
/// `swapBytes::doit(static_cast<unsigned short>(0x1234))` is 0x3412.
/// Floating values are reversed as their IEEE 754 bytes; the swapped value
/// is only meant to be stored, not computed with.
class WAVEMILL_API swapBytes {
public:
  /// The value with its two bytes reversed.
  static short doit(short value);
  /// The value with its two bytes reversed.
  static unsigned short doit(unsigned short value);
  /// The value with its four bytes reversed.
  static int doit(int value);
  /// The value with its four bytes reversed.
  static unsigned int doit(unsigned int value);
  /// The value's four bytes reversed.
  static float doit(float value);
  /// The value's eight bytes reversed.
  static double doit(double value);

private:
  static void swap_bytes(void *src, void *dest, int len);
};

} // namespace Corvane::Wavemill
