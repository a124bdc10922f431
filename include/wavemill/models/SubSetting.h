#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/ICollection.h"
#include "wavemill/models/ModelBase.h"
#include "wavemill/models/Setting.h"
#include "wavemill/models/SettingVisitor.h"

#include <memory>
#include <string>
#include <typeinfo>

namespace Corvane::Wavemill {

/// A setting whose value is a model of class T: it hangs one child under a
/// named slot of its parent. Activating the setting activates the child
/// with the parent as owner and the setting's name as key, so one
/// activation of the root binds the whole tree.
///
/// With WeakSubValue set the setting refers to a model owned elsewhere:
/// getValue() then reads a weak reference and gives null once the model is
/// gone, and setValue() neither binds nor owns the model.
template <class T> class WAVEMILL_API SubSetting : public Setting {
public:
  /// The flag word of a sub-model holder: 0xF0.
  static constexpr ParameterBits SubBits = ParameterBits::Persisted | ParameterBits::ApplicationFlag2 |
                                           ParameterBits::Resettable | ParameterBits::ApplicationFlag3;

  /// A holder of a new, default-constructed T.
  explicit SubSetting(const char *name = "") : SubSetting(name, std::make_shared<T>()) {}
  /// A holder of `model` as it is (used for transaction arguments).
  SubSetting(const char *name, std::shared_ptr<T> model)
      : Setting(name ? name : "", SubBits), value(std::move(model)), weakValue(value) {}

  /// The held model; with WeakSubValue the referenced one, or null when it
  /// is gone.
  std::shared_ptr<T> getValue() const {
    if (hasFlag(ParameterBits::WeakSubValue))
      return weakValue.lock();
    return value;
  }

  /// Replaces the held model without transaction or notification. With
  /// WeakSubValue only the weak reference changes. Otherwise, when the
  /// setting is active, `model` is rebound to this tree; the old model is
  /// dropped as it is.
  void setValue(const std::shared_ptr<T> &model) {
    if (hasFlag(ParameterBits::WeakSubValue)) {
      weakValue = model;
      return;
    }
    if (interceptor != nullptr && model) {
      model->deactivateSettings();
      model->activateSettings(interceptor, owner);
    }
    value = model;
  }

  /// Sets or clears WeakSubValue by the flag rule; follow it with setValue
  /// to establish the reference.
  void setWeakSubValue(bool on) { setFlag(ParameterBits::WeakSubValue, on); }
  bool isWeakSubValue() const { return hasFlag(ParameterBits::WeakSubValue); }

  bool parse(const std::string &) override { return true; }
  bool isSubSetting() const override { return true; }
  std::shared_ptr<IModel> getCommonValue() const override { return getValue(); }
  /// The type name of the held model.
  std::string toString() const override { return value ? value->getTypeName() : std::string(); }
  void visit(SettingVisitor *visitor) override { visitor->dispatch(static_cast<ISetting *>(this)); }

  /// A model of class T is taken with setValue. A collection is copied into
  /// the own collection item by item (the own items are cleared first).
  void setCommonPointer(std::shared_ptr<IModel> model) override {
    if (auto typed = std::dynamic_pointer_cast<T>(model)) {
      setValue(typed);
      return;
    }
    auto source = std::dynamic_pointer_cast<ICollection>(model);
    auto target = std::dynamic_pointer_cast<ICollection>(getValue());
    if (!source || !target)
      return;
    target->clear();
    for (int i = 0; i < source->getCount(); ++i)
      target->add(source->getCommonItem(i));
  }

  /// True for a holder of the same class whose model equals this one's.
  bool equals(const std::shared_ptr<IObject> &other) const override {
    auto *same = dynamic_cast<const SubSetting<T> *>(other.get());
    if (same == nullptr)
      return false;
    auto mine = getValue();
    auto theirs = same->getValue();
    if (!mine || !theirs)
      return mine == theirs;
    return mine->equals(theirs);
  }

  /// Resets the held model.
  void reset() override {
    if (value)
      value->reset();
  }

  void activate(Interceptor *tree, IModel *model) override {
    Setting::activate(tree, model);
    if (value) {
      value->activateSettings(tree, model);
      value->setThisKey(name);
    }
  }

  void deactivate() override {
    Setting::deactivate();
    if (value)
      value->deactivateSettings();
  }

  /// Copies the model of `other`. Holders of the same class copy model into
  /// model. A holder of another class makes this one hold a new model of the
  /// source model's class with its data (clearing WeakSubValue), bound to
  /// this tree when the setting is active.
  void copyFrom(const std::shared_ptr<Setting> &other) override {
    if (!other)
      return;
    auto mine = getValue();
    auto theirs = other->getCommonValue();
    if (!mine || !theirs)
      return;
    if (typeid(*other) == typeid(*this)) {
      mine->copyFrom(theirs);
      return;
    }
    auto made = std::dynamic_pointer_cast<T>(theirs->create());
    if (!made)
      return; // a model this holder cannot hold is not taken
    mine->deactivateSettings();
    made->copyFrom(theirs);
    setWeakSubValue(false);
    value = made;
    weakValue = made;
    if (owner != nullptr && interceptor != nullptr)
      made->activateSettings(interceptor, owner);
  }

protected:
  std::shared_ptr<T> value;
  std::weak_ptr<T> weakValue;
};

template <class M> std::shared_ptr<Setting> ModelBase::makeArgument(const std::shared_ptr<M> &model) {
  return std::make_shared<SubSetting<M>>("", model);
}

} // namespace Corvane::Wavemill
