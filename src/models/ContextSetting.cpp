#include "wavemill/models/ContextSetting.h"

namespace Corvane::Wavemill {

ContextSetting::ContextSetting(const char *name) : StringSetting(name, ContextBits) {}
ContextSetting::ContextSetting(const char *name, ParameterBits bits) : StringSetting(name, bits) {}

} // namespace Corvane::Wavemill
