#include "wavemill/tools/Path.h"
#include "wavemill/tools/Tools.h"

#include "support/TempDir.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <string>
#include <utility>
#include <vector>

using namespace Corvane::Wavemill;
using Corvane::Wavemill::Testing::TempDir;

TEST(PathTest, CombineJoinsWithOneSlashAndFullPathFoldsToTheClassicLength) {
  EXPECT_EQ(Path::combine("a\\", "/b"), "a/b");
  EXPECT_EQ(Path::combine("a//", "\\\\b\\c"), "a/b/c");
  EXPECT_EQ(Path::combine("", "\\b"), "\\b");
  EXPECT_EQ(Path::combine("a\\", "/"), "a\\");
  EXPECT_EQ(Path::combine(Path::longPrefix() + "C:\\data", "b"), "\\/\\\\/");
  EXPECT_TRUE(Path::isLong("\\\\?\\C:\\data"));
  EXPECT_FALSE(Path::isLong("\\\\"));
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
  EXPECT_EQ(Path::getDirectoryName(""), "");
  EXPECT_EQ(Path::getFileName("dir\\name.txt "), "name.txt");
  EXPECT_EQ(Path::getFileName("bare "), "bare ");
  EXPECT_EQ(Path::splitShortName("x\\libwavemill.so.0.1"),
            std::make_pair(std::string("libwavemill.so.0"), std::string("1")));
  EXPECT_EQ(Path::splitShortName("a.b/noext"), std::make_pair(std::string("noext"), std::string()));
  // The parent stops at the root given.
  EXPECT_EQ(Path::getParentDirectory("/data/logs/today"), "/data/logs/");
  EXPECT_EQ(Path::getParentDirectory("/data/logs/", "/data/logs"), "/data/logs/");
  EXPECT_EQ(Path::getParentDirectory("/"), "/");
  EXPECT_EQ(Path::getParentDirectory(""), "");
}

TEST(PathTest, PrepareAndCreateDirectoryBuildMissingTreesButNotOverFilesAndFileNamesListOneLevel) {
  TempDir dir;
  const auto file = dir.path("a\\b/c.txt");
  EXPECT_EQ(Path::prepare(file), file);
  EXPECT_TRUE(Path::directoryExist(dir.path("a/b")));
  EXPECT_FALSE(Path::fileExist(file));

  EXPECT_TRUE(Path::createDirectory(dir.path("a/b/")));
  Tools::writeText(dir.path("f"), "x");
  EXPECT_TRUE(Path::fileExist(dir.path("f")));
  EXPECT_FALSE(Path::fileExist(dir.root()));
  EXPECT_FALSE(Path::createDirectory(dir.path("f")));
  EXPECT_EQ(Path::prepare(dir.path("f/g/h.txt")), "");
  EXPECT_FALSE(Path::createDirectory(""));
  EXPECT_FALSE(Path::createDirectory(dir.path(std::string(300, 'x'))));

  // The entries of one folder, not of its subfolders.
  auto names = Path::getFileNames(dir.root());
  std::sort(names.begin(), names.end());
  EXPECT_EQ(names, (std::vector<std::string>{"a", "f"}));
  EXPECT_TRUE(Path::getFileNames(dir.path("absent")).empty());
}

TEST(PathTest, RemoveDirectoryRemovesATreeButNeverASystemFolderAndReportsRefusalsOfTheFileSystem) {
  TempDir dir;
  Path::createDirectory(dir.path("tree/sub"));
  Tools::writeText(dir.path("tree/sub/f.txt"), "x");
  EXPECT_TRUE(Path::removeDirectory(dir.path("tree\\")));
  EXPECT_FALSE(Path::directoryExist(dir.path("tree")));
  EXPECT_FALSE(Path::removeDirectory(dir.path("tree")));
  EXPECT_FALSE(Path::removeDirectory(""));
  // Unprotected, both would throw: nothing in /proc can be removed.
  EXPECT_FALSE(Path::removeDirectory("\\PROC\\"));
  EXPECT_FALSE(Path::removeDirectory("/proc/self/.."));

  const auto refusal = [](const auto &action, const std::string &what) {
    try {
      action();
    } catch (const std::filesystem::filesystem_error &error) {
      return std::string(error.what()).find(what) != std::string::npos && error.code();
    }
    return false;
  };
  EXPECT_TRUE(refusal([] { Path::createDirectory("/proc/wavemill-test"); }, "create_directory(p): invalid argument"));
  EXPECT_TRUE(refusal([] { Path::removeDirectory("/proc/self/status"); }, "remove_all(p): invalid argument"));
}

TEST(PathTest, TempFileNamesDifferInTheCounterAloneAndShareTheProcessFolder) {
  const auto first = Path::getTempFileName();
  const auto second = Path::getTempFileName();
  const auto folder = Tools::getTempPath() + "/Corvane/Lumenbay/p_" + std::to_string(Tools::getCurrentProcessId());
  const auto stem = folder + "/file_" + std::to_string(Tools::getCurrentThreadId()) + "_";
  ASSERT_EQ(first.compare(0, stem.size(), stem), 0) << first;
  ASSERT_EQ(second.compare(0, stem.size(), stem), 0) << second;
  EXPECT_EQ(std::stoull(second.substr(stem.size())), std::stoull(first.substr(stem.size())) + 1);
  EXPECT_EQ(second.substr(second.size() - 4), ".tmp");
  EXPECT_FALSE(Path::fileExist(first));

  ASSERT_FALSE(Path::prepare(first).empty());
  Tools::writeText(first, "x");
  EXPECT_TRUE(Path::removeTempDirectory());
  EXPECT_FALSE(Path::directoryExist(folder));
  EXPECT_FALSE(Path::removeTempDirectory());
}

TEST(PathTest, PerUserAndTemporaryFoldersOfTheProductFamily) {
  EXPECT_EQ(Path::getDataDirectory("logs"), "~/.appdata/Corvane/Lumenbay/logs");
  EXPECT_EQ(Path::getDataDirectory(""), "~/.appdata/Corvane/Lumenbay");
  EXPECT_EQ(Path::getTempDirectory("\\x"), Tools::getTempPath() + "/x");

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
