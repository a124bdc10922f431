#include "wavemill/models/ActionSetting.h"
#include "wavemill/models/BoolSetting.h"
#include "wavemill/models/ContextSetting.h"
#include "wavemill/models/DoubleSetting.h"
#include "wavemill/models/Int32Setting.h"
#include "wavemill/models/Int64Setting.h"
#include "wavemill/models/Interceptor.h"
#include "wavemill/models/ModelBase.h"
#include "wavemill/models/SettingVisitor.h"
#include "wavemill/models/StringSetting.h"

#include <gtest/gtest.h>

#include <cmath>
#include <functional>
#include <limits>
#include <string>
#include <vector>

using namespace Corvane::Wavemill;

namespace {

// Counts what a setting publishes on its own subject.
struct ChangeProbe {
  explicit ChangeProbe(Setting &setting) {
    subscription = setting.getSubject().get_observable().subscribe(
        [this](const SettingChange &change) { bits.push_back(change.bits); });
  }
  ~ChangeProbe() { subscription.unsubscribe(); }
  std::vector<ParameterBits> bits;
  rxcpp::subscription subscription;
};

// A model that owns the settings under test and counts owner calls.
class Holder : public ModelBase {
public:
  Holder() : ModelBase("Tests::Holder") {}
  void onPropertyChanged(ISetting *) override { ++ownerCalls; }
  int ownerCalls = 0;
};

struct KindVisitor : SettingVisitor {
  using SettingVisitor::dispatch;
  void dispatch(ISetting *) override { seen += "I"; }
  void dispatch(ContextSetting *) override { seen += "C"; }
  void dispatch(StringSetting *) override { seen += "S"; }
  void dispatch(Int64Setting *) override { seen += "L"; }
  void dispatch(Int32Setting *) override { seen += "i"; }
  void dispatch(DoubleSetting *) override { seen += "D"; }
  void dispatch(BoolSetting *) override { seen += "B"; }
  std::string seen;
};

} // namespace

TEST(SettingTest, ConstructorsSetTheFlagWordAndDefaults) {
  EXPECT_EQ(static_cast<unsigned>(BoolSetting("b").getParameterBits()), 0x1A0FCu);
  EXPECT_EQ(static_cast<unsigned>(Int32Setting("i").getParameterBits()), 0x188FCu);
  EXPECT_EQ(static_cast<unsigned>(Int64Setting("l").getParameterBits()), 0x188FCu);
  EXPECT_EQ(static_cast<unsigned>(DoubleSetting("d").getParameterBits()), 0x188FCu);
  EXPECT_EQ(static_cast<unsigned>(StringSetting("s").getParameterBits()), 0x184FCu);
  EXPECT_EQ(static_cast<unsigned>(ContextSetting("c").getParameterBits()), 0x8100u);
  EXPECT_EQ(static_cast<unsigned>(ActionSetting("a").getParameterBits()), 0x8300u);

  Int32Setting i("i");
  EXPECT_EQ(i.getMinimum(), std::numeric_limits<int>::min());
  EXPECT_EQ(i.getMaximum(), std::numeric_limits<int>::max());
  EXPECT_EQ(i.getNepStep(), 1);
  DoubleSetting d("d");
  EXPECT_EQ(d.getMinimum(), -1.7976931348623157e308);
  EXPECT_EQ(d.getMaximum(), 1.7976931348623157e308);
  EXPECT_EQ(d.getNepStep(), 1.0);
  EXPECT_EQ(StringSetting("s").getMaxLength(), 65536);
  EXPECT_EQ(StringSetting("s", "abc").getValue(), "abc");
}

TEST(SettingTest, InactiveSettingStoresAnyValueAsGiven) {
  DoubleSetting level("Level", 1.0, 0.0, 10.0, 0.0);
  ChangeProbe probe(level);
  level.setValue(-50.0);
  EXPECT_EQ(level.getValue(), -50.0);
  EXPECT_FALSE(level.isDefaultValue());
  level.setValue(1.0);
  EXPECT_TRUE(level.isDefaultValue());

  Int64Setting stepped("Stepped", 0, 0, 100, 10);
  stepped.setValue(1234);
  EXPECT_EQ(stepped.getValue(), 1234);
  EXPECT_TRUE(probe.bits.empty());

  StringSetting text("Text");
  text.setValue(text.getValue());
  text.setValue("x");
  EXPECT_EQ(text.getValue(), "x");
}

TEST(SettingTest, ValidationRulesDifferByClass) {
  Holder holder;
  Interceptor tree;
  auto d = holder.init(std::make_shared<DoubleSetting>("D", 0.0, 0.0, 100.0, 0.5));
  auto clipped = holder.init(std::make_shared<DoubleSetting>("C", 0.0, -1.0, 1.0, 0.0));
  auto l = holder.init(std::make_shared<Int64Setting>("L", 0, -1000, 100, 10));
  auto lc = holder.init(std::make_shared<Int64Setting>("LC", 0, -5, 5, 0));
  auto i = holder.init(std::make_shared<Int32Setting>("I", 0, 0, 100, 0));
  holder.activateSettings(&tree, nullptr);

  // The step replaces clipping and the half step is added to the value.
  d->setValue(-3.0);
  EXPECT_DOUBLE_EQ(d->getValue(), -2.75);
  d->setValue(1.0);
  EXPECT_DOUBLE_EQ(d->getValue(), 1.25);
  clipped->setValue(7.0);
  EXPECT_EQ(clipped->getValue(), 1.0);
  clipped->setValue(-7.0);
  EXPECT_EQ(clipped->getValue(), -1.0);
  clipped->setValue(std::nan(""));
  EXPECT_TRUE(std::isnan(clipped->getValue()));

  l->setValue(1234);
  EXPECT_EQ(l->getValue(), 1230);
  l->setValue(-7);
  EXPECT_EQ(l->getValue(), 0);
  lc->setValue(99);
  EXPECT_EQ(lc->getValue(), 5);
  lc->setValue(-99);
  EXPECT_EQ(lc->getValue(), -5);

  // Writes to a 32-bit setting are kept as given; the rule is only there to
  // be called by name.
  i->setValue(1000);
  EXPECT_EQ(i->getValue(), 1000);
  EXPECT_EQ(i->validateValue(1000), 100);
  EXPECT_EQ(i->validateValue(-1), 0);
  i->setStep(10);
  EXPECT_EQ(i->validateValue(1234), 1230);
}

TEST(SettingTest, ParseWritesDirectlyAndReportsFailure) {
  BoolSetting b("B");
  EXPECT_TRUE(b.parse("TRUE"));
  EXPECT_TRUE(b.getValue());
  EXPECT_FALSE(b.parse("1"));
  EXPECT_FALSE(b.getValue());
  EXPECT_FALSE(b.parse("truex"));

  Int32Setting i("I", 5, 0, 10, 0);
  EXPECT_TRUE(i.parse("  42abc"));
  EXPECT_EQ(i.getValue(), 42);
  EXPECT_FALSE(i.parse("abc"));
  EXPECT_FALSE(i.parse(""));
  EXPECT_FALSE(i.parse("99999999999"));
  EXPECT_EQ(i.getValue(), 42);
  EXPECT_TRUE(i.parse("-2147483648"));
  EXPECT_EQ(i.getValue(), std::numeric_limits<int>::min());

  Int64Setting l("L");
  EXPECT_TRUE(l.parse("-9223372036854775808"));
  EXPECT_EQ(l.getValue(), std::numeric_limits<std::int64_t>::min());
  EXPECT_FALSE(l.parse("9223372036854775808"));
  EXPECT_EQ(l.getValue(), std::numeric_limits<std::int64_t>::min());

  DoubleSetting d("D", 0.0, 0.0, 1.0, 0.0);
  EXPECT_TRUE(d.parse("2.5e3Hz"));
  EXPECT_EQ(d.getValue(), 2500.0); // parse bypasses validation
  EXPECT_FALSE(d.parse("1e999"));
  EXPECT_FALSE(d.parse("."));
  EXPECT_EQ(d.getValue(), 2500.0);

  StringSetting s("S");
  EXPECT_TRUE(s.parse(""));
  EXPECT_TRUE(s.parse("a b"));
  EXPECT_EQ(s.getValue(), "a b");
}

TEST(SettingTest, TextFormsAndTypeErasedDoor) {
  DoubleSetting d("D");
  d.setValue(1e6);
  EXPECT_EQ(d.toString(), "1000000");
  d.setValue(0.1);
  EXPECT_EQ(d.toString(), "0.1");
  d.setValue(1.0 / 3.0);
  EXPECT_EQ(d.toString(), "0.333333333333333");
  Int32Setting i("I");
  i.setValue(-17);
  EXPECT_EQ(i.toString(), "-17");
  BoolSetting b("B", true);
  EXPECT_EQ(b.toString(), "true");

  ISetting &erased = b;
  EXPECT_EQ(erased.getInt32(), 1);
  EXPECT_EQ(erased.getInt64(), 1);
  erased.setCommonValue(0);
  EXPECT_FALSE(b.getValue());
  erased.setCommonValue(std::int64_t{7});
  EXPECT_TRUE(b.getValue());
  erased.setCommonValue(std::string("False"));
  EXPECT_FALSE(b.getValue());
  erased.setCommonValue(2.5); // not a bool overload: ignored
  EXPECT_FALSE(b.getValue());

  ISetting &number = i;
  number.setCommonValue(std::string("12")); // numeric settings ignore text here
  EXPECT_EQ(i.getValue(), -17);
  number.setCommonValue(12);
  EXPECT_EQ(number.getInt32(), 12);
  EXPECT_EQ(number.getDouble(), 0.0);
  EXPECT_EQ(number.findEnumIndex("x"), -1);
  EXPECT_FALSE(number.isEnumSetting());

  StringSetting s("S");
  static_cast<ISetting &>(s).setCommonValue(std::string("text"));
  EXPECT_EQ(s.getValue(), "text");
  EXPECT_FALSE(s.getBool());
}

TEST(SettingTest, EqualsCopyFromAndResetWorkOnValuesOnly) {
  auto a = std::make_shared<Int32Setting>("A", 3, 0, 10, 0);
  auto b = std::make_shared<Int32Setting>("B", 3, 0, 10, 0);
  auto l = std::make_shared<Int64Setting>("L", 3, 0, 10, 0);
  EXPECT_TRUE(a->equals(b));
  EXPECT_FALSE(a->equals(l));
  b->setValue(4);
  EXPECT_FALSE(a->equals(b));
  a->copyFrom(b);
  EXPECT_EQ(a->getValue(), 4);
  a->copyFrom(l); // another value type is ignored
  EXPECT_EQ(a->getValue(), 4);

  // ReadOnly is only tested by setValue: parse, copyFrom and reset still store.
  a->setReadOnly(true);
  EXPECT_TRUE(a->parse("8"));
  EXPECT_EQ(a->getValue(), 8);
  a->reset();
  EXPECT_EQ(a->getValue(), 3);
  a->setResettable(false);
  a->setValue(9);
  a->reset();
  EXPECT_EQ(a->getValue(), 9);
}

TEST(SettingTest, FlagChangesNotifyOwnerAndObserversOnlyWhenTheWordChanges) {
  Holder holder;
  Interceptor tree;
  auto s = holder.init(std::make_shared<StringSetting>("S"));
  ChangeProbe probe(*s);

  s->setReadOnly(true); // inactive: owner null, nothing published
  EXPECT_TRUE(probe.bits.empty());

  holder.activateSettings(&tree, nullptr);
  s->setReadOnly(true);
  EXPECT_EQ(holder.ownerCalls, 0);
  s->setVisible(false);
  s->setPersisted(false);
  s->setResettable(false);
  s->setReadOnly(false);
  EXPECT_EQ(holder.ownerCalls, 4);
  EXPECT_EQ(probe.bits, (std::vector<ParameterBits>{ParameterBits::Visible, ParameterBits::Persisted,
                                                    ParameterBits::Resettable, ParameterBits::ReadOnly}));
  EXPECT_FALSE(s->isVisible());
}

TEST(SettingTest, ActionInvokesHandlersInOrderAndPassesFailures) {
  ActionSetting action("Run");
  action.invoke(); // no handlers: nothing happens
  std::string calls;
  action.add([&](ActionSetting *self) { calls += self == &action ? "a" : "?"; })->add([&](ActionSetting *) {
    calls += "b";
  });
  action.invoke();
  EXPECT_EQ(calls, "ab");

  action.add([](ActionSetting *) { throw std::runtime_error("stop"); })->add([&](ActionSetting *) { calls += "c"; });
  EXPECT_THROW(action.invoke(), std::runtime_error);
  EXPECT_EQ(calls, "abab");

  ActionSetting empty("Empty");
  empty.add(ActionSetting::Handler());
  EXPECT_THROW(empty.invoke(), std::bad_function_call);
}

TEST(SettingTest, VisitCallsTheOverloadOfTheSettingsClass) {
  KindVisitor visitor;
  BoolSetting("b").visit(&visitor);
  Int32Setting("i").visit(&visitor);
  Int64Setting("l").visit(&visitor);
  DoubleSetting("d").visit(&visitor);
  StringSetting("s").visit(&visitor);
  ContextSetting("c").visit(&visitor);
  ActionSetting("a").visit(&visitor);
  EXPECT_EQ(visitor.seen, "BiLDSSS");
}

TEST(SettingTest, EnumSettingFillsItsValidValuesThroughTheList) {
  // An enum setting as an application writes it: an Int32Setting subclass
  // with EnumKind that fills the list the first read creates.
  struct Waveform : Int32Setting {
    Waveform() : Int32Setting("Waveform") {
      setFlag(ParameterBits::EnumKind, true);
      getValidInt32Values();
      validValues->assign({0, 1, 4});
    }
    int findEnumIndex(const std::string &text) const override { return text == "Square" ? 1 : -1; }
  };
  Waveform waveform;
  ISetting &setting = waveform;
  EXPECT_TRUE(setting.isEnumSetting());
  auto values = setting.getValidInt32Values();
  ASSERT_EQ(values.size(), 3u);
  EXPECT_EQ(values[2], 4);
  EXPECT_EQ(setting.findEnumIndex("Square"), 1);
  EXPECT_TRUE(Int32Setting("Plain").getValidInt32Values().empty());
  EXPECT_TRUE(BoolSetting("b").getValidInt32Values().empty());
}
