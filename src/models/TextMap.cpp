#include "wavemill/models/TextMap.h"

#include "wavemill/models/Prototype.h"
#include "wavemill/models/RunTime.h"

namespace Corvane::Wavemill {

template class ModelCollection<TextPair>;
template class SubSetting<ModelCollection<TextPair>>;

TextMap::TextMap() : ModelBase("TextMap"), Items(init(std::make_shared<SubSetting<Items_t>>("Items"))) {}
TextMap::~TextMap() = default;

std::string TextMap::getTypeName() const { return WAVEMILL_TYPE_NAME(); }
std::string TextMap::getFullTypeName() const { return WAVEMILL_FULL_TYPE_NAME(); }
std::shared_ptr<IModel> TextMap::create() const { return std::make_shared<TextMap>(); }
std::shared_ptr<IModel> TextMap::getPrototype() const { return Prototype::getInstance<TextMap>(); }

std::string TextMap::getItem(const std::string &key) {
  std::lock_guard<std::mutex> lock(mutex);
  auto found = index.find(key);
  if (found == index.end())
    return std::string();
  auto collection = Items->getValue();
  auto pair = collection ? collection->getItem(found->second) : nullptr;
  return pair ? pair->Value->getValue() : std::string();
}

void TextMap::setItem(const std::string &key, const std::string &value) {
  auto transaction = beginEdit("setItem", key, value);
  std::lock_guard<std::mutex> lock(mutex);
  auto collection = Items->getValue();
  if (!collection)
    return;
  auto found = index.find(key);
  if (found != index.end()) {
    if (auto pair = collection->getItem(found->second)) {
      pair->Value->setValue(value);
      return;
    }
  }
  collection->add(std::make_shared<TextPair>(key, value));
  index[key] = collection->getCount() - 1;
}

void TextMap::onDeserialized() {
  // A recall into a live tree rebuilds the index while other threads may
  // look keys up.
  std::lock_guard<std::mutex> lock(mutex);
  index.clear();
  auto collection = Items->getValue();
  if (!collection)
    return;
  const auto &pairs = collection->getItems();
  for (std::size_t i = 0; i < pairs.size(); ++i)
    if (pairs[i])
      index[pairs[i]->Key->getValue()] = static_cast<std::int32_t>(i);
}

bool TextMap::copyFrom(const std::shared_ptr<IModel> &source) {
  auto transaction = beginEdit(TransactionOption::Couple);
  auto *other = dynamic_cast<TextMap *>(source.get());
  if (other == nullptr || other == this)
    return false;
  // The source's index is taken under its own lock, then this map's lock
  // is held for the copy; never both at once.
  std::map<std::string, std::int32_t> copied;
  {
    std::lock_guard<std::mutex> lock(other->mutex);
    copied = other->index;
  }
  std::lock_guard<std::mutex> lock(mutex);
  if (!ModelBase::copyFrom(source))
    return false;
  index = std::move(copied);
  return true;
}

} // namespace Corvane::Wavemill
