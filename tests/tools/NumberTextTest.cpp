#include "wavemill/json/ConverterBase.h"
#include "wavemill/json/JsonSerializer.h"
#include "wavemill/json/JsonToSettingVisitor.h"
#include "wavemill/json/SettingToJsonVisitor.h"
#include "wavemill/models/Activator.h"
#include "wavemill/models/Prototype.h"
#include "wavemill/tools/Tools.h"

#include "support/TestModels.h"
#include "tools/NumberText.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <clocale>
#include <cmath>
#include <cstdlib>
#include <string>
#include <vector>

using namespace Corvane::Wavemill;

namespace {

// Switches the whole process to `name` for the scope, as a desktop
// application does with setlocale(LC_ALL, ""), and switches back also when
// an assertion ends the test early.
struct ProcessLocale {
  explicit ProcessLocale(const char *name)
      : previous(std::setlocale(LC_ALL, nullptr)), switched(std::setlocale(LC_ALL, name) != nullptr) {}
  ~ProcessLocale() { std::setlocale(LC_ALL, previous.c_str()); }
  const std::string previous;
  const bool switched;
};

constexpr const char *german = "de_DE.UTF-8";
constexpr const char *missing = "the locale de_DE.UTF-8 is missing; scripts/bootstrap generates it";

} // namespace

TEST(NumberTextTest, ReadsUnderADecimalCommaWhatStrtodReadsInTheCLocale) {
  const char *const texts[] = {"12abc",  "  -3.5e2x", "0x1p3", "0x1p+-1", "0x.8",  "0xg",    "inf", "\t-Infinity",
                               "nan(1)", ".",         "-",     "--1",     "1e999", "1e-310", "",    "+.5e+1x"};
  struct Strtod {
    double value;
    std::ptrdiff_t length;
    bool outOfRange;
  };
  std::vector<Strtod> expected;
  {
    const ProcessLocale plain("C");
    for (const char *text : texts) {
      char *end = nullptr;
      errno = 0;
      const double value = std::strtod(text, &end);
      expected.push_back({value, end - text, errno == ERANGE});
    }
  }
  const ProcessLocale locale(german);
  ASSERT_TRUE(locale.switched) << missing;
  for (std::size_t i = 0; i < expected.size(); ++i) {
    SCOPED_TRACE(texts[i]);
    const auto read = NumberText::readDouble(texts[i]);
    EXPECT_EQ(static_cast<std::ptrdiff_t>(read.length), expected[i].length);
    EXPECT_EQ(read.status == NumberText::ReadStatus::none, expected[i].length == 0);
    EXPECT_EQ(read.status == NumberText::ReadStatus::outOfRange, expected[i].outOfRange);
    if (read.status == NumberText::ReadStatus::ok) {
      const bool bothNan = std::isnan(read.value) && std::isnan(expected[i].value);
      EXPECT_TRUE(bothNan || read.value == expected[i].value) << read.value << " " << expected[i].value;
    }
  }

  // Integers by strtoll's rules, base prefixes included.
  using Integer = std::pair<const char *, int>;
  const Integer integers[] = {{"0x1Fg", 0},
                              {"077", 0},
                              {" -12z", 10},
                              {"zz", 36},
                              {"0xg", 16},
                              {"+-1", 10},
                              {"-9223372036854775808", 10},
                              {"9223372036854775808", 10}};
  for (const auto &[text, base] : integers) {
    SCOPED_TRACE(text);
    char *end = nullptr;
    errno = 0;
    const long long value = std::strtoll(text, &end, base);
    const bool outOfRange = errno == ERANGE;
    const auto read = NumberText::readInt64(text, base);
    EXPECT_EQ(static_cast<std::ptrdiff_t>(read.length), end - text);
    EXPECT_EQ(read.status == NumberText::ReadStatus::outOfRange, outOfRange);
    if (!outOfRange) {
      EXPECT_EQ(read.value, value);
    }
  }
}

// A desktop application runs under the user's locale: settings, Tools,
// converters, display data and documents still read and write a decimal point.
TEST(NumberTextTest, EveryLayerKeepsTheDecimalPointUnderAGermanLocale) {
  const ProcessLocale locale(german);
  ASSERT_TRUE(locale.switched) << missing;
  ASSERT_STREQ(std::localeconv()->decimal_point, ",") << "or nothing below is put to the test";

  DoubleSetting setting("Level");
  EXPECT_TRUE(setting.parse("2.5"));
  EXPECT_EQ(setting.getDouble(), 2.5);
  EXPECT_EQ(Tools::parseDouble(" 2.5V", 0), 2.5);
  Prototype::getInstance<DoubleConverter>()->convertBack(&setting, "-0.5");
  EXPECT_EQ(setting.getDouble(), -0.5);
  JsonToSettingVisitor reader(JsonSerializer::parse(R"({"Value": 1, "Min": -0.25})"));
  setting.visit(&reader);
  EXPECT_EQ(setting.getMinimum(), -0.25);

  DoubleSetting half("Half", 0.5, -0.25, 2.5, 0.0);
  EXPECT_EQ(half.toString(), "0.5");
  SettingToJsonVisitor display;
  half.visit(&display);
  EXPECT_EQ(display.getCurrent()->getItem("Min")->toString(), "-0.25");

  JsonSerializer serializer;
  serializer.getActivator()->registerType<Testing::Source>("");
  auto source = std::make_shared<Testing::Source>();
  source->level->setValue(-0.5);
  const std::string document = serializer.serialize(source);
  EXPECT_NE(document.find("\"Level\": -0.5,"), std::string::npos) << document;
  const auto recalled = std::dynamic_pointer_cast<Testing::Source>(serializer.deserialize(document));
  ASSERT_NE(recalled, nullptr);
  EXPECT_EQ(recalled->level->getValue(), -0.5);
}
