#pragma once

#include "wavemill/Export.h"

#include <memory>
#include <string>

namespace Corvane::Wavemill {

/// Root of all classes of the library: identity comparison and a text form.
class WAVEMILL_API IObject {
public:
  virtual ~IObject();

  /// True exactly when `other` is this very object, unless a class compares
  /// its contents instead.
  virtual bool equals(const std::shared_ptr<IObject> &other) const;

  /// A short text that describes the object.
  virtual std::string toString() const = 0;
};

} // namespace Corvane::Wavemill
