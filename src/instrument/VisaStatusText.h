#pragma once

#include <cstddef>
#include <string>

namespace Corvane::Wavemill {

// The text of a VISA status description as a person reads it: the bytes up
// to and including the terminating zero, at most `capacity`. Tabs and the
// controls up to carriage return (0x09-0x0F) and printable ASCII stay; every
// other byte, and the terminating zero, becomes a blank, since a VISA
// library may describe in any code page. "Time\xe9out\0" -> "Time out ".
inline std::string visaStatusText(const char *description, std::size_t capacity) {
  std::string text;
  for (std::size_t i = 0; i < capacity; ++i) {
    const auto byte = static_cast<unsigned char>(description[i]);
    const bool kept = (byte >= 0x09 && byte <= 0x0F) || (byte >= 0x20 && byte <= 0x7E);
    text += kept ? static_cast<char>(byte) : ' ';
    if (byte == 0)
      break;
  }
  return text;
}

} // namespace Corvane::Wavemill
