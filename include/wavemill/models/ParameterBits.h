#pragma once

#include <cstdint>

namespace Corvane::Wavemill {

/// The flag word of a setting. The bits are both state, kept in the word,
/// and change codes, handed to onPropertyChanged when that property changed.
enum class ParameterBits : std::uint32_t {
  None = 0,
  /// setValue refuses to change the value.
  ReadOnly = 0x1,
  /// Set in the defaults and not interpreted by the library: free for
  /// applications.
  ApplicationFlag1 = 0x4,
  Visible = 0x8,
  /// The JSON writer stores the setting.
  Persisted = 0x10,
  /// Set in the defaults and not interpreted by the library.
  ApplicationFlag2 = 0x20,
  /// reset() restores the default value.
  Resettable = 0x40,
  /// Set in the defaults and not interpreted by the library.
  ApplicationFlag3 = 0x80,
  ContextKind = 0x100,
  ActionKind = 0x200,
  StringKind = 0x400,
  NumericKind = 0x800,
  /// Makes the setting an enum setting; set by application subclasses.
  EnumKind = 0x1000,
  BoolKind = 0x2000,
  /// Set on every setting except sub-model holders.
  PlainSettingMark = 0x8000,
  /// A value change is published on the Interceptor's subject.
  PublishChange = 0x10000,
  /// Change code only: the value changed. Never stored.
  ValueChanged = 0x80000,
  /// In tree mode the JSON writer stores a plain setting only with this bit.
  TreeStored = 0x400000,
  /// Only on sub-model holders: the held model is referenced weakly.
  WeakSubValue = 0x800000,
  /// The kinds that carry a value.
  ValueKinds = ContextKind | StringKind | NumericKind | EnumKind | BoolKind,
  /// The kinds whose value the JSON writer quotes.
  QuotedKinds = StringKind | EnumKind,
  /// What every setting of the library carries in its flag word from the
  /// start: the three application flags, Visible, Persisted and Resettable.
  CommonFlags = ApplicationFlag1 | Visible | Persisted | ApplicationFlag2 | Resettable | ApplicationFlag3,
};

static_assert(static_cast<std::uint32_t>(ParameterBits::ValueKinds) == 0x3D00);
static_assert(static_cast<std::uint32_t>(ParameterBits::QuotedKinds) == 0x1400);
static_assert(static_cast<std::uint32_t>(ParameterBits::CommonFlags) == 0xFC);

constexpr ParameterBits operator|(ParameterBits a, ParameterBits b) {
  return static_cast<ParameterBits>(static_cast<std::uint32_t>(a) | static_cast<std::uint32_t>(b));
}
constexpr ParameterBits operator&(ParameterBits a, ParameterBits b) {
  return static_cast<ParameterBits>(static_cast<std::uint32_t>(a) & static_cast<std::uint32_t>(b));
}
constexpr ParameterBits operator^(ParameterBits a, ParameterBits b) {
  return static_cast<ParameterBits>(static_cast<std::uint32_t>(a) ^ static_cast<std::uint32_t>(b));
}
constexpr ParameterBits operator~(ParameterBits a) {
  return static_cast<ParameterBits>(~static_cast<std::uint32_t>(a));
}

/// True when any bit of `mask` is set in `bits`.
constexpr bool hasAny(ParameterBits bits, ParameterBits mask) { return (bits & mask) != ParameterBits::None; }

} // namespace Corvane::Wavemill
