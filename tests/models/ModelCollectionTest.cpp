#include "wavemill/models/ModelCollection.h"
#include "wavemill/models/Couplings.h"
#include "wavemill/models/DoubleSetting.h"
#include "wavemill/models/Int32Setting.h"
#include "wavemill/models/Interceptor.h"
#include "wavemill/models/StringSetting.h"
#include "wavemill/models/SubSetting.h"

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

using namespace Corvane::Wavemill;

namespace CollectionTests {

// Items of a list with a fixed layout of different classes.
class CollPart : public ModelBase {
public:
  WAVEMILL_MODEL(CollPart)
  CollPart() : ModelBase("Tests::CollPart") {}
  std::shared_ptr<Int32Setting> level = init(std::make_shared<Int32Setting>("Level"));
};

class CollPartA : public CollPart {
public:
  WAVEMILL_MODEL(CollPartA)
};

class CollPartB : public CollPart {
public:
  WAVEMILL_MODEL(CollPartB)
};

} // namespace CollectionTests

using namespace CollectionTests;
using Parts = ModelCollection<CollPart>;

namespace {

// A root holding a list of parts and a list of lists.
class CollRoot : public ModelBase {
public:
  WAVEMILL_MODEL(CollRoot)
  CollRoot() : ModelBase("Tests::CollRoot") {}
  std::shared_ptr<SubSetting<Parts>> parts = init(std::make_shared<SubSetting<Parts>>("Parts"));
  std::shared_ptr<SubSetting<ModelCollection<Parts>>> nested =
      init(std::make_shared<SubSetting<ModelCollection<Parts>>>("Nested"));
};

// An active tree whose couplings record each transaction's method, first
// argument and the list's count at that moment.
struct Tree {
  Tree() : root(std::make_shared<CollRoot>()), interceptor(root) {
    root->activateSettings(&interceptor, nullptr);
    root->setCouplings(std::make_shared<Couplings>([this](ModelBase *, Transaction *t) {
      auto argument = t->getSettingAt(0);
      calls.push_back(t->getMethodName() + "(" + (argument ? argument->toString() : "") + ")#" +
                      std::to_string(parts()->getCount()));
    }));
  }
  std::shared_ptr<Parts> parts() const { return root->parts->getValue(); }
  std::vector<std::string> keys() const {
    std::vector<std::string> result;
    for (const auto &item : parts()->getItems())
      result.push_back(item->getThisKey());
    return result;
  }

  std::shared_ptr<CollRoot> root;
  Interceptor interceptor;
  std::vector<std::string> calls;
};

template <class T> std::shared_ptr<T> part(int level) {
  auto made = std::make_shared<T>();
  made->level->setValue(level);
  return made;
}

std::vector<int> levels(const Parts &list) {
  std::vector<int> result;
  for (const auto &item : list.getItems())
    result.push_back(item->level->getValue());
  return result;
}

} // namespace

TEST(ModelCollectionTest, ShapeChangesRunNamedTransactionsAndKeepKeysEqualToIndices) {
  Tree tree;
  auto list = tree.parts();
  list->add();
  list->add(part<CollPartA>(1));
  list->add();
  EXPECT_EQ(list->add(std::make_shared<CollRoot>()), nullptr); // not a part: refused without an edit
  EXPECT_EQ(tree.calls, (std::vector<std::string>{"add()#1", "add(CollPartA)#2", "add()#3"}));
  EXPECT_EQ(tree.keys(), (std::vector<std::string>{"0", "1", "2"}));
  EXPECT_EQ(list->getItem(1)->makePath(), "Parts,1");
  EXPECT_EQ(list->getItem(1)->getInterceptor(), &tree.interceptor);

  tree.calls.clear();
  auto first = list->getItem(0);
  list->removeAt(0);
  EXPECT_EQ(tree.keys(), (std::vector<std::string>{"0", "1"}));
  EXPECT_TRUE(first->getAllSettings().empty()); // a removed item is spent
  list->removeAt(-1);
  list->removeAt(2);
  EXPECT_EQ(list->getCount(), 2);
  EXPECT_EQ(tree.calls, (std::vector<std::string>{"removeAt(0)#2", "removeAt(-1)#2", "removeAt(2)#2"}));

  tree.calls.clear();
  list->resize(4);
  list->resize(-1);
  list->resize(1);
  EXPECT_EQ(tree.calls, (std::vector<std::string>{"resize(4)#4", "resize(1)#1"}));
  EXPECT_EQ(levels(*list), std::vector<int>{1});

  tree.calls.clear();
  auto replacement = part<CollPartB>(7);
  auto old = list->getItem(0);
  list->setItem(0, replacement);
  list->setItem(1, part<CollPartB>(8)); // outside the list
  list->setItem(0, nullptr);
  EXPECT_TRUE(old->getAllSettings().empty());
  EXPECT_EQ(replacement->getThisKey(), "0");
  EXPECT_EQ(replacement->getInterceptor(), &tree.interceptor);

  list->clear(); // the coupling sees the old count
  EXPECT_EQ(tree.calls, (std::vector<std::string>{"setItem()#1", "clear()#1"}));
  EXPECT_EQ(list->getCount(), 0);
  EXPECT_EQ(list->getCommonItem(0), nullptr);
}

TEST(ModelCollectionTest, InactiveCollectionChangesWithoutTransactionsOrBinding) {
  Parts list;
  auto item = std::static_pointer_cast<CollPart>(list.add());
  list.resize(3);
  EXPECT_EQ(list.getCount(), 3);
  EXPECT_EQ(item->getInterceptor(), nullptr);
  EXPECT_EQ(item->getThisKey(), ""); // no owner: no key
  list.clear();
  EXPECT_EQ(list.getCount(), 0);
  list.setCouplings(std::make_shared<Couplings>());
  EXPECT_EQ(list.getCouplings(), nullptr);
  EXPECT_TRUE(list.isCollection());
  EXPECT_EQ(list.getItemPrototype(), Prototype::getInstance<CollPart>());
}

TEST(ModelCollectionTest, TypeNamesWrapTheItemClassNames) {
  Parts list;
  EXPECT_EQ(list.getTypeName(), "ModelCollection`1[[CollPart]]");
  EXPECT_EQ(list.getFullTypeName(), "Models.ModelCollection`1[[CollectionTests.CollPart]]");
  EXPECT_EQ(list.toString(), list.getTypeName());
  EXPECT_EQ(ModelCollection<Parts>().getTypeName(), "ModelCollection`1[[ModelCollection`1[[CollPart]]]]");
}

TEST(ModelCollectionTest, CopyOverwriteFollowsTheSourceButKeepsMismatchingSlots) {
  Parts source, target;
  source.add(part<CollPartA>(1));
  source.add(part<CollPartB>(2));
  source.add(part<CollPartA>(3));
  target.add(part<CollPartA>(10));
  target.add(part<CollPartA>(20)); // class differs from the source's B: keeps its data

  EXPECT_TRUE(target.copyFrom(std::shared_ptr<IModel>(&source, [](IModel *) {})));
  EXPECT_EQ(levels(target), (std::vector<int>{1, 20, 3}));
  EXPECT_EQ(target.getItem(2)->getTypeName(), "CollPartA");

  Parts shorter;
  shorter.add(part<CollPartA>(5));
  EXPECT_TRUE(target.copyFrom(std::shared_ptr<IModel>(&shorter, [](IModel *) {})));
  EXPECT_EQ(levels(target), std::vector<int>{5});

  // A fixed count neither grows nor shrinks the list.
  Parts fixed, five;
  fixed.setFixedCount(true);
  fixed.add(part<CollPartA>(0));
  fixed.add(part<CollPartA>(0));
  for (int i = 1; i <= 5; ++i)
    five.add(part<CollPartA>(i));
  EXPECT_TRUE(fixed.copyFrom(std::shared_ptr<IModel>(&five, [](IModel *) {})));
  EXPECT_EQ(levels(fixed), (std::vector<int>{1, 2}));

  EXPECT_FALSE(target.copyFrom(nullptr));
  EXPECT_FALSE(target.copyFrom(std::shared_ptr<IModel>(&target, [](IModel *) {})));
  EXPECT_FALSE(target.copyFrom(std::make_shared<ModelCollection<CollPartA>>()));
}

TEST(ModelCollectionTest, CopyExistingOnlyPairsItemsByClass) {
  auto copy = [](const std::vector<std::shared_ptr<CollPart>> &from, const std::vector<std::shared_ptr<CollPart>> &to) {
    Parts source, target;
    for (const auto &item : from)
      source.add(item);
    for (const auto &item : to)
      target.add(item);
    target.setCopyExistingOnly(true);
    target.copyFrom(std::shared_ptr<IModel>(&source, [](IModel *) {}));
    return levels(target);
  };
  // [A, B] into [B, A]: each takes data of its own class.
  EXPECT_EQ(copy({part<CollPartA>(1), part<CollPartB>(2)}, {part<CollPartB>(0), part<CollPartA>(0)}),
            (std::vector<int>{2, 1}));
  // [A] into [A, A, A]: item 0 pairs by position; the others find nothing left.
  EXPECT_EQ(copy({part<CollPartA>(1)}, {part<CollPartA>(0), part<CollPartA>(0), part<CollPartA>(0)}),
            (std::vector<int>{1, 0, 0}));
  // [A1, A2, B1] into [B0, A0]: position 1 pairs A0 with A2, B0 takes B1, A1 stays unused.
  EXPECT_EQ(
      copy({part<CollPartA>(1), part<CollPartA>(2), part<CollPartB>(11)}, {part<CollPartB>(0), part<CollPartA>(0)}),
      (std::vector<int>{11, 2}));
  // An unpaired item takes every unused source item of its class: the last one wins.
  EXPECT_EQ(copy({part<CollPartB>(1), part<CollPartA>(2), part<CollPartA>(3)}, {part<CollPartA>(0)}),
            std::vector<int>{3});
}

TEST(ModelCollectionTest, NestedCollectionsActivateAndCopyAsOneTree) {
  Tree tree;
  auto lists = tree.root->nested->getValue();
  auto inner = std::static_pointer_cast<Parts>(lists->add());
  inner->add(part<CollPartA>(4));
  EXPECT_EQ(inner->getItem(0)->makePath(), "Nested,0,0");
  EXPECT_EQ(lists->getThisKey(), "Nested");

  auto copy = std::static_pointer_cast<CollRoot>(tree.root->duplicate());
  ASSERT_EQ(copy->nested->getValue()->getCount(), 1);
  auto copiedInner = copy->nested->getValue()->getItem(0);
  EXPECT_EQ(levels(*copiedInner), std::vector<int>{4});
  EXPECT_TRUE(copy->equals(tree.root));
  copiedInner->getItem(0)->level->setValue(5);
  EXPECT_FALSE(copy->equals(tree.root));

  // Reset descends into every item and keeps the counts.
  inner->getItem(0)->level->setValue(9);
  tree.calls.clear();
  tree.root->reset();
  EXPECT_EQ(inner->getItem(0)->level->getValue(), 0);
  EXPECT_EQ(lists->getCount(), 1);
  EXPECT_EQ(tree.calls, std::vector<std::string>{"Reset()#0"}); // one coupling for the whole tree
}

TEST(ModelCollectionTest, CouplingHandsTheChangeToEveryItem) {
  Parts list;
  int coupled = 0;
  auto counting = std::make_shared<Couplings>([&](ModelBase *, Transaction *) { ++coupled; });
  for (int i = 0; i < 3; ++i)
    std::static_pointer_cast<CollPart>(list.add())->setCouplings(counting);
  Transaction transaction(nullptr, nullptr);
  list.couple(&transaction);
  EXPECT_EQ(coupled, 3);
}
