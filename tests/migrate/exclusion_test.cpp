// Exclusion lists: which names a list excludes, how the user's selection becomes the list of what
// stays behind, and the sample lists that end it.

#include <algorithm>
#include <regex>
#include <string>

#include "migrate/installations_fixture.h"
#include "migrate/sample_lists.h"

namespace vxtest {
namespace {

TEST(IsExcludeFile, AnswersWhetherTheListNamesTheFile) {
  struct Case {
    const char* list;
    const char* file;  // "$" stands for the source folder
    bool inPlace;
    const char* inPlaceExtension;
    int fromInstallation;
    int excluded;
  };
  const Case cases[] = {
      {"", "a.wlp", false, "", 0, 0},
      {"a.wlp, b.wlp", "b.wlp", false, "", 0, 1},
      {" \ta.wlp\t ,  b.wlp  ", "a.wlp", false, "", 0, 1},
      {"x.wlp, my site.wlp", "my site.wlp", false, "", 0, 1},
      {"A.WLP", "a.wlp", false, "", 0, 1},
      {"*.wlp", "a.wlp", false, "", 0, 0},       // no wildcards
      {"a.wlp,", "", false, "", 0, 0},           // a trailing comma names nothing more
      {"a.wlp,,b.wlp", "b.wlp", false, "", 0, 1},  // an empty name does not end the list
      {"a.wlp", "$/a.wlp", false, "", 1, 1},
      {"a.wlp", "$/sub/a.wlp", false, "", 1, 0},
      {"x.wlp, sub/a.wlp", "$/sub/a.wlp", false, "", 1, 1},
      {"sub\\a.wlp", "$/sub/a.wlp", false, "", 1, 1},
      {"a.wlp", "$/a.wlp", false, "", 0, 0},
      {"x.ini", "x.ini", false, "bak", 0, 1},
      {"x.ini", "x.bak", true, "bak", 0, 1},  // in place, "x.ini" stands for the old file
      {"x.ini", "x.ini", true, "bak", 0, 0},
      {"sub/x.ini", "$/sub/x.vxinibak", true, "vxinibak", 1, 1},
      {"x.ini", "x.", true, "", 0, 1}};
  Installations sideBySide;
  Installations inPlace(RunOptions{{}, true});
  for (const Case& c : cases) {
    Installations& run = c.inPlace ? inPlace : sideBySide;
    std::string file = c.file;
    if (file[0] == '$') file.replace(0, 1, run.Src());
    EXPECT_EQ(c.excluded, run.manager().IsExcludeFile(file.c_str(), c.list, c.inPlaceExtension,
                                                       c.fromInstallation))
        << "\"" << c.list << "\" " << c.file << (c.inPlace ? " in place" : "");
  }
  EXPECT_EQ(Entries{}, sideBySide.RunLog());
  EXPECT_EQ(Entries{}, inPlace.RunLog());
}

// The folder holds a.wlp, b.wlp, c.wlp and files of other types.
TEST(MakeFullExclusionList, ListsWhatTheUserDidNotSelectThenTheFixedNames) {
  struct Case {
    const char* selection;
    const char* folder;
    const char* fixedList;
    const char* initial;
    const char* expected;
  };
  const Case cases[] = {
      {"", "profiles", "s1.wlp,s2.wlp", "", "s1.wlp,s2.wlp"},
      {"", "profiles", "s1.wlp", "old", "s1.wlp"},
      {"zz.wlp", "profiles", "s1.wlp,s2.wlp", "", "a.wlp,b.wlp,c.wlp,s1.wlp,s2.wlp"},
      {"c.wlp,a.wlp,b.wlp", "profiles", "s1.wlp", "", "s1.wlp"},
      {" B.WLP , a.wlp", "profiles", "s1.wlp", "", "c.wlp,s1.wlp"},
      {"a.wlp", "profiles", "", "", "b.wlp,c.wlp,"},
      {"a.wlp", "profiles", "s1.wlp", "pre", "pre,b.wlp,c.wlp,s1.wlp"},
      {"a.wlp", "nosuch", "s1.wlp", "", "s1.wlp"}};
  Installations run;
  for (const char* name : {"a.wlp", "b.wlp", "c.wlp", "notes.txt", "a.wlp.old", "sub/d.wlp"}) {
    WriteFile(run.Src(std::string("profiles/") + name), name);
  }
  for (const Case& c : cases) {
    vxStringBase result(c.initial);
    run.manager().MakeFullExclusionList(result, c.selection, c.folder, "wlp", c.fixedList);
    EXPECT_EQ(c.expected, result.str()) << "\"" << c.selection << "\" in " << c.folder;
  }
}

// What the list leaves out is exactly what IsExcludeFile then refuses.
TEST(MakeFullExclusionList, AgreesWithIsExcludeFile) {
  Installations run;
  for (const char* name : {"keep.llp", "drop.llp", "Sample.llp"}) {
    WriteFile(run.Src(std::string("links/") + name), "x");
  }
  vxStringBase list;
  run.manager().MakeFullExclusionList(list, "keep.llp", "links", "llp", "sample.llp");
  for (const char* name : {"keep.llp", "drop.llp", "Sample.llp"}) {
    EXPECT_EQ(name[0] == 'k' ? 0 : 1, run.manager().IsExcludeFile(name, list, "", 0)) << name;
  }
}

TEST(SampleLists, EveryListIsBareNamesOfItsKindAndLookupIgnoresCase) {
  for (const char* product : {"halsuite", "pavsuite", "mirsuite", "log", "obx", "tqrs", "bastion"}) {
    EXPECT_STRNE("", GetSampleFileList(product, "wlp")) << product;
    for (const char* kind : {"wlp", "prx", "slp", "llp", "alp", "arp", "mss"}) {
      const std::string name = std::string("[a-z0-9_]+\\.") + kind;
      EXPECT_TRUE(std::regex_match(GetSampleFileList(product, kind),
                                   std::regex("(" + name + "(," + name + ")*)?")))
          << product << " " << kind;
    }
  }
  // The reporting server ships three profiles.
  const std::string obx = GetSampleFileList("OBX", "WLP");
  EXPECT_EQ(obx, GetSampleFileList("obx", "wlp"));
  EXPECT_EQ(2, std::count(obx.begin(), obx.end(), ','));
  EXPECT_STREQ("", GetSampleFileList("nosuch", "wlp"));
  EXPECT_STREQ("", GetSampleFileList("obx", "nosuch"));
  EXPECT_STREQ("", GetSampleFileList(nullptr, "wlp"));
}

}  // namespace
}  // namespace vxtest
