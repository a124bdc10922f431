#include "wavemill/models/Int64Setting.h"

#include "wavemill/json/ConverterBase.h"
#include "wavemill/models/Prototype.h"
#include "wavemill/models/SettingVisitor.h"

#include "tools/NumberText.h"

#include <limits>

namespace Corvane::Wavemill {

Int64Setting::Int64Setting() : Int64Setting("") {}
Int64Setting::Int64Setting(const char *name)
    : Int64Setting(name, 0, std::numeric_limits<std::int64_t>::min(), std::numeric_limits<std::int64_t>::max(), 0) {}
Int64Setting::Int64Setting(const char *name, std::int64_t value, std::int64_t minimum, std::int64_t maximum,
                           std::int64_t step)
    : NumericSetting<std::int64_t>(name, value, minimum, maximum, step) {}

std::string Int64Setting::toString() const { return std::to_string(value); }

bool Int64Setting::parse(const std::string &text) {
  const auto read = NumberText::readInt64(text, 10);
  if (read.status != NumberText::ReadStatus::ok)
    return false;
  value = read.value;
  return true;
}

std::int64_t Int64Setting::getInt64() const { return value; }
void Int64Setting::setCommonValue(std::int64_t v) { setValue(v); }
void Int64Setting::visit(SettingVisitor *visitor) { visitor->dispatch(this); }

std::int64_t Int64Setting::validateValue(const std::int64_t &v) const {
  if (step >= 1)
    return v - v % step;
  if (v > maximum)
    return maximum;
  if (minimum > v)
    return minimum;
  return v;
}

std::shared_ptr<IConverter> Int64Setting::getConverter() const {
  if (auto chosen = Setting::getConverter())
    return chosen;
  return Prototype::getInstance<Int64Converter>();
}

} // namespace Corvane::Wavemill
