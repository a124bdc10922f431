#include "wavemill/models/ModelCollection.h"

namespace Corvane::Wavemill {

ModelCollectionBase::ModelCollectionBase() = default;
ModelCollectionBase::~ModelCollectionBase() = default;

std::string ModelCollectionBase::toString() const { return getTypeName(); }
bool ModelCollectionBase::isCollection() const { return true; }
Metadata &ModelCollectionBase::getMetadata() { return metadata; }
std::string ModelCollectionBase::getThisKey() const { return owner != nullptr ? thisKey : std::string(); }
void ModelCollectionBase::setThisKey(const std::string &key) { thisKey = key; }
IModel *ModelCollectionBase::getOwner() const { return owner; }
void ModelCollectionBase::setOwner(IModel *model) { owner = model; }
std::shared_ptr<ICouplings> ModelCollectionBase::getCouplings() const { return nullptr; }
void ModelCollectionBase::setCouplings(std::shared_ptr<ICouplings>) {}

} // namespace Corvane::Wavemill
