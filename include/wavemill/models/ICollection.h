#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/IModel.h"

#include <memory>

namespace Corvane::Wavemill {

/// A node whose content is an ordered list of models, keyed by index.
/// Every change of its shape runs in a transaction named after the
/// operation.
class WAVEMILL_API ICollection : public IModel {
public:
  virtual int getCount() const = 0;
  virtual std::shared_ptr<IModel> getCommonItem(int index) const = 0;
  virtual void setCommonItem(int index, std::shared_ptr<IModel> model) = 0;
  virtual std::shared_ptr<IModel> add(std::shared_ptr<IModel> model) = 0;
  virtual std::shared_ptr<IModel> add() = 0;
  virtual void removeAt(int index) = 0;
  virtual void resize(int count) = 0;
  virtual void clear() = 0;
};

} // namespace Corvane::Wavemill
