#include "support/TestModels.h"

#include <gtest/gtest.h>

#include <thread>

using namespace Corvane::Wavemill;

namespace CollectionConcurrencyTests {

struct Slot : ModelBase {
  std::shared_ptr<Int32Setting> value = init(std::make_shared<Int32Setting>("Value"));
};

struct Board : ModelBase {
  std::shared_ptr<SubSetting<ModelCollection<Slot>>> slots =
      init(std::make_shared<SubSetting<ModelCollection<Slot>>>("Slots"));
  std::shared_ptr<Int32Setting> total = init(std::make_shared<Int32Setting>("Total"));
};

} // namespace CollectionConcurrencyTests

using namespace CollectionConcurrencyTests;

// Threads add, write and remove items of one collection at once. The shape
// changes only under the tree's lock, so the coupling always sees keys equal
// to indices, and the last one sees every item (each holds 1).
TEST(ModelCollectionConcurrencyTest, AddRemoveAndWritesFromSeveralThreadsStaySerial) {
  constexpr int threads = 4, rounds = 200;
  Testing::LiveTree<Board> tree;
  auto &board = tree.root;
  auto slots = board->slots->getValue();
  int badKeys = 0;
  board->setCouplings(std::make_shared<Couplings>([&](ModelBase *, Transaction *) {
    int sum = 0;
    for (int i = 0; i < slots->getCount(); ++i) {
      sum += slots->getItem(i)->value->getValue();
      badKeys += slots->getItem(i)->getThisKey() != std::to_string(i);
    }
    board->total->setValue(sum);
  }));

  std::vector<std::thread> workers;
  for (int t = 0; t < threads; ++t)
    workers.emplace_back([&] {
      for (int i = 0; i < rounds; ++i) {
        auto edit = board->beginEdit();
        std::static_pointer_cast<Slot>(slots->add())->value->setValue(1);
      }
      for (int i = 0; i < rounds / 2; ++i)
        slots->removeAt(0);
    });
  for (auto &worker : workers)
    worker.join();
  EXPECT_EQ(slots->getCount(), threads * rounds / 2);
  EXPECT_EQ(board->total->getValue(), slots->getCount());
  EXPECT_EQ(badKeys, 0);
}
