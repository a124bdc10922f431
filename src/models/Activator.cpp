#include "wavemill/models/Activator.h"

#include "wavemill/models/ApplicationManager.h"

#include "models/SavedNames.h"

#include <algorithm>
#include <stdexcept>

namespace Corvane::Wavemill {

namespace {

template <class Map> void prepare(Map &map) {
  map.max_load_factor(1.0f);
  map.rehash(8);
}

} // namespace

Activator::Activator() : modelContainer(Prototype::getInstance<ModelContainer>()) {
  prepare(prototypes);
  prepare(fullNameToTypeName);
  registerType<ApplicationBase>("");
  registerType<ApplicationManager>("");
  registerType<ModelCollection<ApplicationBase>>("");
  modelContainer->addCollectionRuntimeTypes();
}

void Activator::registerModel(std::shared_ptr<IModel> model, std::string name) {
  if (!model)
    return;
  if (!name.empty())
    prototypes[name] = model;
  else
    name = model->getFullTypeName();

  const std::string fullName = model->getFullTypeName();
  if (model->isCollection()) {
    const std::string typeName = model->getTypeName();
    prototypes[typeName] = model;
    if (typeName.size() < 5)
      throw std::out_of_range("invalid string position");
    prototypes[typeName.substr(5)] = model;
    const std::string dotNetName = makeDotNetFullTypeName(std::dynamic_pointer_cast<ICollection>(model));
    prototypes[dotNetName] = model;
    prototypes[fullName] = model;
    fullNameToTypeName[fullName] = dotNetName;
  } else {
    prototypes[model->getTypeName()] = model;
    prototypes[fullName] = model;
    fullNameToTypeName[fullName] = name;
  }
}

std::shared_ptr<IModel> Activator::findPrototype(const std::string &name) {
  if (auto found = prototypes[name])
    return found;
  return prototypes[makeShortTypeName(name)];
}

std::shared_ptr<IModel> Activator::toInstance(const std::string &name) {
  auto found = prototypes.find(name);
  if (found != prototypes.end() && found->second)
    return found->second->create();
  found = prototypes.find(makeShortTypeName(name));
  if (found != prototypes.end() && found->second)
    return found->second->create();
  return nullptr;
}

std::string Activator::toName(std::shared_ptr<IModel> model) {
  if (!model)
    return std::string();
  std::string fullName = model->getFullTypeName();
  if (useRegisteredNames) {
    auto found = fullNameToTypeName.find(fullName);
    if (found != fullNameToTypeName.end())
      return found->second;
  }
  return fullName;
}

std::string Activator::getFullTypeName(std::shared_ptr<IModel> model) { return toName(std::move(model)); }

std::string Activator::makeDotNetFullTypeName(std::shared_ptr<ICollection> collection) {
  auto item = collection ? collection->getItemPrototype() : nullptr;
  return SavedNames::collectionName(toName(item));
}

void Activator::getShortTypeNamePosition(const std::string &name, std::size_t start, std::size_t count,
                                         std::vector<std::tuple<std::size_t, std::size_t>> &positions) {
  const std::size_t size = name.size();
  if (start == std::string::npos)
    return;
  for (;;) {
    // A range that does not lie wholly inside the name ends the walk; the
    // comparison is written so that it cannot overflow.
    if (count == 0 || start > size || count > size - start)
      return;
    const std::size_t end = start + count;
    const std::size_t tick = name.find('`', start);
    if (tick == std::string::npos || tick >= end || start >= size) {
      // A simple name: what lies between the last dot and the assembly's
      // comma, without trailing blanks.
      const std::size_t comma = size == 0 ? std::string::npos : name.rfind(',', std::min(end, size - 1));
      if (comma == 0)
        return;
      const std::size_t last = (comma != std::string::npos ? comma : end) - 1;
      const std::size_t dot = name.rfind('.', last);
      if (dot != std::string::npos && dot >= start)
        start = dot + 1;
      const std::size_t tail = name.find_last_not_of(' ', last);
      const std::size_t length = (tail == std::string::npos || tail + 1 < start) ? 0 : tail + 1 - start;
      positions.emplace_back(start, length);
      return;
    }
    if (tick == start)
      return;
    getShortTypeNamePosition(name, start, tick - start, positions);
    const std::size_t close = name.rfind(']', end - 1);
    start = tick + 4;
    if (start >= end)
      return;
    if (name[tick + 3] != '[' || close == std::string::npos)
      return;
    // What lies between "`1[[" and the final "]]".
    if (close < start + 1)
      return;
    count = close - start - 1;
  }
}

std::string Activator::makeShortTypeName(const std::string &name) {
  std::vector<std::tuple<std::size_t, std::size_t>> positions;
  getShortTypeNamePosition(name, 0, name.size(), positions);

  std::size_t length = 0;
  for (const auto &position : positions)
    length += std::get<1>(position) + 6;
  std::string result;
  result.reserve(length);
  for (std::size_t i = 0; i < positions.size(); ++i) {
    if (i > 0)
      result += "`1[[";
    result.append(name, std::get<0>(positions[i]), std::get<1>(positions[i]));
  }
  for (std::size_t i = 1; i < positions.size(); ++i)
    result += "]]";
  return result;
}

std::string Activator::updateFullTypeName(std::string assemblyName, std::string namespaceName,
                                          std::shared_ptr<IModel> model) {
  if (!model)
    return std::string();
  auto prototype = model->getPrototype();
  if (!prototype)
    return std::string();
  std::string result;
  if (prototype->isCollection()) {
    updateFullTypeName(assemblyName, namespaceName, prototype->getItemPrototype());
    result = makeDotNetFullTypeName(std::dynamic_pointer_cast<ICollection>(prototype));
  } else {
    result = SavedNames::modelName(namespaceName, model->getTypeName(), assemblyName);
  }
  registerModel(prototype, result);
  return result;
}

void Activator::updateFullTypeNames(std::string assemblyName, std::string namespaceName) {
  modelContainer->addCollectionRuntimeTypes();
  for (const auto &model : modelContainer->getModels())
    updateFullTypeName(assemblyName, namespaceName, model);
}

} // namespace Corvane::Wavemill
