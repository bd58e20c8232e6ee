// Exclusion lists: which names a list excludes, how the user's selection becomes the list of what
// stays behind, and the sample lists that end it.

#include <algorithm>
#include <regex>
#include <string>

#include "migrate/installations_fixture.h"
#include "migrate/sample_lists.h"

namespace vxtest {
namespace {

// Blanks around names, empty names and case do not count; a trailing comma names nothing more;
// there are no wildcards. In place, a listed "x.ini" stands for the old file kept under the given
// extension. With fromInstallation, names are paths below the source folder ("$" in a file).
TEST(IsExcludeFile, AnswersWhetherTheListNamesTheFile) {
  struct Case { const char* list; bool inPlace; const char* extension; int fromInstallation;
                Entries excluded; Entries kept; };
  const Case cases[] = {
      {"", false, "", 0, {}, {"a.wlp", ""}},
      {" \ta.wlp\t , my site.wlp,,B.WLP,*.x,", false, "", 0, {"a.wlp", "my site.wlp", "b.wlp"},
       {"c.x", "", "$/a.wlp"}},
      {"a.wlp, sub/b.wlp,sub\\c.wlp", false, "", 1, {"$/a.wlp", "$/sub/b.wlp", "$/sub/c.wlp"},
       {"$/sub/a.wlp", "a.wlp"}},
      {"x.ini", false, "bak", 0, {"x.ini"}, {"x.bak"}},
      {"x.ini", true, "bak", 0, {"x.bak"}, {"x.ini"}},
      {"x.ini, sub/y.ini", true, "vxinibak", 1, {"$/x.vxinibak", "$/sub/y.vxinibak"}, {"$/x.ini"}},
      {"x.ini", true, "", 0, {"x."}, {"x.ini"}}};
  Installations sideBySide;
  Installations inPlace({}, true);
  for (const Case& c : cases) {
    Installations& run = c.inPlace ? inPlace : sideBySide;
    for (int excluded : {1, 0}) {
      for (std::string file : excluded ? c.excluded : c.kept) {
        if (!file.empty() && file[0] == '$') file.replace(0, 1, run.Src());
        EXPECT_EQ(excluded, run.manager().IsExcludeFile(file.c_str(), c.list, c.extension,
                                                         c.fromInstallation))
            << "\"" << c.list << "\" " << file << (c.inPlace ? " in place" : "");
      }
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
      const std::string name = "[a-z0-9_]+\\." + kind;
      EXPECT_TRUE(std::regex_match(GetSampleFileList(p, kind.c_str()),
                                   std::regex("(" + name + "(," + name + ")*)?")))
          << p << " " << kind;
    }
  }
  const std::string obx = GetSampleFileList("OBX", "WLP");  // the reporting server ships three
  EXPECT_EQ(obx, GetSampleFileList("obx", "wlp"));
  EXPECT_EQ(2, std::count(obx.begin(), obx.end(), ','));
  EXPECT_EQ((Entries{"", "", ""}), (Entries{GetSampleFileList("nosuch", "wlp"),
                                             GetSampleFileList("obx", "nosuch"),
                                             GetSampleFileList(nullptr, "wlp")}));
}

}  // namespace
}  // namespace vxtest
