#include "wavemill/tools/OperationSystem.h"
#include "wavemill/tools/Path.h"
#include "wavemill/tools/Tools.h"

#include "support/TempDir.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <limits>
#include <memory>
#include <string>
#include <vector>

using namespace Corvane::Wavemill;
using Corvane::Wavemill::Testing::TempDir;

namespace {

void anchorInTestProgram() {}

} // namespace

TEST(ToolsTest, FindFileMatchesTheEndOfThePathDepthFirstIgnoringCase) {
  TempDir dir;
  Path::createDirectory(dir.path("sub/deep"));
  Tools::writeText(dir.path("readme.TXT"), "");
  Tools::writeText(dir.path("sub/deep/target.cfg"), "");
  Tools::writeText(dir.path("t.dat"), "");
  Tools::writeText(dir.path("sub/t.dat"), "");

  EXPECT_EQ(Tools::findFile(dir.root(), "target.cfg"), dir.path("sub/deep/target.cfg"));
  EXPECT_EQ(Tools::findFile(dir.root(), "DEEP\\Target.CFG"), dir.path("sub/deep/target.cfg"));
  EXPECT_EQ(Tools::findFile(dir.root(), "me.txt"), dir.path("readme.TXT"));
  EXPECT_EQ(Tools::findFile(dir.root(), "t.dat"), dir.path("t.dat"));
  EXPECT_EQ(Tools::findFile(dir.root(), "other/target.cfg"), "");
  EXPECT_EQ(Tools::findFile(dir.path("absent"), "t.dat"), "");

  // A link back up the tree must not make the search endless.
  std::filesystem::create_directory_symlink(dir.root(), dir.path("sub/deep/loop"));
  EXPECT_EQ(Tools::findFile(dir.root(), "absent.txt"), "");
}

TEST(ToolsTest, FilesAndSubDirectoriesListOneLevelOnly) {
  TempDir dir;
  Path::createDirectory(dir.path("sub/deeper"));
  Tools::writeText(dir.path("a.txt"), "");
  Tools::writeText(dir.path("sub/b.txt"), "");

  EXPECT_EQ(Tools::getFiles(dir.root()), std::vector<std::string>{dir.path("a.txt")});
  EXPECT_EQ(Tools::getSubDirectories(dir.root()), std::vector<std::string>{dir.path("sub")});
  EXPECT_TRUE(Tools::getFiles(dir.path("absent")).empty());
  EXPECT_TRUE(Tools::getSubDirectories(dir.path("a.txt")).empty());
}

TEST(ToolsTest, BinaryRoundTripKeepsEveryByteAndUnreadablePathsReadEmpty) {
  TempDir dir;
  const std::vector<unsigned char> bytes{0x00, 0xff, '\r', '\n', 0x1a, '\n', '\r', 0x00};
  Tools::writeFile(dir.path("a.bin"), bytes);
  EXPECT_EQ(*Tools::readFile(dir.path("a.bin")), bytes);
  EXPECT_EQ(Tools::fileSize(dir.path("a.bin")), 8);
  EXPECT_EQ(Tools::readText(dir.path("a.bin")), std::string(bytes.begin(), bytes.end()));
  EXPECT_TRUE(Tools::exist(dir.path("a.bin")));

  for (const auto &unreadable : {dir.path("absent"), dir.root(), std::string()}) {
    ASSERT_NE(Tools::readFile(unreadable), nullptr);
    EXPECT_TRUE(Tools::readFile(unreadable)->empty());
    EXPECT_EQ(Tools::fileSize(unreadable), -1);
    EXPECT_FALSE(Tools::exist(unreadable));
  }
  Tools::writeFile(dir.path("absent/a.bin"), bytes);
  EXPECT_FALSE(Path::directoryExist(dir.path("absent")));
}

TEST(ToolsTest, OpenWriteGivesTheFileItsFullSizeAtOnce) {
  TempDir dir;
  std::ofstream stream;
  Tools::openWrite(stream, dir.path("big.bin"), 10);
  ASSERT_TRUE(stream.good());
  EXPECT_EQ(Tools::fileSize(dir.path("big.bin")), 10);
  stream << "ab";
  stream.close();
  const auto bytes = *Tools::readFile(dir.path("big.bin"));
  ASSERT_EQ(bytes.size(), 10U);
  EXPECT_EQ(bytes[0], 'a');
  EXPECT_EQ(bytes[9], 0);

  Tools::openWrite(stream, dir.path("big.bin"), 0);
  EXPECT_TRUE(stream.is_open());
  stream.close();
  EXPECT_EQ(Tools::fileSize(dir.path("big.bin")), 0);
}

TEST(ToolsTest, ModuleNamesNameThisLibraryAndTheTestProgram) {
  EXPECT_EQ(Tools::getLibraryName(), "wavemill");
  const auto library = Tools::getExecutingFileName();
  EXPECT_EQ(Path::getFileName(library).rfind("libwavemill.so", 0), 0U) << library;
  EXPECT_EQ(Tools::getModuleFileName("wavemill"), library);
  EXPECT_EQ(Tools::getModuleFileName(Path::getFileName(library)), library);
  EXPECT_EQ(Tools::getModuleFileName("libwavemill.so"), library);

  auto *anchor = reinterpret_cast<void *>(&anchorInTestProgram);
  const auto program = Tools::getProcessPath(-1);
  EXPECT_EQ(Path::getFileName(program), "wavemill_tools_tests");
  EXPECT_EQ(Tools::getExecutingFileName(anchor), program);
  EXPECT_EQ(Tools::getLibraryName(anchor), "wavemill_tools_tests");
  EXPECT_EQ(Tools::getModuleFileName("wavemill_tools_tests"), program);

  int onTheStack = 0;
  EXPECT_EQ(Tools::getExecutingFileName(&onTheStack), "");
  EXPECT_EQ(Tools::getModuleFileName("no-such-module"), "");
  EXPECT_EQ(Tools::getModuleFileName(""), "");
  EXPECT_EQ(Tools::getProcessPath(std::numeric_limits<int>::max()), "");
}

TEST(OperationSystemTest, ReportsTheBuildPlatformAndComparesByFields) {
  EXPECT_TRUE(Tools::os().isLinux());
  EXPECT_EQ(Tools::os().toString(), "Linux");
  EXPECT_EQ(&Tools::os(), &Tools::os());
  EXPECT_EQ(OperationSystem().toString(), "Windows");
  EXPECT_EQ(AppleOperationSystem().toString(), "Apple");
  EXPECT_EQ(OperationSystem(static_cast<OperationSystem::Type>(3)).toString(), "Windows");

  const auto other = std::make_shared<LinuxOperationSystem>();
  EXPECT_TRUE(LinuxOperationSystem().equals(other));
  EXPECT_FALSE(WindowsOperationSystem().equals(other));
  other->setVersion("6.1");
  EXPECT_FALSE(LinuxOperationSystem().equals(other));
  EXPECT_FALSE(LinuxOperationSystem().equals(nullptr));
}
