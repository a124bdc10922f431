#include "wavemill/json/JsonSerializer.h"
#include "wavemill/models/ApplicationManager.h"
#include "wavemill/models/Interceptor.h"
#include "wavemill/models/Metadata.h"
#include "wavemill/models/ModelContainer.h"

#include "JsonTestModels.h"

#include <gtest/gtest.h>

using namespace Corvane::Wavemill;
using namespace JsonTests;

WAVEMILL_REGISTER_MODEL(JsonTests::Filter)
WAVEMILL_REGISTER_MODEL(JsonTests::Segment)
WAVEMILL_REGISTER_MODEL(JsonTests::Track)
WAVEMILL_REGISTER_MODEL(JsonTests::Bench)
WAVEMILL_REGISTER_MODEL(JsonTests::Segments) // makes lists of segment lists known too

namespace {

// The document of makeFilter() under the namespace "Ns" and the assembly
// "Asm", line by line with the blanks at both ends.
const std::string filterDocument = "{\n"
                                   "  \"$type\": \"Ns.Filter, Asm\",\n"
                                   "  \"Cutoff\": 1000,\n"
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
  ASSERT_EQ(serializer.serialize(filter), filterDocument);

  auto recalled = std::dynamic_pointer_cast<Filter>(serializer.deserialize(filterDocument));
  ASSERT_TRUE(recalled);
  EXPECT_TRUE(recalled->equals(filter));
  EXPECT_EQ(recalled->texts->getValue()->getItem(1)->Text->getValue(), "Two");

  // Reading made every registered class known by its full name again.
  EXPECT_EQ(serializer.getActivator()->toName(filter), "JsonTests.Filter");

  // Another namespace and assembly in the document: found by short names.
  std::string foreign = filterDocument;
  for (auto at = foreign.find("Ns."); at != std::string::npos; at = foreign.find("Ns.", at))
    foreign.replace(at, 3, "Old.Space.");
  for (auto at = foreign.find(", Asm"); at != std::string::npos; at = foreign.find(", Asm", at))
    foreign.replace(at, 5, ", Legacy");
  recalled = std::dynamic_pointer_cast<Filter>(serializer.deserialize(foreign));
  ASSERT_TRUE(recalled);
  EXPECT_TRUE(recalled->equals(filter));
}

TEST(JsonSerializerTest, DeepTreesRoundTripAndFillInPlace) {
  JsonSerializer serializer;
  serializer.getActivator()->updateFullTypeNames("Lab", "Corvane.Lab");
  auto bench = makeBench();
  const std::string text = serializer.serialize(bench);
  EXPECT_NE(text.find("\"$type\": \"System.Collections.ObjectModel.Collection`1[[Corvane.Lab.Segment, Lab]], "
                      "mscorlib\""),
            std::string::npos);
  EXPECT_NE(text.find(R"("Title": "Band\tpass\nlines \\ and 'marks'")"), std::string::npos);

  auto fresh = std::dynamic_pointer_cast<Bench>(serializer.deserialize(text));
  ASSERT_TRUE(fresh);
  EXPECT_TRUE(fresh->equals(bench));

  // Into an existing tree: items of the right class keep their identity, a
  // longer list in the tree loses its tail, a shorter one grows.
  auto existing = std::make_shared<Bench>();
  auto tracks = existing->tracks->getValue();
  auto keptTrack = tracks->addItem();
  auto keptSegment = keptTrack->segments->getValue()->addItem();
  keptTrack->segments->getValue()->addItem(); // one more than the document's first track
  auto filter = existing->filter->getValue();
  ASSERT_TRUE(serializer.deserializeToExistObject(JsonSerializer::parse(text), existing));
  EXPECT_TRUE(existing->equals(bench));
  EXPECT_EQ(existing->filter->getValue(), filter);
  ASSERT_EQ(tracks->getCount(), 3);
  EXPECT_EQ(tracks->getItem(0), keptTrack);
  EXPECT_EQ(keptTrack->segments->getValue()->getCount(), 1);
  EXPECT_EQ(keptTrack->segments->getValue()->getItem(0), keptSegment);

  // A list of lists is named, but only models are written as its items.
  existing->lanes->getValue()->add(std::make_shared<Segments>());
  const std::string again = serializer.serialize(existing);
  EXPECT_NE(again.find("\"$values\": [\n    ]", again.find("\"Lanes\"")), std::string::npos);

  // An object of another class is not filled.
  EXPECT_FALSE(serializer.deserializeToExistObject(JsonSerializer::parse(text), std::make_shared<Filter>()));
  EXPECT_FALSE(serializer.deserializeToExistObject(JsonSerializer::parse(text), nullptr));
}

TEST(JsonSerializerTest, StoredSettingsTreeModeAndTracking) {
  auto options = std::make_shared<JsonSerializerSetting>();
  JsonSerializer serializer(options, nullptr);
  EXPECT_EQ(serializer.getSetting(), options);
  serializer.getActivator()->registerType<Segment>("");
  auto segment = std::make_shared<Segment>();
  segment->label->setValue("kept");
  segment->label->setPersisted(false);
  segment->samples->setValue(7);

  // Not persisted: neither written nor read.
  std::string text = serializer.serialize(segment);
  EXPECT_EQ(text.find("Label"), std::string::npos);
  auto reader = std::make_shared<Segment>();
  reader->label->setPersisted(false);
  serializer.deserializeToExistObject(JsonSerializer::parse(R"({"$type": "JsonTests.Segment", "Label": "x",)"
                                                            "\n\"Samples\": 3\n}"),
                                      reader);
  EXPECT_EQ(reader->label->getValue(), "");
  EXPECT_EQ(reader->samples->getValue(), 3);

  // Tracking lists what the document lacked, once per run.
  options->setDeserializationTracking(true);
  auto document = JsonSerializer::parse("{\"$type\": \"JsonTests.Segment\",\n\"Samples\": 5\n}");
  serializer.deserializeToExistObject(document, reader);
  serializer.deserializeToExistObject(document, reader);
  auto missing = reader->getMetadata().get<std::vector<std::string>>(ModelBase::MissingSettings_key);
  ASSERT_TRUE(missing);
  EXPECT_EQ(*missing, (std::vector<std::string>{"Offset", "Enabled", "Offset", "Enabled"}));

  // Tree mode writes only TreeStored plain settings but reads any stored one.
  options->setTreeMode(true);
  segment->samples->setFlag(ParameterBits::TreeStored, true);
  text = serializer.serialize(segment);
  EXPECT_NE(text.find("\"Samples\": 7"), std::string::npos);
  EXPECT_EQ(text.find("Offset"), std::string::npos);
  serializer.deserializeToExistObject(
      JsonSerializer::parse("{\"$type\": \"Segment\",\n\"Offset\": 9,\n\"Bogus\": 1\n}"), reader);
  EXPECT_EQ(reader->offset->getValue(), 9);
}

TEST(JsonSerializerTest, EdgesOfTheDocument) {
  JsonSerializer serializer;
  serializer.getActivator()->updateFullTypeNames("Lab", "Corvane.Lab");
  // Only "$type" for a model without stored settings; an empty holder and an
  // empty list.
  EXPECT_EQ(serializer.serialize(std::make_shared<ApplicationBase>()),
            "{\n  \"$type\": \"Corvane.Wavemill.ApplicationBase\"\n}\n");
  auto filter = std::make_shared<Filter>();
  filter->texts->setValue(nullptr);
  EXPECT_EQ(serializer.serialize(filter).find("Texts"), std::string::npos);
  auto empty = std::make_shared<Filter>();
  EXPECT_NE(serializer.serialize(empty).find("\"$values\": [\n    ]"), std::string::npos);
  EXPECT_EQ(serializer.serialize(nullptr), "");

  // Unknown classes give nothing; a sub-model of an unknown class leaves the
  // holder as it was (an empty pointer is no model to take).
  EXPECT_FALSE(serializer.deserialize("{\"$type\": \"Ns.Nothing, Asm\"\n}"));
  EXPECT_FALSE(serializer.deserialize("not a document"));
  auto bench = std::make_shared<Bench>();
  auto kept = bench->filter->getValue();
  EXPECT_TRUE(serializer.deserializeToExistObject(
      JsonSerializer::parse("{\"$type\": \"Bench\",\n\"Level\": 3,\n\"Filter\": {\"$type\": \"Ns.Gone\"\n}\n}"),
      bench));
  EXPECT_EQ(bench->filter->getValue(), kept);
  EXPECT_EQ(bench->level->getValue(), 3.0);

  // Quotation marks at the ends of a text are all cut at reading.
  auto text = std::make_shared<TextModel>();
  serializer.deserializeToExistObject(JsonSerializer::parse("{\"$type\": \"TextModel\",\n\"Text\": \"\"\"a\"\"\n}"),
                                      text);
  EXPECT_EQ(text->Text->getValue(), "a");
}

TEST(JsonSerializerTest, RecallUnderItsTransactionClearsDirty) {
  auto manager = std::make_shared<ApplicationManager>();
  Interceptor interceptor(manager);
  manager->activateSettings(&interceptor, nullptr);
  JsonSerializer serializer;

  auto application = std::make_shared<ApplicationBase>();
  manager->getApplications()->add(application);
  const std::string text = serializer.serialize(manager);
  application->Name->setValue("changed");
  EXPECT_TRUE(application->Dirty->getValue());
  {
    auto recall = manager->beginRecall();
    EXPECT_TRUE(serializer.deserializeToExistObject(JsonSerializer::parse(text), manager));
  }
  EXPECT_FALSE(application->Dirty->getValue());
  EXPECT_EQ(manager->getApplications()->getItem(0), application);
}
