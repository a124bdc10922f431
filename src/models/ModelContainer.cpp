#include "wavemill/models/ModelContainer.h"

#include "wavemill/models/Metadata.h"
#include "wavemill/models/ModelBase.h"
#include "wavemill/models/Setting.h"

#include "models/SavedNames.h"

namespace Corvane::Wavemill {

void ModelContainer::add(std::shared_ptr<IModel> model, std::shared_ptr<RuntimeTypeBase> type) {
  if (!model)
    return;
  const IModel &object = *model;
  if (!runtimeTypes.emplace(std::type_index(typeid(object)), std::move(type)).second)
    return;
  models.push_back(model->getPrototype());
}

void ModelContainer::addCollectionRuntimeTypes() {
  const Models known = models; // add() appends to the list
  for (const auto &model : known) {
    auto base = std::dynamic_pointer_cast<ModelBase>(model);
    if (!base)
      continue;
    for (const auto &setting : base->getAllSettings()) {
      if (!setting || !setting->isSubSetting())
        continue;
      auto collection = std::dynamic_pointer_cast<ICollection>(setting->getCommonValue());
      if (!collection)
        continue;
      auto item = collection->getItemPrototype();
      if (!item)
        continue;
      const IModel &object = *item;
      auto found = runtimeTypes.find(std::type_index(typeid(object)));
      if (found != runtimeTypes.end() && found->second)
        add(collection, found->second->getCollectionRuntimeType());
    }
  }
}

std::shared_ptr<ICollection> ModelContainer::getCollectionPrototype(std::shared_ptr<IModel> model) {
  if (!model)
    return nullptr;
  const IModel &object = *model;
  auto found = runtimeTypes.find(std::type_index(typeid(object)));
  if (found == runtimeTypes.end() || !found->second)
    return nullptr;
  return found->second->getCollection();
}

void ModelContainer::updateFullTypeNamesInternal(std::string assemblyName, std::string namespaceName) {
  addCollectionRuntimeTypes();
  for (const auto &model : models)
    updateFullTypeName(assemblyName, namespaceName, model);
}

void ModelContainer::updateFullTypeName(std::string assemblyName, std::string namespaceName,
                                        std::shared_ptr<IModel> model) {
  if (!model)
    return;
  auto prototype = model->getPrototype();
  std::string text;
  if (auto collection = std::dynamic_pointer_cast<ICollection>(prototype)) {
    auto item = collection->getItemPrototype();
    if (!item)
      return;
    updateFullTypeName(assemblyName, namespaceName, item);
    text = SavedNames::collectionName(item->getFullTypeName());
  } else {
    text = SavedNames::modelName(namespaceName, model->getTypeName(), assemblyName);
  }
  model->getMetadata().setText("FullTypeName", std::move(text));
}

} // namespace Corvane::Wavemill
