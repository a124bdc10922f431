#include "wavemill/models/TextMap.h"
#include "support/TestModels.h"
#include "wavemill/models/TextModel.h"

#include <gtest/gtest.h>

using namespace Corvane::Wavemill;

// The names and the registration of TextModel are read in the activator
// and json tests.
TEST(TextModelTest, PrototypeAndPairDefaults) {
  EXPECT_EQ(TextModel().getPrototype(), Prototype::getInstance<TextModel>());
  // A pair's settings are at their defaults only when given empty texts.
  TextPair pair("Unit", "Hz");
  EXPECT_EQ(pair.Key->getValue(), "Unit");
  EXPECT_FALSE(pair.Key->isDefaultValue());
  EXPECT_FALSE(pair.Value->isDefaultValue());
  TextPair empty("", "");
  EXPECT_TRUE(empty.Key->isDefaultValue());
  EXPECT_TRUE(empty.Value->isDefaultValue());
}

// A live map whose couplings record the method and its two arguments.
class TextMapTest : public testing::Test, public Testing::LiveTree<TextMap> {
protected:
  TextMapTest() {
    map->setCouplings(std::make_shared<Couplings>([this](ModelBase *, Transaction *transaction) {
      ++couples;
      method = transaction->getMethodName();
      auto key = transaction->getSettingAt(0);
      auto value = transaction->getSettingAt(1);
      arguments = (key ? key->toString() : "?") + "=" + (value ? value->toString() : "?");
    }));
  }
  std::shared_ptr<TextMap> &map = root;
  int couples = 0;
  std::string method;
  std::string arguments;
};

TEST_F(TextMapTest, SetItemStoresUnderOneKeyInACoupledMethodTransaction) {
  map->setItem("Unit", "Hz");
  EXPECT_EQ(couples, 1);
  EXPECT_EQ(method, "setItem");
  EXPECT_EQ(arguments, "Unit=Hz");

  map->setItem("Unit", "kHz");
  map->setItem("Mode", "CW");
  EXPECT_EQ(map->Items->getValue()->getCount(), 2);
  EXPECT_EQ(map->getItem("Unit"), "kHz");
  EXPECT_EQ(map->getItem("Mode"), "CW");
  EXPECT_EQ(map->getItem("unit"), "");

  // Storing the same value again changes nothing but still couples.
  Testing::Notifications notes;
  notes.watch(*map->Items->getValue()->getItem(0));
  map->setItem("Unit", "kHz");
  EXPECT_TRUE(notes.take().empty());
  EXPECT_EQ(couples, 4);
  map->setItem("Unit", "MHz");
  EXPECT_EQ(notes.take(), std::vector<std::string>{"setting:Value"});
}

TEST_F(TextMapTest, IndexFollowsRecallAndCopies) {
  // Pairs put into the collection directly are found only after the index
  // is rebuilt; of two equal keys the later wins.
  auto pairs = map->Items->getValue();
  pairs->add(std::make_shared<TextPair>("Unit", "Hz"));
  pairs->add(std::make_shared<TextPair>("Unit", "dBm"));
  EXPECT_EQ(map->getItem("Unit"), "");
  map->onDeserialized();
  EXPECT_EQ(map->getItem("Unit"), "dBm");

  // A copy brings the index along, also into a map of another tree.
  map->setItem("Mode", "CW");
  auto other = std::make_shared<TextMap>();
  EXPECT_TRUE(other->copyFrom(map));
  EXPECT_EQ(other->getItem("Unit"), "dBm");
  EXPECT_EQ(other->getItem("Mode"), "CW");
  EXPECT_FALSE(other->copyFrom(std::make_shared<TextModel>()));
  EXPECT_FALSE(other->copyFrom(other));
  EXPECT_EQ(other->getItem("Mode"), "CW");
}
