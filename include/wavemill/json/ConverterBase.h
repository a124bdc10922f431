#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/IConverter.h"

#include <string>

namespace Corvane::Wavemill {

/// The common base of the text converters: the display text of a value is
/// the setting's own toString(). Converters hold no state; one shared
/// instance of each class (Prototype::getInstance) serves every setting and
/// every thread.
class WAVEMILL_API ConverterBase : public IConverter {
public:
  /// "ConverterBase", in every derived class too.
  std::string toString() const override;
  /// The setting's toString().
  std::string convertTo(ISetting *setting) override;
};

/// Reads "true" in any case as true, every other text as false.
class WAVEMILL_API BoolConverter : public ConverterBase {
public:
  void convertBack(ISetting *setting, const std::string &text) override;
};

/// Shows "On" or "Off"; reads "On" in any case as true, every other text as
/// false. The default converter of BoolSetting.
class WAVEMILL_API OnOffConverter : public BoolConverter {
public:
  std::string convertTo(ISetting *setting) override;
  void convertBack(ISetting *setting, const std::string &text) override;
};

/// Reads a decimal 32-bit number, up to the first character that does not
/// fit. Throws std::invalid_argument "invalid stoi argument" and
/// std::out_of_range "stoi argument out of range".
class WAVEMILL_API Int32Converter : public ConverterBase {
public:
  void convertBack(ISetting *setting, const std::string &text) override;
};

/// Reads a decimal 64-bit number; throws "invalid stoll argument" and
/// "stoll argument out of range".
class WAVEMILL_API Int64Converter : public ConverterBase {
public:
  void convertBack(ISetting *setting, const std::string &text) override;
};

/// Reads a floating-point number; throws "invalid stod argument" and
/// "stod argument out of range".
class WAVEMILL_API DoubleConverter : public ConverterBase {
public:
  void convertBack(ISetting *setting, const std::string &text) override;
};

/// Stores the text as it is.
class WAVEMILL_API StringConverter : public ConverterBase {
public:
  void convertBack(ISetting *setting, const std::string &text) override;
};

/// Stores the index of the text among the setting's enum texts; an unknown
/// text leaves the value as it is.
class WAVEMILL_API EnumConverterBase : public ConverterBase {
public:
  void convertBack(ISetting *setting, const std::string &text) override;
};

} // namespace Corvane::Wavemill
