#include "wavemill/json/SettingToJsonVisitor.h"

#include "wavemill/models/BoolSetting.h"
#include "wavemill/models/ContextSetting.h"
#include "wavemill/models/DoubleSetting.h"
#include "wavemill/models/Int32Setting.h"
#include "wavemill/models/Int64Setting.h"
#include "wavemill/models/StringSetting.h"
#include "wavemill/tools/Tools.h"

#include "tools/NumberText.h"

#include <limits>

namespace Corvane::Wavemill {

namespace {

std::string numberText(std::int32_t value) { return std::to_string(value); }
std::string numberText(std::int64_t value) { return std::to_string(value); }
std::string numberText(double value) { return NumberText::formatDouble(value); }

void addValue(JObject &object, const std::string &name, std::string text) {
  object.addToken(std::make_shared<JValue>(name, std::move(text)));
}

// "Min" and "Max" only where they narrow the type's own range, "Step" and
// "NepStep" only when they are in use.
template <class T> void addLimits(JObject &object, const NumericSetting<T> &setting) {
  if (setting.getMinimum() != std::numeric_limits<T>::lowest())
    addValue(object, "Min", numberText(setting.getMinimum()));
  if (setting.getMaximum() != std::numeric_limits<T>::max())
    addValue(object, "Max", numberText(setting.getMaximum()));
  if (setting.getStep() > 0)
    addValue(object, "Step", numberText(setting.getStep()));
  if (setting.getNepStep() > 0)
    addValue(object, "NepStep", numberText(setting.getNepStep()));
}

} // namespace

void SettingToJsonVisitor::processCommonMembers(Setting *setting, const std::string &typeName) {
  current = std::make_shared<JObject>(setting->getName());
  const bool quoted = hasAny(setting->getParameterBits(), ParameterBits::QuotedKinds);
  addValue(*current, "Name", Tools::q(setting->getName()));
  addValue(*current, "$type", Tools::q(typeName));
  addValue(*current, "Value", quoted ? Tools::q(setting->toString()) : setting->toString());
  addValue(*current, "ReadOnly", setting->isReadOnly() ? "true" : "false");
  addValue(*current, "Visible", setting->isVisible() ? "true" : "false");
}

void SettingToJsonVisitor::dispatch(ISetting *setting) {
  auto *plain = dynamic_cast<Setting *>(setting);
  if (plain == nullptr || !plain->isEnumSetting())
    return;
  processCommonMembers(plain, "EnumSetting");
  auto values = std::make_shared<JArray>("ValidValues");
  for (int value : plain->getValidInt32Values())
    values->addElement(std::make_shared<JValue>("", std::to_string(value)));
  if (!values->getTokens().empty())
    current->addToken(values);
}

void SettingToJsonVisitor::dispatch(ContextSetting *setting) { processCommonMembers(setting, "ContextSetting"); }

void SettingToJsonVisitor::dispatch(StringSetting *setting) {
  processCommonMembers(setting, "StringSetting");
  addValue(*current, "MaxLength", std::to_string(setting->getMaxLength()));
}

void SettingToJsonVisitor::dispatch(Int64Setting *setting) {
  processCommonMembers(setting, "Int64Setting");
  addLimits(*current, *setting);
}

void SettingToJsonVisitor::dispatch(Int32Setting *setting) {
  processCommonMembers(setting, "Int32Setting");
  addLimits(*current, *setting);
}

void SettingToJsonVisitor::dispatch(DoubleSetting *setting) {
  processCommonMembers(setting, "DoubleSetting");
  addLimits(*current, *setting);
}

void SettingToJsonVisitor::dispatch(BoolSetting *setting) { processCommonMembers(setting, "BoolSetting"); }

} // namespace Corvane::Wavemill
