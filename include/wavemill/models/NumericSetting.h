#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/ValueSetting.h"

#include <cstdint>

namespace Corvane::Wavemill {

/// A numeric setting with a range and a step. What a write keeps of its
/// value is the concrete class's rule (see Int64Setting, DoubleSetting and
/// Int32Setting); the range and step are plain stores and notify nobody.
template <class T> class WAVEMILL_API NumericSetting : public ValueSetting<T> {
public:
  /// The flag word of the numeric settings: 0x188FC.
  static constexpr ParameterBits NumericBits = Setting::DefaultBits | ParameterBits::NumericKind;

  NumericSetting(const char *name, T value, T minimum, T maximum, T step)
      : ValueSetting<T>(name ? name : "", value, NumericBits), minimum(minimum), maximum(maximum), step(step),
        nepStep(1) {}

  T getMinimum() const { return minimum; }
  void setMinimum(T v) { minimum = v; }
  T getMaximum() const { return maximum; }
  void setMaximum(T v) { maximum = v; }
  /// Above zero it turns on the step rule of the write.
  T getStep() const { return step; }
  void setStep(T v) { step = v; }
  T getNepStep() const { return nepStep; }
  void setNepStep(T v) { nepStep = v; }

protected:
  T minimum;
  T maximum;
  T step;
  T nepStep;
};

extern template class NumericSetting<int>;
extern template class NumericSetting<std::int64_t>;
extern template class NumericSetting<double>;

} // namespace Corvane::Wavemill
