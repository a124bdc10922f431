#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/ValueSetting.h"

namespace Corvane::Wavemill {

/// An on/off setting. Its text is "true" or "false"; parse accepts "true" in
/// any case and reads every other text as false.
class WAVEMILL_API BoolSetting : public ValueSetting<bool> {
public:
  /// The converter set with setConverter; otherwise the enum converter for an
  /// enum setting, else the shared OnOffConverter.
  std::shared_ptr<IConverter> getConverter() const override;
  /// The flag word of a bool setting: 0x1A0FC.
  static constexpr ParameterBits BoolBits = DefaultBits | ParameterBits::BoolKind;

  BoolSetting();
  explicit BoolSetting(const char *name);
  BoolSetting(const char *name, bool value);

  std::string toString() const override;
  /// Stores whether `text` is "true" ignoring case, and returns that.
  bool parse(const std::string &text) override;
  bool getBool() const override;
  int getInt32() const override;
  std::int64_t getInt64() const override;
  /// parse(), bypassing the transaction.
  void setCommonValue(std::string value) override;
  void setCommonValue(std::int64_t value) override;
  void setCommonValue(int value) override;
  void setCommonValue(bool value) override;
  using ValueSetting<bool>::setCommonValue;
  void visit(SettingVisitor *visitor) override;
};

} // namespace Corvane::Wavemill
