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
  DisplayDataSerializer display;
  auto manager = std::make_shared<ApplicationManager>();
  manager->getApplications()->add(std::make_shared<ApplicationBase>());

  Tools::writeText(folder.path("filter.json"), serializer.serialize(JsonTests::makeFilter()));
  auto bench = JsonTests::makeBench();
  bench->filter->getValue()->title->setValue("Band \"pass\"\twith\nlines \\ and 'marks'");
  Tools::writeText(folder.path("bench.json"), serializer.serialize(bench));
  Tools::writeText(folder.path("display.json"), display.serialize(JsonTests::makeBench()->filter->getValue()));
  Tools::writeText(folder.path("manager.json"), serializer.serialize(manager));

  const std::string script = R"(
import json, sys
folder = sys.argv[1]
def load(name):
    with open(folder + "/" + name, encoding="utf-8") as f:
        return json.load(f)
filter = load("filter.json")
assert filter["$type"] == "Corvane.Lab.Filter, Lab", filter["$type"]
assert filter["Cutoff"] == 1000 and filter["Title"] == "Low pass"
assert [t["Text"] for t in filter["Texts"]["$values"]] == ["One", "Two"]
bench = load("bench.json")
assert bench["Filter"]["Title"] == "Band \"pass\"\twith\nlines \\ and 'marks'", bench["Filter"]["Title"]
tracks = bench["Tracks"]["$values"]
assert [len(t["Segments"]["$values"]) for t in tracks] == [1, 2, 3]
assert tracks[2]["Segments"]["$values"][1]["Offset"] == -(1 << 40) + 1
display = load("display.json")
assert display["Cutoff"]["$type"] == "DoubleSetting" and display["Cutoff"]["Max"] == 1e9
manager = load("manager.json")
assert manager["Applications"]["$values"] == [{"$type": "Corvane.Wavemill.ApplicationBase"}]
)";
  Tools::writeText(folder.path("check.py"), script);
  const std::string command = "python3 " + folder.path("check.py") + " " + folder.root();
  EXPECT_EQ(std::system(command.c_str()), 0) << "python3 refused a document in " << folder.root();
}
