#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/IObject.h"

#include <string>

namespace Corvane::Wavemill {

class ISetting;

/// Turns a setting's value into display text and back.
class WAVEMILL_API IConverter : public IObject {
public:
  /// The display text of the setting's value.
  virtual std::string convertTo(ISetting *setting) = 0;
  /// Reads `text` and writes the result into the setting.
  virtual void convertBack(ISetting *setting, const std::string &text) = 0;
};

} // namespace Corvane::Wavemill
