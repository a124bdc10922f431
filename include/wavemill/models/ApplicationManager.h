#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/ApplicationBase.h"
#include "wavemill/models/BoolSetting.h"
#include "wavemill/models/ModelBase.h"
#include "wavemill/models/ModelCollection.h"
#include "wavemill/models/SubSetting.h"
#include "wavemill/rx/Subject.h"

#include <memory>
#include <string>

namespace Corvane::Wavemill {

class Transaction;

/// The usual root of a model tree: the applications open side by side, a
/// busy flag, and the one place where every finished change can be watched.
///
///   auto manager = std::make_shared<ApplicationManager>();
///   Interceptor interceptor(manager);
///   manager->activateSettings(&interceptor, nullptr);
///   manager->getApplications()->add(std::make_shared<MyApplication>());
///   auto s = manager->transactions.get_observable().subscribe([](Transaction *t) { ... });
class WAVEMILL_API ApplicationManager : public ModelBase {
public:
  using Applications_t = ModelCollection<ApplicationBase>;

  ApplicationManager();
  ~ApplicationManager() override;

  std::string getTypeName() const override;
  std::string getFullTypeName() const override;
  std::shared_ptr<IModel> create() const override;
  std::shared_ptr<IModel> getPrototype() const override;

  /// Runs once for each outermost change of the tree: selects a lone
  /// application, hands changes of plain settings to every application's
  /// couple(), then publishes the transaction on `transactions`. Couplings
  /// set on the manager itself do not run.
  void couple(Transaction *transaction) override;

  /// The collection of applications held by `Applications`.
  std::shared_ptr<Applications_t> getApplications() const { return Applications->getValue(); }

  /// "Applications": the open applications.
  const std::shared_ptr<SubSetting<Applications_t>> Applications;
  /// "Busy": plain state for the application; the library neither sets nor reads it.
  const std::shared_ptr<BoolSetting> Busy;
  /// Every finished change of the tree, after all couplings ran, on the
  /// writer's thread and inside the tree's lock.
  rx::subjects::subject<Transaction *> transactions;
};

extern template class ModelCollection<ApplicationBase>;
extern template class SubSetting<ApplicationBase>;
extern template class SubSetting<ModelCollection<ApplicationBase>>;

} // namespace Corvane::Wavemill
