// INI merging over real files: the destination keeps its values and gains what only the old file
// had, a missing destination is copied, an unloadable one is left alone, and in-place runs read
// the backups.

#include <sys/stat.h>
#include <unistd.h>

#include <string>
#include <vector>

#include "foundation/inifile/ini_file.h"
#include "migrate/toolkit_fixture.h"

namespace vxtest {
namespace {

using Entries = std::vector<std::string>;

const char kMerged[] = "INI file merged: ";
const char kCopied[] = "INI file doesn't exist - file being copied: ";
const char kUnableToOpen[] = "Error: Unable to open file:   ";

const char kOldSettings[] = "[main]\nport=80\nuser=alice\n[old]\nkept=yes\n";
const char kNewSettings[] = "[main]\nport=8080\ntheme=dark\n";

std::string Value(const std::string& path, const char* section, const char* key) {
  vxMappedINIFile file(path.c_str());
  if (file.Open(1) != 0) return "<unreadable>";
  return file.GetVal(section, key).str();
}

TEST_F(ToolkitTest, MergeKeepsDestinationValuesAndAddsTheOldOnes) {
  WriteFile(S("conf.ini"), kOldSettings);
  WriteFile(D("conf.ini"), kNewSettings);
  chmod(D("conf.ini").c_str(), 0640);
  StartRun();
  EXPECT_EQ(0, manager_->MergeINIFiles(S("conf.ini").c_str(), D("conf.ini").c_str()));
  EXPECT_EQ((Entries{kMerged + S("conf.ini")}), NewLogEntries());
  EXPECT_EQ(kOldSettings, ReadFile(S("conf.ini")));
  EXPECT_EQ("8080", Value(D("conf.ini"), "main", "port"));
  EXPECT_EQ("dark", Value(D("conf.ini"), "main", "theme"));
  EXPECT_EQ("alice", Value(D("conf.ini"), "MAIN", "user"));
  EXPECT_EQ("yes", Value(D("conf.ini"), "old", "kept"));
  EXPECT_EQ(0640u, ModeOf(D("conf.ini")));
}

TEST_F(ToolkitTest, MergeOfAMissingSourceDoesNothing) {
  WriteFile(D("conf.ini"), kNewSettings);
  StartRun();
  EXPECT_EQ(1, manager_->MergeINIFiles(S("conf.ini").c_str(), D("conf.ini").c_str()));
  EXPECT_EQ(1, manager_->MergeINIFiles(S("loop.ini").c_str(), D("conf.ini").c_str()));
  EXPECT_TRUE(NewLogEntries().empty());
  EXPECT_EQ(kNewSettings, ReadFile(D("conf.ini")));
}

TEST_F(ToolkitTest, MergeIntoAMissingDestinationCopiesTheSource) {
  WriteFile(S("conf.ini"), kOldSettings);
  StartRun();
  EXPECT_EQ(1, manager_->MergeINIFiles(S("conf.ini").c_str(), D("new/conf.ini").c_str()));
  EXPECT_EQ((Entries{kCopied + S("conf.ini")}), NewLogEntries());
  EXPECT_EQ(kOldSettings, ReadFile(D("new/conf.ini")));
}

// A destination the model cannot load (binary) or read must come out exactly as it went in.
struct UnloadableCase {
  const char* name;
  bool destinationSide;
  std::string content;
  unsigned int mode;
};

class UnloadableFile : public ToolkitTest, public ::testing::WithParamInterface<UnloadableCase> {};

TEST_P(UnloadableFile, IsReportedAndNothingIsWritten) {
  const UnloadableCase& c = GetParam();
  if (c.mode == 0 && RunningAsRoot()) GTEST_SKIP() << "root reads every file";
  const std::string bad = c.destinationSide ? D("conf.ini") : S("conf.ini");
  const std::string good = c.destinationSide ? S("conf.ini") : D("conf.ini");
  WriteFile(bad, c.content);
  WriteFile(good, kNewSettings);
  chmod(bad.c_str(), c.mode);
  StartRun();
  EXPECT_EQ(1, manager_->MergeINIFiles(S("conf.ini").c_str(), D("conf.ini").c_str()));
  EXPECT_EQ((Entries{kUnableToOpen + bad}), NewLogEntries());
  chmod(bad.c_str(), 0644);
  EXPECT_EQ(c.content, ReadFile(bad));
  EXPECT_EQ(kNewSettings, ReadFile(good));
  // No temporary file is left behind beside it either.
  Entries expected = {"conf.ini"};
  if (c.destinationSide) expected.push_back("vxmigrate.log");
  EXPECT_EQ(expected, ListTree(c.destinationSide ? dst_ : src_));
}

INSTANTIATE_TEST_SUITE_P(
    Cases, UnloadableFile,
    ::testing::Values(
        UnloadableCase{"BinaryDestination", true, std::string("[a]\nk=\0v\n", 9), 0644},
        UnloadableCase{"UnreadableDestination", true, "[a]\nk=v\n", 0},
        UnloadableCase{"BinarySource", false, std::string("\x7f" "ELF\0\0\0", 7), 0644},
        UnloadableCase{"UnreadableSource", false, "[a]\nk=v\n", 0}),
    [](const ::testing::TestParamInfo<UnloadableCase>& info) { return info.param.name; });

TEST_F(ToolkitTest, MergeRelativeJoinsBothInstallationFolders) {
  WriteFile(S("vantix.ini"), kOldSettings);
  WriteFile(D("conf/renamed.ini"), kNewSettings);
  StartRun();
  EXPECT_EQ(0, manager_->MergeINIFilesRelative("\\vantix.ini", "\\conf\\renamed.ini"));
  EXPECT_EQ((Entries{kMerged + S("vantix.ini")}), NewLogEntries());
  EXPECT_EQ("alice", Value(D("conf/renamed.ini"), "main", "user"));
}

TEST_F(ToolkitTest, MergeAllWalksTheTreeTopFolderLast) {
  WriteFile(S("top.ini"), kOldSettings);
  WriteFile(D("top.ini"), kNewSettings);
  WriteFile(S("a/one.ini"), kOldSettings);
  WriteFile(D("a/one.ini"), kNewSettings);
  WriteFile(S("a/b/two.ini"), kOldSettings);
  WriteFile(S("a/b/skip.ini"), kOldSettings);
  WriteFile(S("a/b/notes.txt"), "not settings");
  WriteFile(S("my conf/three four.ini"), kOldSettings);
  WriteFile(S("vxm_vxx/datfiles/databases/db.ini"), kOldSettings);
  WriteFile(S("vxm_vxx/datfiles/other.ini"), kOldSettings);
  WriteFile(S("tools/vxmigrate/plugin.ini"), kOldSettings);
  WriteFile(S("vxmigrate.ini"), kOldSettings);
  ASSERT_EQ(0, symlink("loop.ini", S("loop.ini").c_str()));
  StartRun();
  EXPECT_EQ(0, manager_->MergeAllINIFiles(" a/b/skip.ini, nosuch.ini"));
  EXPECT_EQ((Entries{kMerged + S("a/one.ini"), kCopied + S("a/b/two.ini"),
                     kCopied + S("my conf/three four.ini"), kCopied + S("vxm_vxx/datfiles/other.ini"),
                     kMerged + S("top.ini")}),
            NewLogEntries());
  EXPECT_EQ("8080", Value(D("a/one.ini"), "main", "port"));
  EXPECT_EQ("alice", Value(D("top.ini"), "main", "user"));
  EXPECT_EQ(kOldSettings, ReadFile(D("a/b/two.ini")));
  EXPECT_FALSE(FileExists(D("a/b/skip.ini")));
  EXPECT_FALSE(FileExists(D("vxm_vxx/datfiles/databases")));
  EXPECT_FALSE(FileExists(D("tools")));
  EXPECT_FALSE(FileExists(D("vxmigrate.ini")));
}

TEST_F(ToolkitTest, MergeAllInPlaceReadsTheBackups) {
  WriteFile(S("a/b.vxinibak"), kOldSettings);
  WriteFile(S("a/b.ini"), kNewSettings);
  WriteFile(S("a/only.vxinibak"), kOldSettings);
  WriteFile(S("a/skip.vxinibak"), kOldSettings);
  WriteFile(S("a/skip.ini"), kNewSettings);
  WriteFile(S("plain.ini"), kNewSettings);  // no backup: the installer did not replace it
  WriteFile(S("top.vxinibak"), kOldSettings);
  WriteFile(S("top.ini"), kNewSettings);
  StartRun(true);
  EXPECT_EQ(0, manager_->MergeAllINIFiles("a/skip.ini"));
  EXPECT_EQ((Entries{kMerged + S("a/b.vxinibak"), kCopied + S("a/only.vxinibak"),
                     kMerged + S("top.vxinibak")}),
            NewLogEntries());
  EXPECT_EQ("alice", Value(S("a/b.ini"), "main", "user"));
  EXPECT_EQ("8080", Value(S("a/b.ini"), "main", "port"));
  EXPECT_EQ(kOldSettings, ReadFile(S("a/b.vxinibak")));
  EXPECT_EQ(kOldSettings, ReadFile(S("a/only.ini")));
  EXPECT_EQ(kNewSettings, ReadFile(S("a/skip.ini")));
  EXPECT_EQ(kNewSettings, ReadFile(S("plain.ini")));
  EXPECT_EQ("alice", Value(S("top.ini"), "main", "user"));
}

}  // namespace
}  // namespace vxtest
