#pragma once

#include "wavemill/Export.h"
#include "wavemill/json/JsonSerializer.h"

#include <memory>
#include <string>

namespace Corvane::Wavemill {

/// The form of a model that a display needs: "$type" and, for every stored
/// plain setting, the describing object of SettingToJsonVisitor (its kind,
/// name, value, flags and limits) in place of the bare value. Sub-models
/// are not part of this form. Reading fills each setting through
/// JsonToSettingVisitor; a setting without a member keeps all it has.
class WAVEMILL_API DisplayDataSerializer : public JsonSerializer {
public:
  DisplayDataSerializer() = default;

  std::string serialize(std::shared_ptr<ModelBase> model) override;
  std::shared_ptr<JObject> serializeObject(std::shared_ptr<IModel> model) override;

protected:
  std::shared_ptr<JObject> doSerializeModel(std::shared_ptr<ModelBase> model) override;
  void doDeserializeModel(std::shared_ptr<ModelBase> model, std::shared_ptr<JObject> object) override;
  void updateSetting(std::shared_ptr<JToken> token, std::shared_ptr<Setting> setting) override;
};

} // namespace Corvane::Wavemill
