#include "support/TestModels.h"

#include <gtest/gtest.h>

using namespace Corvane::Wavemill;
using Testing::Source;
using Testing::Sources;

namespace CollectionTests {

// Items of two other classes, for lists with a layout of mixed classes.
struct SourceA : Source {
  WAVEMILL_MODEL(SourceA)
};
struct SourceB : Source {
  WAVEMILL_MODEL(SourceB)
};

// A root holding a list of sources and a list of lists.
struct Crate : ModelBase {
  WAVEMILL_MODEL(Crate)
  Crate() : ModelBase("Tests::Crate") {}
  std::shared_ptr<SubSetting<Sources>> parts = init(std::make_shared<SubSetting<Sources>>("Parts"));
  std::shared_ptr<SubSetting<ModelCollection<Sources>>> nested =
      init(std::make_shared<SubSetting<ModelCollection<Sources>>>("Nested"));
};

template <class T = Source> std::shared_ptr<T> part(int count) {
  auto made = std::make_shared<T>();
  made->count->setValue(count);
  return made;
}

std::shared_ptr<Sources> list(std::initializer_list<std::shared_ptr<Source>> items) {
  auto made = std::make_shared<Sources>();
  for (const auto &item : items)
    made->add(item);
  return made;
}

std::vector<int> counts(const Sources &list) {
  std::vector<int> result;
  for (const auto &item : list.getItems())
    result.push_back(item->count->getValue());
  return result;
}

// A live tree whose couplings record each transaction's method, first
// argument and the list's count at that moment.
class ModelCollectionTest : public testing::Test, public Testing::LiveTree<Crate> {
protected:
  ModelCollectionTest() {
    root->setCouplings(std::make_shared<Couplings>([this](ModelBase *, Transaction *t) {
      auto argument = t->getSettingAt(0);
      calls.push_back(t->getMethodName() + "(" + (argument ? argument->toString() : "") + ")#" +
                      std::to_string(parts->getCount()));
    }));
  }
  std::shared_ptr<Sources> parts = root->parts->getValue();
  std::vector<std::string> calls;
};

} // namespace CollectionTests

using namespace CollectionTests;

TEST_F(ModelCollectionTest, ShapeChangesRunNamedTransactionsAndKeepKeysEqualToIndices) {
  parts->add();
  parts->add(part<SourceA>(1));
  parts->add();
  EXPECT_EQ(parts->add(std::make_shared<Crate>()), nullptr); // not a Source: refused without an edit

  auto first = parts->getItem(0);
  parts->removeAt(0);
  EXPECT_EQ(parts->getItem(1)->getThisKey(), "1"); // renumbered
  EXPECT_TRUE(first->getAllSettings().empty());    // a removed item is spent
  parts->removeAt(-1);
  parts->removeAt(2);
  parts->resize(4);
  parts->resize(-1);
  parts->resize(1);
  EXPECT_EQ(counts(*parts), std::vector<int>{1});

  auto replacement = part<SourceB>(7);
  auto old = parts->getItem(0);
  parts->setItem(0, replacement);
  parts->setItem(1, part<SourceB>(8)); // outside the list
  parts->setItem(0, nullptr);
  EXPECT_TRUE(old->getAllSettings().empty());
  EXPECT_EQ(replacement->getThisKey(), "0");
  parts->clear(); // the coupling sees the old count
  EXPECT_EQ(calls,
            (std::vector<std::string>{"add()#1", "add(SourceA)#2", "add()#3", "removeAt(0)#2", "removeAt(-1)#2",
                                      "removeAt(2)#2", "resize(4)#4", "resize(1)#1", "setItem()#1", "clear()#1"}));
  EXPECT_EQ(parts->getCount(), 0);
  EXPECT_EQ(parts->getCommonItem(0), nullptr);
}

TEST_F(ModelCollectionTest, CopyOverwriteFollowsTheSourceButKeepsMismatchingSlots) {
  // The second item's class differs from the source's B: it keeps its data.
  auto target = list({part<SourceA>(10), part<SourceA>(20)});
  EXPECT_TRUE(target->copyFrom(list({part<SourceA>(1), part<SourceB>(2), part<SourceA>(3)})));
  EXPECT_EQ(counts(*target), (std::vector<int>{1, 20, 3}));
  EXPECT_TRUE(target->copyFrom(list({part<SourceA>(5)})));
  EXPECT_EQ(counts(*target), std::vector<int>{5});

  // A fixed count neither grows nor shrinks the list.
  auto fixed = list({part(0), part(0)});
  fixed->setFixedCount(true);
  EXPECT_TRUE(fixed->copyFrom(list({part(1), part(2), part(3)})));
  EXPECT_EQ(counts(*fixed), (std::vector<int>{1, 2}));
  EXPECT_TRUE(fixed->copyFrom(list({part(4)})));
  EXPECT_EQ(counts(*fixed), (std::vector<int>{4, 2}));

  EXPECT_FALSE(target->copyFrom(nullptr));
  EXPECT_FALSE(target->copyFrom(target));
  EXPECT_FALSE(target->copyFrom(std::make_shared<ModelCollection<SourceA>>()));
}

// Item 0 pairs with A1 by position, item 2 with A3; item 1 meets B2 there,
// passes over the used A1 and A3 and takes every other unused A: A5 last.
TEST_F(ModelCollectionTest, CopyExistingOnlyPairsItemsByClass) {
  auto target = list({part<SourceA>(0), part<SourceA>(0), part<SourceA>(0)});
  target->setCopyExistingOnly(true);
  EXPECT_TRUE(target->copyFrom(
      list({part<SourceA>(1), part<SourceB>(2), part<SourceA>(3), part<SourceA>(4), part<SourceA>(5)})));
  EXPECT_EQ(counts(*target), (std::vector<int>{1, 5, 3}));
}

TEST_F(ModelCollectionTest, NestedCollectionsActivateCopyAndResetAsOneTree) {
  auto lists = root->nested->getValue();
  auto inner = std::static_pointer_cast<Sources>(lists->add());
  inner->add(part<SourceA>(4));
  EXPECT_EQ(inner->getItem(0)->makePath(), "Nested,0,0");

  auto copy = std::static_pointer_cast<Crate>(root->duplicate());
  ASSERT_EQ(copy->nested->getValue()->getCount(), 1);
  auto copiedInner = copy->nested->getValue()->getItem(0);
  EXPECT_EQ(counts(*copiedInner), std::vector<int>{4});
  EXPECT_TRUE(copy->equals(root));
  copiedInner->getItem(0)->count->setValue(5);
  EXPECT_FALSE(copy->equals(root));

  // Reset descends into every item and keeps the counts.
  inner->getItem(0)->count->setValue(9);
  calls.clear();
  root->reset();
  EXPECT_EQ(inner->getItem(0)->count->getValue(), 3);
  EXPECT_EQ(lists->getCount(), 1);
  EXPECT_EQ(calls, std::vector<std::string>{"Reset()#0"}); // one coupling for the whole tree
}
