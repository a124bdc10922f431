#include "wavemill/tools/Tools.h"

#include "tools/NumberText.h"
#include "tools/StandardNumbers.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <stdexcept>

namespace Corvane::Wavemill {

namespace {

template <typename T> T valueOr(const NumberText::Read<T> &read, T defaultValue) {
  return read.status == NumberText::ReadStatus::ok ? read.value : defaultValue;
}

bool isDigit(char c) { return c >= '0' && c <= '9'; }

// The number filter of tryParse(double): signs, one dot and blanks in the
// mantissa; one sign before the digits and no dot in the exponent.
bool passesNumberFilter(const std::string &s) {
  const auto e = s.find_first_of("Ee");
  // A leading exponent letter is no exponent at all: it stays in the mantissa,
  // where the filter refuses it.
  const bool hasExponent = e != std::string::npos && e > 0;
  const auto mantissaEnd = hasExponent ? e : s.size();

  bool signAllowed = true;
  bool dotAllowed = true;
  for (std::size_t i = 0; i < mantissaEnd; ++i) {
    const char c = s[i];
    if (c == '+' || c == '-') {
      if (!signAllowed) {
        return false;
      }
      signAllowed = false;
    } else if (c == '.') {
      if (!dotAllowed) {
        return false;
      }
      signAllowed = false;
      dotAllowed = false;
    } else if (isDigit(c)) {
      signAllowed = false;
    } else if (c != ' ') {
      return false;
    }
  }
  if (!hasExponent) {
    return true;
  }
  bool exponentSignAllowed = true;
  for (std::size_t i = e + 1; i < s.size(); ++i) {
    const char c = s[i];
    if (c == '+' || c == '-') {
      if (!exponentSignAllowed) {
        return false;
      }
      exponentSignAllowed = false;
    } else if (isDigit(c)) {
      exponentSignAllowed = false;
    } else if (c != ' ') {
      return false;
    }
  }
  return true;
}

} // namespace

// ---- Numbers from text ------------------------------------------------------

int Tools::parseInt32(const std::string &s, int defaultValue) {
  return valueOr(NumberText::readInt32(s, 10), defaultValue);
}

std::int64_t Tools::parseInt64(const std::string &s, std::int64_t defaultValue) {
  return valueOr(NumberText::readInt64(s, 10), defaultValue);
}

double Tools::parseDouble(const std::string &s, double defaultValue) {
  return valueOr(NumberText::readDouble(s), defaultValue);
}

float Tools::parseFloat(const std::string &s, float defaultValue) {
  return valueOr(NumberText::readFloat(s), defaultValue);
}

bool Tools::tryParse(const std::string &s, int &value, int base) {
  // A base outside 0 and 2..36 reads nothing, as strtol does.
  const auto read = NumberText::readInt32(s, base);
  if (read.status != NumberText::ReadStatus::ok) {
    return false;
  }
  value = read.value;
  return true;
}

bool Tools::tryParse(const std::string &s, double &value) {
  if (s.empty() || !passesNumberFilter(s)) {
    return false;
  }
  // Not swallowed on purpose: what the filter lets through but the
  // conversion cannot read ("-", ".", "1e999") reaches the caller as the
  // standard exception.
  value = StandardNumbers::toDouble(s);
  return true;
}

// ---- Numbers ----------------------------------------------------------------

namespace {

// The range test both floating clips share: `low` is tested first, so it
// wins when low > high.
template <class T> T limit(T value, T low, T high) {
  if (low > value)
    return low;
  if (value > high)
    return high;
  return value;
}

} // namespace

float Tools::clip(float value, float low, float high) { return limit(value, low, high); }

double Tools::clip(double value, double low, double high, double step) {
  if (low > value) {
    return low;
  }
  if (value > high) {
    return high;
  }
  if (!(step > 0)) {
    return value;
  }
  return limit(std::floor(value / step + 0.5) * step, low, high);
}

int Tools::clip(int value, int low, int high, int step) {
  // 64-bit arithmetic: low + step and value - low overflow int at the ends of
  // its range.
  std::int64_t grid = step;
  if (grid < 0 || std::int64_t{low} + grid > high) {
    grid = 0;
  }
  std::int64_t v = value;
  if (low > v) {
    v = low;
  } else if (v > high) {
    v = high;
  }
  if (grid > 0) {
    const std::int64_t steps = (v - low + grid - 1) / grid;
    v = low + steps * grid;
    if (v > high) {
      v -= grid;
    }
  }
  return static_cast<int>(v);
}

double Tools::round(double value, double low, double high, double step) {
  if (step < 0 || step > high - low) {
    step = 0;
  }
  if (value < low) {
    value = low;
  }
  if (value > high) {
    value = high;
  }
  if (step > 0) {
    const double r = std::round(value / step) * step;
    return r > high ? r - step : r;
  }
  return value;
}

float Tools::toSingle(double value) {
  constexpr double largest = 1e38;
  constexpr double smallest = 1e-37;
  if (value > largest) {
    return static_cast<float>(largest);
  }
  if (value < -largest) {
    return static_cast<float>(-largest);
  }
  if (value > -smallest && value < smallest) {
    return 0.0F;
  }
  return static_cast<float>(value);
}

} // namespace Corvane::Wavemill
