#pragma once

#include <gsl/narrow>
#include <gsl/span>

#include <algorithm>
#include <climits>
#include <cstdint>
#include <cstring>
#include <memory>
#include <string>
#include <type_traits>
#include <vector>

namespace Corvane::Wavemill {

/// Encodes and decodes the big-endian fields of a waveform header, whatever
/// the byte order of the host.
///
/// Supported field types and their widths: `unsigned char` and `char` 1 byte,
/// `unsigned short` 2, `unsigned int` and `float` 4, `double` 8; floating
/// values travel as their IEEE 754 bytes, most significant first. A
/// `std::string` is its raw bytes, with no length and no terminator. Any
/// other type is refused at compile time.
///
/// A block is an id byte, a size byte and the fields:
///
///     auto b = BigEndian::makeBlock(9, 0x01020304u);  // 09 04 01 02 03 04
///     int pos = 0;
///     unsigned int v = 0;
///     BigEndian::parseBlock(gsl::make_span(*b).subspan(1), &pos, &v);  // 4; v 0x01020304, pos 5
///
/// Decoding never reads outside the span: a field that does not fit is left
/// as it is, so a shorter block of an older writer leaves the fields it lacks
/// at the values they had. A span whose length does not fit an int raises
/// `gsl::narrowing_error`; nothing else throws.
class BigEndian {
public:
  /// The byte array that encoder steps share.
  using Bytes = std::shared_ptr<std::vector<unsigned char>>;

  BigEndian() = delete;

  /// Appends the values in the order given, each most significant byte
  /// first. A null `bytes` is left alone.
  template <typename... Ts> static void append(const Bytes &bytes, const Ts &...values) {
    if (bytes) {
      (appendOne(*bytes, values), ...);
    }
  }

  /// A new array: `id`, a size byte, then the values. The size byte is the
  /// content length truncated to 8 bits, so content above 255 bytes gives a
  /// wrong size byte (300 bytes store 44) and nothing warns of it.
  template <typename... Ts> static Bytes makeBlock(unsigned char id, const Ts &...values) {
    auto bytes = std::make_shared<std::vector<unsigned char>>();
    bytes->push_back(id);
    bytes->push_back(0);
    (appendOne(*bytes, values), ...);
    (*bytes)[1] = static_cast<unsigned char>((bytes->size() - 2) & 0xFFu);
    return bytes;
  }

  /// Reads the fields in order, starting at `*pos`.
  ///
  /// A number of width w is read only if `*pos + w <= span.size()`; then
  /// `*pos` advances by w. Otherwise the destination and `*pos` stay and the
  /// next, perhaps narrower, field is tried.
  ///
  /// A string with a present length L above 0 is a fixed field: its L bytes
  /// are replaced, zero bytes turning into spaces, only if `*pos + L` is
  /// strictly below the span's size; then `*pos` advances by L. An empty
  /// string takes every byte from `*pos` to the end, and `*pos` stays.
  ///
  /// A null or negative position reads nothing.
  template <typename... Ts> static void parse(gsl::span<unsigned char> span, int *pos, Ts *...values) {
    const int size = gsl::narrow<int>(span.size());
    (parseOne(span, size, pos, values), ...);
  }

  /// Reads the size byte at `*pos`, parses the content behind it from a
  /// position of its own, moves `*pos` past the whole block (a block with
  /// more fields than asked for is skipped whole) and returns the size byte.
  /// A size byte that claims more than the span holds has only the bytes
  /// present parsed. A position outside the span reads nothing and returns 0.
  template <typename... Ts> static int parseBlock(gsl::span<unsigned char> span, int *pos, Ts *...values) {
    const int size = gsl::narrow<int>(span.size());
    if (pos == nullptr || *pos < 0 || *pos >= size) {
      return 0;
    }
    const int length = span.data()[*pos];
    const int start = *pos + 1;
    // Damaged input may claim more than is there; the rest of the span
    // stands in for the block, so nothing outside it is read.
    const int present = std::min(length, size - start);
    *pos = static_cast<int>(std::min<int64_t>(static_cast<int64_t>(start) + length, INT_MAX));
    int inner = 0;
    parse(span.subspan(static_cast<std::size_t>(start), static_cast<std::size_t>(present)), &inner, values...);
    return length;
  }

private:
  template <typename T>
  static constexpr bool isField =
      std::is_same_v<T, unsigned char> || std::is_same_v<T, char> || std::is_same_v<T, unsigned short> ||
      std::is_same_v<T, unsigned int> || std::is_same_v<T, float> || std::is_same_v<T, double> ||
      std::is_same_v<T, std::string>;

  template <typename T> static std::uint64_t toBits(T value) {
    if constexpr (std::is_same_v<T, float>) {
      std::uint32_t bits = 0;
      std::memcpy(&bits, &value, sizeof bits);
      return bits;
    } else if constexpr (std::is_same_v<T, double>) {
      std::uint64_t bits = 0;
      std::memcpy(&bits, &value, sizeof bits);
      return bits;
    } else {
      return static_cast<std::make_unsigned_t<T>>(value);
    }
  }

  template <typename T> static T fromBits(std::uint64_t bits) {
    if constexpr (std::is_same_v<T, float>) {
      const auto narrow = static_cast<std::uint32_t>(bits);
      float value = 0;
      std::memcpy(&value, &narrow, sizeof value);
      return value;
    } else if constexpr (std::is_same_v<T, double>) {
      double value = 0;
      std::memcpy(&value, &bits, sizeof value);
      return value;
    } else {
      return static_cast<T>(static_cast<std::make_unsigned_t<T>>(bits));
    }
  }

  template <typename T> static void appendOne(std::vector<unsigned char> &bytes, const T &value) {
    static_assert(isField<T>, "BigEndian encodes unsigned char, char, unsigned short, unsigned int, float, "
                              "double and std::string only");
    if constexpr (std::is_same_v<T, std::string>) {
      bytes.insert(bytes.end(), value.begin(), value.end());
    } else {
      const std::uint64_t bits = toBits(value);
      for (int shift = 8 * (static_cast<int>(sizeof(T)) - 1); shift >= 0; shift -= 8) {
        bytes.push_back(static_cast<unsigned char>((bits >> shift) & 0xFFu));
      }
    }
  }

  template <typename T> static void parseOne(gsl::span<unsigned char> span, int size, int *pos, T *value) {
    static_assert(isField<T>, "BigEndian decodes unsigned char, char, unsigned short, unsigned int, float, "
                              "double and std::string only");
    if (pos == nullptr || value == nullptr || *pos < 0) {
      return;
    }
    if constexpr (std::is_same_v<T, std::string>) {
      const int64_t length = static_cast<int64_t>(value->size());
      if (length > 0) {
        // The bound is strict: a fixed field that ends exactly at the end of
        // the span is not taken, so every reader of the format fills the same fields.
        if (*pos + length >= size) {
          return;
        }
        const unsigned char *at = span.data() + *pos;
        for (int64_t i = 0; i < length; ++i) {
          (*value)[static_cast<std::size_t>(i)] = at[i] == 0 ? ' ' : static_cast<char>(at[i]);
        }
        *pos += static_cast<int>(length);
      } else if (*pos < size) {
        value->append(reinterpret_cast<const char *>(span.data() + *pos), static_cast<std::size_t>(size - *pos));
      }
    } else {
      constexpr int width = static_cast<int>(sizeof(T));
      if (static_cast<int64_t>(*pos) + width > size) {
        return;
      }
      const unsigned char *at = span.data() + *pos;
      std::uint64_t bits = 0;
      for (int i = 0; i < width; ++i) {
        bits = (bits << 8) | at[i];
      }
      *value = fromBits<T>(bits);
      *pos += width;
    }
  }
};

} // namespace Corvane::Wavemill
