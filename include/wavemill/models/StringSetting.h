#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/ValueSetting.h"

#include <cstdint>
#include <string>

namespace Corvane::Wavemill {

/// A text setting. maxLength is advertised to displays and not enforced.
class WAVEMILL_API StringSetting : public ValueSetting<std::string> {
public:
  /// The converter set with setConverter; otherwise the enum converter for an
  /// enum setting, else the shared StringConverter.
  std::shared_ptr<IConverter> getConverter() const override;
  /// The flag word of a string setting: 0x184FC.
  static constexpr ParameterBits StringBits = DefaultBits | ParameterBits::StringKind;

  StringSetting();
  explicit StringSetting(const char *name);
  StringSetting(const char *name, const char *value);

  std::string toString() const override;
  /// Assigns the text; always true.
  bool parse(const std::string &text) override;
  void setCommonValue(std::string value) override;
  using ValueSetting<std::string>::setCommonValue;
  void visit(SettingVisitor *visitor) override;

  std::int32_t getMaxLength() const { return maxLength; }
  void setMaxLength(std::int32_t length) { maxLength = length; }

protected:
  StringSetting(const char *name, ParameterBits bits);

  std::int32_t maxLength = 0x10000;
};

} // namespace Corvane::Wavemill
