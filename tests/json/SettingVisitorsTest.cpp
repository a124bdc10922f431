#include "wavemill/json/ConverterBase.h"
#include "wavemill/json/DisplayDataSerializer.h"
#include "wavemill/json/JsonToSettingVisitor.h"
#include "wavemill/json/SettingToJsonVisitor.h"
#include "wavemill/models/ContextSetting.h"
#include "wavemill/models/Prototype.h"

#include "support/TestModels.h"

#include <gtest/gtest.h>

#include <stdexcept>
#include <tuple>
#include <utility>
#include <vector>

using namespace Corvane::Wavemill;

constexpr auto npos = std::string::npos;

namespace {

// An enum setting as an application writes one: an Int32Setting with
// EnumKind, its own list of valid values and texts.
class ModeSetting : public Int32Setting {
public:
  ModeSetting() : Int32Setting("Mode") { setFlag(ParameterBits::EnumKind, true); }
  gsl::span<int> getValidInt32Values() override { return {valid.data(), valid.size()}; }
  void setValidInt32Values(gsl::span<int> values) override { valid.assign(values.begin(), values.end()); }
  int findEnumIndex(const std::string &text) const override {
    for (int i = 0; i < 3; ++i)
      if (text == names[i])
        return i;
    return -1;
  }
  void visit(SettingVisitor *visitor) override { visitor->dispatch(static_cast<ISetting *>(this)); }

  std::vector<int> valid;
  const char *names[3] = {"CW", "AM", "FM"};
};

std::string written(Setting &setting) {
  SettingToJsonVisitor visitor;
  setting.visit(&visitor);
  return visitor.getCurrent() ? visitor.getCurrent()->toString() : std::string();
}

void read(Setting &setting, const std::string &text) {
  JsonToSettingVisitor visitor(JsonSerializer::parse(text));
  setting.visit(&visitor);
}

} // namespace

TEST(SettingVisitorsTest, WritesKindsLimitsAndFlags) {
  DoubleSetting level("Level", 1.5, -130.0, 20.0, 0.0);
  EXPECT_EQ(written(level), "{\n  \"$type\": \"DoubleSetting\",\n  \"Max\": 20,\n  \"Min\": -130,\n  \"Name\": "
                            "\"Level\",\n  \"NepStep\": 1,\n  \"ReadOnly\": false,\n  \"Value\": 1.5,\n  \"Visible\": "
                            "true\n}\n");
  StringSetting title("Title");
  title.setReadOnly(true);
  ModeSetting mode, listed;
  listed.valid = {0, 2};
  using Part = std::pair<Setting *, const char *>;
  EXPECT_EQ(written(mode).find("ValidValues"), npos); // an empty list is left out
  for (const auto &[setting, part] :
       {Part{&title, "\"$type\": \"StringSetting\",\n  \"MaxLength\": 65536,"}, Part{&title, "\"ReadOnly\": true"},
        Part{&listed, "\"Value\": \"0\""}, Part{&listed, "\"$type\": \"EnumSetting\""},
        Part{&listed, "\"ValidValues\": [\n    0,\n    2\n  ]"}})
    EXPECT_NE(written(*setting).find(part), npos) << setting->getName() << " lacks " << part;

  // A setting that is not an enum leaves the previous object in place.
  SettingToJsonVisitor visitor;
  title.visit(&visitor);
  auto previous = visitor.getCurrent();
  visitor.dispatch(static_cast<ISetting *>(&level));
  EXPECT_EQ(visitor.getCurrent(), previous);
}

TEST(SettingVisitorsTest, ReadsValuesLimitsAndFlags) {
  DoubleSetting level("Level", 1.5, -130.0, 20.0, 0.0);
  // The value is taken under the old limits; the new ones are stored as
  // they are, even when the value lies outside.
  read(level, "{\"Value\": 10,\n\"Min\": 12.5,\n\"Max\": 30,\n\"Step\": 0.5,\n\"ReadOnly\": true,\n\"Visible\": "
              "false\n}");
  EXPECT_EQ(std::make_tuple(level.getValue(), level.getMinimum(), level.getMaximum(), level.getStep()),
            std::make_tuple(10.0, 12.5, 30.0, 0.5));
  EXPECT_TRUE(level.isReadOnly());
  EXPECT_FALSE(level.isVisible());

  StringSetting title("Title");
  read(title, "{\"Value\": \"two\\nlines\",\n\"MaxLength\": 12\n}");
  EXPECT_EQ(title.getValue(), "two\nlines");
  EXPECT_EQ(title.getMaxLength(), 12);

  ModeSetting mode;
  read(mode, "{\"Value\": \"2\",\n\"ValidValues\": [\n1,\n2\n]\n}");
  EXPECT_EQ(mode.getValue(), 2);
  EXPECT_EQ(mode.valid, (std::vector<int>{1, 2}));
  read(mode, "{\"Value\": \"1\",\n\"ValidValues\": [\n]\n}");
  EXPECT_EQ(mode.valid, (std::vector<int>{1, 2}));

  // A limit that is no number reaches the caller as a standard exception.
  EXPECT_THROW(read(level, "{\"Value\": 1,\n\"NepStep\": 1e999\n}"), std::out_of_range);
}

TEST(SettingVisitorsTest, ConvertersByDefaultAndTheirReadings) {
  BoolSetting onOff("OnOff"), plain("Plain");
  Int32Setting count("Count");
  Int64Setting offset("Offset");
  DoubleSetting level("Level");
  StringSetting title("Title");
  ModeSetting mode;
  EXPECT_EQ(ContextSetting("Context").getConverter(), Prototype::getInstance<StringConverter>());
  EXPECT_EQ(onOff.convertTo(), "Off");
  plain.setConverter(std::make_shared<BoolConverter>());

  // Each row reads a text into the setting and shows what it holds then.
  const struct {
    Setting &setting;
    const char *text, *shown;
  } readings[] = {{onOff, "ON", "On"},        {plain, "TRUE", "true"},
                  {count, "12abc", "12"},     {offset, "-9000000000", "-9000000000"},
                  {level, " 2.5e3V", "2500"}, {title, "Low pass", "Low pass"},
                  {mode, "FM", "2"},          {mode, "CW", "0"},
                  {mode, "PM", "0"}}; // an unknown name keeps the value
  for (const auto &r : readings) {
    r.setting.convertBack(r.text);
    EXPECT_EQ(r.setting.convertTo(), r.shown) << r.setting.getName() << " " << r.text;
  }
  EXPECT_THROW(count.convertBack("abc"), std::invalid_argument);
}

TEST(SettingVisitorsTest, DisplayDataDescribesEachStoredPlainSetting) {
  DisplayDataSerializer display;
  display.getActivator()->registerType<Testing::Source>("");
  auto source = std::make_shared<Testing::Source>();
  source->count->setValue(64);
  const std::string text = display.serialize(source);

  auto other = std::make_shared<Testing::Source>();
  other->offset->setMaximum(5);
  std::string partial = text;
  partial.erase(partial.find("  \"Offset\""), partial.find("  \"On\"") - partial.find("  \"Offset\""));
  EXPECT_TRUE(display.deserializeToExistObject(JsonSerializer::parse(partial), other));
  EXPECT_EQ(other->count->getValue(), 64);
  EXPECT_EQ(other->offset->getMaximum(), 5); // no member: kept as it was

  // Sub-models are not part of the display form: a rack without its name
  // shows only its class.
  auto rack = std::make_shared<Testing::Rack>();
  rack->name->setPersisted(false);
  EXPECT_EQ(display.serialize(rack), "{\n  \"$type\": \"" + display.getActivator()->toName(rack) + "\"\n}\n");
}
