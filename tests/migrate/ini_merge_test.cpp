// INI merging over real files: the destination keeps its values and gains what only the old file
// had, a missing destination is copied, an unloadable one is left alone, and in-place runs read
// the backups.

#include <sys/stat.h>

#include <string>

#include "migrate/installations_fixture.h"

namespace vxtest {
namespace {

const char kMerged[] = "INI file merged: ";
const char kCopied[] = "INI file doesn't exist - file being copied: ";

const char kOldSettings[] = "[main]\nport=80\nuser=alice\n[old]\nkept=yes\n";
const char kNewSettings[] = "[main]\nport=8080\ntheme=dark\n";
const char kMergedSettings[] = "[main]\nport=8080\ntheme=dark\nuser=alice\n[old]\nkept=yes\n";

TEST(MergeINIFiles, KeepsDestinationValuesAndAddsTheOldOnes) {
  Installations run;
  WriteFile(run.Src("conf.ini"), kOldSettings);
  WriteFile(run.Dst("conf.ini"), kNewSettings);
  chmod(run.Dst("conf.ini").c_str(), 0640);
  EXPECT_EQ(0, run.manager().MergeINIFiles(run.Src("conf.ini").c_str(), run.Dst("conf.ini").c_str()));
  EXPECT_EQ((Entries{kMerged + run.Src("conf.ini")}), run.RunLog());
  EXPECT_EQ(kOldSettings, ReadFile(run.Src("conf.ini")));
  EXPECT_EQ(kMergedSettings, ReadFile(run.Dst("conf.ini")));
  EXPECT_EQ(0640u, ModeOf(run.Dst("conf.ini")));
}

TEST(MergeINIFiles, FromAMissingSourceDoesNothingAndIntoAMissingDestinationCopies) {
  Installations run;
  WriteFile(run.Src("conf.ini"), kOldSettings);
  WriteFile(run.Dst("kept.ini"), kNewSettings);
  EXPECT_EQ(1, run.manager().MergeINIFiles(run.Src("none.ini").c_str(), run.Dst("kept.ini").c_str()));
  EXPECT_EQ(1, run.manager().MergeINIFiles(run.Src("conf.ini").c_str(), run.Dst("new/conf.ini").c_str()));
  EXPECT_EQ((Entries{kCopied + run.Src("conf.ini")}), run.RunLog());
  EXPECT_EQ(kNewSettings, ReadFile(run.Dst("kept.ini")));
  EXPECT_EQ(kOldSettings, ReadFile(run.Dst("new/conf.ini")));
}

// A file the model cannot load (binary) or read is reported, and both come out exactly as they went
// in, with no temporary file left beside them.
TEST(MergeINIFiles, AnUnloadableFileOnEitherSideIsReportedAndNothingIsWritten) {
  struct Case {
    bool destinationSide;
    std::string content;
    unsigned int mode;
  };
  for (const Case& c : {Case{true, std::string("[a]\nk=\0v\n", 9), 0644}, Case{true, "[a]\nk=v\n", 0},
                        Case{false, std::string("\x7f" "ELF\0\0\0", 7), 0644},
                        Case{false, "[a]\nk=v\n", 0}}) {
    if (c.mode == 0 && RunningAsRoot()) continue;  // root reads every file
    SCOPED_TRACE(std::string(c.destinationSide ? "destination " : "source ") +
                 (c.mode == 0 ? "unreadable" : "binary"));
    Installations run;
    const std::string bad = c.destinationSide ? run.Dst("conf.ini") : run.Src("conf.ini");
    const std::string good = c.destinationSide ? run.Src("conf.ini") : run.Dst("conf.ini");
    WriteFile(bad, c.content);
    WriteFile(good, kNewSettings);
    chmod(bad.c_str(), c.mode);
    EXPECT_EQ(1, run.manager().MergeINIFiles(run.Src("conf.ini").c_str(), run.Dst("conf.ini").c_str()));
    EXPECT_EQ((Entries{"Error: Unable to open file:   " + bad}), run.RunLog());
    chmod(bad.c_str(), 0644);
    EXPECT_EQ(c.content, ReadFile(bad));
    EXPECT_EQ(kNewSettings, ReadFile(good));
    EXPECT_EQ((Entries{"conf.ini"}), run.DestinationTree());
    EXPECT_EQ((Entries{"conf.ini"}), ListTree(run.Src()));
  }
}

TEST(MergeINIFilesRelative, JoinsBothInstallationFolders) {
  Installations run;
  WriteFile(run.Src("vantix.ini"), kOldSettings);
  WriteFile(run.Dst("conf/renamed.ini"), kNewSettings);
  EXPECT_EQ(0, run.manager().MergeINIFilesRelative("\\vantix.ini", "\\conf\\renamed.ini"));
  EXPECT_EQ((Entries{kMerged + run.Src("vantix.ini")}), run.RunLog());
  EXPECT_EQ(kMergedSettings, ReadFile(run.Dst("conf/renamed.ini")));
}

TEST(MergeAllINIFiles, WalksTheTreeTopFolderLastLeavingProtectedAndExcludedFiles) {
  Installations run;
  for (const char* name : {"top.ini", "a/one.ini"}) WriteFile(run.Dst(name), kNewSettings);
  for (const char* name : {"top.ini", "a/one.ini", "a/b/two.ini", "a/b/skip.ini",
                           "my conf/three four.ini", "vxm_vxx/datfiles/databases/db.ini",
                           "vxm_vxx/datfiles/other.ini", "tools/vxmigrate/plugin.ini",
                           "vxmigrate.ini"}) {
    WriteFile(run.Src(name), kOldSettings);
  }
  WriteFile(run.Src("a/b/notes.txt"), "not settings");
  ASSERT_EQ(0, symlink("loop.ini", run.Src("loop.ini").c_str()));
  EXPECT_EQ(0, run.manager().MergeAllINIFiles(" a/b/skip.ini, nosuch.ini"));
  EXPECT_EQ((Entries{kMerged + run.Src("a/one.ini"), kCopied + run.Src("a/b/two.ini"),
                     kCopied + run.Src("my conf/three four.ini"),
                     kCopied + run.Src("vxm_vxx/datfiles/other.ini"), kMerged + run.Src("top.ini")}),
            run.RunLog());
  EXPECT_EQ((Entries{"a", "a/b", "a/b/two.ini", "a/one.ini", "my conf", "my conf/three four.ini",
                     "top.ini", "vxm_vxx", "vxm_vxx/datfiles", "vxm_vxx/datfiles/other.ini"}),
            run.DestinationTree());
  EXPECT_EQ(kMergedSettings, ReadFile(run.Dst("a/one.ini")));
  EXPECT_EQ(kMergedSettings, ReadFile(run.Dst("top.ini")));
  EXPECT_EQ(kOldSettings, ReadFile(run.Dst("a/b/two.ini")));
}

TEST(MergeAllINIFiles, InPlaceReadsTheBackups) {
  Installations run(RunOptions{{}, true});
  for (const char* name : {"a/b", "a/only", "a/skip", "top"}) {
    WriteFile(run.Src(name + std::string(".vxinibak")), kOldSettings);
  }
  // "plain.ini" has no backup: the installer did not replace it.
  for (const char* name : {"a/b.ini", "a/skip.ini", "plain.ini", "top.ini"}) {
    WriteFile(run.Src(name), kNewSettings);
  }
  EXPECT_EQ(0, run.manager().MergeAllINIFiles("a/skip.ini"));
  EXPECT_EQ((Entries{kMerged + run.Src("a/b.vxinibak"), kCopied + run.Src("a/only.vxinibak"),
                     kMerged + run.Src("top.vxinibak")}),
            run.RunLog());
  EXPECT_EQ(kMergedSettings, ReadFile(run.Src("a/b.ini")));
  EXPECT_EQ(kOldSettings, ReadFile(run.Src("a/b.vxinibak")));
  EXPECT_EQ(kOldSettings, ReadFile(run.Src("a/only.ini")));
  EXPECT_EQ(kNewSettings, ReadFile(run.Src("a/skip.ini")));
  EXPECT_EQ(kNewSettings, ReadFile(run.Src("plain.ini")));
  EXPECT_EQ(kMergedSettings, ReadFile(run.Src("top.ini")));
}

}  // namespace
}  // namespace vxtest
