#include "wavemill/models/Transaction.h"
#include "wavemill/models/BoolSetting.h"
#include "wavemill/models/Couplings.h"
#include "wavemill/models/DoubleSetting.h"
#include "wavemill/models/Int32Setting.h"
#include "wavemill/models/Interceptor.h"
#include "wavemill/models/ModelBase.h"
#include "wavemill/models/Prototype.h"
#include "wavemill/models/StringSetting.h"
#include "wavemill/services/ServiceBase.h"

#include <gtest/gtest.h>

#include <memory>
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

using namespace Corvane::Wavemill;

namespace {

// A small generator model; each test builds its own tree and Interceptor.
class Source : public ModelBase {
public:
  Source() : ModelBase("Tests::Source") {}
  std::shared_ptr<IModel> create() const override { return std::make_shared<Source>(); }
  std::shared_ptr<IModel> getPrototype() const override { return Prototype::getInstance<Source>(); }
  void onPropertyChanged(ISetting *setting) override {
    if (events)
      events->push_back("owner:" + setting->getName());
  }

  std::shared_ptr<DoubleSetting> frequency = init(std::make_shared<DoubleSetting>("Frequency"));
  std::shared_ptr<DoubleSetting> period = init(std::make_shared<DoubleSetting>("Period"));
  std::shared_ptr<BoolSetting> on = init(std::make_shared<BoolSetting>("On"));
  std::shared_ptr<Int32Setting> count = init(std::make_shared<Int32Setting>("Count"));
  std::vector<std::string> *events = nullptr;
};

// One tree: root model, Interceptor, an event log fed by every observer.
struct Tree {
  Tree() : root(std::make_shared<Source>()), interceptor(root) {
    root->events = &events;
    root->activateSettings(&interceptor, nullptr);
    for (const auto &setting : root->getAllSettings()) {
      subscriptions.push_back(setting->getSubject().get_observable().subscribe(
          [this](const SettingChange &change) { events.push_back("setting:" + change.setting->getName()); }));
    }
    subscriptions.push_back(interceptor.getSubject().get_observable().subscribe(
        [this](ISetting *setting) { events.push_back("tree:" + setting->getName()); }));
  }
  ~Tree() {
    for (auto &each : subscriptions)
      each.unsubscribe();
  }
  void onCouple(Couplings::Function function) { root->setCouplings(std::make_shared<Couplings>(std::move(function))); }

  std::shared_ptr<Source> root;
  Interceptor interceptor;
  std::vector<std::string> events;
  std::vector<rxcpp::subscription> subscriptions;
};

} // namespace

TEST(TransactionTest, AWriteNotifiesOwnerSettingAndTreeThenCouplesOnce) {
  Tree tree;
  std::string method;
  TransactionOption option = TransactionOption::NoCouple;
  Setting *started = nullptr;
  tree.onCouple([&](ModelBase *model, Transaction *transaction) {
    tree.events.push_back("couple");
    method = tree.root->frequency->getMethodName();
    option = transaction->getOption();
    started = transaction->getSetting();
    EXPECT_EQ(model, tree.root.get());
    EXPECT_EQ(tree.interceptor.getCurrentTransaction(), transaction);
  });

  tree.root->frequency->setValue(1e6);
  EXPECT_EQ(tree.events,
            (std::vector<std::string>{"owner:Frequency", "setting:Frequency", "tree:Frequency", "couple"}));
  EXPECT_EQ(method, "");
  EXPECT_EQ(option, TransactionOption::Couple);
  EXPECT_EQ(started, tree.root->frequency.get());
  EXPECT_EQ(tree.interceptor.getThreadId(), 0u);
  EXPECT_EQ(tree.interceptor.getCurrentTransaction(), nullptr);
  EXPECT_EQ(tree.root->frequency->getMethodName(), "Frequency"); // no transaction: the setting's name

  // An equal value still runs a transaction and the couplings, silently.
  tree.events.clear();
  tree.root->frequency->setValue(1e6);
  EXPECT_EQ(tree.events, (std::vector<std::string>{"couple"}));
}

TEST(TransactionTest, CouplingWritesAreNestedAndNeverCoupleAgain) {
  Tree tree;
  int couples = 0;
  tree.onCouple([&](ModelBase *, Transaction *) {
    ++couples;
    auto &root = *tree.root;
    if (root.frequency->getValue() != 0)
      root.period->setValue(1.0 / root.frequency->getValue());
    root.frequency->setValue(root.frequency->getValue()); // writes its own trigger: no recursion
  });
  tree.root->frequency->setValue(4.0);
  EXPECT_EQ(couples, 1);
  EXPECT_DOUBLE_EQ(tree.root->period->getValue(), 0.25);
  EXPECT_EQ(tree.events, (std::vector<std::string>{"owner:Frequency", "setting:Frequency", "tree:Frequency",
                                                   "owner:Period", "setting:Period", "tree:Period"}));
}

TEST(TransactionTest, ReadOnlyWriteKeepsValueAndLeavesTheThreadInside) {
  Tree tree;
  int couples = 0;
  tree.onCouple([&](ModelBase *, Transaction *) { ++couples; });
  tree.root->count->setReadOnly(true);
  tree.events.clear();
  tree.root->count->setValue(5);
  EXPECT_EQ(tree.root->count->getValue(), 0);
  EXPECT_TRUE(tree.events.empty());
  EXPECT_EQ(couples, 0);
  EXPECT_EQ(tree.interceptor.getThreadId(), Interceptor::currentThreadId());
  ASSERT_NE(tree.interceptor.getCurrentTransaction(), nullptr);
  EXPECT_EQ(tree.root->frequency->getMethodName(), ""); // the left-behind transaction is still readable

  // This thread now counts as inside: the next writes are nested, even on
  // the read-only setting, and nothing couples.
  tree.root->frequency->setValue(2.0);
  tree.root->count->setValue(6);
  EXPECT_EQ(tree.root->count->getValue(), 6);
  EXPECT_EQ(couples, 0);
  EXPECT_EQ(tree.root->beginEdit(), Transaction::empty());

  // Another thread finds the lock free, and its write resets the state.
  std::thread([&] { tree.root->on->setValue(true); }).join();
  EXPECT_EQ(couples, 1);
  EXPECT_EQ(tree.interceptor.getThreadId(), 0u);
  tree.root->frequency->setValue(3.0);
  EXPECT_EQ(couples, 2);
}

TEST(TransactionTest, CouplingFailureIsSwallowedObserverFailureReachesTheWriter) {
  Tree tree;
  tree.onCouple([](ModelBase *, Transaction *) { throw std::runtime_error("coupling"); });
  EXPECT_NO_THROW(tree.root->frequency->setValue(5.0));
  EXPECT_EQ(tree.root->frequency->getValue(), 5.0);
  EXPECT_EQ(tree.interceptor.getThreadId(), 0u);

  {
    auto edit = tree.root->beginEdit();
    tree.root->frequency->setValue(6.0);
  } // the coupling throws inside the destructor: swallowed
  EXPECT_EQ(tree.interceptor.getThreadId(), 0u);
  EXPECT_TRUE(tree.interceptor.getMutex().try_lock());
  tree.interceptor.getMutex().unlock();

  tree.onCouple(nullptr);
  auto failing = tree.root->on->getSubject().get_observable().subscribe(
      [](const SettingChange &) { throw std::logic_error("observer"); });
  EXPECT_THROW(tree.root->on->setValue(true), std::logic_error);
  EXPECT_TRUE(tree.root->on->getValue());
  failing.unsubscribe();
  // The failed write leaves this thread recorded as inside, the lock open.
  EXPECT_EQ(tree.interceptor.getThreadId(), Interceptor::currentThreadId());
  EXPECT_TRUE(tree.interceptor.getMutex().try_lock());
  tree.interceptor.getMutex().unlock();
  EXPECT_EQ(tree.root->on->getMethodName(), "");
}

TEST(TransactionTest, SyncTransactionGroupsWritesAndCouplesOnceAtTheEnd) {
  Tree tree;
  std::vector<std::string> seenAtCouple;
  std::string method;
  tree.onCouple([&](ModelBase *, Transaction *transaction) {
    seenAtCouple = tree.events;
    method = transaction->getMethodName();
    EXPECT_EQ(transaction->getSetting(), tree.root->getContext().get());
  });
  {
    auto edit = tree.root->beginEdit(TransactionOption::Couple);
    EXPECT_NE(edit, Transaction::empty());
    tree.root->frequency->setValue(1.0);
    tree.root->on->setValue(true);
    EXPECT_TRUE(seenAtCouple.empty());
    EXPECT_EQ(tree.root->beginEdit(), Transaction::empty()); // nested: the shared empty one
  }
  EXPECT_EQ(seenAtCouple.size(), 6u);
  EXPECT_EQ(method, "");

  {
    auto edit = tree.root->beginEdit("setPair", std::string("a"), 7);
    EXPECT_EQ(edit->getMethodName(), "setPair");
    EXPECT_EQ(edit->getSettingAt(0)->toString(), "a");
    EXPECT_EQ(edit->getSettingAt(1)->getInt32(), 7);
    EXPECT_EQ(edit->getSettingAt(-1), nullptr);
    EXPECT_EQ(edit->getSettingAt(3), nullptr);
    EXPECT_THROW(edit->getSettingAt(2), std::out_of_range); // kept: the bound admits the count
  }
  EXPECT_EQ(method, "setPair");

  auto reset = tree.root->beginReset();
  EXPECT_EQ(reset->getMethodName(), "Reset");
  EXPECT_EQ(reset->getOption(), TransactionOption::Reset);
  reset.reset();
  auto recall = tree.root->beginRecall();
  EXPECT_EQ(recall->getMethodName(), "Recall");
  EXPECT_EQ(recall->getOption(), TransactionOption::Recall);
  recall.reset();

  int couples = 0;
  tree.onCouple([&](ModelBase *, Transaction *) { ++couples; });
  {
    auto quiet = tree.root->beginEdit(TransactionOption::NoCouple);
    tree.root->count->setValue(3);
  }
  EXPECT_EQ(couples, 0);
  EXPECT_EQ(tree.interceptor.getThreadId(), 0u);
}

TEST(TransactionTest, InactiveEditsGetTheSharedEmptyTransaction) {
  Source model;
  auto first = model.beginEdit();
  auto second = model.doBeginEdit("x");
  EXPECT_EQ(first, second);
  EXPECT_EQ(first, Transaction::empty());
  EXPECT_EQ(first->getInterceptor(), nullptr);
  EXPECT_EQ(first->getOption(), TransactionOption::NoCouple);
  EXPECT_EQ(first->getSetting()->getName(), "TransactionContext");
  EXPECT_EQ(model.beginEdit("m", 1), Transaction::empty());
  Transaction local(nullptr, nullptr);
  first->setParent(&local);
  EXPECT_EQ(first->getParent(), nullptr);
}

TEST(TransactionTest, CouplingsComeFromThePrototypeUnlessTheInstanceHasItsOwn) {
  Tree tree;
  int shared = 0, own = 0;
  auto prototype = Prototype::getInstance<Source>();
  prototype->setCouplings(std::make_shared<Couplings>([&](ModelBase *, Transaction *) { ++shared; }));
  tree.root->frequency->setValue(1.0);
  EXPECT_EQ(shared, 1);
  tree.onCouple([&](ModelBase *, Transaction *) { ++own; });
  tree.root->frequency->setValue(2.0);
  EXPECT_EQ(shared, 1);
  EXPECT_EQ(own, 1);
  prototype->setCouplings(nullptr);
  EXPECT_EQ(Couplings().toString(), "Couplings");
}

TEST(TransactionTest, PropagationEntersAnotherTreeOnceAndGuardsLoops) {
  Tree first, second;
  int secondCouples = 0;
  Transaction *parentSeen = nullptr;
  second.onCouple([&](ModelBase *, Transaction *transaction) {
    ++secondCouples;
    parentSeen = transaction->getParent();
    // Coming back to the first tree is refused by the loop guard.
    EXPECT_EQ(transaction->propagate(first.root, PropagationOption::PropagateAndCouple, TransactionOption::Couple),
              Transaction::empty());
  });
  first.onCouple([&](ModelBase *, Transaction *transaction) {
    EXPECT_EQ(transaction->propagate(first.root.get(), PropagationOption::PropagateOnly, TransactionOption::Couple),
              Transaction::empty());
    auto into = transaction->propagate(second.root, PropagationOption::PropagateWithOption, TransactionOption::Couple);
    second.root->period->setValue(first.root->frequency->getValue() * 2);
  });
  first.root->frequency->setValue(21.0);
  EXPECT_EQ(second.root->period->getValue(), 42.0);
  EXPECT_EQ(secondCouples, 1);
  EXPECT_NE(parentSeen, nullptr);

  // Option 1 couples the target at once; inside the target tree already,
  // beginEdit gives the empty transaction and that is what the coupling gets.
  Transaction *coupledWith = nullptr;
  second.onCouple([&](ModelBase *, Transaction *transaction) { coupledWith = transaction; });
  {
    auto edit = second.root->beginEdit(TransactionOption::NoCouple);
    Transaction outside(&first.interceptor, nullptr);
    auto result = outside.propagate(second.root, PropagationOption::PropagateAndCouple, TransactionOption::Couple);
    EXPECT_EQ(result, Transaction::empty());
    EXPECT_EQ(coupledWith, Transaction::empty().get());
  }
}

TEST(TransactionTest, InterceptorServicesAndEmptyInstance) {
  Interceptor tree;
  EXPECT_EQ(tree.toString(), "Interceptor");
  EXPECT_EQ(tree.getService("missing"), nullptr);
  auto service = std::make_shared<ServiceBase>();
  tree.addService("svc", service);
  EXPECT_EQ(tree.getService("svc"), service);
  tree.addService("svc", nullptr);
  EXPECT_EQ(tree.getService("svc"), nullptr);
  EXPECT_EQ(Interceptor::empty(), Interceptor::empty());
  EXPECT_EQ(Interceptor::empty()->getRoot(), nullptr);
  EXPECT_NE(Interceptor::currentThreadId(), 0u);
  std::uint32_t other = 0;
  std::thread([&] { other = Interceptor::currentThreadId(); }).join();
  EXPECT_NE(other, 0u);
  EXPECT_NE(other, Interceptor::currentThreadId());
}
