#include "wavemill/json/DisplayDataSerializer.h"
#include "wavemill/json/JsonSerializer.h"
#include "wavemill/models/ApplicationManager.h"
#include "wavemill/tools/Tools.h"

#include "JsonTestModels.h"
#include "support/TempDir.h"

#include <gtest/gtest.h>

#include <cstdlib>

using namespace Corvane::Wavemill;

// Documents written from ordinary values (printable text, finite numbers)
// are valid JSON for a standard parser, with the values a reader expects.
TEST(JsonValidityTest, StandardParserReadsOurDocuments) {
  Testing::TempDir folder;
  JsonSerializer serializer;
  serializer.getActivator()->updateFullTypeNames("Lab", "Corvane.Lab");
  auto manager = std::make_shared<ApplicationManager>();
  manager->getApplications()->add(std::make_shared<ApplicationBase>());
  auto rack = JsonTests::makeRack();
  rack->name->setValue("Band \"pass\"\twith\nlines \\ and 'marks'");
  Tools::writeText(folder.path("filter.json"), serializer.serialize(JsonTests::makeFilter()));
  Tools::writeText(folder.path("rack.json"), serializer.serialize(rack));
  Tools::writeText(folder.path("display.json"), DisplayDataSerializer().serialize(rack->source->getValue()));
  Tools::writeText(folder.path("manager.json"), serializer.serialize(manager));

  Tools::writeText(folder.path("check.py"), R"(
import json, sys
def load(name):
    with open(sys.argv[1] + "/" + name, encoding="utf-8") as f:
        return json.load(f)
filter = load("filter.json")
assert filter["$type"] == "Corvane.Lab.Filter, Lab", filter["$type"]
assert filter["Cutoff"] == 1000 and filter["Title"] == "Low pass"
assert [t["Text"] for t in filter["Texts"]["$values"]] == ["One", "Two"]
rack = load("rack.json")
assert rack["Name"] == "Band \"pass\"\twith\nlines \\ and 'marks'", rack["Name"]
sources = rack["Sources"]["$values"]
assert [s["Count"] for s in sources] == [1, 11, 21] and sources[2]["Offset"] == -(1 << 40) + 2
assert rack["Source"]["Level"] == -42.5 and sources[0]["On"] is True and sources[1]["Label"] == "S1"
display = load("display.json")
assert display["Frequency"]["$type"] == "DoubleSetting" and display["Frequency"]["Max"] == 40e9
assert load("manager.json")["Applications"]["$values"] == [{"$type": "Corvane.Wavemill.ApplicationBase"}]
)");
  const std::string command = "python3 " + folder.path("check.py") + " " + folder.root();
  EXPECT_EQ(std::system(command.c_str()), 0) << "python3 refused a document in " << folder.root();
}
