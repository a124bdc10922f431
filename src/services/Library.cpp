#include "wavemill/services/Library.h"

#include "wavemill/tools/Tools.h"

namespace Corvane::Wavemill {

Library::Library(std::uint64_t index, std::string name) : index(index), name(std::move(name)) {}

void Library::addModel(std::shared_ptr<IModel> model) { models.push_back(std::move(model)); }

std::string Library::getLibraryName(void *address) { return Tools::getLibraryName(address); }

} // namespace Corvane::Wavemill
