#include "wavemill/tools/Tools.h"

#include <clocale>
#include <cstdlib>
#include <cstring>
#include <cwchar>

namespace Corvane::Wavemill {

namespace {

constexpr std::size_t conversionFailed = static_cast<std::size_t>(-1);

// The plain "C"/"POSIX" locale knows nothing beyond ASCII; where the user has
// set no other, UTF-8 stands in so that text does not vanish.
bool applyUserLocaleIsPlain() {
  std::setlocale(LC_CTYPE, "");
  const char *name = std::setlocale(LC_CTYPE, nullptr);
  return name == nullptr || std::strcmp(name, "C") == 0 || std::strcmp(name, "POSIX") == 0;
}

bool isContinuation(unsigned char c) { return (c & 0xC0U) == 0x80U; }

void appendWide(std::wstring &out, char32_t codePoint) {
  if constexpr (sizeof(wchar_t) == 2) {
    if (codePoint >= 0x10000U) {
      codePoint -= 0x10000U;
      out += static_cast<wchar_t>(0xD800U + (codePoint >> 10U));
      out += static_cast<wchar_t>(0xDC00U + (codePoint & 0x3FFU));
      return;
    }
  }
  out += static_cast<wchar_t>(codePoint);
}

// Strict UTF-8 up to the first zero byte; malformed input (overlong forms,
// surrogates, truncated sequences) converts to nothing, as a failed locale
// conversion does.
std::wstring decodeUtf8(const char *data, std::size_t count) {
  std::wstring out;
  std::size_t i = 0;
  while (i < count && data[i] != '\0') {
    const auto lead = static_cast<unsigned char>(data[i]);
    std::size_t length = 0;
    char32_t codePoint = 0;
    char32_t minimum = 0;
    if (lead < 0x80U) {
      length = 1;
      codePoint = lead;
    } else if ((lead & 0xE0U) == 0xC0U) {
      length = 2;
      codePoint = lead & 0x1FU;
      minimum = 0x80U;
    } else if ((lead & 0xF0U) == 0xE0U) {
      length = 3;
      codePoint = lead & 0x0FU;
      minimum = 0x800U;
    } else if ((lead & 0xF8U) == 0xF0U) {
      length = 4;
      codePoint = lead & 0x07U;
      minimum = 0x10000U;
    } else {
      return std::wstring();
    }
    if (count - i < length) {
      return std::wstring();
    }
    for (std::size_t k = 1; k < length; ++k) {
      const auto next = static_cast<unsigned char>(data[i + k]);
      if (!isContinuation(next)) {
        return std::wstring();
      }
      codePoint = (codePoint << 6U) | (next & 0x3FU);
    }
    if (codePoint < minimum || codePoint > 0x10FFFFU || (codePoint >= 0xD800U && codePoint <= 0xDFFFU)) {
      return std::wstring();
    }
    appendWide(out, codePoint);
    i += length;
  }
  return out;
}

std::string encodeUtf8(const wchar_t *data, std::size_t count) {
  std::string out;
  for (std::size_t i = 0; i < count && data[i] != L'\0'; ++i) {
    auto codePoint = static_cast<char32_t>(data[i]);
    if constexpr (sizeof(wchar_t) == 2) {
      if (codePoint >= 0xD800U && codePoint <= 0xDBFFU && i + 1 < count) {
        const auto low = static_cast<char32_t>(data[i + 1]);
        if (low >= 0xDC00U && low <= 0xDFFFU) {
          codePoint = 0x10000U + ((codePoint - 0xD800U) << 10U) + (low - 0xDC00U);
          ++i;
        }
      }
    }
    if (codePoint > 0x10FFFFU || (codePoint >= 0xD800U && codePoint <= 0xDFFFU)) {
      return std::string();
    }
    if (codePoint < 0x80U) {
      out += static_cast<char>(codePoint);
    } else if (codePoint < 0x800U) {
      out += static_cast<char>(0xC0U | (codePoint >> 6U));
      out += static_cast<char>(0x80U | (codePoint & 0x3FU));
    } else if (codePoint < 0x10000U) {
      out += static_cast<char>(0xE0U | (codePoint >> 12U));
      out += static_cast<char>(0x80U | ((codePoint >> 6U) & 0x3FU));
      out += static_cast<char>(0x80U | (codePoint & 0x3FU));
    } else {
      out += static_cast<char>(0xF0U | (codePoint >> 18U));
      out += static_cast<char>(0x80U | ((codePoint >> 12U) & 0x3FU));
      out += static_cast<char>(0x80U | ((codePoint >> 6U) & 0x3FU));
      out += static_cast<char>(0x80U | (codePoint & 0x3FU));
    }
  }
  return out;
}

} // namespace

std::wstring Tools::toWString(const std::string &s) {
  if (applyUserLocaleIsPlain()) {
    return decodeUtf8(s.data(), s.size());
  }
  // Each byte yields at most one wide character, so the input's length plus
  // the terminator always suffices.
  std::wstring buffer(s.size() + 1, L'\0');
  if (std::mbstowcs(&buffer[0], s.c_str(), buffer.size()) == conversionFailed) {
    return std::wstring();
  }
  return std::wstring(buffer.c_str());
}

std::wstring Tools::toWString(const char *data, int count) {
  if (data == nullptr || count <= 0) {
    return std::wstring();
  }
  return toWString(std::string(data, static_cast<std::size_t>(count)));
}

std::string Tools::toString(const std::wstring &s) {
  if (applyUserLocaleIsPlain()) {
    return encodeUtf8(s.data(), s.size());
  }
  // One wide character can take several bytes in a multibyte locale; a
  // buffer of only the input's length would cut such a text short.
  const auto perCharacter = static_cast<std::size_t>(MB_CUR_MAX);
  std::string buffer(s.size() * perCharacter + 1, '\0');
  if (std::wcstombs(&buffer[0], s.c_str(), buffer.size()) == conversionFailed) {
    return std::string();
  }
  return std::string(buffer.c_str());
}

std::string Tools::toString(const wchar_t *data, int count) {
  if (data == nullptr || count <= 0) {
    return std::string();
  }
  return toString(std::wstring(data, static_cast<std::size_t>(count)));
}

} // namespace Corvane::Wavemill
