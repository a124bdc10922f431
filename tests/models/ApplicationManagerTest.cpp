#include "wavemill/models/ApplicationManager.h"
#include "wavemill/models/DoubleSetting.h"
#include "wavemill/models/Interceptor.h"

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

using namespace Corvane::Wavemill;

namespace ApplicationTests {

class Scope : public ApplicationBase {
public:
  WAVEMILL_MODEL(Scope)
  Scope() : ApplicationBase("Tests::Scope") {}
  std::shared_ptr<DoubleSetting> span = init(std::make_shared<DoubleSetting>("Span"));
};

} // namespace ApplicationTests

using namespace ApplicationTests;

namespace {

// A manager root with a recorder on `transactions`.
struct Desk {
  Desk() : manager(std::make_shared<ApplicationManager>()), interceptor(manager) {
    manager->activateSettings(&interceptor, nullptr);
    subscription = manager->transactions.get_observable().subscribe(
        [this](Transaction *t) { seen.push_back(t->getSetting()->getName() + ":" + t->getMethodName()); });
  }
  ~Desk() { subscription.unsubscribe(); }
  std::shared_ptr<Scope> open() {
    auto scope = std::make_shared<Scope>();
    manager->getApplications()->add(scope);
    return scope;
  }

  std::shared_ptr<ApplicationManager> manager;
  Interceptor interceptor;
  rxcpp::subscription subscription;
  std::vector<std::string> seen;
};

} // namespace

TEST(ApplicationManagerTest, RunTimeStateIsNeitherSavedNorResetAndNamesComeFromTheClasses) {
  ApplicationBase application;
  for (const auto &setting : {application.Selected->getParameterBits(), application.Dirty->getParameterBits(),
                              application.Name->getParameterBits()}) {
    EXPECT_FALSE(hasAny(setting, ParameterBits::Persisted));
    EXPECT_FALSE(hasAny(setting, ParameterBits::Resettable));
  }
  EXPECT_EQ(application.getAllSettings()[1]->getName(), "Selected");
  EXPECT_EQ(application.getAllSettings()[3]->getName(), "Name");
  EXPECT_EQ(application.getTypeName(), "ApplicationBase");
  EXPECT_EQ(application.getFullTypeName(), "Corvane.Wavemill.ApplicationBase");
  ApplicationManager manager;
  EXPECT_EQ(manager.getTypeName(), "ApplicationManager");
  EXPECT_EQ(manager.getFullTypeName(), "Corvane.Wavemill.ApplicationManager");
  EXPECT_EQ(manager.getAllSettings()[1]->getName(), "Applications");
  EXPECT_EQ(manager.Applications->getValue()->getTypeName(), "ModelCollection`1[[ApplicationBase]]");
  EXPECT_EQ(Scope().getTypeName(), "Scope");
}

TEST(ApplicationManagerTest, ALoneApplicationIsAlwaysSelected) {
  Desk desk;
  auto only = desk.open();
  EXPECT_TRUE(only->Selected->getValue());
  only->Selected->setValue(false); // the coupling sets it back
  EXPECT_TRUE(only->Selected->getValue());
  EXPECT_EQ(desk.seen, (std::vector<std::string>{"Context:add", "Selected:"}));
}

TEST(ApplicationManagerTest, SelectionIsExclusiveAndAnyChangeMarksEveryApplicationDirty) {
  Desk desk;
  auto first = desk.open();
  auto second = desk.open();
  second->Dirty->setValue(false); // writing Dirty is a change too: it comes back true
  EXPECT_TRUE(second->Dirty->getValue());

  desk.seen.clear();
  second->Selected->setValue(true);
  EXPECT_FALSE(first->Selected->getValue());
  first->Selected->setValue(true);
  EXPECT_FALSE(second->Selected->getValue());
  EXPECT_EQ(desk.seen.size(), 2u); // the deselection was nested, not a change of its own

  first->Selected->setValue(false); // none selected now
  EXPECT_FALSE(second->Selected->getValue());

  first->span->setValue(2.0);
  EXPECT_TRUE(first->Dirty->getValue());
  EXPECT_TRUE(second->Dirty->getValue());

  // A reset or a recall of one application clears Dirty on all of them.
  first->reset();
  EXPECT_FALSE(first->Dirty->getValue());
  EXPECT_FALSE(second->Dirty->getValue());
  first->span->setValue(3.0);
  { auto recall = second->beginRecall(); }
  EXPECT_FALSE(first->Dirty->getValue());

  // A plain edit or a method transaction on the collection leaves Dirty alone.
  first->span->setValue(4.0);
  { auto edit = first->beginEdit(TransactionOption::Couple); }
  desk.manager->getApplications()->add(std::make_shared<Scope>());
  EXPECT_TRUE(first->Dirty->getValue());
  EXPECT_EQ(desk.seen.back(), "Context:add");
}

TEST(ApplicationManagerTest, ChangesOfSubSettingsReachOnlyTheLoneApplicationRuleAndSubscribers) {
  Desk desk;
  auto only = desk.open();
  { auto reset = only->beginReset(); }
  EXPECT_FALSE(only->Dirty->getValue());
  // Write Selected to false without the manager's coupling, then start a
  // transaction whose setting is the sub-model holder itself.
  {
    auto edit = only->beginEdit(TransactionOption::NoCouple);
    only->Selected->setValue(false);
  }
  EXPECT_FALSE(only->Selected->getValue());
  desk.seen.clear();
  { SyncTransaction sub(&desk.interceptor, desk.manager->Applications.get(), TransactionOption::Couple); }
  EXPECT_TRUE(only->Selected->getValue());
  EXPECT_FALSE(only->Dirty->getValue());
  EXPECT_EQ(desk.seen, std::vector<std::string>{"Applications:"});
}
