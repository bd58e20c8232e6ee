// Exclusion lists: which names a list excludes, how the user's selection becomes the list of what
// stays behind, and the sample lists that end it. Copying between installations over real trees:
// what is copied, what is kept, what is logged and in which order, how links, blanks and unreadable
// entries are handled, profiles with their data folders, and the in-place guard of every copying
// operation.

#include <sys/stat.h>
#include <sys/time.h>
#include <unistd.h>

#include <regex>
#include <string>
#include <vector>

#include "migrate/installations_fixture.h"
#include "migrate/sample_lists.h"
#include "support/unprivileged.h"

namespace vxtest {
namespace {

// Blanks around names, empty names and case do not count; a trailing comma names nothing more;
// there are no wildcards. In place, a listed "x.ini" stands for the old file kept under the given
// extension. With fromInstallation, names are paths below the source folder ("$" in a file). A
// file marked "!" is not excluded.
TEST(IsExcludeFile, AnswersWhetherTheListNamesTheFile) {
  struct Case { const char* list; bool inPlace; const char* extension; int fromInstallation;
                Entries files; };
  const Case cases[] = {
      {"", false, "", 0, {"!a.wlp", "!"}},
      {" \ta.wlp\t , my site.wlp,,B.WLP,*.x,", false, "", 0,
       {"a.wlp", "my site.wlp", "b.wlp", "!c.x", "!", "!$/a.wlp"}},
      {"a.wlp, sub/b.wlp,sub\\c.wlp", false, "", 1,
       {"$/a.wlp", "$/sub/b.wlp", "$/sub/c.wlp", "!$/sub/a.wlp", "!a.wlp"}},
      {"x.ini", false, "bak", 0, {"x.ini", "!x.bak"}},
      {"x.ini", true, "bak", 0, {"x.bak", "!x.ini"}},
      {"x.ini, sub/y.ini", true, "vxinibak", 1, {"$/x.vxinibak", "$/sub/y.vxinibak", "!$/x.ini"}},
      {"x.ini", true, "", 0, {"x.", "!x.ini"}}};
  Installations sideBySide;
  Installations inPlace({}, true);
  for (const Case& c : cases) {
    Installations& run = c.inPlace ? inPlace : sideBySide;
    for (std::string file : c.files) {
      const int excluded = file.empty() || file[0] != '!' ? 1 : 0;
      if (!excluded) file.erase(0, 1);
      if (!file.empty() && file[0] == '$') file.replace(0, 1, run.Src());
      EXPECT_EQ(excluded, run.manager().IsExcludeFile(file.c_str(), c.list, c.extension,
                                                       c.fromInstallation))
          << "\"" << c.list << "\" " << file << (c.inPlace ? " in place" : "");
    }
  }
}

// The folder holds a.wlp, b.wlp, c.wlp and files of other types.
TEST(MakeFullExclusionList, ListsWhatTheUserDidNotSelectThenTheFixedNames) {
  struct Case { const char* selection; const char* folder; const char* fixedList;
                const char* initial; const char* expected; };
  const Case cases[] = {
      {"", "p", "s1.wlp,s2.wlp", "", "s1.wlp,s2.wlp"},
      {"", "p", "s1.wlp", "old", "s1.wlp"},
      {"zz.wlp", "p", "s1.wlp,s2.wlp", "", "a.wlp,b.wlp,c.wlp,s1.wlp,s2.wlp"},
      {"c.wlp,a.wlp,b.wlp", "p", "s1.wlp", "", "s1.wlp"},
      {" B.WLP , a.wlp", "p", "s1.wlp", "", "c.wlp,s1.wlp"},
      {"a.wlp", "p", "", "", "b.wlp,c.wlp,"},
      {"a.wlp", "p", "s1.wlp", "pre", "pre,b.wlp,c.wlp,s1.wlp"},
      {"a.wlp", "nosuch", "s1.wlp", "", "s1.wlp"}};
  Installations run;
  run.WriteSources({"p/a.wlp", "p/b.wlp", "p/c.wlp", "p/notes.txt", "p/a.wlp.old", "p/sub/d.wlp"});
  for (const Case& c : cases) {
    vxStringBase list(c.initial);
    run.manager().MakeFullExclusionList(list, c.selection, c.folder, "wlp", c.fixedList);
    EXPECT_EQ(c.expected, list.str()) << "\"" << c.selection << "\" in " << c.folder;
  }
}

TEST(SampleLists, EveryListIsBareNamesOfItsKindAndLookupIgnoresCase) {
  for (const char* p : {"halsuite", "pavsuite", "mirsuite", "log", "obx", "tqrs", "bastion"}) {
    EXPECT_STRNE("", GetSampleFileList(p, "wlp")) << p;
    for (const std::string kind : {"wlp", "prx", "slp", "llp", "alp", "arp", "mss"}) {
      const std::string name = "[a-z0-9_]+\\." + kind, re = "(" + name + "(," + name + ")*)?";
      EXPECT_TRUE(std::regex_match(GetSampleFileList(p, kind.data()), std::regex(re))) << p << kind;
    }
  }
  EXPECT_STREQ(GetSampleFileList("obx", "wlp"), GetSampleFileList("OBX", "WLP"));
  for (const auto& [p, kind] : {std::make_pair("no", "wlp"), {"obx", "no"}, {nullptr, "wlp"}}) {
    EXPECT_STREQ("", GetSampleFileList(p, kind));
  }
}

// Excluded names are relative to the installation; blanks around them and case do not count.
// Links are copied as links; links to folders, a folder loop among them, are never followed.
TEST(CopyAllFilesOfType, CopiesSubfoldersFirstNeverReplacesAndSkipsExcludedFiles) {
  Installations run;
  run.WriteSources({"top.wlp", "kept.wlp", "X.wlp", "readme.txt", "sub/b.wlp", "sub/deep/c.wlp",
                    "sub/deep/c.wlpx", "sub/deep/x.wlp", "my s/my site.wlp", "my s/x y.wlp"});
  for (const char* name : {"sub/b.wlp", "readme.txt"}) WriteFile(run.Dst(name), "new");
  for (const auto& [target, link] :
       {std::make_pair("top.wlp", run.Src("alias.wlp")), {"gone.wlp", run.Src("dangling.wlp")},
        {"loop.wlp", run.Src("loop.wlp")}, {"..", run.Src("sub/up")}, {"sub", run.Src("sublink")},
        {"elsewhere.wlp", run.Dst("kept.wlp")}}) {
    ASSERT_EQ(0, symlink(target, link.c_str()));
  }
  EXPECT_EQ(0, run.manager().CopyAllFilesOfType("wlp", " sub/deep/X.wlp, x.wlp,my s\\x y.wlp,"));
  // Each type in turn, never replacing whatever the option says.
  EXPECT_EQ(0, run.manager().CopyFilesOfTypes(" wlpx, ,txt,", 1));

  EXPECT_EQ((Entries{"File copied:  <src>/my s/my site.wlp",
                     "File exists - no copy made:  <src>/sub/b.wlp",
                     "File copied:  <src>/sub/deep/c.wlp", "File copied:  <src>/alias.wlp",
                     "File copied:  <src>/dangling.wlp",
                     "File exists - no copy made:  <src>/kept.wlp", "File copied:  <src>/loop.wlp",
                     "File copied:  <src>/top.wlp", "File copied:  <src>/sub/deep/c.wlpx",
                     "File exists - no copy made:  <src>/readme.txt"}),
            run.RunLog());
  EXPECT_EQ((Entries{"alias.wlp", "dangling.wlp", "kept.wlp", "loop.wlp", "my s",
                     "my s/my site.wlp", "readme.txt", "sub", "sub/b.wlp", "sub/deep",
                     "sub/deep/c.wlp", "sub/deep/c.wlpx", "top.wlp"}),
            run.DestinationTree());
  EXPECT_EQ((Entries{"new", "new", "my s/my site.wlp", "-> top.wlp", "-> gone.wlp",
                     "-> loop.wlp", "-> elsewhere.wlp"}),
            run.ReadDst({"sub/b.wlp", "readme.txt", "my s/my site.wlp", "alias.wlp",
                         "dangling.wlp", "loop.wlp", "kept.wlp"}));
}

// A pattern copy answers for the whole set, so the files that did not arrive are named one by one.
TEST(CopyOperations, AnUnreadableEntryCostsOneLineAndTheRestIsCopied) {
  Installations run;
  run.WriteSources({"a.wlp", "no.wlp", "dir/in.wlp", "z/z.wlp", "t/a.mss", "t/no.mss",
                    "top.mss", "no.mss", "kept.mss"});
  WriteFile(run.Dst("kept.mss"), "kept");
  EXPECT_TRUE(AsUnprivilegedUser({run.Root()}, [&run] {
    for (const char* name : {"no.wlp", "dir", "t/no.mss", "no.mss"}) {
      chmod(run.Src(name).c_str(), 0);
    }
    run.manager().CopyAllFilesOfType("wlp", vxStringBase::NullStr);
    run.manager().CopyFiles("no.wlp,a.wlp", 0);
    EXPECT_EQ(1, run.manager().CopyFilesInRelativeFolder("t", "mss", 0));
    EXPECT_EQ(1, run.manager().CopyFilesOfType("mss", 0));
    chmod(run.Src("dir").c_str(), 0755);

    EXPECT_EQ((Entries{"Error: Unable to read folder:  <src>/dir/", "File copied:  <src>/z/z.wlp",
                       "File copied:  <src>/a.wlp", "Error: Unable to copy file:  <src>/no.wlp",
                       "Error: Unable to copy file:  <src>/no.wlp", "File copied: <src>/a.wlp",
                       "Files copied from folder:  <src>/t/*.mss",
                       "Error: Unable to copy file:  <src>/t/no.mss",
                       "Error: Unable to copy file:  <src>/no.mss"}),
              run.RunLog());
    EXPECT_EQ((Entries{"a.wlp", "kept.mss", "t", "t/a.mss", "top.mss", "z", "z/z.wlp"}),
              run.DestinationTree());
  }));
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

  EXPECT_EQ((Entries{"File copied: <src>/a.ini", "File copied: <src>/conf/b c.ini",
                     "Files copied from folder:  <src>/t/*.mss",
                     "Files copied from folder:  <src>/t/*.none"}),
            run.RunLog());
  EXPECT_EQ((Entries{"a.ini", "conf", "conf/b c.ini", "n.ini", "t", "t/a.mss", "t/b.mss", "x.dat",
                     "y.dat"}),
            run.DestinationTree());
  EXPECT_EQ((Entries{"a.ini", "new", "x.dat", "t/a.mss"}),
            run.ReadDst({"a.ini", "n.ini", "x.dat", "t/a.mss"}));
}

// Profiles in the top folder and two levels below, data folders beside some of them.
void LayOutProfiles(const Installations& run) {
  run.WriteSources({"top.wlp", "top.dat/h", "a/x.wlp", "a/x.dat/h", "a/x.dat/history/2019",
                    "a/notes.txt", "b/c/y.wlp", "b/c/y.dat/h"});
}

TEST(CopyAllProfilesOfType, CopiesTheTreeKeepsInstalledProfilesAndVisitsTheTopFolderLast) {
  Installations run;
  LayOutProfiles(run);
  run.WriteSources({"a/skip.wlp"});
  WriteFile(run.Dst("b/c/y.wlp"), "new y");
  EXPECT_EQ(0, run.manager().CopyAllProfilesOfType("wlp", " A/SKIP.wlp , skip.wlp"));

  EXPECT_EQ((Entries{"a", "a/x.dat", "a/x.dat/h", "a/x.wlp", "b", "b/c", "b/c/y.wlp", "top.dat",
                     "top.dat/h", "top.wlp"}),
            run.DestinationTree());
  EXPECT_EQ((Entries{"new y", "a/x.dat/h"}), run.ReadDst({"b/c/y.wlp", "a/x.dat/h"}));
  EXPECT_EQ((Entries{"File copied:  <src>/a/x.wlp", "Folder copied:  <src>/a/x.dat/*.*",
                     "File exists - no copy made:  <src>/b/c/y.wlp", "File copied:  <src>/top.wlp",
                     "Folder copied:  <src>/top.dat/*.*"}),
            run.RunLog());
}

TEST(CopyProfilesOfTypes, CopiesEveryTypeWithDataFoldersUnlessFTSaysNo) {
  for (const auto& [option, copiesDataFolders] :
       {std::make_pair("", true), {"-FT:", true}, {"-FT:yes", true}, {"-FT:N", false},
        {"-FT:true", false}}) {
    SCOPED_TRACE(option);
    Installations run({option});
    LayOutProfiles(run);
    EXPECT_EQ(0, run.manager().CopyProfilesOfTypes("txt, wlp,", 0xffffffffu));  // option unused
    EXPECT_TRUE(FileExists(run.Dst("a/notes.txt")) && FileExists(run.Dst("top.wlp")));
    EXPECT_EQ(copiesDataFolders, FileExists(run.Dst("top.dat/h")));
    EXPECT_EQ(copiesDataFolders, FileExists(run.Dst("a/x.dat/h")));
  }
}

// In place the source is the destination: every copying operation (and the data-file merge) answers
// 0 and leaves it alone, whatever the arguments; nothing is copied, created, rewritten or logged.
TEST(InPlaceRun, EveryCopyingOperationDoesNothing) {
  Installations run({}, true);
  LayOutProfiles(run);
  const std::string profile = "[Profile]\nLogFilePassword=abc\n";
  const std::string categories = "[main]\nNumberOfCategories=1\nCategory1=A\n[A]\nProfile1=a.llp\n";
  for (const char* name : {"p/a.wlp", "l/a.llp", "lang/it.rpl"}) WriteFile(run.Src(name), profile);
  for (const char* f : {"p/categories.ini", "l/categories.ini"}) WriteFile(run.Src(f), categories);
  const Entries before = run.DestinationTree();
  vxMigrationManager& m = run.manager();
  EXPECT_EQ(std::vector<int>(15, 0),
            (std::vector<int>{
                m.CopyFilesOfType("wlp", 1), m.CopyFilesOfTypes("wlp", 1), m.CopyFiles("x", 0),
                m.CopyAllFilesOfType("wlp", ""), m.CopyFilesInRelativeFolder("a", "wlp", 0),
                m.CopyFilesInRelativeFolder("nosuch", "wlp", 0), m.CopyProfilesOfTypes("wlp", 0),
                m.CopyAllProfilesOfType("wlp", ""), m.CopyRenamedUserFiles("p", "*.wlp", "wlp", ""),
                m.CopyScheduledEventFiles("p", "*.wlp", "wlp", "*"),
                m.DoCopyLanguageFiles("lang", "new"), m.DoCopyLogProfiles("p", "*.wlp", "wlp", ""),
                m.DoCopyLinkProfiles("l", "*.llp", "llp", ""),
                m.DoCopyAlertProfiles("p", "*.wlp", "wlp", ""),
                m.DoMergeCSVFile("p/a.wlp", "p/a.wlp")}));
  EXPECT_EQ(before, run.DestinationTree());
  EXPECT_EQ((Entries{profile, categories, categories}),
            run.ReadDst({"p/a.wlp", "p/categories.ini", "l/categories.ini"}));
  EXPECT_EQ(Entries{}, run.RunLog());
}

}  // namespace
}  // namespace vxtest
