#include "wavemill/models/Setting.h"

#include "wavemill/json/ConverterBase.h"
#include "wavemill/models/IConverter.h"
#include "wavemill/models/IModel.h"
#include "wavemill/models/Interceptor.h"
#include "wavemill/models/ModelBase.h"
#include "wavemill/models/NumericSetting.h"
#include "wavemill/models/Prototype.h"
#include "wavemill/models/Transaction.h"

namespace Corvane::Wavemill {

// The flag words are part of saved documents and of applications' code.
static_assert(static_cast<std::uint32_t>(Setting::DefaultBits) == 0x180FC);
static_assert(static_cast<std::uint32_t>(NumericSetting<double>::NumericBits) == 0x188FC);

Setting::Setting(std::string name, ParameterBits bits) : name(std::move(name)), parameterBits(bits) {}

Setting::~Setting() = default;

std::string Setting::getName() const { return name; }
bool Setting::isEnumSetting() const { return hasAny(parameterBits, ParameterBits::EnumKind); }
bool Setting::getBool() const { return false; }
int Setting::getInt32() const { return 0; }
std::int64_t Setting::getInt64() const { return 0; }
double Setting::getDouble() const { return 0.0; }
void Setting::setCommonValue(std::string) {}
void Setting::setCommonValue(double) {}
void Setting::setCommonValue(std::int64_t) {}
void Setting::setCommonValue(int) {}
void Setting::setCommonValue(bool) {}
int Setting::findEnumIndex(const std::string &) const { return -1; }
gsl::span<int> Setting::getValidInt32Values() { return {}; }

void Setting::activate(Interceptor *tree, IModel *model) {
  interceptor = tree;
  owner = model;
}

void Setting::deactivate() {
  interceptor = nullptr;
  owner = nullptr;
}

void Setting::reset() {}
void Setting::copyFrom(const std::shared_ptr<Setting> &) {}

std::shared_ptr<IConverter> Setting::getConverter() const {
  if (converter)
    return converter;
  if (hasFlag(ParameterBits::EnumKind))
    return Prototype::getInstance<EnumConverterBase>();
  return nullptr;
}

void Setting::setConverter(std::shared_ptr<IConverter> value) { converter = std::move(value); }

void Setting::onPropertyChanged(ParameterBits bits) {
  // Most settings have no observer; skip taking a subscriber then.
  if (interceptor != nullptr && subject.has_observers())
    subject.get_subscriber().on_next(SettingChange{this, bits});
}

bool Setting::isDefaultValue() const { return false; }
void Setting::setValidInt32Values(gsl::span<int>) {}

std::string Setting::getMethodName() const {
  if (interceptor == nullptr)
    return {};
  if (auto *transaction = interceptor->getCurrentTransaction())
    return transaction->getMethodName();
  return name;
}

IModel *Setting::ancestor(const std::string &typeName) const {
  if (owner == nullptr)
    return nullptr;
  if (owner->getTypeName() == typeName)
    return owner;
  if (auto *model = dynamic_cast<ModelBase *>(owner))
    return model->ancestor(typeName);
  return nullptr;
}

std::string Setting::convertTo() {
  auto conv = getConverter();
  return conv ? conv->convertTo(this) : std::string();
}

void Setting::convertBack(const std::string &text) {
  if (auto conv = getConverter())
    conv->convertBack(this, text);
}

void Setting::setParameterBits(ParameterBits bits) {
  const ParameterBits changed = bits ^ parameterBits;
  if (changed == ParameterBits::None)
    return;
  parameterBits = bits;
  if (owner != nullptr)
    owner->onPropertyChanged(this);
  onPropertyChanged(changed);
}

void Setting::setFlag(ParameterBits flag, bool on) {
  setParameterBits(on ? (parameterBits | flag) : (parameterBits & ~flag));
}

void Setting::notifyValueChanged() {
  if (owner != nullptr)
    owner->onPropertyChanged(this);
  if (interceptor == nullptr)
    return;
  onPropertyChanged(ParameterBits::ValueChanged);
  if (hasAny(parameterBits, ParameterBits::PublishChange) && interceptor->getSubject().has_observers())
    interceptor->getSubject().get_subscriber().on_next(this);
}

} // namespace Corvane::Wavemill
