#include "wavemill/json/DisplayDataSerializer.h"

#include "wavemill/json/JsonToSettingVisitor.h"
#include "wavemill/json/SettingToJsonVisitor.h"
#include "wavemill/tools/Tools.h"

namespace Corvane::Wavemill {

std::string DisplayDataSerializer::serialize(std::shared_ptr<ModelBase> model) {
  return JsonSerializer::serialize(std::move(model));
}

std::shared_ptr<JObject> DisplayDataSerializer::serializeObject(std::shared_ptr<IModel> model) {
  return JsonSerializer::serializeObject(std::move(model));
}

std::shared_ptr<JObject> DisplayDataSerializer::doSerializeModel(std::shared_ptr<ModelBase> model) {
  auto object = std::make_shared<JObject>("");
  object->add("$type", std::make_shared<JValue>("$type", Tools::q(getActivator()->toName(model))));
  SettingToJsonVisitor visitor;
  for (const auto &setting : model->getAllSettings()) {
    if (!setting || !setting->hasFlag(ParameterBits::Persisted) || !isPlain(*setting))
      continue;
    setting->visit(&visitor);
    object->add(setting->getName(), visitor.getCurrent());
  }
  return object;
}

void DisplayDataSerializer::doDeserializeModel(std::shared_ptr<ModelBase> model, std::shared_ptr<JObject> object) {
  const ModelBase::Settings settings = model->getAllSettings();
  for (const auto &setting : settings)
    if (setting && setting->hasFlag(ParameterBits::Persisted))
      updateSetting(object->getItem(setting->getName()), setting);
}

void DisplayDataSerializer::updateSetting(std::shared_ptr<JToken> token, std::shared_ptr<Setting> setting) {
  if (!setting || !isPlain(*setting))
    return;
  auto object = std::dynamic_pointer_cast<JObject>(token);
  if (!object)
    return;
  JsonToSettingVisitor visitor(std::move(object));
  setting->visit(&visitor);
}

} // namespace Corvane::Wavemill
