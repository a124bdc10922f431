#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/StringSetting.h"

namespace Corvane::Wavemill {

/// The setting that stands for a model as a whole in transactions that are
/// not about one setting. Every model and every collection owns one named
/// "Context". It is neither persisted, reset nor published.
class WAVEMILL_API ContextSetting : public StringSetting {
public:
  /// The flag word of a context setting: 0x8100.
  static constexpr ParameterBits ContextBits = ParameterBits::PlainSettingMark | ParameterBits::ContextKind;

  explicit ContextSetting(const char *name = "");

protected:
  ContextSetting(const char *name, ParameterBits bits);
};

} // namespace Corvane::Wavemill
