#include "wavemill/services/LibraryService.h"

#include "wavemill/models/ModelContainer.h"
#include "wavemill/models/Prototype.h"

#include <typeindex>
#include <typeinfo>

namespace Corvane::Wavemill {

std::vector<std::shared_ptr<Library>> LibraryService::getLibraries(bool reload) {
  if (libraries.empty() || reload) {
    nextIndex = 0;
    libraries.clear();
    // The descriptors are keyed by type, in no useful order; the list of
    // prototypes keeps the order in which the classes were registered, so
    // a library's index tells when its first class appeared.
    auto container = Prototype::getInstance<ModelContainer>();
    const auto &types = container->getRuntimeTypes();
    for (const auto &model : container->getModels()) {
      if (!model)
        continue;
      const IModel &object = *model;
      const auto found = types.find(std::type_index(typeid(object)));
      if (found == types.end() || !found->second)
        continue;
      const auto &type = found->second;
      const std::string name = type->getLibraryName();
      auto &library = libraries[name];
      if (!library)
        library = std::make_shared<Library>(nextIndex++, name);
      library->addModel(type->getPrototype());
    }
  }
  std::vector<std::shared_ptr<Library>> result;
  result.reserve(libraries.size());
  for (const auto &entry : libraries)
    result.push_back(entry.second);
  return result;
}

std::vector<std::string> LibraryService::getNames() {
  std::vector<std::string> names;
  for (const auto &library : getLibraries(false))
    names.push_back(library->getName());
  return names;
}

} // namespace Corvane::Wavemill
