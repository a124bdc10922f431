#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/ModelBase.h"
#include "wavemill/models/StringSetting.h"

#include <memory>
#include <string>

namespace Corvane::Wavemill {

/// A key and a value, both text: the entry of a TextMap.
class WAVEMILL_API TextPair : public ModelBase {
public:
  TextPair();
  /// A pair holding `key` and `value`; as the pair is not active yet, both
  /// are plain stores.
  TextPair(const std::string &key, const std::string &value);
  ~TextPair() override;

  std::string getTypeName() const override;
  std::string getFullTypeName() const override;
  std::shared_ptr<IModel> create() const override;
  std::shared_ptr<IModel> getPrototype() const override;

  /// "Key", empty by default.
  const std::shared_ptr<StringSetting> Key;
  /// "Value", empty by default.
  const std::shared_ptr<StringSetting> Value;
};

} // namespace Corvane::Wavemill
