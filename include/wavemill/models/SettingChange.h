#pragma once

#include "wavemill/models/ParameterBits.h"

namespace Corvane::Wavemill {

class ISetting;

/// What a setting publishes on its own subject: which setting changed and
/// which property (ValueChanged for the value, or the flag that changed).
struct SettingChange {
  ISetting *setting = nullptr;
  ParameterBits bits = ParameterBits::None;
};

} // namespace Corvane::Wavemill
