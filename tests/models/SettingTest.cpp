#include "support/TestModels.h"
#include "wavemill/models/ActionSetting.h"

#include <gtest/gtest.h>

#include <array>

using namespace Corvane::Wavemill;

namespace {

// Writes `value` and hands the setting back for a read.
template <class S, class V> S &set(S &setting, const V &value) {
  setting.setValue(value);
  return setting;
}

// A live Source that also binds loose settings to its tree.
struct SettingTest : testing::Test, Testing::LiveTree<Testing::Source> {
  template <class S, class... A> std::shared_ptr<S> live(A... arguments) {
    auto setting = std::make_shared<S>(arguments...);
    setting->activate(&interceptor, root.get());
    return setting;
  }
};

} // namespace

TEST_F(SettingTest, ActiveWritesFollowTheValidationRuleOfTheClass) {
  // With a step the half step is added and nothing is clipped; without one
  // the value is clipped to the range.
  for (auto [step, low, high, in, out] : std::vector<std::array<double, 5>>{
           {0.5, 0.0, 100.0, -3.0, -2.75}, {0.0, -1.0, 1.0, 7.0, 1.0}, {0.0, -1.0, 1.0, -7.0, -1.0}}) {
    SCOPED_TRACE(testing::Message() << "double step " << step << " write " << in);
    EXPECT_DOUBLE_EQ(set(*live<DoubleSetting>("D", 0.0, low, high, step), in).getValue(), out);
  }
  // A 64-bit step rounds down towards zero instead of clipping.
  for (auto [step, low, high, in, out] :
       std::vector<std::array<std::int64_t, 5>>{{10, -1000, 100, 1234, 1230}, {0, -5, 5, 99, 5}, {0, -5, 5, -99, -5}}) {
    SCOPED_TRACE(testing::Message() << "int64 step " << step << " write " << in);
    EXPECT_EQ(set(*live<Int64Setting>("L", std::int64_t{0}, low, high, step), in).getValue(), out);
  }

  // A 32-bit setting's rule is only called by name.
  auto i = live<Int32Setting>("I", 0, 0, 100, 0);
  EXPECT_EQ(i->validateValue(1000), 100);
  EXPECT_EQ(i->validateValue(-1), 0);
  i->setStep(10);
  EXPECT_EQ(i->validateValue(1234), 1230);
}

TEST(SettingParseTest, StoresWithoutValidationAndReportsFailure) {
  // Each row parses a text into a setting and reads the value back: a failed
  // parse keeps the value, and a stored one bypasses the range. The number
  // forms themselves are the number reader's (tools tests).
  BoolSetting b("B");
  Int32Setting i("I", 5, 0, 10, 0);
  Int64Setting l("L");
  DoubleSetting d("D", 0.0, 0.0, 1.0, 0.0);
  const char *const min64 = "-9223372036854775808";
  const struct {
    Setting *setting;
    const char *text;
    bool parsed;
    const char *value;
  } rows[] = {{&b, "TRUE", true, "true"},    {&b, "truex", false, "false"}, {&i, "  42abc", true, "42"},
              {&i, "abc", false, "42"},      {&l, min64, true, min64},      {&l, "9223372036854775808", false, min64},
              {&d, "2.5e3Hz", true, "2500"}, {&d, "1e999", false, "2500"}};
  for (const auto &row : rows) {
    SCOPED_TRACE(row.text);
    EXPECT_EQ(row.setting->parse(row.text), row.parsed);
    EXPECT_EQ(row.setting->toString(), row.value);
  }
}

TEST(SettingTextTest, TypeErasedDoorOfABoolSettingTakesAndGivesNumbersAsTruth) {
  BoolSetting b("B", true);
  ISetting &erased = b;
  EXPECT_EQ(erased.getInt32(), 1);
  EXPECT_EQ(erased.getInt64(), 1);
  erased.setCommonValue(0);
  EXPECT_FALSE(b.getValue());
  erased.setCommonValue(std::int64_t{7});
  EXPECT_TRUE(b.getValue());
}

TEST(SettingValueTest, EqualsAndCopyFromNeedTheValueTypeAndResetTheResettableFlag) {
  auto a = std::make_shared<Int32Setting>("A", 3, 0, 10, 0);
  auto b = std::make_shared<Int32Setting>("B", 4, 0, 10, 0);
  auto l = std::make_shared<Int64Setting>("L", 3, 0, 10, 0);
  EXPECT_FALSE(a->equals(l)); // the same value of another type
  a->copyFrom(b);
  a->copyFrom(l); // another value type is ignored
  EXPECT_EQ(a->getValue(), 4);
  a->setResettable(false);
  a->reset();
  EXPECT_EQ(a->getValue(), 4);
}

TEST(SettingFlagTest, FlagChangesNotifyOwnerAndObserversOnlyWhenTheWordChanges) {
  auto source = std::make_shared<Testing::Source>();
  auto &s = source->label;
  std::vector<ParameterBits> bits;
  auto probe = s->getSubject().get_observable().subscribe([&](const SettingChange &c) { bits.push_back(c.bits); });
  s->setReadOnly(true); // inactive: owner null, nothing published
  Testing::LiveTree<Testing::Source> tree(source);
  s->setReadOnly(true); // no change of the word
  EXPECT_TRUE(bits.empty());
  EXPECT_TRUE(source->events.empty());

  s->setVisible(false);
  s->setReadOnly(false);
  EXPECT_EQ(source->events.size(), 2u);
  EXPECT_EQ(bits, (std::vector<ParameterBits>{ParameterBits::Visible, ParameterBits::ReadOnly}));
  probe.unsubscribe();
}

TEST(ActionSettingTest, InvokesHandlersInOrderAndPassesFailures) {
  ActionSetting action("Run");
  std::string calls;
  action.add([&](ActionSetting *self) { calls += self == &action ? "a" : "?"; })->add([&](ActionSetting *) {
    calls += "b";
  });
  action.add([](ActionSetting *) { throw std::runtime_error("stop"); })->add([&](ActionSetting *) { calls += "c"; });
  EXPECT_THROW(action.invoke(), std::runtime_error);
  EXPECT_EQ(calls, "ab");
}
