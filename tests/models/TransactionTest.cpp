#include "support/TestModels.h"
#include "wavemill/services/ServiceBase.h"

#include <gtest/gtest.h>

using namespace Corvane::Wavemill;
using Testing::Source;

namespace {

using Events = std::vector<std::string>;

// A live Source whose owner calls, setting notifications and tree
// notifications all land in one log.
struct Tree : Testing::LiveTree<Source> {
  Tree() {
    notes.watch(*root);
    notes.watch(interceptor);
  }
  Events &events = root->events;
  Testing::Notifications notes{events};
};

class TransactionTest : public testing::Test, public Tree {
protected:
  // Counts the couplings of the root and keeps the last method name.
  void countCouples() {
    root->onCouple([this](ModelBase *, Transaction *transaction) {
      ++couples;
      method = transaction->getMethodName();
    });
  }
  int couples = 0;
  std::string method;
};

} // namespace

TEST_F(TransactionTest, AWriteNotifiesOwnerSettingAndTreeThenCouplesOnceAndCouplingWritesAreNested) {
  root->onCouple([&](ModelBase *, Transaction *transaction) {
    events.push_back("couple");
    EXPECT_EQ(transaction->getSetting(), root->frequency.get());
  });
  root->frequency->setValue(1e6);
  EXPECT_EQ(events, (Events{"owner:Frequency", "setting:Frequency", "tree:Frequency", "couple"}));
  EXPECT_EQ(root->frequency->getMethodName(), "Frequency"); // no transaction: the setting's name

  // An equal value still runs a transaction and the couplings, silently.
  events.clear();
  root->frequency->setValue(1e6);
  EXPECT_EQ(events, Events{"couple"});

  // Writes of the coupling are nested: they notify but never couple again,
  // not even a write of the setting that started the change.
  events.clear();
  root->onCouple([&](ModelBase *, Transaction *) {
    ++couples;
    root->level->setValue(root->frequency->getValue() / 1e3);
    root->frequency->setValue(root->frequency->getValue());
  });
  root->frequency->setValue(4e3);
  EXPECT_EQ(couples, 1);
  EXPECT_EQ(root->level->getValue(), 4.0);
  EXPECT_EQ(events, (Events{"owner:Frequency", "setting:Frequency", "tree:Frequency", "owner:Level", "setting:Level",
                            "tree:Level"}));
}

TEST_F(TransactionTest, ReadOnlyWriteKeepsValueAndLeavesTheThreadInside) {
  countCouples();
  root->count->setReadOnly(true);
  events.clear();
  root->count->setValue(5);
  EXPECT_EQ(root->count->getValue(), 3);
  EXPECT_TRUE(events.empty());
  EXPECT_EQ(couples, 0);
  EXPECT_EQ(interceptor.getThreadId(), Interceptor::currentThreadId());
  ASSERT_NE(interceptor.getCurrentTransaction(), nullptr);
  EXPECT_EQ(root->frequency->getMethodName(), ""); // the left-behind transaction is still readable
}

TEST_F(TransactionTest, CouplingFailureIsSwallowedInWritesAndEdits) {
  auto &lock = interceptor.getMutex();
  root->onCouple([](ModelBase *, Transaction *) { throw std::runtime_error("coupling"); });
  EXPECT_NO_THROW(root->frequency->setValue(5e3));
  EXPECT_EQ(root->frequency->getValue(), 5e3);
  EXPECT_EQ(interceptor.getThreadId(), 0u);
  {
    auto edit = root->beginEdit();
    root->frequency->setValue(6e3);
  } // the coupling throws inside the destructor: swallowed
  EXPECT_EQ(interceptor.getThreadId(), 0u);
  EXPECT_TRUE(lock.try_lock());
  lock.unlock();
}

TEST_F(TransactionTest, SyncTransactionGroupsWritesAndCouplesOnceAtTheEnd) {
  root->onCouple([&](ModelBase *, Transaction *transaction) {
    ++couples;
    method = transaction->getMethodName();
    EXPECT_EQ(transaction->getSetting(), root->getContext().get());
  });
  {
    auto edit = root->beginEdit(TransactionOption::Couple);
    root->frequency->setValue(1e3);
    root->on->setValue(true);
    EXPECT_EQ(couples, 0);
    EXPECT_EQ(root->beginEdit(), Transaction::empty()); // nested: the shared empty one
  }
  EXPECT_EQ(couples, 1);

  {
    auto edit = root->beginEdit("setPair", std::string("a"), 7);
    EXPECT_EQ(edit->getMethodName(), "setPair");
    EXPECT_EQ(edit->getSettingAt(0)->toString(), "a");
    EXPECT_EQ(edit->getSettingAt(-1), nullptr);
    EXPECT_THROW(edit->getSettingAt(2), std::out_of_range); // kept: the bound admits the count
  }
  EXPECT_EQ(method, "setPair");
  EXPECT_EQ(root->beginRecall()->getOption(), TransactionOption::Recall);

  couples = 0;
  {
    auto quiet = root->beginEdit(TransactionOption::NoCouple);
    root->count->setValue(4);
  }
  EXPECT_EQ(couples, 0);
  EXPECT_EQ(interceptor.getThreadId(), 0u);
}

// A reset and a recall of an inactive model must leave the shared empty
// transaction's option alone.
TEST_F(TransactionTest, InactiveEditsGetTheSharedEmptyTransactionAndLeaveItUnchanged) {
  Source model;
  model.reset();
  EXPECT_EQ(model.beginRecall(), Transaction::empty());
  EXPECT_EQ(model.beginEdit(), Transaction::empty());
  EXPECT_EQ(Transaction::empty()->getOption(), TransactionOption::NoCouple);
  Transaction local(nullptr, nullptr);
  Transaction::empty()->setParent(&local);
  EXPECT_EQ(Transaction::empty()->getParent(), nullptr);
}

TEST_F(TransactionTest, CouplingsComeFromThePrototypeUnlessTheInstanceHasItsOwn) {
  int shared = 0;
  auto prototype = Prototype::getInstance<Source>();
  prototype->onCouple([&](ModelBase *, Transaction *) { ++shared; });
  root->frequency->setValue(1e3);
  countCouples();
  root->frequency->setValue(2e3);
  prototype->setCouplings(nullptr);
  EXPECT_EQ(shared, 1);
  EXPECT_EQ(couples, 1);
}

TEST_F(TransactionTest, PropagationEntersAnotherTreeOnceAndGuardsLoops) {
  Tree second;
  int secondCouples = 0;
  second.root->onCouple([&](ModelBase *, Transaction *transaction) {
    ++secondCouples;
    EXPECT_NE(transaction->getParent(), nullptr);
    // Coming back to the first tree is refused by the loop guard.
    EXPECT_EQ(transaction->propagate(root, PropagationOption::PropagateAndCouple, TransactionOption::Couple),
              Transaction::empty());
  });
  root->onCouple([&](ModelBase *, Transaction *transaction) {
    EXPECT_EQ(transaction->propagate(root.get(), PropagationOption::PropagateOnly, TransactionOption::Couple),
              Transaction::empty());
    auto into = transaction->propagate(second.root, PropagationOption::PropagateWithOption, TransactionOption::Couple);
    second.root->count->setValue(static_cast<int>(root->frequency->getValue() / 500));
  });
  root->frequency->setValue(21e3);
  EXPECT_EQ(second.root->count->getValue(), 42);
  EXPECT_EQ(secondCouples, 1);

  // PropagateAndCouple couples the target at once; inside the target tree
  // already, beginEdit gives the empty transaction and the coupling gets it.
  Transaction *coupledWith = nullptr;
  second.root->onCouple([&](ModelBase *, Transaction *transaction) { coupledWith = transaction; });
  auto edit = second.root->beginEdit(TransactionOption::NoCouple);
  Transaction outside(&interceptor, nullptr);
  EXPECT_EQ(outside.propagate(second.root, PropagationOption::PropagateAndCouple, TransactionOption::Couple),
            Transaction::empty());
  EXPECT_EQ(coupledWith, Transaction::empty().get());
}

TEST_F(TransactionTest, InterceptorKeepsServices) {
  auto service = std::make_shared<ServiceBase>();
  interceptor.addService("svc", service);
  EXPECT_EQ(interceptor.getService("svc"), service);
}
