#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/ISetting.h"
#include "wavemill/models/ParameterBits.h"
#include "wavemill/models/SettingChange.h"
#include "wavemill/rx/Subject.h"

#include <memory>
#include <string>

namespace Corvane::Wavemill {

class IConverter;
class IModel;
class Interceptor;
class SettingVisitor;

/// The base of all settings. A setting has two lives: until activate() binds
/// it to an Interceptor and an owner model it is a plain value, and writing
/// it stores the value and nothing else; once active, every write goes
/// through the Interceptor's lock, a transaction and the couplings of the
/// tree, and its observers are told at once.
///
/// Reads take no lock. A setting holds its owner and its Interceptor by raw
/// pointer; both must outlive it while it is active.
class WAVEMILL_API Setting : public ISetting {
public:
  /// The flag word of a plain setting: 0x180FC.
  static constexpr ParameterBits DefaultBits =
      ParameterBits::CommonFlags | ParameterBits::PlainSettingMark | ParameterBits::PublishChange;

  explicit Setting(std::string name = {}, ParameterBits bits = DefaultBits);
  ~Setting() override;

  Setting(const Setting &) = delete;
  Setting &operator=(const Setting &) = delete;

  // The type-erased door: neutral answers unless a concrete class overrides.
  std::string getName() const override;
  bool isEnumSetting() const override;
  bool getBool() const override;
  int getInt32() const override;
  std::int64_t getInt64() const override;
  double getDouble() const override;
  void setCommonValue(std::string value) override;
  void setCommonValue(double value) override;
  void setCommonValue(std::int64_t value) override;
  void setCommonValue(int value) override;
  void setCommonValue(bool value) override;
  int findEnumIndex(const std::string &text) const override;
  gsl::span<int> getValidInt32Values() override;

  /// Binds the setting to a tree. A later call replaces the binding. The
  /// value and the observers are left as they are.
  virtual void activate(Interceptor *interceptor, IModel *owner);
  /// Unbinds the setting; writes become plain stores again.
  virtual void deactivate();
  /// Restores the default value when Resettable is set, inside the caller's
  /// transaction (no lock, no coupling of its own).
  virtual void reset();
  /// Copies the value of `other`, a setting of the same class, without
  /// validation or notification.
  virtual void copyFrom(const std::shared_ptr<Setting> &other);
  /// The converter set with setConverter, else the class's default one.
  virtual std::shared_ptr<IConverter> getConverter() const;
  virtual void setConverter(std::shared_ptr<IConverter> converter);

protected:
  /// Publishes SettingChange{this, bits} on the setting's subject while the
  /// setting is active; an inactive setting publishes nothing.
  virtual void onPropertyChanged(ParameterBits bits);

public:
  /// True when the value equals the value given at construction.
  virtual bool isDefaultValue() const;
  virtual void setValidInt32Values(gsl::span<int> values);
  /// Calls the visitor's dispatch overload for the setting's own class.
  virtual void visit(SettingVisitor *visitor) = 0;

  /// The method name of the running transaction of the tree, or the
  /// setting's name when there is none; empty when inactive.
  std::string getMethodName() const;
  /// The nearest model up the owner chain whose type name is `typeName`,
  /// starting with the owner; null when there is no owner.
  IModel *ancestor(const std::string &typeName) const;
  /// The display text through the converter; empty without a converter.
  std::string convertTo();
  /// Writes `text` through the converter; nothing without a converter.
  void convertBack(const std::string &text);

  /// The owner model, null while inactive.
  IModel *getOwner() const { return owner; }
  /// The Interceptor of the tree, null while inactive.
  Interceptor *getInterceptor() const { return interceptor; }
  /// True while bound to an Interceptor.
  bool isActive() const { return interceptor != nullptr; }

  /// The subject on which the setting publishes its changes. Subscribers
  /// run on the writer's thread, inside the tree's lock.
  rx::subjects::subject<SettingChange> &getSubject() { return subject; }

  const std::string &getAuxiliaryText() const { return auxiliaryText; }
  void setAuxiliaryText(std::string text) { auxiliaryText = std::move(text); }

  ParameterBits getParameterBits() const { return parameterBits; }
  /// Replaces the flag word. When it differs from the old one, the owner is
  /// told and the changed bits are published as the change code.
  void setParameterBits(ParameterBits bits);
  /// True when every bit of `flag` is set.
  bool hasFlag(ParameterBits flag) const { return (parameterBits & flag) == flag; }
  /// Sets or clears `flag`; setting a flag to its present state does nothing.
  void setFlag(ParameterBits flag, bool on);

  bool isReadOnly() const { return hasFlag(ParameterBits::ReadOnly); }
  void setReadOnly(bool on) { setFlag(ParameterBits::ReadOnly, on); }
  bool isVisible() const { return hasFlag(ParameterBits::Visible); }
  void setVisible(bool on) { setFlag(ParameterBits::Visible, on); }
  bool isPersisted() const { return hasFlag(ParameterBits::Persisted); }
  void setPersisted(bool on) { setFlag(ParameterBits::Persisted, on); }
  bool isResettable() const { return hasFlag(ParameterBits::Resettable); }
  void setResettable(bool on) { setFlag(ParameterBits::Resettable, on); }
  bool isPublishChange() const { return hasFlag(ParameterBits::PublishChange); }
  void setPublishChange(bool on) { setFlag(ParameterBits::PublishChange, on); }

protected:
  /// The tail of a value change: tells the owner, publishes ValueChanged on
  /// the setting's subject and, with PublishChange, the setting on the
  /// Interceptor's subject.
  void notifyValueChanged();

  IModel *owner = nullptr;
  Interceptor *interceptor = nullptr;
  rx::subjects::subject<SettingChange> subject;
  const std::string name;
  std::string auxiliaryText;
  std::shared_ptr<IConverter> converter;
  ParameterBits parameterBits;
};

} // namespace Corvane::Wavemill
