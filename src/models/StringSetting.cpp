#include "wavemill/models/StringSetting.h"

#include "wavemill/json/ConverterBase.h"
#include "wavemill/models/Prototype.h"
#include "wavemill/models/SettingVisitor.h"

namespace Corvane::Wavemill {

// The flag words are part of saved documents and of applications' code.
static_assert(static_cast<std::uint32_t>(StringSetting::StringBits) == 0x184FC);

StringSetting::StringSetting() : StringSetting("", StringBits) {}
StringSetting::StringSetting(const char *name) : StringSetting(name, StringBits) {}
StringSetting::StringSetting(const char *name, const char *value)
    : ValueSetting<std::string>(name ? name : "", value ? value : "", StringBits) {}
StringSetting::StringSetting(const char *name, ParameterBits bits)
    : ValueSetting<std::string>(name ? name : "", std::string(), bits) {}

std::string StringSetting::toString() const { return value; }

bool StringSetting::parse(const std::string &text) {
  value = text;
  return true;
}

void StringSetting::setCommonValue(std::string v) { setValue(v); }
void StringSetting::visit(SettingVisitor *visitor) { visitor->dispatch(this); }

std::shared_ptr<IConverter> StringSetting::getConverter() const {
  if (auto chosen = Setting::getConverter())
    return chosen;
  return Prototype::getInstance<StringConverter>();
}

} // namespace Corvane::Wavemill
