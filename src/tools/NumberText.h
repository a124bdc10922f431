#pragma once

#include <charconv>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <limits>
#include <string>
#include <string_view>
#include <system_error>
#include <type_traits>

namespace Corvane::Wavemill::NumberText {

// The one way the library reads and writes numbers as text: always the form
// of the "C" locale (a decimal point, no grouping), whatever the application
// has set with setlocale. strtod, std::stod and printf's %g follow
// LC_NUMERIC, so under a German locale they read "2.5" as 2 and write 0.5 as
// "0,5", which no document of ours may contain.
//
// The readers keep the rules of strtod and strtol: white space of the "C"
// locale and one sign first, then the longest number that fits; the caller
// learns where it stopped. "12abc" gives 12 after two characters.
//
// Inline, so that the library needs no exported symbol for it and the tests
// compile the very same code.

enum class ReadStatus {
  ok,
  none,      // no number at the start: strtod's end pointer would not move
  outOfRange // a number, but not one the type holds (strtod's ERANGE)
};

template <class T> struct Read {
  T value{};            // the number when `status` is ok, otherwise 0
  std::size_t length{}; // characters used, leading white space included; 0 for none
  ReadStatus status = ReadStatus::none;
};

namespace detail {

inline bool isSpace(char c) { return c == ' ' || (c >= '\t' && c <= '\r'); }

inline bool isDigit(char c) { return c >= '0' && c <= '9'; }

inline bool isHexDigit(char c) { return isDigit(c) || (c >= 'a' && c <= 'f') || (c >= 'A' && c <= 'F'); }

inline bool hasHexPrefix(const char *first, const char *last) {
  return last - first > 2 && first[0] == '0' && (first[1] == 'x' || first[1] == 'X');
}

// The end of the hexadecimal floating form after "0x": hex digits with at
// most one point, at least one digit, then "p", an optional sign and decimal
// digits if they follow in full. `first` when there is no digit. Measured
// here rather than left to from_chars, which in libstdc++ 12 reads "1p+-1"
// as one half where strtod stops before the "p".
inline const char *hexFloatEnd(const char *first, const char *last) {
  const char *end = first;
  bool digits = false;
  for (; end != last && isHexDigit(*end); ++end)
    digits = true;
  if (end != last && *end == '.')
    for (++end; end != last && isHexDigit(*end); ++end)
      digits = true;
  if (!digits)
    return first;
  if (end != last && (*end == 'p' || *end == 'P')) {
    const char *exponent = end + 1;
    if (exponent != last && (*exponent == '+' || *exponent == '-'))
      ++exponent;
    if (exponent != last && isDigit(*exponent)) {
      while (exponent != last && isDigit(*exponent))
        ++exponent;
      end = exponent;
    }
  }
  return end;
}

// Position after the white space and the one optional sign.
inline std::size_t skipLead(std::string_view text, bool &negative) {
  std::size_t i = 0;
  while (i < text.size() && isSpace(text[i]))
    ++i;
  negative = false;
  if (i < text.size() && (text[i] == '+' || text[i] == '-')) {
    negative = text[i] == '-';
    ++i;
  }
  return i;
}

// strtod reports ERANGE for a result below the normal range unless it is
// exact; from_chars takes such a value as it comes. A decimal text is exact
// there only with some 700 significant digits, so it counts as inexact. A
// hexadecimal one is read again into a wider type, which holds every such
// text of up to 64 (for float 53) significant bits exactly.
template <class T, class Wider>
bool isInexactSubnormal(T value, const char *first, const char *last, std::chars_format format) {
  if (!(value != 0 && std::fabs(value) < std::numeric_limits<T>::min()))
    return false;
  if (format != std::chars_format::hex)
    return true;
  Wider wide{};
  std::from_chars(first, last, wide, format);
  return static_cast<Wider>(value) != wide;
}

template <class T, class Wider> Read<T> readFloating(std::string_view text) {
  Read<T> result;
  bool negative = false;
  const char *const start = text.data();
  const char *const last = start + text.size();
  const char *first = start + skipLead(text, negative);
  // from_chars takes a minus of its own: "--1" and "+-1" must stay no number.
  if (first == last || *first == '+' || *first == '-')
    return result;
  // Without a hexadecimal digit after it ("0x.p1"), "0x" is the number 0
  // and the text after it, as strtod reads it.
  const char *digits = first;
  const char *numberEnd = last;
  std::chars_format format = std::chars_format::general;
  if (hasHexPrefix(first, last) && hexFloatEnd(first + 2, last) != first + 2) {
    digits = first + 2;
    numberEnd = hexFloatEnd(digits, last);
    format = std::chars_format::hex;
  }
  T value{};
  const auto [end, error] = std::from_chars(digits, numberEnd, value, format);
  if (error == std::errc::invalid_argument)
    return result;
  result.length = static_cast<std::size_t>(end - start);
  if (error == std::errc::result_out_of_range || isInexactSubnormal<T, Wider>(value, digits, end, format)) {
    result.status = ReadStatus::outOfRange;
    return result;
  }
  result.value = negative ? -value : value;
  result.status = ReadStatus::ok;
  return result;
}

} // namespace detail

/// strtod in the "C" locale: decimal and hexadecimal forms, "inf",
/// "infinity" and "nan" in any case, "nan(chars)".
inline Read<double> readDouble(std::string_view text) { return detail::readFloating<double, long double>(text); }

/// strtof in the "C" locale; out of range means out of float's range.
inline Read<float> readFloat(std::string_view text) { return detail::readFloating<float, double>(text); }

/// strtol in the "C" locale, with the range of T: `base` 0 takes "0x" as
/// hexadecimal and a leading 0 as octal, 16 allows "0x", 2 to 36 read
/// digits and letters of that base. Another base reads nothing.
template <class T> Read<T> readInteger(std::string_view text, int base) {
  static_assert(std::is_signed_v<T> && sizeof(T) <= sizeof(unsigned long long));
  Read<T> result;
  if (base != 0 && (base < 2 || base > 36))
    return result;
  bool negative = false;
  const char *const start = text.data();
  const char *const last = start + text.size();
  const char *first = start + detail::skipLead(text, negative);
  if ((base == 0 || base == 16) && detail::hasHexPrefix(first, last) && detail::isHexDigit(first[2])) {
    first += 2;
    base = 16;
  } else if (base == 0) {
    base = first != last && *first == '0' ? 8 : 10;
  }
  // Unsigned, so that from_chars takes no sign after ours, and so that the
  // magnitude of the lowest value fits.
  unsigned long long magnitude = 0;
  const auto [end, error] = std::from_chars(first, last, magnitude, base);
  if (error == std::errc::invalid_argument)
    return result;
  result.length = static_cast<std::size_t>(end - start);
  const auto largest = static_cast<unsigned long long>(std::numeric_limits<T>::max());
  if (error == std::errc::result_out_of_range || magnitude > largest + (negative ? 1U : 0U)) {
    result.status = ReadStatus::outOfRange;
    return result;
  }
  // -(magnitude - 1) - 1 stays inside T also for the lowest value.
  result.value =
      negative && magnitude != 0 ? static_cast<T>(-static_cast<T>(magnitude - 1) - 1) : static_cast<T>(magnitude);
  result.status = ReadStatus::ok;
  return result;
}

inline Read<std::int32_t> readInt32(std::string_view text, int base) { return readInteger<std::int32_t>(text, base); }

inline Read<std::int64_t> readInt64(std::string_view text, int base) { return readInteger<std::int64_t>(text, base); }

/// The text of printf's %.15g in the "C" locale: 1e6 -> "1000000",
/// 0.1 -> "0.1", 1e20 -> "1e+20". Written without the format parser: a
/// document of thousands of numbers spends much of its time here.
inline std::string formatDouble(double value) {
  char text[32]; // "-1.23456789012345e-308" is the longest
  const auto written = std::to_chars(text, text + sizeof text, value, std::chars_format::general, 15);
  return std::string(text, written.ptr);
}

} // namespace Corvane::Wavemill::NumberText
