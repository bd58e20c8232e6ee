// INI merging over real files: the destination keeps its values and gains what only the old file
// had, a missing destination is copied, an unloadable one is left alone, and in-place runs read
// the backups.

#include <sys/stat.h>
#include <unistd.h>

#include <string>

#include "migrate/installations_fixture.h"
#include "support/unprivileged.h"

namespace vxtest {
namespace {

const char kOld[] = "[main]\nport=80\nuser=alice\n[old]\nkept=yes\n";
const char kNew[] = "[main]\nport=8080\ntheme=dark\n";
const char kMerged[] = "[main]\nport=8080\ntheme=dark\nuser=alice\n[old]\nkept=yes\n";

// Relative names join both installation folders; nothing comes of a missing source, and a
// missing destination gets a copy.
TEST(MergeINIFiles, KeepsDestinationValuesAddsTheOldOnesAndCopiesIntoAMissingDestination) {
  Installations run;
  WriteFile(run.Src("c.ini"), kOld);
  for (const char* name : {"c.ini", "conf/renamed.ini", "kept.ini"}) WriteFile(run.Dst(name), kNew);
  vxMigrationManager& manager = run.manager();
  EXPECT_EQ(0, manager.MergeINIFiles(run.Src("c.ini").c_str(), run.Dst("c.ini").c_str()));
  EXPECT_EQ(0, manager.MergeINIFilesRelative("\\c.ini", "\\conf\\renamed.ini"));
  EXPECT_EQ(1, manager.MergeINIFiles(run.Src("none.ini").c_str(), run.Dst("kept.ini").c_str()));
  EXPECT_EQ(1, manager.MergeINIFiles(run.Src("c.ini").c_str(), run.Dst("new/c.ini").c_str()));
  EXPECT_EQ((Entries{"INI file merged: <src>/c.ini", "INI file merged: <src>/c.ini",
                     "INI file doesn't exist - file being copied: <src>/c.ini"}),
            run.RunLog());
  EXPECT_EQ(kOld, ReadFile(run.Src("c.ini")));
  EXPECT_EQ((Entries{kMerged, kMerged, kNew, kOld}),
            run.ReadDst({"c.ini", "conf/renamed.ini", "kept.ini", "new/c.ini"}));
}

// A file the model cannot load (binary) or read is reported, and both come out exactly as they
// went in, with no temporary file left beside them.
TEST(MergeINIFiles, AnUnloadableFileOnEitherSideIsReportedAndNothingIsWritten) {
  for (const auto& [destinationSide, mode] :
       {std::make_pair(true, 0644), {true, 0}, {false, 0644}, {false, 0}}) {
    Installations run;
    // An unreadable file needs a user who cannot read it: root reads every file.
    const auto check = [&, destinationSide = destinationSide, mode = mode] {
      const std::string bad = destinationSide ? run.Dst("c.ini") : run.Src("c.ini");
      const std::string good = destinationSide ? run.Src("c.ini") : run.Dst("c.ini");
      const std::string content = mode == 0 ? "[a]\nk=v\n"
                                  : destinationSide ? std::string("[a]\nk=\0v\n", 9)
                                                    : std::string("\x7f" "ELF\0\0\0", 7);
      WriteFile(bad, content);
      WriteFile(good, kNew);
      chmod(bad.c_str(), static_cast<mode_t>(mode));
      EXPECT_EQ(1,
                run.manager().MergeINIFiles(run.Src("c.ini").c_str(), run.Dst("c.ini").c_str()));
      chmod(bad.c_str(), 0644);
      EXPECT_EQ((Entries{"Error: Unable to open file:   " + run.Marked(bad)}), run.RunLog());
      EXPECT_EQ((Entries{content, kNew}), (Entries{ReadFile(bad), ReadFile(good)}));
      EXPECT_EQ((Entries{"c.ini"}), run.DestinationTree());
      EXPECT_EQ((Entries{"c.ini"}), ListTree(run.Src()));
    };
    if (mode == 0) {
      EXPECT_TRUE(AsUnprivilegedUser({run.Root()}, check));
    } else {
      check();
    }
  }
}

TEST(MergeAllINIFiles, WalksTheTreeTopFolderLastLeavingProtectedAndExcludedFiles) {
  Installations run;
  for (const char* name : {"top.ini", "a/1.ini"}) WriteFile(run.Dst(name), kNew);
  for (const char* name : {"top.ini", "a/1.ini", "a/b/2.ini", "a/b/skip.ini", "my conf/3 4.ini",
                           "vxm_vxx/datfiles/databases/db.ini", "vxm_vxx/datfiles/other.ini",
                           "tools/vxmigrate/plugin.ini", "vxmigrate.ini"}) {
    WriteFile(run.Src(name), kOld);
  }
  WriteFile(run.Src("a/b/notes.txt"), "not settings");
  ASSERT_EQ(0, symlink("loop.ini", run.Src("loop.ini").c_str()));
  EXPECT_EQ(0, run.manager().MergeAllINIFiles(" a/b/skip.ini, nosuch.ini"));
  EXPECT_EQ((Entries{"INI file merged: <src>/a/1.ini",
                     "INI file doesn't exist - file being copied: <src>/a/b/2.ini",
                     "INI file doesn't exist - file being copied: <src>/my conf/3 4.ini",
                     "INI file doesn't exist - file being copied: <src>/vxm_vxx/datfiles/other.ini",
                     "INI file merged: <src>/top.ini"}),
            run.RunLog());
  EXPECT_EQ((Entries{"a", "a/1.ini", "a/b", "a/b/2.ini", "my conf", "my conf/3 4.ini", "top.ini",
                     "vxm_vxx", "vxm_vxx/datfiles", "vxm_vxx/datfiles/other.ini"}),
            run.DestinationTree());
  EXPECT_EQ((Entries{kMerged, kMerged, kOld}), run.ReadDst({"a/1.ini", "top.ini", "a/b/2.ini"}));
}

// "p.ini" has no backup: the installer did not replace it.
TEST(MergeAllINIFiles, InPlaceReadsTheBackups) {
  Installations run({}, true);
  for (std::string n : {"a/b", "a/only", "a/x", "top"}) WriteFile(run.Src(n + ".vxinibak"), kOld);
  for (const char* n : {"a/b.ini", "a/x.ini", "p.ini", "top.ini"}) WriteFile(run.Src(n), kNew);
  EXPECT_EQ(0, run.manager().MergeAllINIFiles("a/x.ini"));
  EXPECT_EQ((Entries{"INI file merged: <src>/a/b.vxinibak",
                     "INI file doesn't exist - file being copied: <src>/a/only.vxinibak",
                     "INI file merged: <src>/top.vxinibak"}),
            run.RunLog());
  EXPECT_EQ((Entries{kMerged, kOld, kOld, kNew, kNew, kMerged}),
            run.ReadDst({"a/b.ini", "a/b.vxinibak", "a/only.ini", "a/x.ini", "p.ini", "top.ini"}));
}

}  // namespace
}  // namespace vxtest
