// Copying between installations over real trees: what is copied, what is kept, what is logged and
// in which order, and how links, blanks and unreadable entries are handled.

#include <sys/stat.h>
#include <sys/time.h>
#include <unistd.h>

#include <functional>
#include <string>
#include <vector>

#include "migrate/toolkit_fixture.h"

namespace vxtest {
namespace {

using Entries = std::vector<std::string>;

const char kCopiedTree[] = "File copied:  ";
const char kExists[] = "File exists - no copy made:  ";

class CopyAllFilesOfType : public ToolkitTest {
 protected:
  // The same tree for every test: profiles at the top, in nested folders and in a folder whose
  // name has blanks, and files of other types beside them.
  void WriteSourceTree() {
    WriteFile(S("top.wlp"), "top");
    WriteFile(S("readme.txt"), "text");
    WriteFile(S("sub/b.wlp"), "source b");
    WriteFile(S("sub/deep/c.wlp"), "c");
    WriteFile(S("sub/deep/c.wlpx"), "not a profile");
    WriteFile(S("my sites/my site.wlp"), "blanks");
    WriteFile(D("sub/b.wlp"), "the new installation's b");
  }
};

TEST_F(CopyAllFilesOfType, CopiesTheTreeSubfoldersFirstAndKeepsExistingFiles) {
  WriteSourceTree();
  chmod(S("sub/deep/c.wlp").c_str(), 0640);
  StartRun();
  EXPECT_EQ(0, manager_->CopyAllFilesOfType("wlp", vxStringBase::NullStr));

  EXPECT_EQ((Entries{Entry(kCopiedTree, "my sites/my site.wlp"), Entry(kExists, "sub/b.wlp"),
                     Entry(kCopiedTree, "sub/deep/c.wlp"), Entry(kCopiedTree, "top.wlp")}),
            NewLogEntries());
  EXPECT_EQ("the new installation's b", ReadFile(D("sub/b.wlp")));
  EXPECT_EQ("c", ReadFile(D("sub/deep/c.wlp")));
  EXPECT_EQ("blanks", ReadFile(D("my sites/my site.wlp")));
  EXPECT_EQ(0640u, ModeOf(D("sub/deep/c.wlp")));
  EXPECT_FALSE(FileExists(D("readme.txt")));
  EXPECT_FALSE(FileExists(D("sub/deep/c.wlpx")));
}

TEST_F(CopyAllFilesOfType, SkipsExcludedFilesSilently) {
  WriteSourceTree();
  StartRun();
  manager_->CopyAllFilesOfType("wlp", " sub/deep/c.wlp, TOP.wlp,my sites\\my site.wlp,");
  EXPECT_EQ((Entries{Entry(kExists, "sub/b.wlp")}), NewLogEntries());
  EXPECT_EQ((Entries{"sub", "sub/b.wlp", "vxmigrate.log"}), ListTree(dst_));
}

TEST_F(CopyAllFilesOfType, CopiesLinksAsLinksAndNeverFollowsFolderLinks) {
  WriteFile(S("real.wlp"), "real");
  ASSERT_EQ(0, symlink("real.wlp", S("alias.wlp").c_str()));
  ASSERT_EQ(0, symlink("gone.wlp", S("dangling.wlp").c_str()));
  ASSERT_EQ(0, symlink("loop.wlp", S("loop.wlp").c_str()));
  WriteFile(S("sub/inner.wlp"), "inner");
  ASSERT_EQ(0, symlink("..", S("sub/up").c_str()));   // a folder loop
  ASSERT_EQ(0, symlink("sub", S("sublink").c_str()));
  StartRun();
  manager_->CopyAllFilesOfType("wlp", vxStringBase::NullStr);

  EXPECT_EQ((Entries{Entry(kCopiedTree, "sub/inner.wlp"), Entry(kCopiedTree, "alias.wlp"),
                     Entry(kCopiedTree, "dangling.wlp"), Entry(kCopiedTree, "loop.wlp"),
                     Entry(kCopiedTree, "real.wlp")}),
            NewLogEntries());
  EXPECT_EQ("real.wlp", LinkTarget(D("alias.wlp")));
  EXPECT_EQ("gone.wlp", LinkTarget(D("dangling.wlp")));
  EXPECT_EQ("loop.wlp", LinkTarget(D("loop.wlp")));
  EXPECT_EQ((Entries{"alias.wlp", "dangling.wlp", "loop.wlp", "real.wlp", "sub", "sub/inner.wlp",
                     "vxmigrate.log"}),
            ListTree(dst_));
}

TEST_F(CopyAllFilesOfType, ADanglingLinkAtTheDestinationIsKept) {
  WriteFile(S("a.wlp"), "a");
  ASSERT_EQ(0, symlink("elsewhere.wlp", D("a.wlp").c_str()));
  StartRun();
  manager_->CopyAllFilesOfType("wlp", vxStringBase::NullStr);
  EXPECT_EQ((Entries{Entry(kExists, "a.wlp")}), NewLogEntries());
  EXPECT_EQ("elsewhere.wlp", LinkTarget(D("a.wlp")));
}

TEST_F(CopyAllFilesOfType, UnreadableEntriesCostOneLineEachAndTheRestIsCopied) {
  if (RunningAsRoot()) GTEST_SKIP() << "root reads every file";
  WriteFile(S("a.wlp"), "a");
  WriteFile(S("secret.wlp"), "secret");
  WriteFile(S("locked/hidden.wlp"), "hidden");
  WriteFile(S("z/z.wlp"), "z");
  chmod(S("secret.wlp").c_str(), 0);
  chmod(S("locked").c_str(), 0);
  StartRun();
  manager_->CopyAllFilesOfType("wlp", vxStringBase::NullStr);
  chmod(S("locked").c_str(), 0755);

  EXPECT_EQ((Entries{"Error: Unable to read folder:  " + S("locked/"), Entry(kCopiedTree, "z/z.wlp"),
                     Entry(kCopiedTree, "a.wlp"), Entry("Error: Unable to copy file:  ", "secret.wlp")}),
            NewLogEntries());
  EXPECT_EQ((Entries{"a.wlp", "vxmigrate.log", "z", "z/z.wlp"}), ListTree(dst_));
}

TEST_F(ToolkitTest, CopyFilesOfTypesCopiesEachTypeInTurnAndNeverReplaces) {
  WriteFile(S("a.ini"), "a");
  WriteFile(S("sub/b.dat"), "b");
  WriteFile(S("sub/c.ini"), "c");
  WriteFile(S("d.txt"), "d");
  WriteFile(D("a.ini"), "new a");
  StartRun();
  // The option would allow replacing in CopyFilesOfType; here it changes nothing.
  EXPECT_EQ(0, manager_->CopyFilesOfTypes(" ini, ,dat,", 1));
  EXPECT_EQ((Entries{Entry(kCopiedTree, "sub/c.ini"), Entry(kExists, "a.ini"),
                     Entry(kCopiedTree, "sub/b.dat")}),
            NewLogEntries());
  EXPECT_EQ("new a", ReadFile(D("a.ini")));
  EXPECT_FALSE(FileExists(D("d.txt")));
}

TEST_F(ToolkitTest, CopyFilesCopiesNamedFilesAndReplacesExistingOnes) {
  WriteFile(S("a.ini"), "old a");
  WriteFile(S("conf/b c.ini"), "b");
  WriteFile(D("a.ini"), "new a");
  StartRun();
  EXPECT_EQ(0, manager_->CopyFiles("a.ini,missing.ini,, conf\\b c.ini", 0));
  EXPECT_EQ((Entries{"File copied: " + S("a.ini"), "File copied: " + S("conf/b c.ini")}),
            NewLogEntries());
  EXPECT_EQ("old a", ReadFile(D("a.ini")));
  EXPECT_EQ("b", ReadFile(D("conf/b c.ini")));
  EXPECT_FALSE(FileExists(D("missing.ini")));
}

TEST_F(ToolkitTest, CopyFilesWithNewerOnlyKeepsANewerDestination) {
  WriteFile(S("a.ini"), "old a");
  WriteFile(D("a.ini"), "new a");
  const struct timeval old[2] = {{1000000000, 0}, {1000000000, 0}};
  utimes(S("a.ini").c_str(), old);
  StartRun();
  EXPECT_EQ(0, manager_->CopyFiles("a.ini", 1));
  EXPECT_EQ("new a", ReadFile(D("a.ini")));
  for (const std::string& entry : NewLogEntries()) EXPECT_EQ(std::string::npos, entry.find("Error"));
}

TEST_F(ToolkitTest, CopyFilesReportsAnUnreadableFile) {
  if (RunningAsRoot()) GTEST_SKIP() << "root reads every file";
  WriteFile(S("secret.ini"), "secret");
  WriteFile(S("open.ini"), "open");
  chmod(S("secret.ini").c_str(), 0);
  StartRun();
  manager_->CopyFiles("secret.ini,open.ini", 0);
  EXPECT_EQ((Entries{"Error: Unable to copy file:  " + S("secret.ini"), "File copied: " + S("open.ini")}),
            NewLogEntries());
}

TEST_F(ToolkitTest, CopyFilesOfTypeCopiesTheTopFolderOnlyAsTheOptionSays) {
  WriteFile(S("a.ini"), "old a");
  WriteFile(S("b.ini"), "b");
  WriteFile(S("sub/c.ini"), "c");
  WriteFile(D("a.ini"), "new a");
  StartRun();
  manager_->CopyFilesOfType("ini", 0);
  EXPECT_EQ("new a", ReadFile(D("a.ini")));
  EXPECT_EQ("b", ReadFile(D("b.ini")));
  EXPECT_FALSE(FileExists(D("sub")));
  EXPECT_TRUE(NewLogEntries().empty());

  EXPECT_EQ(0, manager_->CopyFilesOfType("ini", 1));
  EXPECT_EQ("old a", ReadFile(D("a.ini")));
}

TEST_F(ToolkitTest, CopyFilesInRelativeFolderCopiesOneFolderAndLogsIt) {
  WriteFile(S("templates/a.mss"), "old a");
  WriteFile(S("templates/b.mss"), "b");
  WriteFile(S("templates/deeper/c.mss"), "c");
  WriteFile(D("templates/a.mss"), "new a");
  StartRun();
  EXPECT_EQ(1, manager_->CopyFilesInRelativeFolder("nosuch", "mss", 0));
  EXPECT_EQ(0, manager_->CopyFilesInRelativeFolder("\\templates", "mss", 0));
  manager_->CopyFilesInRelativeFolder("templates", "none", 0);
  EXPECT_EQ((Entries{"Files copied from folder:  " + S("templates/*.mss"),
                     "Files copied from folder:  " + S("templates/*.none")}),
            NewLogEntries());
  EXPECT_EQ("old a", ReadFile(D("templates/a.mss")));
  EXPECT_EQ("b", ReadFile(D("templates/b.mss")));
  EXPECT_FALSE(FileExists(D("templates/deeper")));
}

// A pattern copy answers for the whole set; the files that did not arrive are named one by one.
TEST_F(ToolkitTest, PatternCopiesNameTheFilesThatStayedBehind) {
  if (RunningAsRoot()) GTEST_SKIP() << "root reads every file";
  WriteFile(S("templates/a.mss"), "a");
  WriteFile(S("templates/secret.mss"), "secret");
  WriteFile(S("top.mss"), "top");
  WriteFile(S("hidden.mss"), "hidden");
  WriteFile(D("kept.mss"), "kept");
  WriteFile(S("kept.mss"), "old kept");
  chmod(S("templates/secret.mss").c_str(), 0);
  chmod(S("hidden.mss").c_str(), 0);
  StartRun();
  EXPECT_EQ(1, manager_->CopyFilesInRelativeFolder("templates", "mss", 0));
  EXPECT_EQ(1, manager_->CopyFilesOfType("mss", 0));
  EXPECT_EQ((Entries{"Files copied from folder:  " + S("templates/*.mss"),
                     "Error: Unable to copy file:  " + S("templates/secret.mss"),
                     "Error: Unable to copy file:  " + S("hidden.mss")}),
            NewLogEntries());
  EXPECT_EQ("a", ReadFile(D("templates/a.mss")));
  EXPECT_EQ("top", ReadFile(D("top.mss")));
  EXPECT_EQ("kept", ReadFile(D("kept.mss")));
}

// In place, the source is the destination: every operation does nothing, whatever it is given.
TEST_F(ToolkitTest, InPlaceRunsCopyAndLogNothing) {
  WriteFile(S("a.ini"), "a");
  WriteFile(S("sub/b.ini"), "b");
  StartRun(true);
  const Entries before = ListTree(src_);
  const std::vector<std::function<int()>> operations = {
      [&] { return manager_->CopyFilesOfType("ini", 1); },
      [&] { return manager_->CopyFilesOfTypes("ini", 1); },
      [&] { return manager_->CopyFiles("a.ini,sub/b.ini", 0); },
      [&] { return manager_->CopyAllFilesOfType("ini", vxStringBase::NullStr); },
      [&] { return manager_->CopyFilesInRelativeFolder("sub", "ini", 0); },
      [&] { return manager_->CopyFilesInRelativeFolder("nosuch", "ini", 0); },
  };
  for (const auto& operation : operations) EXPECT_EQ(0, operation());
  EXPECT_EQ(before, ListTree(src_));
  EXPECT_TRUE(NewLogEntries().empty());
}

TEST_F(ToolkitTest, EmptyListsCopyNothing) {
  WriteFile(S("a.ini"), "a");
  StartRun();
  EXPECT_EQ(0, manager_->CopyFilesOfTypes("", 0));
  EXPECT_EQ(0, manager_->CopyFilesOfTypes(",", 0));
  EXPECT_EQ(0, manager_->CopyFiles("", 0));
  EXPECT_EQ(0, manager_->CopyFiles(" , ", 0));
  EXPECT_TRUE(NewLogEntries().empty());
  EXPECT_EQ((Entries{"vxmigrate.log"}), ListTree(dst_));
}

}  // namespace
}  // namespace vxtest
