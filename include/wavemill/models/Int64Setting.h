#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/NumericSetting.h"

namespace Corvane::Wavemill {

/// A 64-bit integer setting. A write keeps v - v % step when the step is 1
/// or more (no clipping then), otherwise v clipped to minimum and maximum.
class WAVEMILL_API Int64Setting : public NumericSetting<std::int64_t> {
public:
  /// The converter set with setConverter; otherwise the enum converter for an
  /// enum setting, else the shared Int64Converter.
  std::shared_ptr<IConverter> getConverter() const override;
  Int64Setting();
  explicit Int64Setting(const char *name);
  Int64Setting(const char *name, std::int64_t value, std::int64_t minimum, std::int64_t maximum, std::int64_t step);

  std::string toString() const override;
  /// Reads a base-10 number from the start of `text`; false, with the value
  /// unchanged, when there is none or it does not fit.
  bool parse(const std::string &text) override;
  std::int64_t getInt64() const override;
  void setCommonValue(std::int64_t value) override;
  using NumericSetting<std::int64_t>::setCommonValue;
  void visit(SettingVisitor *visitor) override;

protected:
  std::int64_t validateValue(const std::int64_t &v) const override;
};

} // namespace Corvane::Wavemill
