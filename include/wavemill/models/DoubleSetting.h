#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/NumericSetting.h"

namespace Corvane::Wavemill {

/// A floating-point setting. With a step above zero a write keeps
/// (v / step + 0.5) * step, which is v + step / 2, with no clipping;
/// otherwise v clipped to minimum and maximum. NaN passes unchanged.
/// Equality is exact, with no tolerance.
class WAVEMILL_API DoubleSetting : public NumericSetting<double> {
public:
  /// The converter set with setConverter; otherwise the enum converter for an
  /// enum setting, else the shared DoubleConverter.
  std::shared_ptr<IConverter> getConverter() const override;
  DoubleSetting();
  explicit DoubleSetting(const char *name);
  DoubleSetting(const char *name, double value, double minimum, double maximum, double step);

  /// printf %.15g in the "C" locale, whatever locale the process has set:
  /// 1e6 -> "1000000", 0.1 -> "0.1", never "0,1".
  std::string toString() const override;
  /// Reads a number from the start of `text` as strtod does in the "C"
  /// locale ("2.5" is 2.5 under any locale); false, with the value
  /// unchanged, when there is none or it is out of range.
  bool parse(const std::string &text) override;
  double getDouble() const override;
  void setCommonValue(double value) override;
  using NumericSetting<double>::setCommonValue;
  void visit(SettingVisitor *visitor) override;

protected:
  double validateValue(const double &v) const override;
};

} // namespace Corvane::Wavemill
