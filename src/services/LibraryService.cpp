#include "wavemill/services/LibraryService.h"

#include "wavemill/models/ModelContainer.h"
#include "wavemill/models/Prototype.h"

namespace Corvane::Wavemill {

std::vector<std::shared_ptr<Library>> LibraryService::getLibraries(bool reload) {
  if (libraries.empty() || reload) {
    nextIndex = 0;
    libraries.clear();
    auto container = Prototype::getInstance<ModelContainer>();
    for (const auto &entry : container->getRuntimeTypes()) {
      const auto &type = entry.second;
      if (!type)
        continue;
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
