#pragma once

#include "wavemill/Export.h"

#include <functional>
#include <memory>
#include <typeindex>
#include <typeinfo>

namespace Corvane::Wavemill {

/// The process-wide cache of prototypes: one shared instance per class,
/// keyed by the class's run-time type identity. Every module that asks for
/// the same class gets the same object, because all of them meet in the one
/// map that lives in the library.
///
/// Prototypes live to process exit. The map is meant to be filled while the
/// application starts; the first access of a class is nevertheless safe from
/// several threads.
class WAVEMILL_API Prototype {
public:
  /// The one shared instance of `T`; `T` must be default-constructible.
  /// The first call in a module fetches the instance from the shared map (or
  /// makes it there) and keeps it in a static of that module; later calls
  /// return a copy of that static.
  template <class T> static std::shared_ptr<T> getInstance() {
    static const std::shared_ptr<T> instance = std::static_pointer_cast<T>(
        getOrCreate(std::type_index(typeid(T)), [] { return std::shared_ptr<void>(std::make_shared<T>()); }));
    return instance;
  }

  /// Empties the shared map. A module that reached a class before keeps its
  /// instance; only a module that had not reached it yet makes a new one.
  static void clear();

  Prototype(const Prototype &) = delete;
  Prototype &operator=(const Prototype &) = delete;
  ~Prototype();

private:
  class Impl;

  Prototype();

  static Prototype &getPrototypeInstance();
  std::shared_ptr<void> getCachedItem(std::type_index type);
  void setCachedItem(std::type_index type, std::shared_ptr<void> item);
  static std::shared_ptr<void> getOrCreate(std::type_index type, const std::function<std::shared_ptr<void>()> &make);

  std::unique_ptr<Impl> impl;
};

} // namespace Corvane::Wavemill
