#include "wavemill/models/Couplings.h"
#include "wavemill/models/ModelCollection.h"

#include <gtest/gtest.h>

using namespace Corvane::Wavemill;

namespace SubSettingTests {

struct Channel : ModelBase {
  WAVEMILL_MODEL(Channel)
  Channel() : ModelBase("Tests::Channel") {}
  std::shared_ptr<Int32Setting> gain = init(std::make_shared<Int32Setting>("Gain", 3, 0, 100, 0));
};
struct WideChannel : Channel {
  WAVEMILL_MODEL(WideChannel)
};
// A holder of another class than SubSetting<Channel>, for copies across classes.
struct WideHolder : SubSetting<Channel> {
  using SubSetting<Channel>::SubSetting;
};
struct Rack : ModelBase {
  WAVEMILL_MODEL(Rack)
  Rack() : ModelBase("Tests::Rack") {}
  std::shared_ptr<SubSetting<Channel>> channel = init(std::make_shared<SubSetting<Channel>>("Channel"));
  std::shared_ptr<SubSetting<ModelCollection<Channel>>> list =
      init(std::make_shared<SubSetting<ModelCollection<Channel>>>("List"));
};

} // namespace SubSettingTests

using namespace SubSettingTests;

TEST(SubSettingTest, ActivationBindsTheModelUnderTheHoldersOwnerAndName) {
  auto rack = std::make_shared<Rack>();
  Interceptor tree(rack);
  rack->activateSettings(&tree, nullptr);
  auto channel = rack->channel->getValue();
  EXPECT_EQ(channel->getOwner(), rack.get());
  EXPECT_EQ(channel->getThisKey(), "Channel");
  EXPECT_EQ(channel->gain->getInterceptor(), &tree);
  EXPECT_FALSE(rack->channel->hasFlag(ParameterBits::PlainSettingMark));
  EXPECT_EQ(rack->channel->toString(), "Channel");
  EXPECT_TRUE(rack->channel->parse("anything"));

  // setValue rebinds the new model to the tree, with no transaction.
  int couples = 0;
  rack->setCouplings(std::make_shared<Couplings>([&](ModelBase *, Transaction *) { ++couples; }));
  auto replacement = std::make_shared<Channel>();
  rack->channel->setValue(replacement);
  EXPECT_EQ(couples, 0);
  EXPECT_EQ(replacement->getOwner(), rack.get());
  EXPECT_EQ(replacement->gain->getInterceptor(), &tree);
  rack->deactivateSettings();
  EXPECT_TRUE(replacement->getAllSettings().empty());
}

TEST(SubSettingTest, WeakValueIsNotOwnedAndGivesNullOnceGone) {
  SubSetting<Channel> holder("Ref");
  auto own = holder.getValue();
  holder.setWeakSubValue(true);
  {
    auto referenced = std::make_shared<Channel>();
    holder.setValue(referenced);
    EXPECT_EQ(holder.getValue(), referenced);
    EXPECT_EQ(holder.getCommonValue(), referenced);
  }
  EXPECT_EQ(holder.getValue(), nullptr);
  own->gain->setValue(50);
  holder.reset(); // reset still reaches the owned value
  EXPECT_EQ(own->gain->getValue(), 3);
}

TEST(SubSettingTest, CopyFromCopiesModelsAndAcrossHolderClassesTakesANewModel) {
  auto source = std::make_shared<SubSetting<Channel>>("A");
  auto target = std::make_shared<SubSetting<Channel>>("B");
  source->getValue()->gain->setValue(40);
  auto kept = target->getValue();
  target->copyFrom(source);
  target->copyFrom(nullptr);
  EXPECT_EQ(target->getValue(), kept);
  EXPECT_EQ(kept->gain->getValue(), 40);
  EXPECT_TRUE(target->equals(source));

  auto wide = std::make_shared<WideHolder>("W", std::make_shared<WideChannel>());
  wide->getValue()->gain->setValue(70);
  target->setWeakSubValue(true);
  target->setValue(kept);
  target->copyFrom(wide);
  EXPECT_FALSE(target->isWeakSubValue());
  EXPECT_NE(target->getValue(), kept);
  EXPECT_EQ(target->getValue()->getTypeName(), "WideChannel");
  EXPECT_EQ(target->getValue()->gain->getValue(), 70);
  EXPECT_FALSE(target->equals(std::make_shared<Int32Setting>("X")));
}

TEST(SubSettingTest, CommonPointerTakesAModelOrTheItemsOfACollection) {
  Rack rack;
  auto channel = std::make_shared<Channel>();
  rack.channel->setCommonPointer(channel);
  rack.channel->setCommonPointer(std::make_shared<Rack>()); // another class: ignored
  EXPECT_EQ(rack.channel->getValue(), channel);

  auto other = std::make_shared<ModelCollection<WideChannel>>();
  other->resize(2);
  auto own = rack.list->getValue();
  own->add();
  rack.list->setCommonPointer(other); // a list of another class: its items replace the own ones
  EXPECT_EQ(rack.list->getValue(), own);
  ASSERT_EQ(own->getCount(), 2);
  EXPECT_EQ(own->getItem(1), other->getItem(1));
}
