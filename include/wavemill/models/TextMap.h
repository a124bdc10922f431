#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/ModelBase.h"
#include "wavemill/models/ModelCollection.h"
#include "wavemill/models/SubSetting.h"
#include "wavemill/models/TextPair.h"

#include <cstdint>
#include <map>
#include <memory>
#include <mutex>
#include <string>

namespace Corvane::Wavemill {

/// A dictionary of texts kept in the tree. Its pairs live in the collection
/// "Items", which is what is saved; a key index of its own finds them.
///
/// getItem and setItem may be called from several threads at once.
/// setItem takes the tree's lock first and the map's own lock second;
/// getItem takes only the map's lock. The notifications of a changed value
/// run with the map's lock held, so a subscriber must not call back into
/// the same map.
///
/// Pairs removed from the collection directly leave the index stale until
/// onDeserialized() runs again; the map offers no removal of its own.
class WAVEMILL_API TextMap : public ModelBase {
public:
  using Items_t = ModelCollection<TextPair>;

  TextMap();
  ~TextMap() override;

  std::string getTypeName() const override;
  std::string getFullTypeName() const override;
  std::shared_ptr<IModel> create() const override;
  std::shared_ptr<IModel> getPrototype() const override;

  /// The value stored under `key`, or the empty string for an unknown key.
  std::string getItem(const std::string &key);
  /// Stores `value` under `key`, in a method transaction "setItem" whose
  /// arguments are `key` and `value`. The coupling runs after the map's
  /// lock is released.
  void setItem(const std::string &key, const std::string &value);
  /// Rebuilds the key index from the collection; of two pairs with one key
  /// the later wins.
  void onDeserialized() override;
  /// Copies the pairs and the index of another TextMap.
  bool copyFrom(const std::shared_ptr<IModel> &source) override;

  /// The pairs, as they are saved.
  const std::shared_ptr<SubSetting<Items_t>> Items;

private:
  std::map<std::string, std::int32_t> index;
  std::mutex mutex;
};

extern template class ModelCollection<TextPair>;
extern template class SubSetting<ModelCollection<TextPair>>;

} // namespace Corvane::Wavemill
