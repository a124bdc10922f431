#include "wavemill/models/DoubleSetting.h"

#include "wavemill/json/ConverterBase.h"
#include "wavemill/models/Prototype.h"
#include "wavemill/models/SettingVisitor.h"

#include <cerrno>
#include <charconv>
#include <cstdlib>
#include <limits>

namespace Corvane::Wavemill {

DoubleSetting::DoubleSetting() : DoubleSetting("") {}
DoubleSetting::DoubleSetting(const char *name)
    : DoubleSetting(name, 0.0, std::numeric_limits<double>::lowest(), std::numeric_limits<double>::max(), 0.0) {}
DoubleSetting::DoubleSetting(const char *name, double value, double minimum, double maximum, double step)
    : NumericSetting<double>(name, value, minimum, maximum, step) {}

// The text of printf's "%.15g", written without the format parser: a
// document of thousands of numbers spends much of its time here.
std::string DoubleSetting::toString() const {
  char text[32];
  const auto written = std::to_chars(text, text + sizeof text, value, std::chars_format::general, 15);
  return std::string(text, written.ptr);
}

bool DoubleSetting::parse(const std::string &text) {
  const char *begin = text.c_str();
  char *end = nullptr;
  errno = 0;
  const double read = std::strtod(begin, &end);
  if (end == begin || errno == ERANGE)
    return false;
  value = read;
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
