#include "wavemill/models/ContextSetting.h"

namespace Corvane::Wavemill {

// The flag words are part of saved documents and of applications' code.
static_assert(static_cast<std::uint32_t>(ContextSetting::ContextBits) == 0x8100);

ContextSetting::ContextSetting(const char *name) : StringSetting(name, ContextBits) {}
ContextSetting::ContextSetting(const char *name, ParameterBits bits) : StringSetting(name, bits) {}

} // namespace Corvane::Wavemill
