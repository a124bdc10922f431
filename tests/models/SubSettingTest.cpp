#include "support/TestModels.h"

#include <gtest/gtest.h>

using namespace Corvane::Wavemill;
using Testing::Rack;
using Testing::Source;

namespace {

// Another class of Source, and a holder of another class than
// SubSetting<Source>, for copies across classes.
struct WideSource : Source {
  WAVEMILL_MODEL(WideSource)
};
struct WideHolder : SubSetting<Source> {
  using SubSetting<Source>::SubSetting;
};

} // namespace

TEST(SubSettingTest, ActivationBindsTheModelUnderTheHoldersOwnerAndNameAndSetValueRebinds) {
  Testing::LiveTree<Rack> tree;
  auto &rack = tree.root;
  auto source = rack->source->getValue();
  EXPECT_EQ(source->getThisKey(), "Source");
  EXPECT_EQ(source->count->getInterceptor(), &tree.interceptor);
  EXPECT_EQ(rack->source->toString(), "Source");

  auto replacement = std::make_shared<Source>();
  rack->source->setValue(replacement);
  EXPECT_EQ(replacement->count->getInterceptor(), &tree.interceptor);
  rack->deactivateSettings();
  EXPECT_TRUE(replacement->getAllSettings().empty());
}

TEST(SubSettingTest, WeakValueIsNotOwnedAndGivesNullOnceGone) {
  SubSetting<Source> holder("Ref");
  holder.setWeakSubValue(true);
  {
    auto referenced = std::make_shared<Source>();
    holder.setValue(referenced);
    EXPECT_EQ(holder.getCommonValue(), referenced);
  }
  EXPECT_EQ(holder.getValue(), nullptr);
}

TEST(SubSettingTest, CopyFromCopiesModelsAndAcrossHolderClassesTakesANewModel) {
  auto source = std::make_shared<SubSetting<Source>>("A");
  auto target = std::make_shared<SubSetting<Source>>("B");
  source->getValue()->count->setValue(40);
  auto kept = target->getValue();
  target->copyFrom(source);
  target->copyFrom(nullptr);
  EXPECT_EQ(target->getValue(), kept);
  EXPECT_EQ(kept->count->getValue(), 40);
  EXPECT_TRUE(target->equals(source));

  auto wide = std::make_shared<WideHolder>("W", std::make_shared<WideSource>());
  wide->getValue()->count->setValue(70);
  target->setWeakSubValue(true);
  target->setValue(kept);
  target->copyFrom(wide);
  EXPECT_FALSE(target->isWeakSubValue());
  EXPECT_EQ(target->getValue()->getTypeName(), "WideSource");
  EXPECT_EQ(target->getValue()->count->getValue(), 70);
  EXPECT_FALSE(target->equals(std::make_shared<Int32Setting>("X")));
}

TEST(SubSettingTest, CommonPointerTakesAModelOrTheItemsOfACollection) {
  Rack rack;
  auto source = std::make_shared<Source>();
  rack.source->setCommonPointer(source);
  rack.source->setCommonPointer(std::make_shared<Rack>()); // another class: ignored
  EXPECT_EQ(rack.source->getValue(), source);

  auto other = std::make_shared<ModelCollection<WideSource>>();
  other->resize(2);
  auto own = rack.sources->getValue();
  own->add();
  rack.sources->setCommonPointer(other); // a list of another class: its items replace the own ones
  ASSERT_EQ(own->getCount(), 2);
  EXPECT_EQ(own->getItem(1), other->getItem(1));
}
