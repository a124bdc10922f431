#include "wavemill/models/Prototype.h"

#include <mutex>
#include <unordered_map>

namespace Corvane::Wavemill {

class Prototype::Impl {
public:
  Impl() : items(8) { items.max_load_factor(1.0f); }

  std::mutex mutex;
  std::unordered_map<std::type_index, std::shared_ptr<void>> items;
};

Prototype::Prototype() : impl(std::make_unique<Impl>()) {}

Prototype::~Prototype() = default;

Prototype &Prototype::getPrototypeInstance() {
  static Prototype instance;
  return instance;
}

std::shared_ptr<void> Prototype::getCachedItem(std::type_index type) {
  std::lock_guard<std::mutex> guard(impl->mutex);
  auto found = impl->items.find(type);
  return found == impl->items.end() ? nullptr : found->second;
}

void Prototype::setCachedItem(std::type_index type, std::shared_ptr<void> item) {
  std::lock_guard<std::mutex> guard(impl->mutex);
  impl->items[type] = std::move(item);
}

std::shared_ptr<void> Prototype::getOrCreate(std::type_index type, const std::function<std::shared_ptr<void>()> &make) {
  auto &prototypes = getPrototypeInstance();
  if (auto cached = prototypes.getCachedItem(type))
    return cached;
  // The constructor of a prototype may itself ask for other prototypes, so it
  // runs without the lock; should two threads race here, the first stored wins.
  auto made = make();
  std::lock_guard<std::mutex> guard(prototypes.impl->mutex);
  auto &slot = prototypes.impl->items[type];
  if (!slot)
    slot = std::move(made);
  return slot;
}

void Prototype::clear() {
  auto &prototypes = getPrototypeInstance();
  std::unordered_map<std::type_index, std::shared_ptr<void>> old(8);
  {
    std::lock_guard<std::mutex> guard(prototypes.impl->mutex);
    old.swap(prototypes.impl->items);
    prototypes.impl->items.max_load_factor(1.0f);
  }
  // The old prototypes are released outside the lock: their destructors may
  // reach other prototypes.
}

} // namespace Corvane::Wavemill
