#pragma once

#include "wavemill/Export.h"

#include <memory>
#include <string>
#include <typeindex>
#include <typeinfo>
#include <unordered_map>

namespace Corvane::Wavemill {

/// A bag of shared objects of any type under string keys, held by every
/// model. Each entry remembers its type, so a typed read of an entry of
/// another type finds nothing instead of misreading it.
class WAVEMILL_API Metadata {
public:
  Metadata();

  /// Stores a shared copy of `text` under `key`, replacing any entry.
  void setText(const std::string &key, std::string text);
  /// The text stored under `key`, or an empty string.
  std::string getText(const std::string &key) const;

  /// The object of type T under `key`; when there is none (or one of
  /// another type, or a null one) a new default T is stored and returned.
  template <class T> std::shared_ptr<T> getOrCreate(const std::string &key) {
    if (auto found = get<T>(key))
      return found;
    auto made = std::make_shared<T>();
    set<T>(key, made);
    return made;
  }

  /// The object of type T under `key`, or null.
  template <class T> std::shared_ptr<T> get(const std::string &key) const {
    auto found = items.find(key);
    if (found == items.end() || found->second.type != std::type_index(typeid(T)))
      return nullptr;
    return std::static_pointer_cast<T>(found->second.object);
  }

  /// Stores `object` under `key`, replacing any entry.
  template <class T> void set(const std::string &key, std::shared_ptr<T> object) {
    items.insert_or_assign(key, Entry{std::move(object), std::type_index(typeid(T))});
  }

  bool contains(const std::string &key) const { return items.count(key) != 0; }
  void erase(const std::string &key) { items.erase(key); }
  std::size_t size() const { return items.size(); }

private:
  struct Entry {
    std::shared_ptr<void> object;
    std::type_index type;
  };
  std::unordered_map<std::string, Entry> items;
};

} // namespace Corvane::Wavemill
