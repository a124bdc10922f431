#include "wavemill/tools/OperationSystem.h"
#include "wavemill/tools/Path.h"
#include "wavemill/tools/Tools.h"

#include "support/TempDir.h"

#include <gtest/gtest.h>

#include <dlfcn.h>
#include <link.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <map>
#include <memory>
#include <string>
#include <utility>
#include <vector>

using namespace Corvane::Wavemill;
using Corvane::Wavemill::Testing::TempDir;

namespace {

void anchorInTestProgram() {}

// A temporary folder and a file in it with the text a test reads back.
class ToolsFileTest : public ::testing::Test {
protected:
  std::string file(const std::string &text, const std::string &name = "f") {
    Tools::writeText(dir.path(name), text);
    return dir.path(name);
  }
  // The entries of a map in their order as "[key]value", for a compact expectation.
  static std::string flat(const std::map<std::string, std::string> &entries) {
    std::string result;
    for (const auto &[key, value] : entries)
      result += "[" + key + "]" + value;
    return result;
  }
  TempDir dir;
};

} // namespace

TEST_F(ToolsFileTest, ReadConfigTrimsKeysAndValuesAndLetsTheLastRepeatWin) {
  EXPECT_EQ(flat(Tools::readConfig(file("  name = \"Lumenbay\"  \npath\t=\t'C:\\data'\nurl=http://host/?a=b\n=no key\n"
                                        "# a line without delimiter\n\na=1\na=2\ncrlf=yes\r\nempty="),
                                   "=")),
            "[]no key[a]2[crlf]yes[empty][name]Lumenbay[path]C:\\data[url]http://host/?a=b");
  // With other delimiters a line without one is a key of its own.
  EXPECT_EQ(flat(Tools::readConfig(file("x: 1\ny;2\nplain line\na=b\n"), ":;")), "[a=b][plain line][x]1[y]2");
  EXPECT_EQ(Tools::readLines(file("a\r\n b \n\nc")), (std::vector<std::string>{"a", " b ", "", "c"}));
}

TEST_F(ToolsFileTest, ReadXmlKeysOneElementPerLineByItsPath) {
  const std::pair<const char *, const char *> rows[] = {
      // Comments, values over several lines, a stray ">", a wrong end tag and a "<" that ends a name.
      {"<?xml version=\"1.0\"?>\n<root>\n  <name>Lumenbay</name>  \r\n  <!-- one line -->\n  <device id=\"7\">\n"
       "    <address>\npart1\npart2\t\n    </address>\n    <!--\ntext of a comment\n    -->\n  only > one\n"
       "  </device>\n  <empty></empty>\n  <other>x</wrong>\n  </other>\n  <odd<>v</odd<>\n</root>\n",
       "[root][root.device][root.device.address]part1part2[root.empty][root.name]Lumenbay[root.odd<]v[root.other]"},
      // Repeated elements are numbered, and so are the keys of their children.
      {"<list>\n<item>\n<v>1</v>\n</item>\n<item>\n<v>2</v>\n</item>\n<item>3</item>\n</list>\n<list>\n</list>\n",
       "[list][list.1][list.item][list.item.1][list.item.1.v]2[list.item.2]3[list.item.v]1"},
      // Only the first tag of a line counts, and a self-closing tag stays open.
      {"<a><b>x</b>\n</a>\n", "[a]"},
      {"<r>\n<flag/>\n<v>1</v>\n</r>\n", "[r.flag.v]1"},
  };
  for (const auto &[text, expected] : rows)
    EXPECT_EQ(flat(Tools::readXml(file(text))), expected) << text;
}

TEST_F(ToolsFileTest, ReadersOfAnUnreadablePathYieldNothing) {
  for (const auto &path : {dir.path("absent"), dir.root()}) {
    SCOPED_TRACE(path);
    EXPECT_EQ(Tools::readText(path), "");
    EXPECT_EQ(Tools::fileSize(path), -1);
    EXPECT_FALSE(Tools::exist(path));
  }
}

TEST_F(ToolsFileTest, FindFileMatchesTheEndOfThePathDepthFirstIgnoringCase) {
  Path::createDirectory(dir.path("sub/deep"));
  for (const char *name : {"readme.TXT", "sub/deep/target.cfg", "t.dat", "sub/t.dat"})
    file("", name);
  // A link back up the tree must not make the search endless.
  std::filesystem::create_directory_symlink(dir.root(), dir.path("sub/deep/loop"));
  EXPECT_EQ(Tools::findFile(dir.root(), "DEEP\\Target.CFG"), dir.path("sub/deep/target.cfg"));
  EXPECT_EQ(Tools::findFile(dir.root(), "me.txt"), dir.path("readme.TXT"));
  EXPECT_EQ(Tools::findFile(dir.root(), "t.dat"), dir.path("t.dat"));
  EXPECT_EQ(Tools::findFile(dir.root(), "other/target.cfg"), "");

  // Files and subfolders are listed one level deep only.
  EXPECT_EQ(Tools::getFiles(dir.path("sub")), std::vector<std::string>{dir.path("sub/t.dat")});
  EXPECT_EQ(Tools::getSubDirectories(dir.path("sub")), std::vector<std::string>{dir.path("sub/deep")});
  EXPECT_TRUE(Tools::getSubDirectories(dir.path("t.dat")).empty());
}

TEST_F(ToolsFileTest, OpenWriteGivesTheFileItsFullSizeAtOnce) {
  std::ofstream stream;
  Tools::openWrite(stream, dir.path("big.bin"), 10);
  EXPECT_EQ(Tools::fileSize(dir.path("big.bin")), 10);
  stream << "ab";
  stream.close();
  EXPECT_EQ(*Tools::readFile(dir.path("big.bin")), (std::vector<unsigned char>{'a', 'b', 0, 0, 0, 0, 0, 0, 0, 0}));

  Tools::openWrite(stream, dir.path("big.bin"), 0);
  EXPECT_TRUE(stream.is_open());
}

TEST(ToolsTest, ModuleNamesNameThisLibraryAndTheTestProgram) {
  const auto library = Tools::getExecutingFileName();
  for (const auto &name : {std::string("wavemill"), Path::getFileName(library), std::string("libwavemill.so")})
    EXPECT_EQ(Tools::getModuleFileName(name), library) << name;

  auto *anchor = reinterpret_cast<void *>(&anchorInTestProgram);
  const auto program = Tools::getProcessPath(-1);
  EXPECT_EQ(Tools::getExecutingFileName(anchor), program);
  EXPECT_EQ(Tools::getModuleFileName("wavemill_tools_tests"), program);

  int onTheStack = 0;
  EXPECT_EQ(Tools::getExecutingFileName(&onTheStack), "");
  EXPECT_EQ(Tools::getModuleFileName("no-such-module"), "");
}

TEST(ToolsTest, LibraryNameLooksPastAnEarlierDotSoForTheVersionAtTheEnd) {
  // The test plugin, built next to this program, loaded under a name whose
  // first ".so" starts ".sock" and whose last is followed by a version.
  const auto plugin = Path::getDirectoryName(Tools::getProcessPath(-1)) + "/libwavemill_test_plugin.so";
  ASSERT_TRUE(Path::fileExist(plugin)) << "build the target wavemill_test_plugin first";
  TempDir dir;
  const auto renamed = dir.path("libwavemill_test_plugin.sock.so.1");
  std::filesystem::copy_file(plugin, renamed);
  void *module = ::dlopen(renamed.c_str(), RTLD_NOW | RTLD_LOCAL);
  ASSERT_NE(module, nullptr) << ::dlerror();
  link_map *loaded = nullptr;
  ASSERT_EQ(::dlinfo(module, RTLD_DI_LINKMAP, &loaded), 0) << ::dlerror();
  // The module stays loaded: the classes it registered must not lose their code.
  EXPECT_EQ(Tools::getLibraryName(loaded->l_ld), "wavemill_test_plugin.sock");
}

TEST(OperationSystemTest, ReportsTheBuildPlatformAndComparesByFields) {
  EXPECT_EQ(Tools::os().toString(), "Linux");
  EXPECT_EQ(OperationSystem().toString(), "Windows");
  EXPECT_EQ(AppleOperationSystem().toString(), "Apple");

  const auto other = std::make_shared<LinuxOperationSystem>();
  EXPECT_TRUE(LinuxOperationSystem().equals(other));
  EXPECT_FALSE(WindowsOperationSystem().equals(other));
  other->setVersion("6.1");
  EXPECT_FALSE(LinuxOperationSystem().equals(other));
  EXPECT_FALSE(LinuxOperationSystem().equals(nullptr));
}

TEST(PathTest, CombineJoinsWithOneSlashAndFullPathFoldsToTheClassicLength) {
  EXPECT_EQ(Path::combine("a\\", "/b"), "a/b");
  EXPECT_EQ(Path::combine("", "\\b"), "\\b");
  EXPECT_EQ(Path::combine("a\\", "/"), "a\\");
  EXPECT_EQ(Path::combine(Path::longPrefix() + "C:\\data", "b"), "\\/\\\\/");
  // A full path is absolute, folded and limited to the classic length.
  const auto cwd = Tools::getCurrentDirectory();
  EXPECT_EQ(Path::getFullPath("a/./b/../c"), cwd + "/a/c");
  EXPECT_EQ(Path::getFullPath("\\x\\\\y\\..\\z\\"), "/x/z/");
  EXPECT_EQ(Path::getFullPath("/../.."), "/");
  EXPECT_EQ(Path::getFullPath("/" + std::string(258, 'a')), "/" + std::string(258, 'a'));
  EXPECT_EQ(Path::getFullPath("/" + std::string(259, 'a')), "");
  EXPECT_EQ(Path::getFullPath(""), "");
}

TEST(PathTest, NamePartsAndParentOfAPath) {
  EXPECT_EQ(Path::getDirectoryName("/data\\logs/a.txt"), "/data/logs");
  EXPECT_EQ(Path::getDirectoryName("/a.txt"), "/");
  EXPECT_EQ(Path::getFileName("dir\\name.txt "), "name.txt");
  EXPECT_EQ(Path::getFileName("bare "), "bare ");
  EXPECT_EQ(Path::splitShortName("x\\libwavemill.so.0.1"),
            std::make_pair(std::string("libwavemill.so.0"), std::string("1")));
  EXPECT_EQ(Path::splitShortName("a.b/noext"), std::make_pair(std::string("noext"), std::string()));
  // The parent stops at the root given.
  EXPECT_EQ(Path::getParentDirectory("/data/logs/today"), "/data/logs/");
  EXPECT_EQ(Path::getParentDirectory("/data/logs/", "/data/logs"), "/data/logs/");
  EXPECT_EQ(Path::getParentDirectory("/"), "/");
}

TEST(PathTest, PrepareAndCreateDirectoryBuildMissingTreesButNotOverFilesAndFileNamesListOneLevel) {
  TempDir dir;
  const auto file = dir.path("a\\b/c.txt");
  EXPECT_EQ(Path::prepare(file), file);

  EXPECT_TRUE(Path::createDirectory(dir.path("a/b/")));
  Tools::writeText(dir.path("f"), "x");
  EXPECT_FALSE(Path::createDirectory(dir.path("f")));
  EXPECT_EQ(Path::prepare(dir.path("f/g/h.txt")), "");
  EXPECT_FALSE(Path::createDirectory(dir.path(std::string(300, 'x'))));

  // The entries of one folder, not of its subfolders.
  auto names = Path::getFileNames(dir.root());
  std::sort(names.begin(), names.end());
  EXPECT_EQ(names, (std::vector<std::string>{"a", "f"}));
  EXPECT_TRUE(Path::getFileNames(dir.path("absent")).empty());
}

TEST(PathTest, RemoveDirectoryRemovesATreeButNeverASystemFolder) {
  TempDir dir;
  Path::createDirectory(dir.path("tree/sub"));
  Tools::writeText(dir.path("tree/sub/f.txt"), "x");
  EXPECT_TRUE(Path::removeDirectory(dir.path("tree\\")));
  EXPECT_FALSE(Path::removeDirectory(dir.path("tree")));
  EXPECT_FALSE(Path::removeDirectory(""));
  // Unprotected, it would throw: nothing in /proc can be removed.
  EXPECT_FALSE(Path::removeDirectory("\\PROC\\"));
}

TEST(PathTest, PerUserFolderOfTheProductFamilyAndTheTemporaryFolder) {
  EXPECT_EQ(Path::getDataDirectory("logs"), "~/.appdata/Corvane/Lumenbay/logs");

  // TMPDIR is taken without its trailing slashes; a relative one is made
  // absolute so that a change of the working directory cannot move it.
  const char *before = std::getenv("TMPDIR");
  const std::string saved = before == nullptr ? "" : before;
  const auto cwd = Tools::getCurrentDirectory();
  const std::pair<const char *, std::string> rows[] = {
      {"", "/tmp"}, {"/var/x/./y//", "/var/x/./y"}, {"rel/tmp/", cwd + "/rel/tmp"}, {"./a/../b", cwd + "/b"}};
  for (const auto &[variable, expected] : rows) {
    SCOPED_TRACE(variable);
    ::setenv("TMPDIR", variable, 1);
    EXPECT_EQ(Tools::getTempPath(), expected);
  }
  before == nullptr ? ::unsetenv("TMPDIR") : ::setenv("TMPDIR", saved.c_str(), 1);
}
