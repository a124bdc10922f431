#include "wavemill/json/JsonSerializer.h"
#include "wavemill/models/Metadata.h"
#include "wavemill/models/ModelContainer.h"

#include "JsonTestModels.h"

#include <gtest/gtest.h>

using namespace Corvane::Wavemill;
using namespace JsonTests;

WAVEMILL_REGISTER_MODEL(JsonTests::Filter)
WAVEMILL_REGISTER_MODEL(Testing::Source)
WAVEMILL_REGISTER_MODEL(Testing::Rack)
WAVEMILL_REGISTER_MODEL(Testing::Sources) // makes lists of source lists known too

namespace {

constexpr auto npos = std::string::npos;

// The document of makeFilter() under the namespace "Ns" and the assembly
// "Asm", line by line with the blanks at both ends.
const std::string filterDocument = "{\n"
                                   "  \"$type\": \"Ns.Filter, Asm\",\n"
                                   "  \"Cutoff\": 1000,\n"
                                   "  \"Lanes\": {\n"
                                   "    \"$type\": \"System.Collections.ObjectModel.Collection`1[[System.Collections."
                                   "ObjectModel.Collection`1[[Ns.Source, Asm]], mscorlib]], mscorlib\",\n"
                                   "    \"$values\": [\n"
                                   "    ]  \n"
                                   "  }\n"
                                   ",\n"
                                   "  \"Texts\": {\n"
                                   "    \"$type\": \"System.Collections.ObjectModel.Collection`1[[Ns.TextModel, Asm]], "
                                   "mscorlib\",\n"
                                   "    \"$values\": [\n"
                                   "      {\n"
                                   "        \"$type\": \"Ns.TextModel, Asm\",\n"
                                   "        \"Text\": \"One\"      \n"
                                   "      }\n"
                                   ",\n"
                                   "      {\n"
                                   "        \"$type\": \"Ns.TextModel, Asm\",\n"
                                   "        \"Text\": \"Two\"      \n"
                                   "      }\n"
                                   "\n"
                                   "    ]  \n"
                                   "  }\n"
                                   ",\n"
                                   "  \"Title\": \"Low pass\"\n"
                                   "}\n";

} // namespace

TEST(JsonSerializerTest, WritesTheDocumentByteForByteAndReadsItBack) {
  JsonSerializer serializer;
  serializer.getActivator()->updateFullTypeNames("Asm", "Ns");
  auto filter = makeFilter();
  const std::string text = serializer.serialize(filter);
  ASSERT_EQ(text, filterDocument);
  EXPECT_EQ(text.capacity(), text.size()); // sized before it was written
  // A list of lists is named, but only models are written as its items.
  auto laned = makeFilter();
  laned->lanes->getValue()->add(std::make_shared<Testing::Sources>());
  EXPECT_EQ(serializer.serialize(laned), filterDocument);

  auto recalled = std::dynamic_pointer_cast<Filter>(serializer.deserialize(filterDocument));
  ASSERT_TRUE(recalled);
  EXPECT_TRUE(recalled->equals(filter));
  EXPECT_EQ(serializer.serialize(nullptr), ""); // no model, no document
}

TEST(JsonSerializerTest, DeepTreesRoundTripAndFillInPlace) {
  JsonSerializer serializer;
  serializer.getActivator()->updateFullTypeNames("Lab", "Corvane.Lab");
  auto rack = makeRack();
  const std::string text = serializer.serialize(rack);

  // Into an existing tree: the held model and the items of the right class
  // keep their identity, a shorter list grows, a longer one loses its tail.
  auto existing = std::make_shared<Testing::Rack>();
  const auto source = existing->source->getValue();
  const auto sources = existing->sources->getValue();
  const auto kept = sources->addItem();
  for (int more : {0, 2}) {
    for (int i = 0; i < more; ++i)
      sources->addItem();
    ASSERT_TRUE(serializer.deserializeToExistObject(JsonSerializer::parse(text), existing));
    EXPECT_TRUE(existing->equals(rack));
    EXPECT_EQ(existing->source->getValue(), source);
    EXPECT_EQ(sources->getItem(0), kept);
  }

  // An object of another class is not filled.
  EXPECT_FALSE(serializer.deserializeToExistObject(JsonSerializer::parse(text), std::make_shared<Filter>()));
  EXPECT_FALSE(serializer.deserializeToExistObject(JsonSerializer::parse(text), nullptr));
}

TEST(JsonSerializerTest, StoredSettingsTreeModeAndTracking) {
  auto options = std::make_shared<JsonSerializerSetting>();
  JsonSerializer serializer(options, nullptr);
  serializer.getActivator()->registerType<Testing::Source>("");
  auto writer = std::make_shared<Testing::Source>(), reader = std::make_shared<Testing::Source>();
  const auto read = [&](const std::string &text) {
    serializer.deserializeToExistObject(JsonSerializer::parse(text), reader);
  };
  writer->label->setPersisted(false);
  writer->count->setValue(7);

  // Not persisted: neither written nor read.
  EXPECT_EQ(serializer.serialize(writer).find("Label"), npos);
  reader->label->setPersisted(false);
  read("{\"$type\": \"Testing.Source\", \"Label\": \"x\",\n\"Count\": 4\n}");
  EXPECT_EQ(reader->label->getValue(), "idle");

  // Tracking lists what the document lacked.
  options->setDeserializationTracking(true);
  read("{\"$type\": \"Testing.Source\",\n\"Count\": 5\n}");
  auto missing = reader->getMetadata().get<std::vector<std::string>>(ModelBase::MissingSettings_key);
  ASSERT_TRUE(missing);
  EXPECT_EQ(*missing, (std::vector<std::string>{"Frequency", "Level", "On", "Offset"}));

  // Tree mode writes only TreeStored plain settings but reads any stored one.
  options->setTreeMode(true);
  writer->count->setFlag(ParameterBits::TreeStored, true);
  const std::string text = serializer.serialize(writer);
  EXPECT_NE(text.find("\"Count\": 7"), npos);
  EXPECT_EQ(text.find("Offset"), npos);
  read("{\"$type\": \"Source\",\n\"Offset\": 9,\n\"Bogus\": 1\n}");
  EXPECT_EQ(reader->offset->getValue(), 9);
}
