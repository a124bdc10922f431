#include "wavemill/models/StringSetting.h"

#include "wavemill/models/SettingVisitor.h"

namespace Corvane::Wavemill {

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

} // namespace Corvane::Wavemill
