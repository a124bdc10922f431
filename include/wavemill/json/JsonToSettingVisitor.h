#pragma once

#include "wavemill/Export.h"
#include "wavemill/json/JToken.h"
#include "wavemill/models/SettingVisitor.h"

#include <memory>

namespace Corvane::Wavemill {

class Setting;

/// Reads the describing object of one setting (as SettingToJsonVisitor
/// writes it) back into the setting. The value goes through the setting's
/// parse(), with its validation and notifications, under the limits the
/// setting had before; "Min", "Max", "Step", "NepStep", "MaxLength" and
/// "ValidValues" are then stored as they are. "ReadOnly" and "Visible" set
/// their flag only for the exact text "true".
///
/// Numbers that cannot be read throw the standard exceptions
/// (std::invalid_argument "invalid stoi argument", std::out_of_range
/// "stoi argument out of range", and likewise for stoll and stod).
class WAVEMILL_API JsonToSettingVisitor : public SettingVisitor {
public:
  explicit JsonToSettingVisitor(std::shared_ptr<JObject> current);

  /// An enum setting; other settings are left alone.
  void dispatch(ISetting *setting) override;
  void dispatch(ContextSetting *setting) override;
  void dispatch(StringSetting *setting) override;
  void dispatch(Int64Setting *setting) override;
  void dispatch(Int32Setting *setting) override;
  void dispatch(DoubleSetting *setting) override;
  void dispatch(BoolSetting *setting) override;

private:
  void processCommonMembers(Setting *setting);

  std::shared_ptr<JObject> current;
};

} // namespace Corvane::Wavemill
