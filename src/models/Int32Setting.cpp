#include "wavemill/models/Int32Setting.h"

#include "wavemill/json/ConverterBase.h"
#include "wavemill/models/Prototype.h"
#include "wavemill/models/SettingVisitor.h"

#include "tools/NumberText.h"

#include <climits>

namespace Corvane::Wavemill {

Int32Setting::Int32Setting() : Int32Setting("") {}
Int32Setting::Int32Setting(const char *name) : Int32Setting(name, 0, INT_MIN, INT_MAX, 0) {}
Int32Setting::Int32Setting(const char *name, int value, int minimum, int maximum, int step)
    : NumericSetting<int>(name, value, minimum, maximum, step) {}

std::string Int32Setting::toString() const { return std::to_string(value); }

bool Int32Setting::parse(const std::string &text) {
  const auto read = NumberText::readInt32(text, 10);
  if (read.status != NumberText::ReadStatus::ok)
    return false;
  value = read.value;
  return true;
}

int Int32Setting::getInt32() const { return value; }
void Int32Setting::setCommonValue(int v) { setValue(v); }

gsl::span<int> Int32Setting::getValidInt32Values() {
  if (!validValues)
    validValues = std::make_shared<std::vector<int>>();
  return gsl::span<int>(validValues->data(), validValues->size());
}

void Int32Setting::visit(SettingVisitor *visitor) { visitor->dispatch(this); }

int Int32Setting::validateValue(const int &v) {
  if (step >= 1)
    return v - v % step;
  if (v > maximum)
    return maximum;
  if (minimum > v)
    return minimum;
  return v;
}

std::shared_ptr<IConverter> Int32Setting::getConverter() const {
  if (auto chosen = Setting::getConverter())
    return chosen;
  return Prototype::getInstance<Int32Converter>();
}

} // namespace Corvane::Wavemill
