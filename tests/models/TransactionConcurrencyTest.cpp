#include "wavemill/models/Couplings.h"
#include "wavemill/models/Int32Setting.h"
#include "wavemill/models/Int64Setting.h"
#include "wavemill/models/Interceptor.h"
#include "wavemill/models/ModelBase.h"

#include <gtest/gtest.h>

#include <atomic>
#include <memory>
#include <thread>
#include <vector>

using namespace Corvane::Wavemill;

namespace {

class Counters : public ModelBase {
public:
  Counters() : ModelBase("Tests::Counters") {}
  std::shared_ptr<Int32Setting> a = init(std::make_shared<Int32Setting>("A"));
  std::shared_ptr<Int32Setting> b = init(std::make_shared<Int32Setting>("B"));
  std::shared_ptr<Int64Setting> sum = init(std::make_shared<Int64Setting>("Sum"));
  std::shared_ptr<Int64Setting> couples = init(std::make_shared<Int64Setting>("Couples"));
};

} // namespace

// Several threads write one tree at once while observers and a coupling
// run. Writers are serial, so every outermost write couples exactly once
// and the coupling always sees a consistent tree.
TEST(TransactionConcurrencyTest, WritersAreSerialAndEachOutermostWriteCouplesOnce) {
  constexpr int threads = 4;
  constexpr int writesPerThread = 500;
  auto root = std::make_shared<Counters>();
  Interceptor tree(root);
  root->activateSettings(&tree, nullptr);

  std::atomic<int> notifications{0};
  auto observed = root->a->getSubject().get_observable().subscribe([&](const SettingChange &) { ++notifications; });
  auto published = tree.getSubject().get_observable().subscribe([&](ISetting *) { ++notifications; });
  root->setCouplings(std::make_shared<Couplings>([](ModelBase *model, Transaction *) {
    auto &self = static_cast<Counters &>(*model);
    self.couples->setValue(self.couples->getValue() + 1);
    self.sum->setValue(std::int64_t{self.a->getValue()} + self.b->getValue());
  }));

  std::vector<std::thread> writers;
  for (int t = 0; t < threads; ++t) {
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
  }
  for (auto &writer : writers)
    writer.join();
  observed.unsubscribe();
  published.unsubscribe();

  EXPECT_EQ(root->couples->getValue(), threads * writesPerThread);
  EXPECT_EQ(root->b->getValue(), threads / 2 * writesPerThread);
  EXPECT_EQ(root->sum->getValue(), std::int64_t{root->a->getValue()} + root->b->getValue());
  EXPECT_EQ(tree.getThreadId(), 0u);
  EXPECT_GT(notifications.load(), 0);
}
