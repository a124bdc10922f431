#include "Text.h"

#include <charconv>
#include <cmath>

namespace Corvane::Wavemill::Cli {

namespace {

template <class T> std::string shortest(T value) {
  char text[64];
  const auto result = std::to_chars(text, text + sizeof text, value);
  return std::string(text, result.ptr);
}

template <class T> bool parseWhole(std::string_view text, T &value) {
  if (!text.empty() && text.front() == '+') {
    text.remove_prefix(1);
    if (!text.empty() && text.front() == '-')
      return false;
  }
  T parsed{};
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), parsed);
  if (error != std::errc() || end != text.data() + text.size() || !std::isfinite(parsed))
    return false;
  value = parsed;
  return true;
}

} // namespace

std::string formatNumber(double value) { return shortest(value); }
std::string formatNumber(float value) { return shortest(value); }
std::string formatNumber(std::int64_t value) { return shortest(value); }
std::string formatNumber(std::uint64_t value) { return shortest(value); }

std::string formatFixed(double value, int decimals) {
  char text[64];
  const auto result = std::to_chars(text, text + sizeof text, value, std::chars_format::fixed, decimals);
  return std::string(text, result.ptr);
}

bool parseNumber(std::string_view text, double &value) { return parseWhole(text, value); }
bool parseNumber(std::string_view text, float &value) { return parseWhole(text, value); }

bool parseInteger(std::string_view text, std::int64_t &value) {
  bool negative = false;
  if (!text.empty() && (text.front() == '-' || text.front() == '+')) {
    negative = text.front() == '-';
    text.remove_prefix(1);
  }
  int base = 10;
  if (text.size() > 2 && text[0] == '0' && (text[1] == 'x' || text[1] == 'X')) {
    base = 16;
    text.remove_prefix(2);
  }
  if (text.empty())
    return false;
  std::uint64_t magnitude = 0;
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), magnitude, base);
  if (error != std::errc() || end != text.data() + text.size() || magnitude > (std::uint64_t{1} << 63) - 1)
    return false;
  value = negative ? -static_cast<std::int64_t>(magnitude) : static_cast<std::int64_t>(magnitude);
  return true;
}

std::string_view trim(std::string_view text) {
  const auto blank = [](char c) { return c == ' ' || c == '\t' || c == '\r'; };
  while (!text.empty() && blank(text.front()))
    text.remove_prefix(1);
  while (!text.empty() && blank(text.back()))
    text.remove_suffix(1);
  return text;
}

std::string jsonString(std::string_view text) {
  static constexpr char hex[] = "0123456789abcdef";
  std::string out = "\"";
  for (const char c : text) {
    const auto byte = static_cast<unsigned char>(c);
    switch (c) {
    case '"':
      out += "\\\"";
      break;
    case '\\':
      out += "\\\\";
      break;
    case '\n':
      out += "\\n";
      break;
    case '\r':
      out += "\\r";
      break;
    case '\t':
      out += "\\t";
      break;
    default:
      if (byte < 0x20 || byte == 0x7f) {
        out += "\\u00";
        out += hex[byte >> 4];
        out += hex[byte & 15];
      } else {
        out += c;
      }
    }
  }
  return out + "\"";
}

} // namespace Corvane::Wavemill::Cli
