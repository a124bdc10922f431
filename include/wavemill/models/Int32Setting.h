#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/NumericSetting.h"

namespace Corvane::Wavemill {

/// A 32-bit integer setting. Writes through setValue are stored as given,
/// neither clipped nor stepped; validateValue(int) applies the range and
/// step rule for callers that want it. Also the base of enum settings: an
/// application subclass sets EnumKind, overrides findEnumIndex and fills
/// the list that getValidInt32Values returns.
class WAVEMILL_API Int32Setting : public NumericSetting<int> {
public:
  /// The converter set with setConverter; otherwise the enum converter for an
  /// enum setting, else the shared Int32Converter.
  std::shared_ptr<IConverter> getConverter() const override;
  Int32Setting();
  explicit Int32Setting(const char *name);
  Int32Setting(const char *name, int value, int minimum, int maximum, int step);

  /// Decimal, with a leading "-" when negative.
  std::string toString() const override;
  /// Reads a base-10 number from the start of `text`; false, with the value
  /// unchanged, when there is none or it does not fit.
  bool parse(const std::string &text) override;
  int getInt32() const override;
  void setCommonValue(int value) override;
  using NumericSetting<int>::setCommonValue;
  /// The list of valid values, created empty on first use.
  gsl::span<int> getValidInt32Values() override;
  void visit(SettingVisitor *visitor) override;

  /// The range and step rule: with a step of 1 or more, v - v % step;
  /// otherwise v clipped to minimum and maximum. The write path does not
  /// call it.
  virtual int validateValue(const int &v);
};

} // namespace Corvane::Wavemill
