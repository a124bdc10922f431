#include "support/TestModels.h"
#include "wavemill/services/LogBase.h"

#include <gtest/gtest.h>

#include <functional>

using namespace Corvane::Wavemill;

namespace {

// Runs a hook when it is bound, to look at its model at that moment.
struct HookSetting : StringSetting {
  using StringSetting::StringSetting;
  void activate(Interceptor *interceptor, IModel *owner) override {
    StringSetting::activate(interceptor, owner);
    if (hook)
      hook();
  }
  std::function<void()> hook;
};

// A Source with a second setting named "Count" that counts its initializations.
struct Probe : Testing::Source {
  WAVEMILL_MODEL(Probe)
  void initialize() override { ++initializations; }
  void change() {
    level->setValue(7.25);
    label->setValue("busy");
  }
  std::shared_ptr<Int32Setting> shadow = init(std::make_shared<Int32Setting>("Count"));
  std::shared_ptr<HookSetting> probe = init(std::make_shared<HookSetting>("Probe"));
  int initializations = 0;
};

// The same settings as Probe, but another class.
struct Twin : Probe {
  WAVEMILL_MODEL(Twin)
};

// A live Probe whose couplings count and record what they receive.
class ModelBaseTest : public testing::Test, public Testing::LiveTree<Probe> {
protected:
  ModelBaseTest() {
    root->onCouple([this](ModelBase *, Transaction *transaction) {
      ++couples;
      option = transaction->getOption();
    });
  }
  std::shared_ptr<Probe> &model = root;
  int couples = 0;
  TransactionOption option = TransactionOption::NoCouple;
};

} // namespace

TEST_F(ModelBaseTest, TypeNameDropsNamespaceAndFirstOfEqualSettingNamesWins) {
  ModelBase plain("A::B::C");
  EXPECT_EQ(plain.getTypeName(), "C");
  EXPECT_EQ(ModelBase("Flat").getTypeName(), "Flat");
  EXPECT_EQ(model->getSetting("Level"), model->level);
  EXPECT_EQ(model->getSetting("Count"), model->count);
  EXPECT_EQ(model->getSetting("Absent"), nullptr);
}

TEST_F(ModelBaseTest, ActivationNeedsATreeAndDeactivationIsTerminal) {
  Probe parent;
  auto child = std::make_shared<Probe>();
  // Initialized, owned and in the tree before its settings bind; a setting
  // appended while they bind is bound in the same pass.
  bool readyFirst = false;
  child->probe->hook = [&] {
    readyFirst = child->initializations == 1 && child->getOwner() == &parent && child->getInterceptor() == &interceptor;
    child->init(std::make_shared<BoolSetting>("Late"));
  };
  child->activateSettings(nullptr, &parent);
  EXPECT_EQ(child->getOwner(), nullptr);
  child->setThisKey("Slot");

  child->activateSettings(&interceptor, &parent);
  EXPECT_TRUE(readyFirst);
  EXPECT_EQ(child->getAllSettings().back()->getInterceptor(), &interceptor);
  EXPECT_EQ(child->getThisKey(), "Slot");

  child->deactivateSettings();
  EXPECT_TRUE(child->getAllSettings().empty());
  EXPECT_EQ(child->level->getInterceptor(), nullptr);
  child->setOwner(&parent);
  EXPECT_EQ(child->getThisKey(), ""); // the stored key was cleared too

  const auto before = parent.getAllSettings();
  parent.deactivateSettings(); // inactive: nothing to undo
  EXPECT_EQ(parent.getAllSettings(), before);
}

TEST(ModelTreeTest, PathJoinsKeysBelowTheRootAndAncestorCountsItselfFirst) {
  ModelBase root("Root"), a("Outer::A"), gap("Gap"), b("Inner::B"), c("C"), lead("Lead"), d("D");
  root.setThisKey("Ignored");
  EXPECT_EQ(root.getThisKey(), ""); // no owner: no key
  for (auto [child, owner, key] :
       {std::make_tuple(&a, &root, "A"), std::make_tuple(&b, &a, "B"), std::make_tuple(&gap, &a, ""),
        std::make_tuple(&c, &gap, "C"), std::make_tuple(&lead, &root, ""), std::make_tuple(&d, &lead, "D")}) {
    child->setOwner(owner);
    child->setThisKey(key);
  }
  EXPECT_EQ(b.makePath(), "A,B");
  EXPECT_EQ(c.makePath(), "A,,C"); // an empty key in the middle keeps its comma
  EXPECT_EQ(d.makePath(), "D");    // but no comma before any text
  EXPECT_EQ(b.ancestor("A"), &a);
  EXPECT_EQ(b.ancestor("Missing"), &b);
}

// A loop ends the same way as a chain too deep.
TEST(ModelTreeTest, AncestorStopsOnDeepChainsWithAWarning) {
  std::vector<std::pair<int, std::string>> warnings;
  auto subscription = LogBase::get("Log")->getSubject().get_observable().subscribe(
      [&](LogMessage *message) { warnings.emplace_back(message->level, message->text); });
  std::vector<std::unique_ptr<ModelBase>> chain;
  for (int i = 0; i < 52; ++i) {
    chain.push_back(std::make_unique<ModelBase>(i == 50 ? "Fifty" : i == 51 ? "FiftyOne" : "Link"));
    if (i > 0)
      chain[i - 1]->setOwner(chain[i].get());
  }
  EXPECT_EQ(chain[0]->ancestor("Fifty"), chain[50].get());
  EXPECT_TRUE(warnings.empty());
  EXPECT_EQ(chain[0]->ancestor("FiftyOne"), chain[0].get()); // too deep
  subscription.unsubscribe();
  EXPECT_EQ(warnings, (std::vector<std::pair<int, std::string>>{{3, "There may be a loop or deep node in models."}}));
}

TEST_F(ModelBaseTest, ResetRestoresResettableSettingsUnderOneCoupling) {
  model->change();
  couples = 0;
  model->reset();
  EXPECT_EQ(couples, 1);
  EXPECT_EQ(option, TransactionOption::Reset);
  EXPECT_EQ(model->level->getValue(), -10.0);
}

TEST_F(ModelBaseTest, CopyFromTakesSameClassOnlyByPositionInOneEdit) {
  auto source = std::make_shared<Probe>();
  source->change();
  EXPECT_FALSE(model->copyFrom(nullptr));
  EXPECT_FALSE(model->copyFrom(model));
  EXPECT_FALSE(model->copyFrom(std::make_shared<Twin>())); // same layout, another class

  EXPECT_TRUE(model->copyFrom(source));
  EXPECT_EQ(couples, 1);
  EXPECT_TRUE(model->equals(source));
}

TEST_F(ModelBaseTest, DuplicateIsAnEqualCopyAndEqualsNeedsTheSameClass) {
  model->change();
  auto copy = std::dynamic_pointer_cast<Probe>(model->duplicate());
  ASSERT_NE(copy, nullptr);
  EXPECT_TRUE(copy->equals(model));
  copy->shadow->setValue(99);
  EXPECT_FALSE(model->equals(copy));
  EXPECT_FALSE(copy->equals(nullptr));
  EXPECT_TRUE(copy->equals(copy));
  EXPECT_FALSE(std::make_shared<Probe>()->equals(std::make_shared<Twin>()));
}

TEST(MetadataTest, TextAndTypedEntriesReplaceRatherThanMisread) {
  Metadata metadata;
  metadata.setText("Name", "first");
  EXPECT_EQ(metadata.getText("Name"), "first");

  EXPECT_TRUE(metadata.getOrCreate<std::vector<std::string>>("Name")->empty());
  EXPECT_EQ(metadata.getText("Name"), ""); // the text is gone, not reread as a list
}
