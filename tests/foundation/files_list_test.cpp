// Folder listings: sorted, patterns as a shell user expects, links handled without loops.

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <string>
#include <vector>

#include "foundation/files/file_manager.h"
#include "support/test_files.h"

namespace {

std::vector<std::string> FileNames(const std::string& folder, const char* pattern,
                                   unsigned int followLinks) {
  vxFileInfoList list;
  int added = vxFileManager::GetFileList(vxStringBase(folder.c_str()), pattern, list, followLinks);
  std::vector<std::string> names;
  for (const vxFileInfo& info : list) names.push_back(info.GetFilename().Filename().str());
  EXPECT_EQ(static_cast<int>(names.size()), added);
  return names;
}

std::vector<std::string> Folders(const std::string& folder, unsigned int recursive,
                                 unsigned int listLinked, const char* pattern = "") {
  std::vector<vxStringBase> list;
  vxFileManager::GetFolderList(vxStringBase(folder.c_str()), pattern, list, recursive, listLinked);
  std::vector<std::string> names;
  for (const vxStringBase& name : list) names.push_back(name.str());
  return names;
}

struct PatternCase {
  const char* pattern;
  std::vector<std::string> expected;
};

class FileListPattern : public testing::TestWithParam<PatternCase> {};

TEST_P(FileListPattern, ListsMatchingFilesSortedBytewise) {
  vxtest::TempDir tmp;
  for (const char* name : {"b.so", "a.so", "B.so", "readme", ".hidden.so", "plugin.so.bak",
                           "x.ini", "folder.so/inner.so"}) {
    vxtest::WriteFile(tmp.Path(name), name);
  }
  EXPECT_EQ(GetParam().expected, FileNames(tmp.path(), GetParam().pattern, 1));
}

const std::vector<std::string> kAllFiles = {".hidden.so", "B.so", "a.so", "b.so",
                                            "plugin.so.bak", "readme", "x.ini"};

INSTANTIATE_TEST_SUITE_P(
    Patterns, FileListPattern,
    testing::Values(PatternCase{"*.so", {".hidden.so", "B.so", "a.so", "b.so"}},
                    PatternCase{"*.*", kAllFiles},  // names without a dot too
                    PatternCase{"", kAllFiles},
                    PatternCase{"*.INI", {}},  // case counts
                    PatternCase{"[ab].so", {"a.so", "b.so"}}));

TEST(FileList, FollowLinksDecidesHowLinksAreListed) {
  vxtest::TempDir tmp;
  vxtest::WriteFile(tmp.Path("real.ini"), "x");
  vxtest::MakeDirs(tmp.Path("folder"));
  ASSERT_EQ(0, symlink("real.ini", tmp.Path("link.ini").c_str()));
  ASSERT_EQ(0, symlink("missing.ini", tmp.Path("dangling.ini").c_str()));
  ASSERT_EQ(0, symlink("folder", tmp.Path("folderlink.ini").c_str()));
  ASSERT_EQ(0, mkfifo(tmp.Path("pipe.ini").c_str(), 0600));

  vxFileInfoList followed;
  vxFileManager::GetFileList((tmp.path() + "/").c_str(), "*.ini", followed, 1);
  ASSERT_EQ(2u, followed.size());
  EXPECT_EQ(tmp.path() + "/link.ini", followed[0].GetFilename().Pathname().str());
  EXPECT_TRUE(followed[0].IsRegular());
  EXPECT_EQ((std::vector<std::string>{"dangling.ini", "folderlink.ini", "link.ini", "real.ini"}),
            FileNames(tmp.path(), "*.ini", 0));
  EXPECT_TRUE(FileNames(tmp.Path("missing"), "*", 0).empty());
}

TEST(FolderList, RecursiveListingIsDepthFirstAndSortedAtEachLevel) {
  vxtest::TempDir tmp;
  for (const char* folder : {"b", "a/z", "a/b/c", "a b", "c.dat"}) {
    vxtest::MakeDirs(tmp.Path(folder));
  }
  vxtest::WriteFile(tmp.Path("a/file"), "not a folder");
  EXPECT_EQ((std::vector<std::string>{"a", "a/b", "a/b/c", "a/z", "a b", "b", "c.dat"}),
            Folders(tmp.path(), 1, 0));
  EXPECT_EQ((std::vector<std::string>{"a", "a b", "b", "c.dat"}), Folders(tmp.path(), 0, 0));
  // A pattern selects by the folder's own name; folders it skips are still searched.
  EXPECT_EQ((std::vector<std::string>{"a/b", "b"}), Folders(tmp.path(), 1, 0, "b"));
  EXPECT_TRUE(Folders(tmp.Path("missing"), 1, 0).empty());
}

TEST(FolderList, LinksToFoldersAreNeverDescended) {
  vxtest::TempDir tmp;
  vxtest::MakeDirs(tmp.Path("a/b"));
  ASSERT_EQ(0, symlink("..", tmp.Path("a/b/up").c_str()));  // a loop back to "a"
  ASSERT_EQ(0, symlink("/", tmp.Path("a/root").c_str()));   // a way out of the tree
  EXPECT_EQ((std::vector<std::string>{"a", "a/b"}), Folders(tmp.path(), 1, 0));
  EXPECT_EQ((std::vector<std::string>{"a", "a/b", "a/b/up", "a/root"}), Folders(tmp.path(), 1, 1));
}

}  // namespace
