#include "wavemill/models/ApplicationManager.h"

#include "wavemill/models/Prototype.h"
#include "wavemill/models/RunTime.h"
#include "wavemill/models/Transaction.h"

namespace Corvane::Wavemill {

// The collection classes of the applications are instantiated once, here, so
// that every module shares one definition and one type identity of each.
template class ModelCollection<ApplicationBase>;
template class SubSetting<ApplicationBase>;
template class SubSetting<ModelCollection<ApplicationBase>>;

ApplicationManager::ApplicationManager()
    : ModelBase("ApplicationManager"), Applications(init(std::make_shared<SubSetting<Applications_t>>("Applications"))),
      Busy(init(std::make_shared<BoolSetting>("Busy"))) {}

ApplicationManager::~ApplicationManager() = default;

std::string ApplicationManager::getTypeName() const { return WAVEMILL_TYPE_NAME(); }
std::string ApplicationManager::getFullTypeName() const { return WAVEMILL_FULL_TYPE_NAME(); }
std::shared_ptr<IModel> ApplicationManager::create() const { return std::make_shared<ApplicationManager>(); }
std::shared_ptr<IModel> ApplicationManager::getPrototype() const {
  return Prototype::getInstance<ApplicationManager>();
}

void ApplicationManager::couple(Transaction *transaction) {
  Setting *setting = transaction->getSetting();
  auto applications = getApplications();
  if (applications && applications->getCount() == 1)
    applications->getItem(0)->Selected->setValue(true);
  if (applications && setting->hasFlag(ParameterBits::PlainSettingMark))
    applications->couple(transaction);
  if (transactions.has_observers())
    transactions.get_subscriber().on_next(transaction);
}

} // namespace Corvane::Wavemill
