#pragma once

#include <cstdint>
#include <string>
#include <string_view>

namespace Corvane::Wavemill::Cli {

// Numbers in and out of text, the same whatever the process's locale.

/// The shortest text that reads back as the same value: 0.5 -> "0.5",
/// 9e99 -> "9e+99".
std::string formatNumber(double value);
std::string formatNumber(float value);
std::string formatNumber(std::int64_t value);
std::string formatNumber(std::uint64_t value);
inline std::string formatNumber(int value) { return formatNumber(static_cast<std::int64_t>(value)); }
inline std::string formatNumber(unsigned value) { return formatNumber(static_cast<std::uint64_t>(value)); }
/// `value` with `decimals` digits after the point: (2.345, 1) -> "2.3".
std::string formatFixed(double value, int decimals);

/// Reads a whole text as a number; false for anything else, such as "",
/// "1.5x" or "1,5". A leading "+" is allowed; "inf" and "nan" are not.
bool parseNumber(std::string_view text, double &value);
bool parseNumber(std::string_view text, float &value);
/// Reads a whole text as an integer, decimal or with "0x" as hexadecimal.
bool parseInteger(std::string_view text, std::int64_t &value);

/// `text` without blanks, tabs and carriage returns at both ends.
std::string_view trim(std::string_view text);

/// `text` as a JSON string with its quotes: a"b -> "a\"b".
std::string jsonString(std::string_view text);

} // namespace Corvane::Wavemill::Cli
