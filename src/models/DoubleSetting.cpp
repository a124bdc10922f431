#include "wavemill/models/DoubleSetting.h"

#include "wavemill/json/ConverterBase.h"
#include "wavemill/models/Prototype.h"
#include "wavemill/models/SettingVisitor.h"

#include "tools/NumberText.h"

#include <limits>

namespace Corvane::Wavemill {

DoubleSetting::DoubleSetting() : DoubleSetting("") {}
DoubleSetting::DoubleSetting(const char *name)
    : DoubleSetting(name, 0.0, std::numeric_limits<double>::lowest(), std::numeric_limits<double>::max(), 0.0) {}
DoubleSetting::DoubleSetting(const char *name, double value, double minimum, double maximum, double step)
    : NumericSetting<double>(name, value, minimum, maximum, step) {}

std::string DoubleSetting::toString() const { return NumberText::formatDouble(value); }

bool DoubleSetting::parse(const std::string &text) {
  const auto read = NumberText::readDouble(text);
  if (read.status != NumberText::ReadStatus::ok)
    return false;
  value = read.value;
  return true;
}

double DoubleSetting::getDouble() const { return value; }
void DoubleSetting::setCommonValue(double v) { setValue(v); }
void DoubleSetting::visit(SettingVisitor *visitor) { visitor->dispatch(this); }

double DoubleSetting::validateValue(const double &v) const {
  // The half step is added to the value, not used to round it: the stored
  // result is v + step / 2. Applications depend on this exact arithmetic.
  if (step > 0)
    return (v / step + 0.5) * step;
  if (v > maximum)
    return maximum;
  if (minimum > v)
    return minimum;
  return v;
}

std::shared_ptr<IConverter> DoubleSetting::getConverter() const {
  if (auto chosen = Setting::getConverter())
    return chosen;
  return Prototype::getInstance<DoubleConverter>();
}

} // namespace Corvane::Wavemill
