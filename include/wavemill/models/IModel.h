#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/IObject.h"

#include <memory>
#include <string>

namespace Corvane::Wavemill {

class ICouplings;
class Interceptor;
class ISetting;
class Metadata;

/// A node of the state tree: a model or a collection of models.
class WAVEMILL_API IModel : public IObject {
public:
  /// The class's short name, such as "TextModel".
  virtual std::string getTypeName() const = 0;
  /// The class's full name, as documents store it.
  virtual std::string getFullTypeName() const = 0;
  virtual bool isCollection() const = 0;
  /// For a collection, the prototype of its items; else null.
  virtual std::shared_ptr<IModel> getItemPrototype() const = 0;
  /// A new, inactive object of the same class.
  virtual std::shared_ptr<IModel> create() const = 0;
  /// The one shared instance of the class: home of its couplings and its
  /// setting-name map.
  virtual std::shared_ptr<IModel> getPrototype() const = 0;
  virtual Metadata &getMetadata() = 0;
  /// The key of this node within its parent; empty for a root.
  virtual std::string getThisKey() const = 0;
  virtual void setThisKey(const std::string &key) = 0;
  /// Binds every setting and nested model to `interceptor`, with `owner` as
  /// parent (null for the root).
  virtual void activateSettings(Interceptor *interceptor, IModel *owner) = 0;
  /// Unbinds the node for good.
  virtual void deactivateSettings() = 0;
  /// Runs within each value or flag change of an owned setting, before the
  /// notifications.
  virtual void onPropertyChanged(ISetting *setting) = 0;
  virtual IModel *getOwner() const = 0;
  virtual void setOwner(IModel *owner) = 0;
  /// Restores the defaults of every resettable setting below this node.
  virtual void reset() = 0;
  /// Copies the values of a model of the same class; false when nothing was
  /// copied.
  virtual bool copyFrom(const std::shared_ptr<IModel> &source) = 0;
  /// An inactive copy.
  virtual std::shared_ptr<IModel> duplicate() const = 0;
  virtual void setCouplings(std::shared_ptr<ICouplings> couplings) = 0;
  virtual std::shared_ptr<ICouplings> getCouplings() const = 0;
};

} // namespace Corvane::Wavemill
