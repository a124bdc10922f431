#include "wavemill/json/JsonToSettingVisitor.h"

#include "wavemill/models/BoolSetting.h"
#include "wavemill/models/ContextSetting.h"
#include "wavemill/models/DoubleSetting.h"
#include "wavemill/models/Int32Setting.h"
#include "wavemill/models/Int64Setting.h"
#include "wavemill/models/StringSetting.h"
#include "wavemill/tools/Tools.h"

#include "tools/StandardNumbers.h"

#include <vector>

namespace Corvane::Wavemill {

namespace {

std::string textOf(const JObject &object, const std::string &name) {
  auto token = object.getItem(name);
  return token ? token->toString() : std::string();
}

void readNumber(const std::string &text, std::int32_t &value) { value = StandardNumbers::toInt32(text); }
void readNumber(const std::string &text, std::int64_t &value) { value = StandardNumbers::toInt64(text); }
void readNumber(const std::string &text, double &value) { value = StandardNumbers::toDouble(text); }

// Stored as they are: no notification, and the value is not checked against
// the new limits.
template <class T> void readLimits(const JObject &object, NumericSetting<T> &setting) {
  T number{};
  if (object.hasItem("Min")) {
    readNumber(textOf(object, "Min"), number);
    setting.setMinimum(number);
  }
  if (object.hasItem("Max")) {
    readNumber(textOf(object, "Max"), number);
    setting.setMaximum(number);
  }
  if (object.hasItem("Step")) {
    readNumber(textOf(object, "Step"), number);
    setting.setStep(number);
  }
  if (object.hasItem("NepStep")) {
    readNumber(textOf(object, "NepStep"), number);
    setting.setNepStep(number);
  }
}

} // namespace

JsonToSettingVisitor::JsonToSettingVisitor(std::shared_ptr<JObject> current) : current(std::move(current)) {}

void JsonToSettingVisitor::processCommonMembers(Setting *setting) {
  if (!current)
    return;
  if (current->getItem("Value")) {
    std::string text = textOf(*current, "Value");
    if (hasAny(setting->getParameterBits(), ParameterBits::QuotedKinds))
      text = Tools::removeQuot(text);
    setting->parse(text);
  }
  if (current->hasItem("ReadOnly"))
    setting->setReadOnly(textOf(*current, "ReadOnly") == "true");
  if (current->hasItem("Visible"))
    setting->setVisible(textOf(*current, "Visible") == "true");
}

void JsonToSettingVisitor::dispatch(ISetting *setting) {
  auto *plain = dynamic_cast<Setting *>(setting);
  if (plain == nullptr || !plain->isEnumSetting())
    return;
  processCommonMembers(plain);
  auto values = current ? std::dynamic_pointer_cast<JArray>(current->getItem("ValidValues")) : nullptr;
  if (!values || values->getTokens().empty())
    return;
  std::vector<int> list;
  list.reserve(values->getTokens().size());
  for (const auto &token : values->getTokens())
    list.push_back(StandardNumbers::toInt32(token ? token->toString() : std::string()));
  plain->setValidInt32Values(gsl::span<int>(list.data(), list.size()));
}

void JsonToSettingVisitor::dispatch(ContextSetting *setting) { processCommonMembers(setting); }

void JsonToSettingVisitor::dispatch(StringSetting *setting) {
  processCommonMembers(setting);
  if (current && current->hasItem("MaxLength"))
    setting->setMaxLength(StandardNumbers::toInt32(textOf(*current, "MaxLength")));
}

void JsonToSettingVisitor::dispatch(Int64Setting *setting) {
  processCommonMembers(setting);
  if (current)
    readLimits(*current, *setting);
}

void JsonToSettingVisitor::dispatch(Int32Setting *setting) {
  processCommonMembers(setting);
  if (current)
    readLimits(*current, *setting);
}

void JsonToSettingVisitor::dispatch(DoubleSetting *setting) {
  processCommonMembers(setting);
  if (current)
    readLimits(*current, *setting);
}

void JsonToSettingVisitor::dispatch(BoolSetting *setting) { processCommonMembers(setting); }

} // namespace Corvane::Wavemill
