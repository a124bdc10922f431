#include "wavemill/models/BoolSetting.h"

#include "wavemill/json/ConverterBase.h"
#include "wavemill/models/Prototype.h"
#include "wavemill/models/SettingVisitor.h"

#include <cctype>

namespace Corvane::Wavemill {

// The flag words are part of saved documents and of applications' code.
static_assert(static_cast<std::uint32_t>(BoolSetting::BoolBits) == 0x1A0FC);

BoolSetting::BoolSetting() : BoolSetting("", false) {}
BoolSetting::BoolSetting(const char *name) : BoolSetting(name, false) {}
BoolSetting::BoolSetting(const char *name, bool value) : ValueSetting<bool>(name ? name : "", value, BoolBits) {}

std::string BoolSetting::toString() const { return value ? "true" : "false"; }

bool BoolSetting::parse(const std::string &text) {
  static const char truth[] = "true";
  bool isTrue = text.size() == sizeof(truth) - 1;
  for (std::size_t i = 0; isTrue && i < text.size(); ++i)
    isTrue = std::toupper(static_cast<unsigned char>(text[i])) == std::toupper(static_cast<unsigned char>(truth[i]));
  value = isTrue;
  return isTrue;
}

bool BoolSetting::getBool() const { return value; }
int BoolSetting::getInt32() const { return value ? 1 : 0; }
std::int64_t BoolSetting::getInt64() const { return value ? 1 : 0; }
void BoolSetting::setCommonValue(std::string text) { parse(text); }
void BoolSetting::setCommonValue(std::int64_t v) { setValue(v != 0); }
void BoolSetting::setCommonValue(int v) { setValue(v != 0); }
void BoolSetting::setCommonValue(bool v) { setValue(v); }
void BoolSetting::visit(SettingVisitor *visitor) { visitor->dispatch(this); }

std::shared_ptr<IConverter> BoolSetting::getConverter() const {
  if (auto chosen = Setting::getConverter())
    return chosen;
  return Prototype::getInstance<OnOffConverter>();
}

} // namespace Corvane::Wavemill
