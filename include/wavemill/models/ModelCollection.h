#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/ContextSetting.h"
#include "wavemill/models/ICollection.h"
#include "wavemill/models/Int32Setting.h"
#include "wavemill/models/Interceptor.h"
#include "wavemill/models/Metadata.h"
#include "wavemill/models/ModelBase.h"
#include "wavemill/models/Prototype.h"
#include "wavemill/models/SubSetting.h"
#include "wavemill/models/Transaction.h"

#include <algorithm>
#include <memory>
#include <string>
#include <vector>

namespace Corvane::Wavemill {

/// What every collection shares: a key, metadata and an owner. A collection
/// has no couplings of its own: getCouplings() is always null.
class WAVEMILL_API ModelCollectionBase : public ICollection {
public:
  ModelCollectionBase();
  ~ModelCollectionBase() override;

  /// The collection's type name.
  std::string toString() const override;
  bool isCollection() const override;
  Metadata &getMetadata() override;
  /// The stored key while the collection has an owner; otherwise empty.
  std::string getThisKey() const override;
  void setThisKey(const std::string &key) override;
  IModel *getOwner() const override;
  void setOwner(IModel *model) override;
  /// Always null.
  std::shared_ptr<ICouplings> getCouplings() const override;
  /// Discards its argument.
  void setCouplings(std::shared_ptr<ICouplings> value) override;

protected:
  std::string thisKey;
  Metadata metadata;
  IModel *owner = nullptr;
};

/// An ordered list of models of class T, keyed by their index. Every change
/// of its shape (add, removeAt, resize, clear, setItem) runs, while the
/// collection is active, in a transaction named after the operation with
/// its argument, so that couplings can tell which operation ran; the
/// coupling runs after the list changed.
///
/// Items are active exactly while they sit in an active collection. A
/// removed item is spent and must not be put back.
template <class T> class WAVEMILL_API ModelCollection : public ModelCollectionBase {
public:
  ModelCollection() : context(std::make_shared<ContextSetting>("Context")) {}

  // Shape
  int getCount() const override { return static_cast<int>(items.size()); }
  /// The item at `index`; null for an index outside the list.
  std::shared_ptr<IModel> getCommonItem(int index) const override {
    if (index < 0 || index >= getCount())
      return nullptr;
    return items[static_cast<std::size_t>(index)];
  }
  /// The item at `index` as a T; null for an index outside the list.
  std::shared_ptr<T> getItem(int index) const {
    if (index < 0 || index >= getCount())
      return nullptr;
    return items[static_cast<std::size_t>(index)];
  }
  /// setItem when `model` is a T; other models are dropped.
  void setCommonItem(int index, std::shared_ptr<IModel> model) override {
    if (auto typed = std::dynamic_pointer_cast<T>(model))
      setItem(index, typed);
  }
  /// Appends `model` (shared, not copied) under an "add" transaction with
  /// the item as argument; a model that is not a T gives null.
  std::shared_ptr<IModel> add(std::shared_ptr<IModel> model) override {
    auto item = std::dynamic_pointer_cast<T>(model);
    if (!item)
      return nullptr;
    auto edit = beginEdit("add", item);
    append(item);
    return item;
  }
  /// Appends a new T under an "add" transaction.
  std::shared_ptr<IModel> add() override { return addItem(); }
  /// add() with the item's own type.
  std::shared_ptr<T> addItem() {
    auto edit = beginEdit("add");
    auto item = std::make_shared<T>();
    append(item);
    return item;
  }
  /// Removes and deactivates the item at `index` under a "removeAt"
  /// transaction, which couples also for an invalid index; the later items
  /// are renumbered.
  void removeAt(int index) override {
    auto edit = beginEdit("removeAt", index);
    if (index < 0 || index >= getCount())
      return;
    auto &removed = items[static_cast<std::size_t>(index)];
    if (removed)
      removed->deactivateSettings();
    items.erase(items.begin() + index);
    renumber(static_cast<std::size_t>(index));
  }
  /// Removes from the back or adds new items until the count is `count`,
  /// under one "resize" transaction; a negative count does nothing.
  void resize(int count) override {
    if (count < 0)
      return;
    auto edit = beginEdit("resize", count);
    while (getCount() > count)
      removeAt(getCount() - 1);
    while (getCount() < count)
      add();
  }
  /// Empties the list under a "clear" transaction. The coupling runs while
  /// the deactivated items are still in the list, so it sees the old count.
  void clear() override {
    if (interceptor == nullptr) {
      items.clear();
      return;
    }
    {
      auto edit = beginEdit("clear");
      for (auto &item : items)
        if (item)
          item->deactivateSettings();
    }
    items.clear();
  }
  /// Replaces the item at `index` under a "setItem" transaction; the old item
  /// is deactivated and the new one bound. An index outside the list or a
  /// null item does nothing.
  void setItem(int index, std::shared_ptr<T> item) {
    if (index < 0 || index >= getCount() || !item)
      return;
    auto &slot = items[static_cast<std::size_t>(index)];
    if (interceptor == nullptr) {
      slot = std::move(item);
      return;
    }
    auto edit = beginEdit("setItem");
    if (slot)
      slot->deactivateSettings();
    slot = item;
    item->activateSettings(interceptor, this);
    item->setThisKey(std::to_string(index));
  }

  /// The items, in order.
  const std::vector<std::shared_ptr<T>> &getItems() const { return items; }

  // Names
  /// "ModelCollection`1[[" + the item class's type name + "]]".
  std::string getTypeName() const override {
    static const std::string name = "ModelCollection`1[[" + Prototype::getInstance<T>()->getTypeName() + "]]";
    return name;
  }
  /// "Models.ModelCollection`1[[" + the item class's full name + "]]".
  std::string getFullTypeName() const override {
    static const std::string name =
        "Models.ModelCollection`1[[" + Prototype::getInstance<T>()->getFullTypeName() + "]]";
    return name;
  }
  std::shared_ptr<IModel> getItemPrototype() const override { return Prototype::getInstance<T>(); }
  std::shared_ptr<IModel> create() const override { return std::make_shared<ModelCollection<T>>(); }
  std::shared_ptr<IModel> getPrototype() const override { return Prototype::getInstance<ModelCollection<T>>(); }

  // Life
  void activateSettings(Interceptor *tree, IModel *model) override {
    setOwner(model);
    interceptor = tree;
    context->activate(tree, this);
    for (std::size_t i = 0; i < items.size(); ++i) {
      if (items[i]) {
        items[i]->activateSettings(tree, this);
        items[i]->setThisKey(std::to_string(i));
      }
    }
  }
  void deactivateSettings() override {
    setOwner(nullptr);
    interceptor = nullptr;
    context->deactivate();
    for (auto &item : items)
      if (item)
        item->deactivateSettings();
    setThisKey("");
  }
  void onPropertyChanged(ISetting *) override {}

  /// Resets every item under one transaction; the count stays.
  void reset() override {
    auto edit = beginEdit(std::string());
    for (std::size_t i = 0; i < items.size(); ++i)
      if (items[i])
        items[i]->reset();
  }

  /// Runs the couplings of each item, in order.
  virtual void couple(Transaction *transaction) {
    for (std::size_t i = 0; i < items.size(); ++i)
      if (items[i])
        items[i]->couple(transaction);
  }

  /// Copies a collection of the same class: with copyExistingOnly into the
  /// existing items paired by class, otherwise item by item (see the
  /// private operations). False for null, itself or another class.
  bool copyFrom(const std::shared_ptr<IModel> &source) override {
    if (!source || source.get() == this)
      return false;
    auto other = std::dynamic_pointer_cast<ModelCollection<T>>(source);
    if (!other || other->getPrototype() != getPrototype())
      return false;
    auto edit = beginEdit(std::string());
    if (copyExistingOnly)
      copyExistItems(other);
    else
      copyOverwrite(other);
    return true;
  }

  /// An inactive copy.
  std::shared_ptr<IModel> duplicate() const override {
    auto copy = create();
    copy->copyFrom(std::shared_ptr<IModel>(std::shared_ptr<void>(), const_cast<ModelCollection<T> *>(this)));
    return copy;
  }

  /// True for a collection of the same class with as many items, equal
  /// position by position.
  bool equals(const std::shared_ptr<IObject> &other) const override {
    if (!other)
      return false;
    if (other.get() == this)
      return true;
    auto *same = dynamic_cast<const ModelCollection<T> *>(other.get());
    if (same == nullptr || same->items.size() != items.size())
      return false;
    for (std::size_t i = 0; i < items.size(); ++i) {
      const auto &mine = items[i];
      const auto &theirs = same->items[i];
      if (!mine || !theirs ? mine != theirs : !mine->equals(theirs))
        return false;
    }
    return true;
  }

  /// With true, copyFrom copies only into existing items, pairing them by
  /// class; nothing is added or removed.
  void setCopyExistingOnly(bool on) { copyExistingOnly = on; }
  bool isCopyExistingOnly() const { return copyExistingOnly; }
  /// With true, copyFrom neither adds nor removes items.
  void setFixedCount(bool on) { fixedCount = on; }
  bool isFixedCount() const { return fixedCount; }

  Interceptor *getInterceptor() const { return interceptor; }
  const std::shared_ptr<ContextSetting> &getContext() const { return context; }

protected:
  bool canBeginEdit() const { return interceptor != nullptr && !interceptor->isInside(); }

  /// A transaction on "Context" named `methodName`, without arguments.
  std::shared_ptr<Transaction> beginEdit(const std::string &methodName) {
    if (!canBeginEdit())
      return Transaction::empty();
    return std::make_shared<SyncTransaction>(interceptor, context.get(), methodName, nullptr);
  }
  /// The same with an index or count as argument.
  std::shared_ptr<Transaction> beginEdit(const std::string &methodName, int argument) {
    if (!canBeginEdit())
      return Transaction::empty();
    auto arguments = std::make_shared<SyncTransaction::Arguments>();
    auto setting = std::make_shared<Int32Setting>("");
    setting->setValue(argument);
    arguments->push_back(std::move(setting));
    return std::make_shared<SyncTransaction>(interceptor, context.get(), methodName, std::move(arguments));
  }
  /// The same with an item as argument.
  std::shared_ptr<Transaction> beginEdit(const std::string &methodName, const std::shared_ptr<T> &item) {
    if (!canBeginEdit())
      return Transaction::empty();
    auto arguments = std::make_shared<SyncTransaction::Arguments>();
    arguments->push_back(std::make_shared<SubSetting<T>>("", item));
    return std::make_shared<SyncTransaction>(interceptor, context.get(), methodName, std::move(arguments));
  }

  Interceptor *interceptor = nullptr;
  bool copyExistingOnly = false;
  bool fixedCount = false;
  std::vector<std::shared_ptr<T>> items;
  std::shared_ptr<ContextSetting> context;

private:
  void append(const std::shared_ptr<T> &item) {
    items.push_back(item);
    if (interceptor != nullptr) {
      item->activateSettings(interceptor, this);
      item->setThisKey(std::to_string(items.size() - 1));
    }
  }

  void renumber(std::size_t from) {
    for (std::size_t j = from; j < items.size(); ++j)
      if (items[j])
        items[j]->setThisKey(std::to_string(j));
  }

  // Makes this list look like the source, item by item. An item of another
  // class than the source's at the same position keeps its old data: the
  // copy goes into a short-lived local item that is bound, filled and
  // dropped. Items added at the end stay inactive until the next activation.
  void copyOverwrite(const std::shared_ptr<ModelCollection<T>> &source) {
    const std::size_t sourceCount = source->items.size();
    for (std::size_t i = 0; i < sourceCount; ++i) {
      const auto &theirs = source->items[i];
      if (i >= items.size()) {
        if (fixedCount)
          return;
        auto made = theirs ? std::dynamic_pointer_cast<T>(theirs->create()) : nullptr;
        if (!made)
          continue;
        items.push_back(made);
        made->copyFrom(theirs);
        made->setThisKey(std::to_string(i));
        continue;
      }
      const auto &mine = items[i];
      if (!mine || !theirs)
        continue;
      if (theirs->getTypeName() != mine->getTypeName()) {
        auto local = std::dynamic_pointer_cast<T>(theirs->create());
        if (!local)
          continue;
        local->activateSettings(interceptor, this);
        local->setThisKey(std::to_string(i));
        local->copyFrom(theirs);
        continue;
      }
      mine->copyFrom(theirs);
    }
    if (fixedCount)
      return;
    while (items.size() > sourceCount)
      removeAt(getCount() - 1);
  }

  // Copies into existing items only, pairing them by class: first position
  // by position, then each unpaired item takes every unused source item of
  // its class in turn (the last one wins).
  void copyExistItems(const std::shared_ptr<ModelCollection<T>> &source) {
    const auto &theirs = source->items;
    std::vector<bool> usedSource(theirs.size(), false);
    std::vector<bool> usedMine(items.size(), false);
    const std::size_t common = std::min(items.size(), theirs.size());
    for (std::size_t i = 0; i < common; ++i) {
      if (theirs[i] && items[i] && theirs[i]->getPrototype() == items[i]->getPrototype()) {
        items[i]->copyFrom(theirs[i]);
        usedSource[i] = usedMine[i] = true;
      }
    }
    for (std::size_t i = 0; i < items.size(); ++i) {
      if (usedMine[i] || !items[i])
        continue;
      for (std::size_t j = 0; j < theirs.size(); ++j) {
        if (usedSource[j] || !theirs[j] || theirs[j]->getPrototype() != items[i]->getPrototype())
          continue;
        items[i]->copyFrom(theirs[j]);
        usedSource[j] = usedMine[i] = true;
      }
    }
  }
};

} // namespace Corvane::Wavemill
