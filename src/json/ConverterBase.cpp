#include "wavemill/json/ConverterBase.h"

#include "wavemill/models/ISetting.h"
#include "wavemill/tools/Tools.h"

#include "tools/StandardNumbers.h"

namespace Corvane::Wavemill {

std::string ConverterBase::toString() const { return "ConverterBase"; }

std::string ConverterBase::convertTo(ISetting *setting) { return setting ? setting->toString() : std::string(); }

void BoolConverter::convertBack(ISetting *setting, const std::string &text) {
  if (setting)
    setting->setCommonValue(Tools::compareIgnoreCase(text, "true"));
}

std::string OnOffConverter::convertTo(ISetting *setting) { return setting && setting->getBool() ? "On" : "Off"; }

void OnOffConverter::convertBack(ISetting *setting, const std::string &text) {
  if (setting)
    setting->setCommonValue(Tools::compareIgnoreCase(text, "On"));
}

void Int32Converter::convertBack(ISetting *setting, const std::string &text) {
  const int value = StandardNumbers::toInt32(text);
  if (setting)
    setting->setCommonValue(value);
}

void Int64Converter::convertBack(ISetting *setting, const std::string &text) {
  const std::int64_t value = StandardNumbers::toInt64(text);
  if (setting)
    setting->setCommonValue(value);
}

void DoubleConverter::convertBack(ISetting *setting, const std::string &text) {
  const double value = StandardNumbers::toDouble(text);
  if (setting)
    setting->setCommonValue(value);
}

void StringConverter::convertBack(ISetting *setting, const std::string &text) {
  if (setting)
    setting->setCommonValue(std::string(text));
}

void EnumConverterBase::convertBack(ISetting *setting, const std::string &text) {
  if (!setting)
    return;
  const int index = setting->findEnumIndex(text);
  if (index >= 0)
    setting->setCommonValue(index);
}

} // namespace Corvane::Wavemill
