#include "wavemill/models/Couplings.h"
#include "wavemill/models/Int32Setting.h"
#include "wavemill/models/Interceptor.h"
#include "wavemill/models/ModelCollection.h"
#include "wavemill/models/SubSetting.h"

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <thread>
#include <vector>

using namespace Corvane::Wavemill;

namespace CollectionConcurrencyTests {

class Slot : public ModelBase {
public:
  WAVEMILL_MODEL(Slot)
  Slot() : ModelBase("Tests::Slot") {}
  std::shared_ptr<Int32Setting> value = init(std::make_shared<Int32Setting>("Value"));
};

class Board : public ModelBase {
public:
  WAVEMILL_MODEL(Board)
  Board() : ModelBase("Tests::Board") {}
  std::shared_ptr<SubSetting<ModelCollection<Slot>>> slots =
      init(std::make_shared<SubSetting<ModelCollection<Slot>>>("Slots"));
  std::shared_ptr<Int32Setting> total = init(std::make_shared<Int32Setting>("Total"));
  std::shared_ptr<Int32Setting> count = init(std::make_shared<Int32Setting>("Count"));
};

} // namespace CollectionConcurrencyTests

using namespace CollectionConcurrencyTests;

// Threads add, write and remove items of one collection at once. The shape
// changes only under the tree's lock, so the coupling always sees keys equal
// to indices and a count that matches the list.
TEST(ModelCollectionConcurrencyTest, AddRemoveAndWritesFromSeveralThreadsStaySerial) {
  constexpr int threads = 4;
  constexpr int rounds = 200;
  auto board = std::make_shared<Board>();
  Interceptor tree(board);
  board->activateSettings(&tree, nullptr);
  auto slots = board->slots->getValue();
  int badKeys = 0;
  board->setCouplings(std::make_shared<Couplings>([&badKeys](ModelBase *model, Transaction *) {
    auto &self = static_cast<Board &>(*model);
    auto list = self.slots->getValue();
    int sum = 0;
    for (int i = 0; i < list->getCount(); ++i) {
      sum += list->getItem(i)->value->getValue();
      badKeys += list->getItem(i)->getThisKey() != std::to_string(i);
    }
    self.total->setValue(sum);
    self.count->setValue(list->getCount());
  }));

  std::vector<std::thread> workers;
  for (int t = 0; t < threads; ++t) {
    workers.emplace_back([&] {
      for (int i = 0; i < rounds; ++i) {
        auto edit = board->beginEdit();
        auto item = std::static_pointer_cast<Slot>(slots->add());
        item->value->setValue(1);
      }
      for (int i = 0; i < rounds / 2; ++i)
        slots->removeAt(0);
    });
  }
  for (auto &worker : workers)
    worker.join();

  EXPECT_EQ(slots->getCount(), threads * rounds / 2);
  EXPECT_EQ(board->count->getValue(), slots->getCount());
  EXPECT_EQ(board->total->getValue(), slots->getCount());
  EXPECT_EQ(badKeys, 0);
}
