#include "wavemill/models/ApplicationManager.h"
#include "support/TestModels.h"

#include <gtest/gtest.h>

using namespace Corvane::Wavemill;

namespace ApplicationTests {

struct Scope : ApplicationBase {
  WAVEMILL_MODEL(Scope)
  Scope() : ApplicationBase("Tests::Scope") {}
  std::shared_ptr<DoubleSetting> span = init(std::make_shared<DoubleSetting>("Span"));
};

// A manager root with a recorder on `transactions`.
class ApplicationManagerTest : public testing::Test, public Testing::LiveTree<ApplicationManager> {
protected:
  ApplicationManagerTest() {
    manager->transactions.get_observable().subscribe(
        [this](Transaction *t) { seen.push_back(t->getSetting()->getName() + ":" + t->getMethodName()); });
  }
  std::shared_ptr<Scope> open() {
    auto scope = std::make_shared<Scope>();
    manager->getApplications()->add(scope);
    return scope;
  }
  std::shared_ptr<ApplicationManager> &manager = root;
  std::vector<std::string> seen;
};

} // namespace ApplicationTests

using namespace ApplicationTests;

TEST_F(ApplicationManagerTest, ALoneApplicationIsAlwaysSelected) {
  auto only = open();
  EXPECT_FALSE(only->Dirty->isResettable()); // run-time state; that it is not stored: json tests
  only->Selected->setValue(false);           // the coupling sets it back
  EXPECT_TRUE(only->Selected->getValue());
  EXPECT_EQ(seen, (std::vector<std::string>{"Context:add", "Selected:"}));
}

TEST_F(ApplicationManagerTest, SelectionIsExclusiveAndAnyChangeMarksEveryApplicationDirty) {
  auto first = open();
  auto second = open();
  second->Selected->setValue(true);
  EXPECT_FALSE(first->Selected->getValue());
  first->Selected->setValue(true);
  EXPECT_FALSE(second->Selected->getValue());
  first->Selected->setValue(false); // none selected now
  EXPECT_FALSE(second->Selected->getValue());

  first->span->setValue(2.0);
  EXPECT_TRUE(first->Dirty->getValue());
  EXPECT_TRUE(second->Dirty->getValue());
  // A reset of one application clears Dirty on all of them (a recall too:
  // json tests).
  first->reset();
  EXPECT_FALSE(first->Dirty->getValue());
  EXPECT_FALSE(second->Dirty->getValue());

  // A plain edit or a method transaction on the collection leaves Dirty alone.
  first->span->setValue(4.0);
  { auto edit = first->beginEdit(TransactionOption::Couple); }
  manager->getApplications()->add(std::make_shared<Scope>());
  EXPECT_TRUE(first->Dirty->getValue());
  EXPECT_EQ(seen.back(), "Context:add");
}

TEST_F(ApplicationManagerTest, ChangesOfSubSettingsReachOnlyTheLoneApplicationRuleAndSubscribers) {
  auto only = open();
  { auto reset = only->beginReset(); }
  EXPECT_FALSE(only->Dirty->getValue());
  // Write Selected to false without the manager's coupling, then start a
  // transaction whose setting is the sub-model holder itself.
  {
    auto edit = only->beginEdit(TransactionOption::NoCouple);
    only->Selected->setValue(false);
  }
  EXPECT_FALSE(only->Selected->getValue());
  seen.clear();
  { SyncTransaction sub(&interceptor, manager->Applications.get(), TransactionOption::Couple); }
  EXPECT_TRUE(only->Selected->getValue());
  EXPECT_FALSE(only->Dirty->getValue());
  EXPECT_EQ(seen, std::vector<std::string>{"Applications:"});
}
