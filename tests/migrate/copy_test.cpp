// Copying between installations over real trees: what is copied, what is kept, what is logged and
// in which order, how links, blanks and unreadable entries are handled, profiles with their data
// folders, and the in-place guard of every copying operation.

#include <sys/stat.h>
#include <sys/time.h>
#include <unistd.h>

#include <functional>
#include <string>
#include <utility>
#include <vector>

#include "migrate/installations_fixture.h"

namespace vxtest {
namespace {

const char kCopied[] = "File copied:  ";
const char kExists[] = "File exists - no copy made:  ";
const char kUnableToCopy[] = "Error: Unable to copy file:  ";

TEST(CopyAllFilesOfType, CopiesSubfoldersFirstKeepsExistingFilesAndSkipsExcludedOnes) {
  Installations run;
  run.WriteSources({"top.wlp", "readme.txt", "sub/b.wlp", "sub/deep/c.wlp", "sub/deep/c.wlpx",
                    "sub/deep/skip.wlp", "my sites/my site.wlp", "my sites/skip me.wlp", "Skip.wlp"});
  WriteFile(run.Dst("sub/b.wlp"), "new b");
  WriteFile(run.Dst("readme.txt"), "new readme");
  chmod(run.Src("sub/deep/c.wlp").c_str(), 0640);
  // Excluded names are relative to the installation; blanks around them and case do not count.
  EXPECT_EQ(0, run.manager().CopyAllFilesOfType(
                   "wlp", " sub/deep/SKIP.wlp, skip.wlp,my sites\\skip me.wlp,"));
  // Each type in turn, never replacing whatever the option says.
  EXPECT_EQ(0, run.manager().CopyFilesOfTypes(" wlpx, ,txt,", 1));

  EXPECT_EQ((Entries{kCopied + run.Src("my sites/my site.wlp"), kExists + run.Src("sub/b.wlp"),
                     kCopied + run.Src("sub/deep/c.wlp"), kCopied + run.Src("top.wlp"),
                     kCopied + run.Src("sub/deep/c.wlpx"), kExists + run.Src("readme.txt")}),
            run.RunLog());
  EXPECT_EQ((Entries{"my sites", "my sites/my site.wlp", "readme.txt", "sub", "sub/b.wlp",
                     "sub/deep", "sub/deep/c.wlp", "sub/deep/c.wlpx", "top.wlp"}),
            run.DestinationTree());
  EXPECT_EQ((Entries{"new b", "new readme", "my sites/my site.wlp"}),
            (Entries{ReadFile(run.Dst("sub/b.wlp")), ReadFile(run.Dst("readme.txt")),
                     ReadFile(run.Dst("my sites/my site.wlp"))}));
  EXPECT_EQ(0640u, ModeOf(run.Dst("sub/deep/c.wlp")));
}

TEST(CopyAllFilesOfType, CopiesLinksAsLinksAndNeverFollowsFolderLinksNorReplacesADanglingOne) {
  Installations run;
  run.WriteSources({"real.wlp", "kept.wlp", "sub/inner.wlp"});
  const std::vector<std::pair<std::string, std::string>> links = {
      {"real.wlp", run.Src("alias.wlp")}, {"gone.wlp", run.Src("dangling.wlp")},
      {"loop.wlp", run.Src("loop.wlp")},  {"..", run.Src("sub/up")},  // a folder loop
      {"sub", run.Src("sublink")},        {"elsewhere.wlp", run.Dst("kept.wlp")}};
  for (const auto& link : links) ASSERT_EQ(0, symlink(link.first.c_str(), link.second.c_str()));
  run.manager().CopyAllFilesOfType("wlp", vxStringBase::NullStr);

  EXPECT_EQ((Entries{kCopied + run.Src("sub/inner.wlp"), kCopied + run.Src("alias.wlp"),
                     kCopied + run.Src("dangling.wlp"), kExists + run.Src("kept.wlp"),
                     kCopied + run.Src("loop.wlp"), kCopied + run.Src("real.wlp")}),
            run.RunLog());
  EXPECT_EQ((Entries{"alias.wlp", "dangling.wlp", "kept.wlp", "loop.wlp", "real.wlp", "sub",
                     "sub/inner.wlp"}),
            run.DestinationTree());
  EXPECT_EQ((Entries{"real.wlp", "gone.wlp", "loop.wlp", "elsewhere.wlp"}),
            (Entries{LinkTarget(run.Dst("alias.wlp")), LinkTarget(run.Dst("dangling.wlp")),
                     LinkTarget(run.Dst("loop.wlp")), LinkTarget(run.Dst("kept.wlp"))}));
}

// A pattern copy answers for the whole set, so the files that did not arrive are named one by one.
TEST(CopyOperations, AnUnreadableEntryCostsOneLineAndTheRestIsCopied) {
  if (RunningAsRoot()) GTEST_SKIP() << "root reads every file";
  Installations run;
  run.WriteSources({"a.wlp", "secret.wlp", "locked/hidden.wlp", "z/z.wlp", "templates/a.mss",
                    "templates/secret.mss", "top.mss", "hidden.mss", "kept.mss"});
  WriteFile(run.Dst("kept.mss"), "kept");
  for (const char* name : {"secret.wlp", "locked", "templates/secret.mss", "hidden.mss"}) {
    chmod(run.Src(name).c_str(), 0);
  }
  vxMigrationManager& manager = run.manager();
  manager.CopyAllFilesOfType("wlp", vxStringBase::NullStr);
  manager.CopyFiles("secret.wlp,a.wlp", 0);
  EXPECT_EQ(1, manager.CopyFilesInRelativeFolder("templates", "mss", 0));
  EXPECT_EQ(1, manager.CopyFilesOfType("mss", 0));
  chmod(run.Src("locked").c_str(), 0755);

  EXPECT_EQ((Entries{"Error: Unable to read folder:  " + run.Src("locked/"),
                     kCopied + run.Src("z/z.wlp"), kCopied + run.Src("a.wlp"),
                     kUnableToCopy + run.Src("secret.wlp"), kUnableToCopy + run.Src("secret.wlp"),
                     "File copied: " + run.Src("a.wlp"),
                     "Files copied from folder:  " + run.Src("templates/*.mss"),
                     kUnableToCopy + run.Src("templates/secret.mss"),
                     kUnableToCopy + run.Src("hidden.mss")}),
            run.RunLog());
  EXPECT_EQ((Entries{"a.wlp", "kept.mss", "templates", "templates/a.mss", "top.mss", "z", "z/z.wlp"}),
            run.DestinationTree());
  EXPECT_EQ("kept", ReadFile(run.Dst("kept.mss")));
}

// Named files, the top folder's files of a type and one folder's files replace what is there,
// unless their option asks to keep newer (CopyFiles) or existing (CopyFilesOfType) files.
TEST(CopyOperations, CopiesOfNamedFilesAndOfOneFolderReplaceAsTheirOptionsSay) {
  Installations run;
  run.WriteSources({"a.ini", "conf/b c.ini", "n.ini", "x.dat", "y.dat", "sub/z.dat", "t/a.mss",
                    "t/b.mss", "t/deeper/c.mss"});
  for (const char* name : {"a.ini", "n.ini", "x.dat", "t/a.mss"}) WriteFile(run.Dst(name), "new");
  const struct timeval old[2] = {{1000000000, 0}, {1000000000, 0}};
  utimes(run.Src("n.ini").c_str(), old);
  vxMigrationManager& manager = run.manager();
  EXPECT_EQ(0, manager.CopyFiles(" , ", 0));
  EXPECT_EQ(0, manager.CopyFiles("a.ini,missing.ini,, conf\\b c.ini", 0));
  EXPECT_EQ(0, manager.CopyFiles("n.ini", 1));
  manager.CopyFilesOfType("dat", 0);
  EXPECT_EQ("new", ReadFile(run.Dst("x.dat")));
  EXPECT_EQ(0, manager.CopyFilesOfType("dat", 1));
  EXPECT_EQ(1, manager.CopyFilesInRelativeFolder("nosuch", "mss", 0));
  EXPECT_EQ(0, manager.CopyFilesInRelativeFolder("\\t", "mss", 0));
  manager.CopyFilesInRelativeFolder("t", "none", 0);

  EXPECT_EQ((Entries{"File copied: " + run.Src("a.ini"), "File copied: " + run.Src("conf/b c.ini"),
                     "Files copied from folder:  " + run.Src("t/*.mss"),
                     "Files copied from folder:  " + run.Src("t/*.none")}),
            run.RunLog());
  EXPECT_EQ((Entries{"a.ini", "conf", "conf/b c.ini", "n.ini", "t", "t/a.mss", "t/b.mss", "x.dat",
                     "y.dat"}),
            run.DestinationTree());
  EXPECT_EQ((Entries{"a.ini", "new", "x.dat", "t/a.mss"}),
            (Entries{ReadFile(run.Dst("a.ini")), ReadFile(run.Dst("n.ini")),
                     ReadFile(run.Dst("x.dat")), ReadFile(run.Dst("t/a.mss"))}));
}

// Profiles in the top folder and two levels below, data folders beside some of them.
void LayOutProfiles(const Installations& run) {
  run.WriteSources({"top.wlp", "top.dat/hits.dat", "a/x.wlp", "a/x.dat/hits.dat",
                    "a/x.dat/history/2019.dat", "a/notes.txt", "b/c/y.wlp", "b/c/y.dat/hits.dat"});
}

TEST(CopyAllProfilesOfType, CopiesTheTreeKeepsInstalledProfilesAndVisitsTheTopFolderLast) {
  Installations run;
  LayOutProfiles(run);
  run.WriteSources({"a/skip.wlp"});
  WriteFile(run.Dst("b/c/y.wlp"), "new y");
  EXPECT_EQ(0, run.manager().CopyAllProfilesOfType("wlp", " A/SKIP.wlp , skip.wlp"));

  EXPECT_EQ((Entries{"a", "a/x.dat", "a/x.dat/hits.dat", "a/x.wlp", "b", "b/c", "b/c/y.wlp",
                     "top.dat", "top.dat/hits.dat", "top.wlp"}),
            run.DestinationTree());
  EXPECT_EQ("new y", ReadFile(run.Dst("b/c/y.wlp")));
  EXPECT_EQ("a/x.dat/hits.dat", ReadFile(run.Dst("a/x.dat/hits.dat")));
  EXPECT_EQ((Entries{kCopied + run.Src("a/x.wlp"), "Folder copied:  " + run.Src("a/x.dat/*.*"),
                     kExists + run.Src("b/c/y.wlp"), kCopied + run.Src("top.wlp"),
                     "Folder copied:  " + run.Src("top.dat/*.*")}),
            run.RunLog());
}

TEST(CopyProfilesOfTypes, CopiesEveryTypeWithDataFoldersUnlessFTSaysNo) {
  for (const auto& [option, copiesDataFolders] : std::vector<std::pair<std::string, bool>>{
           {"", true}, {"-FT:", true}, {"-FT:yes", true}, {"-FT:N", false}, {"-FT:true", false}}) {
    SCOPED_TRACE(option);
    Installations run(RunOptions{option.empty() ? Entries{} : Entries{option}});
    LayOutProfiles(run);
    EXPECT_EQ(0, run.manager().CopyProfilesOfTypes("txt,wlp", 0xffffffffu));  // option unused
    EXPECT_TRUE(FileExists(run.Dst("a/notes.txt")) && FileExists(run.Dst("top.wlp")));
    EXPECT_EQ(copiesDataFolders, FileExists(run.Dst("top.dat/hits.dat")));
    EXPECT_EQ(copiesDataFolders, FileExists(run.Dst("a/x.dat/hits.dat")));
  }
}

// In place the source is the destination: every copying operation leaves it alone, whatever the
// arguments, and nothing is copied, created, rewritten or logged.
TEST(InPlaceRun, EveryCopyingOperationDoesNothing) {
  Installations run(RunOptions{{}, true});
  LayOutProfiles(run);
  const std::string categories = "[main]\nNumberOfCategories=1\nCategory1=A\n[A]\nProfile1=a.llp\n";
  for (const char* name : {"p/a.wlp", "links/a.llp", "lang/italian.rpl"}) {
    WriteFile(run.Src(name), "[Profile]\nLogFilePassword=abc\n");
  }
  WriteFile(run.Src("p/categories.ini"), categories);
  WriteFile(run.Src("links/categories.ini"), categories);
  const Entries before = run.DestinationTree();
  vxMigrationManager& m = run.manager();
  const std::vector<std::function<int()>> operations = {
      [&] { return m.CopyFilesOfType("wlp", 1); },
      [&] { return m.CopyFilesOfTypes("wlp", 1); },
      [&] { return m.CopyFiles("top.wlp,a/x.wlp", 0); },
      [&] { return m.CopyAllFilesOfType("wlp", vxStringBase::NullStr); },
      [&] { return m.CopyFilesInRelativeFolder("a", "wlp", 0); },
      [&] { return m.CopyFilesInRelativeFolder("nosuch", "wlp", 0); },
      [&] { return m.CopyProfilesOfTypes("wlp", 0); },
      [&] { return m.CopyAllProfilesOfType("wlp", vxStringBase::NullStr); },
      [&] { return m.CopyRenamedUserFiles("p", "*.wlp", "wlp", ""); },
      [&] { return m.CopyScheduledEventFiles("p", "*.wlp", "wlp", "*"); },
      [&] { return m.DoCopyLanguageFiles("lang", "lang2"); },
      [&] { return m.DoCopyLogProfiles("p", "*.wlp", "wlp", ""); },
      [&] { return m.DoCopyLinkProfiles("links", "*.llp", "llp", ""); },
      [&] { return m.DoCopyAlertProfiles("p", "*.wlp", "wlp", ""); }};
  for (size_t i = 0; i < operations.size(); ++i) EXPECT_EQ(0, operations[i]()) << "operation " << i;
  EXPECT_EQ(before, run.DestinationTree());
  EXPECT_EQ("[Profile]\nLogFilePassword=abc\n", ReadFile(run.Src("p/a.wlp")));
  EXPECT_EQ(categories, ReadFile(run.Src("p/categories.ini")));
  EXPECT_EQ(categories, ReadFile(run.Src("links/categories.ini")));
  EXPECT_EQ(Entries{}, run.RunLog());
}

}  // namespace
}  // namespace vxtest
