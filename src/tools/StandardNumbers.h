#pragma once

#include "tools/NumberText.h"

#include <cstdint>
#include <stdexcept>
#include <string>

namespace Corvane::Wavemill::StandardNumbers {

// The conversions of std::stoi, std::stoll and std::stod, in the "C" form
// whatever the process's locale, with fixed texts in their exceptions:
// callers show them, and each standard library words its own differently.
// Like the standard ones they skip leading white space and stop at the first
// character that does not fit ("12abc" gives 12).

template <class T> T valueOr(const NumberText::Read<T> &read, const char *invalid, const char *outOfRange) {
  if (read.status == NumberText::ReadStatus::none)
    throw std::invalid_argument(invalid);
  if (read.status == NumberText::ReadStatus::outOfRange)
    throw std::out_of_range(outOfRange);
  return read.value;
}

inline int toInt32(const std::string &text) {
  return valueOr(NumberText::readInt32(text, 10), "invalid stoi argument", "stoi argument out of range");
}

inline std::int64_t toInt64(const std::string &text) {
  return valueOr(NumberText::readInt64(text, 10), "invalid stoll argument", "stoll argument out of range");
}

inline double toDouble(const std::string &text) {
  return valueOr(NumberText::readDouble(text), "invalid stod argument", "stod argument out of range");
}

} // namespace Corvane::Wavemill::StandardNumbers
