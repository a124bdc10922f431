#include "wavemill/models/ModelCollection.h"
#include "wavemill/models/Couplings.h"

#include <gtest/gtest.h>

using namespace Corvane::Wavemill;

namespace CollectionTests {

// Items of a list with a fixed layout of different classes.
struct CollPart : ModelBase {
  WAVEMILL_MODEL(CollPart)
  CollPart() : ModelBase("Tests::CollPart") {}
  std::shared_ptr<Int32Setting> level = init(std::make_shared<Int32Setting>("Level"));
};
struct CollPartA : CollPart {
  WAVEMILL_MODEL(CollPartA)
};
struct CollPartB : CollPart {
  WAVEMILL_MODEL(CollPartB)
};
using Parts = ModelCollection<CollPart>;

// A root holding a list of parts and a list of lists.
struct CollRoot : ModelBase {
  WAVEMILL_MODEL(CollRoot)
  CollRoot() : ModelBase("Tests::CollRoot") {}
  std::shared_ptr<SubSetting<Parts>> parts = init(std::make_shared<SubSetting<Parts>>("Parts"));
  std::shared_ptr<SubSetting<ModelCollection<Parts>>> nested =
      init(std::make_shared<SubSetting<ModelCollection<Parts>>>("Nested"));
};

template <class T = CollPart> std::shared_ptr<T> part(int level) {
  auto made = std::make_shared<T>();
  made->level->setValue(level);
  return made;
}

std::shared_ptr<Parts> list(std::initializer_list<std::shared_ptr<CollPart>> items) {
  auto made = std::make_shared<Parts>();
  for (const auto &item : items)
    made->add(item);
  return made;
}

std::vector<int> levels(const Parts &list) {
  std::vector<int> result;
  for (const auto &item : list.getItems())
    result.push_back(item->level->getValue());
  return result;
}

// An active tree whose couplings record each transaction's method, first
// argument and the list's count at that moment.
class ModelCollectionTest : public testing::Test {
protected:
  ModelCollectionTest() {
    root->activateSettings(&interceptor, nullptr);
    root->setCouplings(std::make_shared<Couplings>([this](ModelBase *, Transaction *t) {
      auto argument = t->getSettingAt(0);
      calls.push_back(t->getMethodName() + "(" + (argument ? argument->toString() : "") + ")#" +
                      std::to_string(parts->getCount()));
    }));
  }
  void expectKeysEqualIndices() {
    for (int i = 0; i < parts->getCount(); ++i)
      EXPECT_EQ(parts->getItem(i)->getThisKey(), std::to_string(i));
  }
  std::shared_ptr<CollRoot> root = std::make_shared<CollRoot>();
  Interceptor interceptor{root};
  std::shared_ptr<Parts> parts = root->parts->getValue();
  std::vector<std::string> calls;
};

} // namespace CollectionTests

using namespace CollectionTests;

TEST_F(ModelCollectionTest, ShapeChangesRunNamedTransactionsAndKeepKeysEqualToIndices) {
  parts->add();
  parts->add(part<CollPartA>(1));
  parts->add();
  EXPECT_EQ(parts->add(std::make_shared<CollRoot>()), nullptr); // not a part: refused without an edit
  EXPECT_EQ(calls, (std::vector<std::string>{"add()#1", "add(CollPartA)#2", "add()#3"}));
  expectKeysEqualIndices();
  EXPECT_EQ(parts->getItem(1)->makePath(), "Parts,1");
  EXPECT_EQ(parts->getItem(1)->getInterceptor(), &interceptor);

  calls.clear();
  auto first = parts->getItem(0);
  parts->removeAt(0);
  expectKeysEqualIndices();
  EXPECT_TRUE(first->getAllSettings().empty()); // a removed item is spent
  parts->removeAt(-1);
  parts->removeAt(2);
  EXPECT_EQ(parts->getCount(), 2);
  EXPECT_EQ(calls, (std::vector<std::string>{"removeAt(0)#2", "removeAt(-1)#2", "removeAt(2)#2"}));

  calls.clear();
  parts->resize(4);
  parts->resize(-1);
  parts->resize(1);
  EXPECT_EQ(calls, (std::vector<std::string>{"resize(4)#4", "resize(1)#1"}));
  EXPECT_EQ(levels(*parts), std::vector<int>{1});

  calls.clear();
  auto replacement = part<CollPartB>(7);
  auto old = parts->getItem(0);
  parts->setItem(0, replacement);
  parts->setItem(1, part<CollPartB>(8)); // outside the list
  parts->setItem(0, nullptr);
  EXPECT_TRUE(old->getAllSettings().empty());
  EXPECT_EQ(replacement->getThisKey(), "0");
  EXPECT_EQ(replacement->getInterceptor(), &interceptor);
  parts->clear(); // the coupling sees the old count
  EXPECT_EQ(calls, (std::vector<std::string>{"setItem()#1", "clear()#1"}));
  EXPECT_EQ(parts->getCount(), 0);
  EXPECT_EQ(parts->getCommonItem(0), nullptr);
}

TEST_F(ModelCollectionTest, InactiveCollectionChangesWithoutTransactionsOrBindingAndHasNoCouplings) {
  Parts inactive;
  auto item = inactive.add();
  inactive.resize(3);
  EXPECT_EQ(inactive.getCount(), 3);
  EXPECT_EQ(item->getThisKey(), ""); // no owner: no key
  EXPECT_EQ(std::static_pointer_cast<CollPart>(item)->getInterceptor(), nullptr);
  inactive.clear();
  EXPECT_EQ(inactive.getCount(), 0);
  inactive.setCouplings(std::make_shared<Couplings>());
  EXPECT_EQ(inactive.getCouplings(), nullptr);
}

TEST_F(ModelCollectionTest, TypeNamesWrapTheItemClassNames) {
  EXPECT_EQ(parts->getTypeName(), "ModelCollection`1[[CollPart]]");
  EXPECT_EQ(parts->getFullTypeName(), "Models.ModelCollection`1[[CollectionTests.CollPart]]");
  EXPECT_EQ(parts->toString(), parts->getTypeName());
  EXPECT_EQ(ModelCollection<Parts>().getTypeName(), "ModelCollection`1[[ModelCollection`1[[CollPart]]]]");
}

TEST_F(ModelCollectionTest, CopyOverwriteFollowsTheSourceButKeepsMismatchingSlots) {
  // The second item's class differs from the source's B: it keeps its data.
  auto target = list({part<CollPartA>(10), part<CollPartA>(20)});
  EXPECT_TRUE(target->copyFrom(list({part<CollPartA>(1), part<CollPartB>(2), part<CollPartA>(3)})));
  EXPECT_EQ(levels(*target), (std::vector<int>{1, 20, 3}));
  EXPECT_EQ(target->getItem(2)->getTypeName(), "CollPartA");
  EXPECT_TRUE(target->copyFrom(list({part<CollPartA>(5)})));
  EXPECT_EQ(levels(*target), std::vector<int>{5});

  // A fixed count neither grows nor shrinks the list.
  auto fixed = list({part(0), part(0)});
  fixed->setFixedCount(true);
  EXPECT_TRUE(fixed->copyFrom(list({part(1), part(2), part(3), part(4), part(5)})));
  EXPECT_EQ(levels(*fixed), (std::vector<int>{1, 2}));

  EXPECT_FALSE(target->copyFrom(nullptr));
  EXPECT_FALSE(target->copyFrom(target));
  EXPECT_FALSE(target->copyFrom(std::make_shared<ModelCollection<CollPartA>>()));
}

TEST_F(ModelCollectionTest, CopyExistingOnlyPairsItemsByClass) {
  auto copy = [](std::shared_ptr<Parts> from, std::shared_ptr<Parts> to) {
    to->setCopyExistingOnly(true);
    to->copyFrom(from);
    return levels(*to);
  };
  // [A, B] into [B, A]: each takes data of its own class.
  EXPECT_EQ(copy(list({part<CollPartA>(1), part<CollPartB>(2)}), list({part<CollPartB>(0), part<CollPartA>(0)})),
            (std::vector<int>{2, 1}));
  // [A] into [A, A, A]: item 0 pairs by position; the others find nothing left.
  EXPECT_EQ(copy(list({part<CollPartA>(1)}), list({part<CollPartA>(0), part<CollPartA>(0), part<CollPartA>(0)})),
            (std::vector<int>{1, 0, 0}));
  // [A1, A2, B1] into [B0, A0]: position 1 pairs A0 with A2, B0 takes B1, A1 stays unused.
  EXPECT_EQ(copy(list({part<CollPartA>(1), part<CollPartA>(2), part<CollPartB>(11)}),
                 list({part<CollPartB>(0), part<CollPartA>(0)})),
            (std::vector<int>{11, 2}));
  // An unpaired item takes every unused source item of its class: the last one wins.
  EXPECT_EQ(copy(list({part<CollPartB>(1), part<CollPartA>(2), part<CollPartA>(3)}), list({part<CollPartA>(0)})),
            std::vector<int>{3});
}

TEST_F(ModelCollectionTest, NestedCollectionsActivateCopyAndResetAsOneTree) {
  auto lists = root->nested->getValue();
  auto inner = std::static_pointer_cast<Parts>(lists->add());
  inner->add(part<CollPartA>(4));
  EXPECT_EQ(inner->getItem(0)->makePath(), "Nested,0,0");
  EXPECT_EQ(lists->getThisKey(), "Nested");

  auto copy = std::static_pointer_cast<CollRoot>(root->duplicate());
  ASSERT_EQ(copy->nested->getValue()->getCount(), 1);
  auto copiedInner = copy->nested->getValue()->getItem(0);
  EXPECT_EQ(levels(*copiedInner), std::vector<int>{4});
  EXPECT_TRUE(copy->equals(root));
  copiedInner->getItem(0)->level->setValue(5);
  EXPECT_FALSE(copy->equals(root));

  // Reset descends into every item and keeps the counts.
  inner->getItem(0)->level->setValue(9);
  calls.clear();
  root->reset();
  EXPECT_EQ(inner->getItem(0)->level->getValue(), 0);
  EXPECT_EQ(lists->getCount(), 1);
  EXPECT_EQ(calls, std::vector<std::string>{"Reset()#0"}); // one coupling for the whole tree
}

TEST_F(ModelCollectionTest, CouplingHandsTheChangeToEveryItem) {
  int coupled = 0;
  auto counting = std::make_shared<Couplings>([&](ModelBase *, Transaction *) { ++coupled; });
  auto items = list({part(0), part(0), part(0)});
  for (const auto &item : items->getItems())
    item->setCouplings(counting);
  Transaction transaction(nullptr, nullptr);
  items->couple(&transaction);
  EXPECT_EQ(coupled, 3);
}
