#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/IObject.h"

#include <gsl/span>

#include <cstdint>
#include <memory>
#include <string>

namespace Corvane::Wavemill {

class IModel;

/// One named, typed, observable value of a model. Code that holds an
/// ISetting and does not know its type reads and writes it through the
/// type-erased door: the get... and setCommonValue overloads. An overload
/// that does not fit the setting's type reads as false/0 and writes nothing.
class WAVEMILL_API ISetting : public IObject {
public:
  /// Stores the value read from `text` without validation or notification;
  /// false when the text does not hold a value of the setting's type.
  virtual bool parse(const std::string &text) = 0;
  /// The key of the setting within its model and its JSON member name.
  virtual std::string getName() const = 0;
  /// True for the holders of sub-models.
  virtual bool isSubSetting() const = 0;
  /// True when the EnumKind flag is set.
  virtual bool isEnumSetting() const = 0;
  /// The held model of a sub-model holder, else null.
  virtual std::shared_ptr<IModel> getCommonValue() const = 0;
  /// The valid values of an enum setting; empty for others.
  virtual gsl::span<int> getValidInt32Values() = 0;
  /// Replaces the held model of a sub-model holder; others ignore it.
  virtual void setCommonPointer(std::shared_ptr<IModel> model) = 0;
  virtual bool getBool() const = 0;
  virtual int getInt32() const = 0;
  virtual std::int64_t getInt64() const = 0;
  virtual double getDouble() const = 0;
  virtual void setCommonValue(std::string value) = 0;
  virtual void setCommonValue(double value) = 0;
  virtual void setCommonValue(std::int64_t value) = 0;
  virtual void setCommonValue(int value) = 0;
  virtual void setCommonValue(bool value) = 0;
  /// The index of `text` among an enum setting's choices, else -1.
  virtual int findEnumIndex(const std::string &text) const = 0;
};

} // namespace Corvane::Wavemill
