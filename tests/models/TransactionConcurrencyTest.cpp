#include "support/TestModels.h"

#include <gtest/gtest.h>

#include <atomic>
#include <thread>

using namespace Corvane::Wavemill;

namespace {

struct Counters : ModelBase {
  std::shared_ptr<Int32Setting> a = init(std::make_shared<Int32Setting>("A"));
  std::shared_ptr<Int32Setting> b = init(std::make_shared<Int32Setting>("B"));
  std::shared_ptr<Int64Setting> sum = init(std::make_shared<Int64Setting>("Sum"));
};

} // namespace

// Several threads write one tree at once while observers and a coupling
// run. Writers are serial, so every outermost write couples exactly once
// and the coupling always sees a consistent tree.
TEST(TransactionConcurrencyTest, WritersAreSerialAndEachOutermostWriteCouplesOnce) {
  constexpr int threads = 4, writesPerThread = 500;
  Testing::LiveTree<Counters> live;
  auto &root = live.root;
  auto &tree = live.interceptor;
  std::atomic<int> notifications{0};
  int couples = 0; // written only inside the lock
  auto observed = root->a->getSubject().get_observable().subscribe([&](const SettingChange &) { ++notifications; });
  auto published = tree.getSubject().get_observable().subscribe([&](ISetting *) { ++notifications; });
  root->setCouplings(std::make_shared<Couplings>([&](ModelBase *, Transaction *) {
    ++couples;
    root->sum->setValue(std::int64_t{root->a->getValue()} + root->b->getValue());
  }));

  std::vector<std::thread> writers;
  for (int t = 0; t < threads; ++t)
    writers.emplace_back([&, t] {
      for (int i = 0; i < writesPerThread; ++i) {
        if (t % 2 == 0) {
          root->a->setValue(t * writesPerThread + i + 1); // values read only inside the lock
        } else {
          auto edit = root->beginEdit();
          root->b->setValue(root->b->getValue() + 1); // read inside the lock: exact
          root->a->setValue(root->a->getValue());
        }
      }
    });
  for (auto &writer : writers)
    writer.join();
  EXPECT_EQ(couples, threads * writesPerThread);
  EXPECT_EQ(root->b->getValue(), threads / 2 * writesPerThread);
  EXPECT_EQ(root->sum->getValue(), std::int64_t{root->a->getValue()} + root->b->getValue());
  EXPECT_EQ(tree.getThreadId(), 0u);
  EXPECT_GT(notifications.load(), 0);
}
