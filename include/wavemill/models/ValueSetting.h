#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/IModel.h"
#include "wavemill/models/Interceptor.h"
#include "wavemill/models/Setting.h"
#include "wavemill/models/Transaction.h"

#include <cstdint>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

namespace Corvane::Wavemill {

/// A setting that holds a value of type T (int, int64_t, double, bool or
/// std::string) and the default given at construction.
///
/// setValue is the one door for a write from application code:
/// - inactive: the value is stored as given, nothing else happens;
/// - on the thread that is inside a transaction of the tree: the value is
///   validated, stored and notified, without lock and without coupling;
/// - otherwise: the tree's lock is taken, a transaction runs, the value is
///   validated, stored and notified, and the couplings of the tree run once.
/// A write of an equal value notifies nobody. A ReadOnly setting keeps its
/// value. An exception of a coupling is swallowed; one of an observer
/// reaches the caller.
template <class T> class WAVEMILL_API ValueSetting : public Setting {
public:
  using ValueType = T;

  ValueSetting(std::string name, T value, ParameterBits bits)
      : Setting(std::move(name), bits), value(value), defaultValue(std::move(value)) {}

  /// The current value. Reads take no lock.
  const T &getValue() const { return value; }
  /// The value given at construction.
  const T &getDefaultValue() const { return defaultValue; }

  /// Writes the value through the tree's transaction; see the class comment.
  void setValue(const T &v);

  /// Stores a validated value and notifies, when it differs from the
  /// present one. Runs inside a transaction (or inactive): no lock, no
  /// coupling.
  void internalSetValue(const T &v) {
    if (valueEquals(v))
      return;
    T old = value;
    value = validateValue(v);
    onChanged(old, value);
  }

  /// True when `v` equals the present value.
  virtual bool valueEquals(const T &v) const { return value == v; }

  std::shared_ptr<IModel> getCommonValue() const override { return nullptr; }
  bool isSubSetting() const override { return false; }
  void setCommonPointer(std::shared_ptr<IModel>) override {}
  bool isDefaultValue() const override { return valueEquals(defaultValue); }

  /// True when `other` is a setting of the same value type with an equal
  /// value; names are not compared.
  bool equals(const std::shared_ptr<IObject> &other) const override {
    auto same = dynamic_cast<const ValueSetting<T> *>(other.get());
    return same != nullptr && valueEquals(same->value);
  }

  /// Assigns the value of `other` directly; a setting of another value type
  /// is ignored.
  void copyFrom(const std::shared_ptr<Setting> &other) override {
    if (auto same = dynamic_cast<const ValueSetting<T> *>(other.get()))
      value = same->value;
  }

  void reset() override {
    if (hasFlag(ParameterBits::Resettable))
      internalSetValue(defaultValue);
  }

protected:
  /// The value that is stored for `v`; returns `v` unless a class adjusts it.
  virtual T validateValue(const T &v) const { return v; }
  /// A detached setting that keeps the old value for the transaction; null
  /// unless an application class provides one.
  virtual std::shared_ptr<Setting> createTempSetting(const T &) const { return nullptr; }

  /// The tail of internalSetValue.
  void onChanged(const T &oldValue, const T &newValue) {
    (void)oldValue;
    (void)newValue;
    notifyValueChanged();
  }

  std::shared_ptr<std::vector<int>> validValues;
  T value;
  const T defaultValue;
};

template <class T> void ValueSetting<T>::setValue(const T &v) {
  Interceptor *const tree = interceptor;
  if (tree == nullptr) {
    if (&v != &value)
      value = v;
    return;
  }
  const std::uint32_t self = Interceptor::currentThreadId();
  if (tree->getThreadId() == self) {
    internalSetValue(v);
    return;
  }
  std::unique_lock<std::mutex> lock(tree->getMutex());
  tree->setThreadId(self);
  Transaction transaction(tree, this, TransactionOption::Couple);
  transaction.setOldValue(createTempSetting(value));
  tree->setCurrentTransaction(&transaction);
  // A read-only write leaves the thread recorded as inside the tree, so its
  // next write on this tree takes the nested path; callers rely on that.
  if (hasFlag(ParameterBits::ReadOnly))
    return;
  internalSetValue(v);
  try {
    tree->couple(&transaction);
  } catch (...) {
    // A coupling never fails the writer: the value stays written.
    transaction.setOldValue(nullptr);
  }
  tree->setCurrentTransaction(nullptr);
  tree->setThreadId(0);
}

extern template class ValueSetting<int>;
extern template class ValueSetting<std::int64_t>;
extern template class ValueSetting<double>;
extern template class ValueSetting<bool>;
extern template class ValueSetting<std::string>;

} // namespace Corvane::Wavemill
