#include "wavemill/json/JsonSerializer.h"

#include "wavemill/models/Metadata.h"
#include "wavemill/tools/Tools.h"

#include <algorithm>
#include <vector>

namespace Corvane::Wavemill {

namespace {

const std::string typeKey = "$type";
const std::string valuesKey = "$values";

} // namespace

JsonSerializer::JsonSerializer() : JsonSerializer(std::make_shared<JsonSerializerSetting>(), nullptr) {}

JsonSerializer::JsonSerializer(std::shared_ptr<JsonSerializerSetting> setting, std::shared_ptr<Activator> activator)
    : setting(std::move(setting)), activator(activator ? std::move(activator) : std::make_shared<Activator>()) {}

JsonSerializer::~JsonSerializer() = default;

std::shared_ptr<JObject> JsonSerializer::parse(const std::string &text) {
  auto object = std::make_shared<JObject>("");
  int position = 0;
  object->parse(text, position);
  return object;
}

bool JsonSerializer::readTypeName(const JObject &object, std::string &name) {
  auto value = std::dynamic_pointer_cast<JValue>(object.getItem(typeKey));
  if (!value)
    return false;
  name = Tools::trim(value->getValue(), '"');
  return true;
}

// ---- Writing -----------------------------------------------------------------

std::string JsonSerializer::serialize(std::shared_ptr<ModelBase> model) {
  auto object = serializeObject(std::move(model));
  return object ? object->toString() : std::string();
}

std::shared_ptr<JObject> JsonSerializer::serializeObject(std::shared_ptr<IModel> model) {
  if (auto base = std::dynamic_pointer_cast<ModelBase>(model))
    return doSerializeModel(std::move(base));
  if (auto collection = std::dynamic_pointer_cast<ICollection>(model))
    return doSerializeCollection(std::move(collection));
  return nullptr;
}

std::shared_ptr<JObject> JsonSerializer::doSerializeModel(std::shared_ptr<ModelBase> model) {
  auto object = std::make_shared<JObject>("");
  object->reserve(model->getAllSettings().size());
  object->add(typeKey, std::make_shared<JValue>(typeKey, Tools::q(activator->toName(model))));
  const bool treeMode = setting && setting->getTreeMode();
  for (const auto &item : model->getAllSettings()) {
    if (!item || !item->hasFlag(ParameterBits::Persisted))
      continue;
    const std::string &name = item->getName();
    if (!isPlain(*item)) {
      // Sub-models are written in tree mode too.
      object->add(name, serializeObject(item->getCommonValue()));
    } else if (!treeMode || item->hasFlag(ParameterBits::TreeStored)) {
      object->add(name,
                  std::make_shared<JValue>(name, isQuoted(*item) ? Tools::q(item->toString()) : item->toString()));
    }
  }
  return object;
}

std::shared_ptr<JObject> JsonSerializer::doSerializeCollection(std::shared_ptr<ICollection> collection) {
  auto object = std::make_shared<JObject>("");
  object->add(typeKey, std::make_shared<JValue>(typeKey, Tools::q(activator->toName(collection))));
  auto values = std::make_shared<JArray>(valuesKey);
  const int count = collection->getCount();
  for (int i = 0; i < count; ++i) {
    auto item = collection->getCommonItem(i);
    if (std::dynamic_pointer_cast<ModelBase>(item))
      values->addElement(serializeObject(item));
  }
  object->add(valuesKey, values);
  return object;
}

// ---- Reading -----------------------------------------------------------------

std::shared_ptr<ModelBase> JsonSerializer::deserialize(const std::string &text) {
  auto object = parse(text);
  // Classes of modules loaded after the Activator was made become known
  // here, by their type names and full type names.
  for (const auto &model : activator->getModelContainer()->getModels())
    activator->registerModel(model, "");
  return std::dynamic_pointer_cast<ModelBase>(deserializeObject(object));
}

std::shared_ptr<IModel> JsonSerializer::deserializeObject(std::shared_ptr<JObject> object) {
  std::string typeName;
  if (!object || !readTypeName(*object, typeName))
    return nullptr;
  auto made = activator->toInstance(typeName);
  if (auto model = std::dynamic_pointer_cast<ModelBase>(made)) {
    doDeserializeModel(model, object);
    model->onDeserialized();
    return made;
  }
  if (auto collection = std::dynamic_pointer_cast<ICollection>(made)) {
    doDeserializeCollection(std::move(collection), std::move(object));
    return made;
  }
  return nullptr;
}

bool JsonSerializer::deserializeToExistObject(std::shared_ptr<JObject> object, std::shared_ptr<IModel> existing) {
  std::string typeName;
  if (!existing || !object || !readTypeName(*object, typeName))
    return false;
  if (existing->getPrototype() != activator->findPrototype(typeName))
    return false;
  if (auto model = std::dynamic_pointer_cast<ModelBase>(existing)) {
    doDeserializeModel(model, std::move(object));
    model->onDeserialized();
    return true;
  }
  if (auto collection = std::dynamic_pointer_cast<ICollection>(existing)) {
    doDeserializeCollection(std::move(collection), std::move(object));
    return true;
  }
  return false;
}

void JsonSerializer::doDeserializeModel(std::shared_ptr<ModelBase> model, std::shared_ptr<JObject> object) {
  const bool treeMode = setting && setting->getTreeMode();
  if (!treeMode) {
    const bool tracking = setting && setting->getDeserializationTracking();
    // Indexed, and each setting held while it is read: a setting's parse may
    // run couplings that are free to touch the model.
    const ModelBase::Settings &settings = model->getAllSettings();
    for (std::size_t i = 0; i < settings.size(); ++i) {
      const std::shared_ptr<Setting> item = settings[i];
      if (!item || !item->hasFlag(ParameterBits::Persisted))
        continue;
      auto token = object->getItem(item->getName());
      if (tracking && !object->hasItem(item->getName()))
        model->getMetadata()
            .getOrCreate<std::vector<std::string>>(ModelBase::MissingSettings_key)
            ->push_back(item->getName());
      updateSetting(std::move(token), item);
    }
    return;
  }
  // Tree mode walks the document: members without a setting are ignored.
  for (const auto &member : object->getItems()) {
    auto item = model->getSetting(member.first);
    if (item && item->hasFlag(ParameterBits::Persisted))
      updateSetting(member.second, item);
  }
}

void JsonSerializer::updateSetting(std::shared_ptr<JToken> token, std::shared_ptr<Setting> setting) {
  if (!setting)
    return;
  if (isPlain(*setting)) {
    auto value = std::dynamic_pointer_cast<JValue>(token);
    if (!value)
      return;
    if (isQuoted(*setting))
      setting->parse(Tools::trim(value->getValue(), '"'));
    else
      setting->parse(value->getValue());
    return;
  }
  auto object = std::dynamic_pointer_cast<JObject>(token);
  if (!object)
    return;
  if (deserializeToExistObject(object, setting->getCommonValue()))
    return;
  setting->setCommonPointer(deserializeObject(object));
}

void JsonSerializer::doDeserializeCollection(std::shared_ptr<ICollection> collection, std::shared_ptr<JObject> object) {
  auto values = std::dynamic_pointer_cast<JArray>(object->getItem(valuesKey));
  if (!values)
    return;
  const auto &tokens = values->getTokens();
  const int size = static_cast<int>(std::min<std::size_t>(tokens.size(), 0x7fffffff));
  const int existing = std::min(collection->getCount(), size);
  for (int i = 0; i < existing; ++i) {
    auto element = std::dynamic_pointer_cast<JObject>(tokens[i]);
    if (!deserializeToExistObject(element, collection->getCommonItem(i)))
      collection->setCommonItem(i, deserializeObject(element));
  }
  for (int i = existing; i < size; ++i)
    collection->add(deserializeObject(std::dynamic_pointer_cast<JObject>(tokens[i])));
  while (collection->getCount() > size) {
    const int before = collection->getCount();
    collection->removeAt(before - 1);
    if (collection->getCount() >= before)
      break; // a collection that refuses to shrink (a fixed count)
  }
}

} // namespace Corvane::Wavemill
