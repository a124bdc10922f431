#pragma once

#include "wavemill/Export.h"
#include "wavemill/json/JToken.h"
#include "wavemill/models/SettingVisitor.h"

#include <memory>
#include <string>

namespace Corvane::Wavemill {

class Setting;

/// Writes one setting as an object with all that describes it: "$type"
/// (the kind, such as "DoubleSetting"), "Name", "Value", "ReadOnly",
/// "Visible", and by kind "Min", "Max", "Step", "NepStep", "MaxLength" or
/// "ValidValues". The object bears the setting's name.
///
///   SettingToJsonVisitor visitor;
///   setting->visit(&visitor);
///   auto object = visitor.getCurrent();
class WAVEMILL_API SettingToJsonVisitor : public SettingVisitor {
public:
  SettingToJsonVisitor() = default;

  /// An enum setting; a setting that is not an enum leaves getCurrent() as
  /// it was.
  void dispatch(ISetting *setting) override;
  void dispatch(ContextSetting *setting) override;
  void dispatch(StringSetting *setting) override;
  void dispatch(Int64Setting *setting) override;
  void dispatch(Int32Setting *setting) override;
  void dispatch(DoubleSetting *setting) override;
  void dispatch(BoolSetting *setting) override;

  /// The object of the setting visited last; empty before the first visit.
  std::shared_ptr<JObject> getCurrent() const { return current; }

private:
  void processCommonMembers(Setting *setting, const std::string &typeName);

  std::shared_ptr<JObject> current;
};

} // namespace Corvane::Wavemill
