#include "wavemill/models/ModelBase.h"
#include "wavemill/models/BoolSetting.h"
#include "wavemill/models/Couplings.h"
#include "wavemill/models/DoubleSetting.h"
#include "wavemill/models/Int32Setting.h"
#include "wavemill/models/Interceptor.h"
#include "wavemill/models/Metadata.h"
#include "wavemill/models/Prototype.h"
#include "wavemill/models/StringSetting.h"
#include "wavemill/services/LogBase.h"

#include <gtest/gtest.h>

#include <functional>
#include <memory>
#include <string>
#include <vector>

using namespace Corvane::Wavemill;

namespace {

// Runs a hook when it is bound, to look at its model at that moment.
class HookSetting : public StringSetting {
public:
  explicit HookSetting(const char *name) : StringSetting(name) {}
  void activate(Interceptor *interceptor, IModel *owner) override {
    StringSetting::activate(interceptor, owner);
    if (hook)
      hook();
  }
  std::function<void()> hook;
};

class Oscillux : public ModelBase {
public:
  Oscillux() : ModelBase("Quartz::Oscillux") { dirty->setResettable(false); }
  std::shared_ptr<IModel> create() const override { return std::make_shared<Oscillux>(); }
  std::shared_ptr<IModel> getPrototype() const override { return Prototype::getInstance<Oscillux>(); }
  void initialize() override {
    ++initializations;
    ownedWhenInitialized = getOwner() != nullptr; // initialize runs before the owner is set
  }

  std::shared_ptr<DoubleSetting> level = init(std::make_shared<DoubleSetting>("Level", 1.5, -10.0, 10.0, 0.0));
  std::shared_ptr<Int32Setting> taps = init(std::make_shared<Int32Setting>("Taps"));
  std::shared_ptr<BoolSetting> armed = init(std::make_shared<BoolSetting>("Armed", true));
  std::shared_ptr<StringSetting> label = init(std::make_shared<StringSetting>("Label", "idle"));
  std::shared_ptr<BoolSetting> dirty = init(std::make_shared<BoolSetting>("Dirty"));
  std::shared_ptr<Int32Setting> shadow = init(std::make_shared<Int32Setting>("Taps"));
  std::shared_ptr<HookSetting> probe = init(std::make_shared<HookSetting>("Probe"));
  int initializations = 0;
  bool ownedWhenInitialized = false;
};

// Same settings as Oscillux, but another class.
class OscilluxTwin : public Oscillux {
public:
  std::shared_ptr<IModel> create() const override { return std::make_shared<OscilluxTwin>(); }
  std::shared_ptr<IModel> getPrototype() const override { return Prototype::getInstance<OscilluxTwin>(); }
};

// An active root whose couplings count and record what they receive.
struct ActiveOscillux {
  ActiveOscillux() : model(std::make_shared<Oscillux>()), interceptor(model) {
    model->activateSettings(&interceptor, nullptr);
    model->setCouplings(std::make_shared<Couplings>([this](ModelBase *, Transaction *transaction) {
      ++couples;
      method = transaction->getMethodName();
      option = transaction->getOption();
    }));
  }
  std::shared_ptr<Oscillux> model;
  Interceptor interceptor;
  int couples = 0;
  std::string method;
  TransactionOption option = TransactionOption::NoCouple;
};

void change(Oscillux &model) {
  model.level->setValue(7.25);
  model.taps->setValue(12);
  model.armed->setValue(false);
  model.label->setValue("busy");
  model.dirty->setValue(true);
}

} // namespace

TEST(ModelBaseTest, ContextComesFirstAndTypeNameDropsNamespace) {
  ModelBase plain("Foo::Bar");
  ASSERT_EQ(plain.getAllSettings().size(), 1u);
  EXPECT_EQ(plain.getAllSettings()[0]->getName(), "Context");
  EXPECT_EQ(plain.getTypeName(), "Bar");
  EXPECT_EQ(ModelBase("A::B::C").getTypeName(), "C");
  EXPECT_EQ(ModelBase("Flat").getTypeName(), "Flat");

  Oscillux model;
  EXPECT_EQ(model.getAllSettings()[0], model.getContext());
  EXPECT_EQ(model.getAllSettings()[1], model.level);
  // One full name serves every class that keeps the inherited form.
  EXPECT_EQ(plain.getFullTypeName(), model.getFullTypeName());
  EXPECT_EQ(plain.getFullTypeName().rfind("Models.", 0), 0u);
}

TEST(ModelBaseTest, GetSettingUsesOneMapPerClassAndFirstOfEqualNamesWins) {
  Oscillux first;
  Oscillux second;
  EXPECT_EQ(first.getSetting("Level"), first.level);
  EXPECT_EQ(second.getSetting("Label"), second.label);
  EXPECT_EQ(first.getSetting("Taps"), first.taps);
  EXPECT_EQ(first.getSetting("Context"), first.getContext());

  auto map = Prototype::getInstance<Oscillux>()->getMetadata().get<ModelBase::SettingMap>("SettingMap");
  ASSERT_NE(map, nullptr);
  const auto size = map->size();
  EXPECT_EQ(first.getSetting("Absent"), nullptr);
  EXPECT_EQ(map->size(), size);
  EXPECT_EQ(first.getMetadata().size(), 0u); // instances carry no map of their own
}

TEST(ModelBaseTest, ActivationBindsInOrderAndDeactivationIsTerminal) {
  Oscillux parent;
  Interceptor interceptor;
  auto model = std::make_shared<Oscillux>();
  bool ownerSetFirst = false;
  model->probe->hook = [&] {
    ownerSetFirst =
        model->initializations == 1 && model->getOwner() == &parent && model->getInterceptor() == &interceptor;
    model->init(std::make_shared<BoolSetting>("Late"));
  };
  model->activateSettings(nullptr, &parent);
  EXPECT_EQ(model->getOwner(), nullptr);
  model->setThisKey("Slot");

  model->activateSettings(&interceptor, &parent);
  EXPECT_TRUE(ownerSetFirst);
  EXPECT_FALSE(model->ownedWhenInitialized);
  EXPECT_EQ(model->getAllSettings().back()->getInterceptor(), &interceptor); // appended during activation
  EXPECT_EQ(model->level->getOwner(), model.get());
  EXPECT_EQ(model->getThisKey(), "Slot");

  model->deactivateSettings();
  EXPECT_TRUE(model->getAllSettings().empty());
  EXPECT_EQ(model->level->getInterceptor(), nullptr);
  EXPECT_EQ(model->getOwner(), nullptr);
  model->setOwner(&parent);
  EXPECT_EQ(model->getThisKey(), ""); // the stored key was cleared too

  Oscillux inactive;
  const auto before = inactive.getAllSettings();
  inactive.deactivateSettings();
  EXPECT_EQ(inactive.getAllSettings(), before);
}

TEST(ModelBaseTest, PathJoinsKeysBelowTheRoot) {
  ModelBase root("Root"), a("A"), gap("Gap"), b("B"), c("C"), lead("Lead"), d("D");
  root.setThisKey("Ignored");
  EXPECT_EQ(root.getThisKey(), "");
  EXPECT_EQ(root.makePath(), "");
  auto place = [](ModelBase &child, ModelBase &owner, const std::string &key) {
    child.setOwner(&owner);
    child.setThisKey(key);
  };
  place(a, root, "A");
  place(b, a, "B");
  place(gap, a, "");
  place(c, gap, "C");
  place(lead, root, "");
  place(d, lead, "D");
  EXPECT_EQ(a.makePath(), "A");
  EXPECT_EQ(b.makePath(), "A,B");
  EXPECT_EQ(c.makePath(), "A,,C"); // an empty key in the middle keeps its comma
  EXPECT_EQ(d.makePath(), "D");    // but no comma before any text
}

TEST(ModelBaseTest, AncestorCountsItselfFirstAndStopsOnLoopsWithWarning) {
  ModelBase top("Outer::Console"), mid("Inner::Panel"), leaf("Inner::Knob");
  mid.setOwner(&top);
  leaf.setOwner(&mid);
  EXPECT_EQ(leaf.ancestor("Knob"), &leaf);
  EXPECT_EQ(leaf.ancestor("Panel"), &mid);
  EXPECT_EQ(leaf.ancestor("Missing"), &leaf);

  std::vector<std::pair<int, std::string>> warnings;
  auto subscription = LogBase::get("Log")->getSubject().get_observable().subscribe(
      [&](LogMessage *message) { warnings.emplace_back(message->level, message->text); });

  std::vector<std::unique_ptr<ModelBase>> chain;
  for (int i = 0; i < 52; ++i)
    chain.push_back(std::make_unique<ModelBase>(i == 50 ? "Fifty" : i == 51 ? "FiftyOne" : "Link"));
  for (int i = 0; i + 1 < 52; ++i)
    chain[i]->setOwner(chain[i + 1].get());
  EXPECT_EQ(chain[0]->ancestor("Fifty"), chain[50].get());
  EXPECT_TRUE(warnings.empty());
  EXPECT_EQ(chain[0]->ancestor("FiftyOne"), chain[0].get()); // too deep

  ModelBase x("X"), y("Y");
  x.setOwner(&y);
  y.setOwner(&x);
  EXPECT_EQ(x.ancestor("Missing"), &x);
  subscription.unsubscribe();

  const std::pair<int, std::string> warning{3, "There may be a loop or deep node in models."};
  EXPECT_EQ(warnings, (std::vector<std::pair<int, std::string>>{warning, warning}));
}

TEST(ModelBaseTest, ResetRestoresResettableSettingsUnderOneCoupling) {
  Oscillux inactive;
  change(inactive);
  inactive.reset();
  EXPECT_EQ(inactive.level->getValue(), 1.5);
  EXPECT_EQ(inactive.label->getValue(), "idle");
  EXPECT_TRUE(inactive.dirty->getValue()); // not resettable
  // The shared empty transaction of an inactive reset keeps its option.
  EXPECT_EQ(Transaction::empty()->getOption(), TransactionOption::NoCouple);

  ActiveOscillux tree;
  change(*tree.model);
  tree.couples = 0;
  tree.model->reset();
  EXPECT_EQ(tree.couples, 1);
  EXPECT_EQ(tree.method, "Reset");
  EXPECT_EQ(tree.option, TransactionOption::Reset);
  EXPECT_EQ(tree.model->taps->getValue(), 0);
  EXPECT_TRUE(tree.model->dirty->getValue());
}

TEST(ModelBaseTest, CopyFromTakesSameClassOnlyByPositionInOneEdit) {
  ActiveOscillux tree;
  auto source = std::make_shared<Oscillux>();
  change(*source);
  EXPECT_FALSE(tree.model->copyFrom(nullptr));
  EXPECT_FALSE(tree.model->copyFrom(tree.model));
  EXPECT_FALSE(tree.model->copyFrom(std::make_shared<OscilluxTwin>()));
  EXPECT_FALSE(tree.model->copyFrom(std::make_shared<ModelBase>("Quartz::Oscillux")));
  EXPECT_EQ(tree.couples, 0);

  int notified = 0;
  auto subscription =
      tree.model->level->getSubject().get_observable().subscribe([&](const SettingChange &) { ++notified; });
  EXPECT_TRUE(tree.model->copyFrom(source));
  subscription.unsubscribe();
  EXPECT_EQ(tree.couples, 1);
  EXPECT_EQ(tree.option, TransactionOption::Couple);
  EXPECT_EQ(notified, 0);
  EXPECT_EQ(tree.model->level->getValue(), 7.25);
  EXPECT_TRUE(tree.model->equals(source));
}

TEST(ModelBaseTest, DuplicateIsAnInactiveCopyAndEqualsNeedsTheSameClass) {
  Oscillux parent;
  ActiveOscillux tree;
  tree.model->setOwner(&parent);
  tree.model->setThisKey("Slot");
  tree.model->getMetadata().setText("Note", "only here");
  change(*tree.model);

  auto copy = std::dynamic_pointer_cast<Oscillux>(tree.model->duplicate());
  ASSERT_NE(copy, nullptr);
  EXPECT_EQ(copy->getOwner(), nullptr);
  EXPECT_EQ(copy->getInterceptor(), nullptr);
  copy->setOwner(&parent);
  EXPECT_EQ(copy->getThisKey(), "");
  EXPECT_EQ(copy->level->getValue(), 7.25);
  EXPECT_TRUE(copy->equals(tree.model)); // keys and metadata do not count
  EXPECT_TRUE(tree.model->equals(copy));

  copy->taps->setValue(99);
  EXPECT_FALSE(copy->equals(tree.model));
  EXPECT_FALSE(tree.model->equals(copy));

  EXPECT_FALSE(copy->equals(nullptr));
  EXPECT_TRUE(copy->equals(copy));
  EXPECT_FALSE(std::make_shared<Oscillux>()->equals(std::make_shared<OscilluxTwin>()));
}

TEST(MetadataTest, TextAndTypedEntriesReplaceRatherThanMisread) {
  Metadata metadata;
  EXPECT_EQ(metadata.getText("Missing"), "");
  metadata.setText("Name", "first");
  metadata.setText("Name", "second");
  EXPECT_EQ(metadata.getText("Name"), "second");

  auto list = metadata.getOrCreate<std::vector<std::string>>("MissingSettings");
  list->push_back("Gain");
  EXPECT_EQ(metadata.getOrCreate<std::vector<std::string>>("MissingSettings"), list);

  auto replaced = metadata.getOrCreate<std::vector<std::string>>("Name");
  ASSERT_NE(replaced, nullptr);
  EXPECT_TRUE(replaced->empty());
  EXPECT_EQ(metadata.getText("Name"), ""); // the text is gone, not reread as a list

  metadata.set<std::vector<std::string>>("Null", nullptr);
  EXPECT_NE(metadata.getOrCreate<std::vector<std::string>>("Null"), nullptr);
}
