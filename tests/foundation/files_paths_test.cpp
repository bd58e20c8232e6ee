// Paths and folder listings: joins with exactly one separator, name parts split at either
// separator, listings sorted bytewise with shell-style patterns and never led into a loop by links.

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <string>
#include <vector>

#include "foundation/files/file_manager.h"
#include "foundation/files/filename.h"
#include "foundation/files/path_text.h"
#include "support/test_files.h"

namespace {

using Names = std::vector<std::string>;

TEST(FileManager, MakePathJoinsWithExactlyOneSeparator) {
  // folder, sub-folder (null: the two-part join with isFile), name, isFile, the joined path
  struct { const char *folder, *subFolder, *name; unsigned int isFile; const char* expected; }
  cases[] = {
      {"/src", nullptr, "\\vxm_log\\datfiles", 0, "/src/vxm_log/datfiles/"},
      {"/src//", nullptr, "\\a\\b.ini", 1, "/src/a/b.ini"},
      {"/src", nullptr, "/", 0, "/src/"},  // the top folder itself
      {"/src", nullptr, "", 1, "/src"},
      {"/src\\", nullptr, "a\\\\b//c/", 1, "/src/a/b/c"},
      {"/", nullptr, "a", 1, "/a"},
      {"", nullptr, "a b/c d", 1, "a b/c d"},
      {"", nullptr, "", 0, ""},
      {"/d", "", "vxmigrate.log", 0, "/d/vxmigrate.log"},
      {"/d", "/", "p.wlp", 0, "/d/p.wlp"},
      {"/d/", "\\vxm_vxx\\reports", "/p.wlp", 0, "/d/vxm_vxx/reports/p.wlp"},
      {"/d", "sub", "", 0, "/d/sub/"}};
  for (const auto& c : cases) {
    vxStringBase result(c.folder);  // the result may be one of the inputs
    c.subFolder ? vxFileManager::MakePath(result, result, c.subFolder, c.name)
                : vxFileManager::MakePath(result, result, c.name, c.isFile);
    EXPECT_EQ(c.expected, result.str()) << c.folder << " + " << c.name;
  }
}

TEST(Filename, PartsSplitAtEitherSeparator) {
  // The path, then its name, folder, base name and extension.
  const char* cases[][2] = {{"c:\\x\\b.tar.gz", "b.tar.gz|c:\\x\\|b.tar|gz"},
                            {"/home/u/.profile", ".profile|/home/u/|.profile|"},
                            {"dir.d/name", "name|dir.d/|name|"},
                            {"bare", "bare||bare|"},
                            {"/folder/", "|/folder/||"}};
  for (const auto& c : cases) {
    vxFilename name(c[0]);
    EXPECT_EQ(c[1], name.Filename().str() + "|" + name.Directory().str() + "|" +
                        name.BaseName().str() + "|" + name.Extension().str());
  }
  vxFilename name("x.d/name.wlp");
  name.SetExtension("vxinibak");
  EXPECT_EQ("x.d/name.vxinibak", name.Pathname().str());
}

Names FileNames(const std::string& folder, const char* pattern, unsigned int followLinks) {
  vxFileInfoList list;
  int added = vxFileManager::GetFileList(vxStringBase(folder.c_str()), pattern, list, followLinks);
  Names names;
  for (const vxFileInfo& info : list) names.push_back(info.GetFilename().Filename().str());
  EXPECT_EQ(static_cast<int>(names.size()), added);
  return names;
}

Names Folders(const std::string& folder, unsigned int recursive, unsigned int listLinked,
              const char* pattern = "") {
  std::vector<vxStringBase> list;
  vxFileManager::GetFolderList(vxStringBase(folder.c_str()), pattern, list, recursive, listLinked);
  Names names;
  for (const vxStringBase& name : list) names.push_back(name.str());
  return names;
}

TEST(FileList, ListsMatchingFilesSortedBytewiseAndFollowsLinksOnlyWhenAsked) {
  vxtest::TempDir tmp;
  for (const char* name : {"b.so", "a.so", "B.so", "readme", ".h.so", "x.so.bak", "sub.so/in.so"}) {
    vxtest::WriteFile(tmp.Path(name), name);
  }
  ASSERT_EQ(0, symlink("a.so", tmp.Path("link.so").c_str()));
  ASSERT_EQ(0, symlink("missing", tmp.Path("dangling.so").c_str()));
  ASSERT_EQ(0, symlink("sub.so", tmp.Path("folder.so").c_str()));
  ASSERT_EQ(0, mkfifo(tmp.Path("pipe.so").c_str(), 0600));
  const Names all = {".h.so", "B.so", "a.so", "b.so", "link.so", "readme", "x.so.bak"};
  EXPECT_EQ(all, FileNames(tmp.path(), "*.*", 1));  // names without a dot too
  EXPECT_EQ(all, FileNames(tmp.path(), "", 1));
  EXPECT_EQ((Names{"a.so", "b.so"}), FileNames(tmp.path(), "[ab].so", 1));  // case counts
  EXPECT_EQ((Names{".h.so", "B.so", "a.so", "b.so", "dangling.so", "folder.so", "link.so"}),
            FileNames(tmp.path(), "*.so", 0));
  EXPECT_EQ(Names{}, FileNames(tmp.Path("missing"), "*", 0));
  vxFileInfoList followed;
  vxFileManager::GetFileList((tmp.path() + "/").c_str(), "link.so", followed, 1);
  ASSERT_EQ(1u, followed.size());
  EXPECT_TRUE(followed[0].IsRegular());
}

TEST(FolderList, FoldersAreCreatedAndListedDepthFirstSortedWithoutFollowingLinks) {
  vxtest::TempDir tmp;
  for (const char* folder : {"b", "a/z", "a/b/c", "a b", "c.dat", "a"}) {  // "a" exists already
    EXPECT_EQ(0, vxFileManager::CreateDirectory(tmp.Path(folder).c_str(), nullptr)) << folder;
  }
  vxtest::WriteFile(tmp.Path("a/file"), "not a folder");
  EXPECT_EQ(1, vxFileManager::CreateDirectory(tmp.Path("a/file/sub").c_str(), nullptr));
  ASSERT_EQ(0, symlink("..", tmp.Path("a/b/up").c_str()));  // a loop back to "a"
  ASSERT_EQ(0, symlink("/", tmp.Path("a/root").c_str()));   // a way out of the tree
  EXPECT_EQ((Names{"a", "a/b", "a/b/c", "a/z", "a b", "b", "c.dat"}), Folders(tmp.path(), 1, 0));
  EXPECT_EQ((Names{"a", "a/b", "a/b/c", "a/b/up", "a/root", "a/z", "a b", "b", "c.dat"}),
            Folders(tmp.path(), 1, 1));
  EXPECT_EQ((Names{"a", "a b", "b", "c.dat"}), Folders(tmp.path(), 0, 0));
  // A pattern selects by the folder's own name; folders it skips are still searched.
  EXPECT_EQ((Names{"a/b", "b"}), Folders(tmp.path(), 1, 0, "b"));
  EXPECT_EQ(Names{}, Folders(tmp.Path("missing"), 1, 0));
  EXPECT_EQ(0, vxFileManager::DeleteFile(tmp.Path("a/file").c_str(), 0));
  EXPECT_EQ(1, vxFileManager::DeleteFile(tmp.Path("a/file").c_str(), 0));
  EXPECT_EQ(0, vxFileManager::DeleteFile(tmp.Path("a/file").c_str(), 1));  // missing is fine here
}

TEST(RealPaths, NameTheEntryItselfThroughResolvedFoldersAndKeepMissingOnesAsWritten) {
  vxtest::TempDir tmp;
  std::string root;
  ASSERT_TRUE(vxfiles::RealPath(tmp.path(), root));
  vxtest::MakeDirs(tmp.Path("real/sub"));
  ASSERT_EQ(0, symlink("real", tmp.Path("via").c_str()));
  ASSERT_EQ(0, symlink("/etc/passwd", tmp.Path("real/sub/out").c_str()));
  vxRealPaths paths;
  std::string real;
  ASSERT_TRUE(paths.Entry(tmp.Path("via/sub/out"), real));  // the link is named, not followed
  EXPECT_EQ(root + "/real/sub/out", real);
  ASSERT_TRUE(paths.Entry(tmp.Path("via//sub/new/deeper/file"), real));
  EXPECT_EQ(root + "/real/sub/new/deeper/file", real);
  EXPECT_TRUE(paths.Entry(tmp.Path("via/sub/../sub/x"), real));  // ".." is the kernel's to resolve
  EXPECT_EQ(root + "/real/sub/x", real);
  EXPECT_FALSE(paths.Entry(tmp.Path("via/missing/.."), real));
  EXPECT_FALSE(paths.Entry("", real));
  ASSERT_EQ(0, symlink("loop", tmp.Path("loop").c_str()));
  EXPECT_FALSE(paths.Entry(tmp.Path("loop/file"), real));
  // Each folder is asked once: a folder seen before keeps its real path for the run.
  ASSERT_EQ(0, rename(tmp.Path("real").c_str(), tmp.Path("moved").c_str()));
  ASSERT_TRUE(paths.Entry(tmp.Path("via/sub/out"), real));
  EXPECT_EQ(root + "/real/sub/out", real);
  ASSERT_TRUE(vxRealPaths().Entry(tmp.Path("via/sub/out"), real));  // "via" now leads nowhere
  EXPECT_EQ(root + "/via/sub/out", real);
}

}  // namespace
