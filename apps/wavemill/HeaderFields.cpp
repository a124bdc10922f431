#include "HeaderFields.h"

#include "Text.h"

#include <cmath>
#include <cstdint>
#include <limits>
#include <type_traits>

namespace Corvane::Wavemill::Cli {

using Header = ExportImport::WaveformHeader;

namespace {

template <class> constexpr bool alwaysFalse = false;

template <class T> bool setInteger(T &target, std::string_view text) {
  std::int64_t value = 0;
  if (!parseInteger(text, value))
    return false;
  // A char field holds a byte: it takes -128 to 255, as both spellings of
  // the same byte are common.
  const std::int64_t low = std::is_same_v<T, char> ? -128 : 0;
  const std::int64_t high = std::is_same_v<T, char> ? 255 : static_cast<std::int64_t>(std::numeric_limits<T>::max());
  if (value < low || value > high)
    return false;
  target = static_cast<T>(value);
  return true;
}

} // namespace

const std::vector<HeaderField> &headerFields() {
  static const std::vector<HeaderField> fields = {
      {"magic", &Header::magic},
      {"headerId", &Header::headerId},
      {"version", &Header::version},
      {"stamp", &Header::stamp},
      {"baseExtra", &Header::baseExtra},
      {"tag5", &Header::tag5},
      {"tag6", &Header::tag6},
      {"tag7", &Header::tag7},
      {"tag8", &Header::tag8},
      {"tag9", &Header::tag9},
      {"tag10", &Header::tag10},
      {"tag11", &Header::tag11},
      {"tag12", &Header::tag12},
      {"tag13", &Header::tag13},
      {"tag15", &Header::tag15},
      {"tag16", &Header::tag16},
      {"tag17", &Header::tag17},
      {"tag22", &Header::tag22},
      {"tag25", &Header::tag25},
      {"tag26", &Header::tag26},
      {"tag27", &Header::tag27},
      {"tag28", &Header::tag28},
      {"tag29", &Header::tag29},
      {"tag30", &Header::tag30},
      {"tag31", &Header::tag31},
      {"tag32", &Header::tag32},
      {"tag33", &Header::tag33},
      {"tag34", &Header::tag34},
      {"extension1", &Header::extension1},
      {"extension2", &Header::extension2},
      {"block2Value", &Header::block2Value},
      {"reservedText", &Header::reservedText},
      {"tag20", &Header::tag20},
      {"tag35", &Header::tag35},
      {"tag36", &Header::tag36},
      {"tag37", &Header::tag37},
      {"tag38", &Header::tag38},
      {"block4A", &Header::block4A},
      {"block4B", &Header::block4B},
      {"block5Value", &Header::block5Value},
      {"block5Text", &Header::block5Text},
      {"block6A", &Header::block6A},
      {"block6B", &Header::block6B},
      {"block6C", &Header::block6C},
      {"block7A", &Header::block7A},
      {"block7B", &Header::block7B},
      {"block8Value", &Header::block8Value},
      {"block9Value", &Header::block9Value},
      {"tag41", &Header::tag41},
      {"tag42", &Header::tag42},
      {"tag43", &Header::tag43},
      {"tag44", &Header::tag44},
      {"tag45", &Header::tag45},
      {"tag46", &Header::tag46},
      {"block14Value", &Header::block14Value},
      {"hasExtension1", &Header::hasExtension1},
      {"hasExtension2", &Header::hasExtension2},
      {"hasTextBlocks", &Header::hasTextBlocks},
      {"hasBlock14", &Header::hasBlock14},
  };
  return fields;
}

const HeaderField *findHeaderField(std::string_view name) {
  for (const auto &field : headerFields())
    if (name == field.name)
      return &field;
  return nullptr;
}

std::string formatField(const Header &header, const HeaderField &field, bool json) {
  return std::visit(
      [&](auto member) -> std::string {
        const auto &value = header.*member;
        using T = std::decay_t<decltype(value)>;
        if constexpr (std::is_same_v<T, std::string>)
          return json ? jsonString(value) : value;
        else if constexpr (std::is_same_v<T, bool>)
          return value ? "true" : "false";
        else if constexpr (std::is_same_v<T, char>)
          return formatNumber(static_cast<unsigned>(static_cast<unsigned char>(value)));
        else if constexpr (std::is_floating_point_v<T>)
          return json && !std::isfinite(value) ? "null" : formatNumber(value);
        else
          return formatNumber(static_cast<std::uint64_t>(value));
      },
      field.member);
}

bool setField(Header &header, const HeaderField &field, std::string_view text) {
  return std::visit(
      [&](auto member) -> bool {
        auto &value = header.*member;
        using T = std::decay_t<decltype(value)>;
        if constexpr (std::is_same_v<T, std::string>) {
          value = std::string(text);
          return true;
        } else if constexpr (std::is_same_v<T, bool>) {
          if (text != "true" && text != "false" && text != "1" && text != "0")
            return false;
          value = text == "true" || text == "1";
          return true;
        } else if constexpr (std::is_floating_point_v<T>) {
          return parseNumber(text, value);
        } else {
          return setInteger(value, text);
        }
      },
      field.member);
}

std::string describeField(const HeaderField &field) {
  return std::visit(
      [](auto member) -> std::string {
        using T = std::decay_t<decltype(std::declval<Header &>().*member)>;
        if constexpr (std::is_same_v<T, std::string>)
          return "a text";
        else if constexpr (std::is_same_v<T, bool>)
          return "true or false";
        else if constexpr (std::is_same_v<T, char>)
          return "a byte from -128 to 255";
        else if constexpr (std::is_floating_point_v<T>)
          return "a number";
        else if constexpr (std::is_integral_v<T>)
          return "an integer from 0 to " + formatNumber(static_cast<std::uint64_t>(std::numeric_limits<T>::max()));
        else
          static_assert(alwaysFalse<T>);
      },
      field.member);
}

} // namespace Corvane::Wavemill::Cli
