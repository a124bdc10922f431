#include "wavemill/json/ConverterBase.h"
#include "wavemill/json/DisplayDataSerializer.h"
#include "wavemill/json/JsonToSettingVisitor.h"
#include "wavemill/json/SettingToJsonVisitor.h"
#include "wavemill/models/ContextSetting.h"
#include "wavemill/models/Prototype.h"

#include "JsonTestModels.h"

#include <gtest/gtest.h>

#include <stdexcept>
#include <vector>

using namespace Corvane::Wavemill;

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

// A model of sub-models only.
struct Holder : ModelBase {
  WAVEMILL_MODEL(Holder)
  Holder() : ModelBase("Holder") {}
  std::shared_ptr<SubSetting<JsonTests::Filter>> filter =
      init(std::make_shared<SubSetting<JsonTests::Filter>>("Filter"));
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
  DoubleSetting open("Open"); // no limits and no step
  EXPECT_EQ(written(open).find("Min"), std::string::npos);
  EXPECT_EQ(written(open).find("\"Step\""), std::string::npos);
  Int32Setting count("Count", 3, 0, 2147483647, 1);
  EXPECT_NE(written(count).find("\"Min\": 0,"), std::string::npos);
  EXPECT_EQ(written(count).find("Max"), std::string::npos);
  StringSetting title("Title");
  title.setReadOnly(true);
  EXPECT_NE(written(title).find("\"$type\": \"StringSetting\",\n  \"MaxLength\": 65536,"), std::string::npos);
  EXPECT_NE(written(title).find("\"ReadOnly\": true"), std::string::npos);
  BoolSetting output("Output");
  EXPECT_NE(written(output).find("\"Value\": false"), std::string::npos);

  ModeSetting mode;
  EXPECT_EQ(written(mode).find("ValidValues"), std::string::npos);
  mode.valid = {0, 2};
  EXPECT_NE(written(mode).find("\"$type\": \"EnumSetting\""), std::string::npos);
  EXPECT_NE(written(mode).find("\"ValidValues\": [\n    0,\n    2\n  ]"), std::string::npos);
  EXPECT_NE(written(mode).find("\"Value\": \"0\""), std::string::npos);

  // A setting that is not an enum leaves the previous object in place.
  SettingToJsonVisitor visitor;
  output.visit(&visitor);
  auto previous = visitor.getCurrent();
  visitor.dispatch(static_cast<ISetting *>(&level));
  EXPECT_EQ(visitor.getCurrent(), previous);
}

TEST(SettingVisitorsTest, ReadsValuesLimitsAndFlags) {
  DoubleSetting level("Level", 1.5, -130.0, 20.0, 0.0);
  // The value is taken under the old limits; the new ones are stored as
  // they are, even when the value lies outside.
  read(level, "{\"Value\": 10,\n\"Min\": 12.5,\n\"Max\": 30,\n\"Step\": 0.5,\n\"ReadOnly\": True,\n\"Visible\": "
              "false\n}");
  EXPECT_EQ(level.getValue(), 10.0);
  EXPECT_EQ(level.getMinimum(), 12.5);
  EXPECT_EQ(level.getMaximum(), 30.0);
  EXPECT_EQ(level.getStep(), 0.5);
  EXPECT_FALSE(level.isReadOnly());
  EXPECT_FALSE(level.isVisible());
  read(level, "{\"Value\": 11,\n\"ReadOnly\": true\n}");
  EXPECT_TRUE(level.isReadOnly());

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

  // Numbers that cannot be read reach the caller as standard exceptions.
  Int32Setting count("Count");
  Int64Setting offset("Offset");
  auto message = [](auto &&action) {
    try {
      action();
    } catch (const std::exception &e) {
      return std::string(e.what());
    }
    return std::string("none");
  };
  EXPECT_EQ(message([&] { read(count, "{\"Value\": 1,\n\"Min\": \"x\"\n}"); }), "invalid stoi argument");
  EXPECT_EQ(message([&] { read(count, "{\"Value\": 1,\n\"Max\": 99999999999\n}"); }), "stoi argument out of range");
  EXPECT_EQ(message([&] { read(offset, "{\"Value\": 1,\n\"Step\": -\n}"); }), "invalid stoll argument");
  EXPECT_EQ(message([&] { read(level, "{\"Value\": 1,\n\"NepStep\": 1e999\n}"); }), "stod argument out of range");
}

TEST(SettingVisitorsTest, ConvertersByDefaultAndTheirReadings) {
  BoolSetting output("Output");
  EXPECT_EQ(output.getConverter(), Prototype::getInstance<OnOffConverter>());
  EXPECT_EQ(output.convertTo(), "Off");
  output.convertBack("ON");
  EXPECT_TRUE(output.getValue());
  output.convertBack("1");
  EXPECT_FALSE(output.getValue());
  output.setConverter(std::make_shared<BoolConverter>());
  output.convertBack("On");
  EXPECT_FALSE(output.getValue());
  output.convertBack("TRUE");
  EXPECT_TRUE(output.getValue());
  EXPECT_EQ(output.convertTo(), "true");
  EXPECT_EQ(output.getConverter()->toString(), "ConverterBase");

  Int32Setting count("Count");
  EXPECT_EQ(count.getConverter(), Prototype::getInstance<Int32Converter>());
  count.convertBack("12abc");
  EXPECT_EQ(count.getValue(), 12);
  EXPECT_THROW(count.convertBack("abc"), std::invalid_argument);
  Int64Setting offset("Offset");
  offset.convertBack("-9000000000");
  EXPECT_EQ(offset.getValue(), -9000000000LL);
  EXPECT_THROW(offset.convertBack("99999999999999999999"), std::out_of_range);
  DoubleSetting level("Level");
  level.convertBack(" 2.5e3V");
  EXPECT_EQ(level.getValue(), 2500.0);
  StringSetting title("Title");
  title.convertBack("Low pass");
  EXPECT_EQ(title.convertTo(), "Low pass");
  EXPECT_EQ(ContextSetting("Context").getConverter(), Prototype::getInstance<StringConverter>());

  ModeSetting mode;
  EXPECT_EQ(mode.getConverter(), Prototype::getInstance<EnumConverterBase>());
  mode.convertBack("FM");
  EXPECT_EQ(mode.getValue(), 2);
  mode.convertBack("PM");
  EXPECT_EQ(mode.getValue(), 2);
}

TEST(SettingVisitorsTest, DisplayDataDescribesEachStoredPlainSetting) {
  DisplayDataSerializer display;
  display.getActivator()->registerType<JsonTests::Segment>("");
  auto segment = std::make_shared<JsonTests::Segment>();
  segment->samples->setValue(64);
  segment->label->setValue("first\nsecond");
  const std::string text = display.serialize(segment);
  EXPECT_NE(text.find("\"Samples\": {\n    \"$type\": \"Int32Setting\""), std::string::npos);
  EXPECT_NE(text.find("\"Value\": \"first\\nsecond\""), std::string::npos);

  auto other = std::make_shared<JsonTests::Segment>();
  other->offset->setMaximum(5);
  std::string partial = text;
  partial.erase(partial.find("  \"Offset\""), partial.find("  \"Samples\"") - partial.find("  \"Offset\""));
  EXPECT_TRUE(display.deserializeToExistObject(JsonSerializer::parse(partial), other));
  EXPECT_EQ(other->samples->getValue(), 64);
  EXPECT_EQ(other->label->getValue(), "first\nsecond");
  EXPECT_EQ(other->offset->getMaximum(), 5); // no member: kept as it was

  // Sub-models are not part of the display form.
  EXPECT_EQ(display.serialize(std::make_shared<JsonTests::Filter>()).find("Texts"), std::string::npos);
  auto holder = std::make_shared<Holder>();
  EXPECT_EQ(display.serialize(holder), "{\n  \"$type\": \"" + display.getActivator()->toName(holder) + "\"\n}\n");
}
