#include "wavemill/tools/Tools.h"

#include <algorithm>
#include <cctype>
#include <stdexcept>

namespace Corvane::Wavemill {

namespace {

// toupper of a negative char other than EOF is undefined, so every byte goes
// through unsigned char first.
char upperByte(char c) { return static_cast<char>(std::toupper(static_cast<unsigned char>(c))); }

bool isQuote(char c) { return c == '"' || c == '\''; }

bool isBlankOrComma(char c) { return c == ' ' || c == ','; }

} // namespace

std::string Tools::trim(const std::string &s, const std::string &chars) { return trimEnd(trimStart(s, chars), chars); }

std::string Tools::trim(const std::string &s, char c) { return trim(s, std::string(1, c)); }

std::string Tools::trimStart(const std::string &s, const std::string &chars) {
  if (s.empty() || chars.empty()) {
    return s;
  }
  const auto first = s.find_first_not_of(chars);
  return first == std::string::npos ? std::string() : s.substr(first);
}

std::string Tools::trimStart(const std::string &s, char c) { return trimStart(s, std::string(1, c)); }

std::string Tools::trimEnd(const std::string &s, const std::string &chars) {
  if (s.empty() || chars.empty()) {
    return s;
  }
  const auto last = s.find_last_not_of(chars);
  return last == std::string::npos ? std::string() : s.substr(0, last + 1);
}

std::string Tools::trimEnd(const std::string &s, char c) { return trimEnd(s, std::string(1, c)); }

std::vector<std::string> Tools::split(const std::string &s, const std::string &delimiters) {
  std::vector<std::string> pieces;
  if (s.empty()) {
    pieces.emplace_back();
    return pieces;
  }
  std::size_t position = 0;
  while (position < s.size()) {
    const auto delimiter = s.find_first_of(delimiters, position);
    if (delimiter == std::string::npos) {
      pieces.push_back(s.substr(position));
      break;
    }
    pieces.push_back(s.substr(position, delimiter - position));
    position = delimiter + 1;
  }
  return pieces;
}

std::vector<std::string> Tools::split(const std::string &s, char delimiter) {
  return split(s, std::string(1, delimiter));
}

std::vector<std::string> Tools::splitTrim(const std::string &s, const std::string &delimiters,
                                          const std::string &trimChars) {
  auto pieces = split(s, delimiters);
  for (auto &piece : pieces) {
    piece = trim(piece, trimChars);
  }
  return pieces;
}

std::vector<std::string> Tools::splitTrim(const std::string &s, char delimiter, char trimChar) {
  return splitTrim(s, std::string(1, delimiter), std::string(1, trimChar));
}

std::string Tools::replace(const std::string &s, std::string from, std::string to) {
  if (s.empty() || from.empty()) {
    return s;
  }
  std::string result;
  result.reserve(s.size());
  std::size_t position = 0;
  while (position < s.size()) {
    const auto match = s.find(from, position);
    if (match == std::string::npos) {
      result.append(s, position, std::string::npos);
      break;
    }
    result.append(s, position, match - position);
    result += to;
    position = match + from.size();
  }
  return result;
}

std::string Tools::join(gsl::span<const std::string> parts, const std::string &separator) {
  std::string result;
  bool first = true;
  for (const auto &part : parts) {
    if (!first) {
      result += separator;
    }
    result += part;
    first = false;
  }
  return result;
}

void Tools::append(std::string &target, const char *data, int count) {
  if (data != nullptr && count > 0) {
    target.append(data, static_cast<std::size_t>(count));
  }
}

bool Tools::compareIgnoreCase(const std::string &a, const std::string &b) {
  return a.size() == b.size() &&
         std::equal(a.begin(), a.end(), b.begin(), [](char x, char y) { return upperByte(x) == upperByte(y); });
}

std::string Tools::toUpper(const std::string &s) {
  std::string result(s);
  std::transform(result.begin(), result.end(), result.begin(), upperByte);
  return result;
}

std::string Tools::q(const std::string &s) {
  std::string quoted;
  quoted.reserve(s.size() + 2);
  quoted += '"';
  quoted += s;
  quoted += '"';
  return quoted;
}

std::string Tools::removeQuot(const std::string &s) {
  if (s.size() >= 2 && isQuote(s.front()) && isQuote(s.back())) {
    return s.substr(1, s.size() - 2);
  }
  return s;
}

std::string Tools::formatString(const std::string &s, const std::string &allowed) {
  std::string result;
  std::copy_if(s.begin(), s.end(), std::back_inserter(result),
               [&allowed](char c) { return allowed.find(c) != std::string::npos; });
  return result;
}

std::string Tools::padLeftClip(std::string &s, std::uint64_t length) {
  if (length == UINT64_MAX) {
    throw std::invalid_argument("length");
  }
  const std::uint64_t size = s.size();
  if (length <= size) {
    return s.substr(static_cast<std::size_t>(size - length));
  }
  return std::string(static_cast<std::size_t>(length - size), '0') + s;
}

// ---- Bit strings ------------------------------------------------------------

std::string Tools::formatBitsWithLength(const std::string &s, int length) {
  if (length <= 0) {
    return std::string();
  }
  const auto target = static_cast<std::size_t>(length);
  std::string result;
  for (std::size_t i = 0; i < std::min(s.size(), target); ++i) {
    if (s[i] == '0' || s[i] == '1') {
      result += s[i];
    }
  }
  result.append(target - result.size(), '0');
  return result;
}

std::string Tools::uint32ToOneZeroString(std::uint32_t value, int length) {
  const int count = std::clamp(length, 0, 32);
  std::string result;
  for (int bit = count - 1; bit >= 0; --bit) {
    result += ((value >> bit) & 1U) != 0 ? '1' : '0';
  }
  return result;
}

std::string Tools::bitsToOneZeroString(gsl::span<const unsigned char> bits) {
  std::string result;
  for (const auto bit : bits) {
    if (bit <= 1) {
      result += static_cast<char>('0' + bit);
    }
  }
  return result;
}

std::vector<unsigned char> Tools::oneZeroStringToBits(const std::string &s) {
  std::vector<unsigned char> bits;
  bits.reserve(s.size());
  for (const char c : s) {
    if (c != '0' && c != '1') {
      throw std::invalid_argument("input");
    }
    bits.push_back(static_cast<unsigned char>(c - '0'));
  }
  return bits;
}

// ---- Enumerations as text ---------------------------------------------------

std::string Tools::enumIndexToText(const std::string &list, int index) {
  // A choice name longer than this is a broken list, not a name worth copying.
  constexpr std::size_t maxItemLength = 255;
  std::size_t start = 0;
  int commas = 0;
  for (std::size_t i = 0; i < list.size() && commas < index; ++i) {
    if (list[i] == ',') {
      start = i;
      ++commas;
    }
  }
  while (start < list.size() && isBlankOrComma(list[start])) {
    ++start;
  }
  std::size_t end = start;
  while (end < list.size() && !isBlankOrComma(list[end]) && end - start < maxItemLength) {
    ++end;
  }
  return list.substr(start, end - start);
}

int Tools::textToEnumIndex(const std::string &list, const std::string &text) {
  // An empty name would match between any two characters; no choice is empty.
  if (text.empty()) {
    return -1;
  }
  for (auto position = list.find(text); position != std::string::npos; position = list.find(text, position + 1)) {
    const auto end = position + text.size();
    // The last item is accepted without a look before it: "Alpha,Beta" finds
    // "eta" as item 1, which callers rely on.
    const bool accepted =
        end == list.size() || (isBlankOrComma(list[end]) && (position == 0 || isBlankOrComma(list[position - 1])));
    if (accepted) {
      return static_cast<int>(std::count(list.begin(), list.begin() + static_cast<std::ptrdiff_t>(position), ','));
    }
  }
  return -1;
}

} // namespace Corvane::Wavemill
