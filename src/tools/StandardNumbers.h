#pragma once

#include <cstdint>
#include <stdexcept>
#include <string>

namespace Corvane::Wavemill::StandardNumbers {

// Decimal and floating-point conversions that let the standard exceptions
// through with fixed texts: callers show them, and each standard library
// words its own differently. Like std::stoi and friends they skip leading
// white space and stop at the first character that does not fit ("12abc"
// gives 12).

inline int toInt32(const std::string &text) {
  try {
    return std::stoi(text, nullptr, 10);
  } catch (const std::invalid_argument &) {
    throw std::invalid_argument("invalid stoi argument");
  } catch (const std::out_of_range &) {
    throw std::out_of_range("stoi argument out of range");
  }
}

inline std::int64_t toInt64(const std::string &text) {
  try {
    return std::stoll(text, nullptr, 10);
  } catch (const std::invalid_argument &) {
    throw std::invalid_argument("invalid stoll argument");
  } catch (const std::out_of_range &) {
    throw std::out_of_range("stoll argument out of range");
  }
}

inline double toDouble(const std::string &text) {
  try {
    return std::stod(text);
  } catch (const std::invalid_argument &) {
    throw std::invalid_argument("invalid stod argument");
  } catch (const std::out_of_range &) {
    throw std::out_of_range("stod argument out of range");
  }
}

} // namespace Corvane::Wavemill::StandardNumbers
