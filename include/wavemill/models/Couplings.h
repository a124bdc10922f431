#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/IObject.h"

#include <functional>

namespace Corvane::Wavemill {

class ModelBase;
class Transaction;

/// What a model runs at the end of every outermost change of its tree.
class WAVEMILL_API ICouplings : public IObject {
public:
  std::string toString() const override;
  /// Keeps the settings of `model` consistent after the change `transaction`.
  virtual void couple(ModelBase *model, Transaction *transaction) = 0;
};

/// Couplings given by a callable. Set them once on the prototype of a class
/// and they serve every instance; an instance may have its own.
class WAVEMILL_API Couplings : public ICouplings {
public:
  using Function = std::function<void(ModelBase *, Transaction *)>;

  Couplings() = default;
  explicit Couplings(Function function) : function(std::move(function)) {}

  /// Calls the callable; does nothing when it is empty.
  void couple(ModelBase *model, Transaction *transaction) override;

private:
  Function function;
};

} // namespace Corvane::Wavemill
