#include "wavemill/models/ApplicationBase.h"

#include "wavemill/models/ApplicationManager.h"
#include "wavemill/models/Prototype.h"
#include "wavemill/models/RunTime.h"
#include "wavemill/models/Transaction.h"

#include <cstdio>

namespace Corvane::Wavemill {

namespace {

// Run-time state is neither saved nor reset.
template <class S> std::shared_ptr<S> runTimeState(std::shared_ptr<S> setting) {
  setting->setPersisted(false);
  setting->setResettable(false);
  return setting;
}

} // namespace

ApplicationBase::ApplicationBase() : ApplicationBase("ApplicationBase") {}

ApplicationBase::ApplicationBase(const std::string &typeName)
    : ModelBase(typeName), Selected(init(runTimeState(std::make_shared<BoolSetting>("Selected")))),
      Dirty(init(runTimeState(std::make_shared<BoolSetting>("Dirty")))),
      Name(init(runTimeState(std::make_shared<StringSetting>("Name")))) {}

ApplicationBase::~ApplicationBase() = default;

std::string ApplicationBase::getTypeName() const { return WAVEMILL_TYPE_NAME(); }
std::string ApplicationBase::getFullTypeName() const { return WAVEMILL_FULL_TYPE_NAME(); }
std::shared_ptr<IModel> ApplicationBase::create() const { return std::make_shared<ApplicationBase>(); }
std::shared_ptr<IModel> ApplicationBase::getPrototype() const { return Prototype::getInstance<ApplicationBase>(); }

void ApplicationBase::couple(Transaction *transaction) {
  Setting *setting = transaction->getSetting();

  ApplicationManager *manager = nullptr;
  IModel *node = this;
  for (int nodes = 0; node != nullptr; node = node->getOwner()) {
    if (++nodes > 51) {
      std::fputs("There may be a loop in models.\n", stdout);
      std::fflush(stdout);
      break;
    }
    if ((manager = dynamic_cast<ApplicationManager *>(node)) != nullptr)
      break;
  }

  if (manager != nullptr && setting == Selected.get() && Selected->getValue()) {
    for (const auto &application : manager->getApplications()->getItems())
      if (application && application.get() != this)
        application->Selected->setValue(false);
  }

  if (setting->getName() == "Context") {
    const auto option = transaction->getOption();
    if (option == TransactionOption::Reset || option == TransactionOption::Recall)
      Dirty->setValue(false);
    return;
  }
  Dirty->setValue(true);
}

} // namespace Corvane::Wavemill
