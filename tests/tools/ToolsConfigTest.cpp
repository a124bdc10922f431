#include "wavemill/tools/Tools.h"

#include "support/TempDir.h"

#include <gtest/gtest.h>

#include <map>
#include <string>
#include <vector>

using namespace Corvane::Wavemill;
using Corvane::Wavemill::Testing::TempDir;

namespace {

using Entries = std::map<std::string, std::string>;

} // namespace

TEST(ToolsTest, ReadConfigTrimsKeysAndValuesAndLetsTheLastRepeatWin) {
  TempDir dir;
  Tools::writeText(dir.path("a.cfg"), "  name = \"Lumenbay\"  \n"
                                      "path\t=\t'C:\\data'\n"
                                      "url=http://host/?a=b\n"
                                      "=no key\n"
                                      "# a line without delimiter\n"
                                      "\n"
                                      "a=1\n"
                                      "a=2\n"
                                      "crlf=yes\r\n"
                                      "empty=");
  EXPECT_EQ(Tools::readConfig(dir.path("a.cfg"), "="), (Entries{{"name", "Lumenbay"},
                                                                {"path", "C:\\data"},
                                                                {"url", "http://host/?a=b"},
                                                                {"", "no key"},
                                                                {"a", "2"},
                                                                {"crlf", "yes"},
                                                                {"empty", ""}}));
}

TEST(ToolsTest, ReadConfigWithOtherDelimitersKeepsLinesWithoutOneAsKeys) {
  TempDir dir;
  Tools::writeText(dir.path("a.cfg"), "x: 1\ny;2\nplain line\na=b\n");
  EXPECT_EQ(Tools::readConfig(dir.path("a.cfg"), ":;"),
            (Entries{{"x", "1"}, {"y", "2"}, {"plain line", ""}, {"a=b", ""}}));
}

TEST(ToolsTest, ReadersOfAnUnreadablePathYieldNothing) {
  TempDir dir;
  for (const auto &path : {dir.path("absent"), dir.root()}) {
    EXPECT_TRUE(Tools::readConfig(path, "=").empty());
    EXPECT_TRUE(Tools::readXml(path).empty());
    EXPECT_TRUE(Tools::readLines(path).empty());
    EXPECT_EQ(Tools::readText(path), "");
  }
  Tools::writeText(dir.path("absent/a.txt"), "x");
  EXPECT_FALSE(Tools::exist(dir.path("absent/a.txt")));
}

TEST(ToolsTest, ReadLinesDropsTheLineEndsOnly) {
  TempDir dir;
  Tools::writeText(dir.path("a.txt"), "a\r\n b \n\nc");
  EXPECT_EQ(Tools::readLines(dir.path("a.txt")), (std::vector<std::string>{"a", " b ", "", "c"}));
}

TEST(ToolsTest, ReadXmlKeysElementsByTheirPath) {
  TempDir dir;
  Tools::writeText(dir.path("a.xml"), "<?xml version=\"1.0\"?>\n"
                                      "<root>\n"
                                      "  <name>Lumenbay</name>  \r\n"
                                      "  <!-- one line -->\n"
                                      "  <device id=\"7\">\n"
                                      "    <address>\n"
                                      "part1\n"
                                      "part2\t\n"
                                      "    </address>\n"
                                      "    <!--\n"
                                      "text of a comment\n"
                                      "    -->\n"
                                      "  only > one\n"
                                      "  </device>\n"
                                      "  <empty></empty>\n"
                                      "  <other>x</wrong>\n"
                                      "  </other>\n"
                                      "</root>\n");
  EXPECT_EQ(Tools::readXml(dir.path("a.xml")), (Entries{{"root", ""},
                                                        {"root.name", "Lumenbay"},
                                                        {"root.device", ""},
                                                        {"root.device.address", "part1part2"},
                                                        {"root.empty", ""},
                                                        {"root.other", ""}}));
}

TEST(ToolsTest, ReadXmlNumbersRepeatedElementsWithTheirChildren) {
  TempDir dir;
  Tools::writeText(dir.path("a.xml"), "<list>\n"
                                      "<item>\n<v>1</v>\n</item>\n"
                                      "<item>\n<v>2</v>\n</item>\n"
                                      "<item>3</item>\n"
                                      "</list>\n"
                                      "<list>\n</list>\n");
  EXPECT_EQ(Tools::readXml(dir.path("a.xml")), (Entries{{"list", ""},
                                                        {"list.item", ""},
                                                        {"list.item.v", "1"},
                                                        {"list.item.1", ""},
                                                        {"list.item.1.v", "2"},
                                                        {"list.item.2", "3"},
                                                        {"list.1", ""}}));
}

TEST(ToolsTest, ReadXmlTakesTheFirstTagOfALineAndKeepsSelfClosingTagsOpen) {
  TempDir dir;
  Tools::writeText(dir.path("a.xml"), "<a><b>x</b>\n</a>\n");
  EXPECT_EQ(Tools::readXml(dir.path("a.xml")), (Entries{{"a", ""}}));

  Tools::writeText(dir.path("b.xml"), "<r>\n<flag/>\n<v>1</v>\n</r>\n");
  EXPECT_EQ(Tools::readXml(dir.path("b.xml")), (Entries{{"r.flag.v", "1"}}));
}
