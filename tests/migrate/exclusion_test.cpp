// Exclusion lists: which names a list excludes, how the user's selection becomes the list of what
// stays behind, and the sample lists that end it.

#include <algorithm>
#include <regex>
#include <string>
#include <vector>

#include "migrate/sample_lists.h"
#include "migrate/toolkit_fixture.h"

namespace vxtest {
namespace {

std::string Replace(std::string text, const std::string& from, const std::string& to) {
  for (size_t at = text.find(from); at != std::string::npos; at = text.find(from, at + to.size())) {
    text.replace(at, from.size(), to);
  }
  return text;
}

struct ExcludeCase {
  const char* name;
  const char* list;
  const char* file;  // "$SRC" stands for the source folder
  bool inPlace;
  const char* inPlaceExtension;
  int fromInstallation;
  int excluded;
};

class IsExcludeFile : public ToolkitTest, public ::testing::WithParamInterface<ExcludeCase> {};

TEST_P(IsExcludeFile, AnswersWhetherTheListNamesTheFile) {
  const ExcludeCase& c = GetParam();
  StartRun(c.inPlace);
  const vxStringBase file(Replace(c.file, "$SRC", src_).c_str());
  EXPECT_EQ(c.excluded, manager_->IsExcludeFile(file, c.list, c.inPlaceExtension, c.fromInstallation));
  EXPECT_TRUE(NewLogEntries().empty());
}

INSTANTIATE_TEST_SUITE_P(
    Cases, IsExcludeFile,
    ::testing::Values(
        ExcludeCase{"EmptyListExcludesNothing", "", "a.wlp", false, "", 0, 0},
        ExcludeCase{"LastName", "a.wlp,b.wlp", "b.wlp", false, "", 0, 1},
        ExcludeCase{"BlankAfterComma", "a.wlp, b.wlp", "b.wlp", false, "", 0, 1},
        ExcludeCase{"BlanksAndTabsAround", " \ta.wlp\t ,  b.wlp  ", "a.wlp", false, "", 0, 1},
        ExcludeCase{"NameWithBlanks", "x.wlp, my site.wlp", "my site.wlp", false, "", 0, 1},
        ExcludeCase{"CaseIgnored", "A.WLP", "a.wlp", false, "", 0, 1},
        ExcludeCase{"NoWildcards", "*.wlp", "a.wlp", false, "", 0, 0},
        ExcludeCase{"TrailingCommaNamesNothingMore", "a.wlp,", "", false, "", 0, 0},
        ExcludeCase{"EmptyNamesDoNotStopTheWalk", "a.wlp,,b.wlp", "b.wlp", false, "", 0, 1},
        ExcludeCase{"InstallationTopFile", "a.wlp", "$SRC/a.wlp", false, "", 1, 1},
        ExcludeCase{"BareNameMissesSubfolder", "a.wlp", "$SRC/sub/a.wlp", false, "", 1, 0},
        ExcludeCase{"RelativePath", "x.wlp, sub/a.wlp", "$SRC/sub/a.wlp", false, "", 1, 1},
        ExcludeCase{"BackslashPath", "sub\\a.wlp", "$SRC/sub/a.wlp", false, "", 1, 1},
        ExcludeCase{"FullPathAgainstBareList", "a.wlp", "$SRC/a.wlp", false, "", 0, 0},
        ExcludeCase{"IniKeptSideBySide", "x.ini", "x.ini", false, "bak", 0, 1},
        ExcludeCase{"InPlaceIniBecomesExtension", "x.ini", "x.bak", true, "bak", 0, 1},
        ExcludeCase{"InPlaceIniNoLongerMatchesItself", "x.ini", "x.ini", true, "bak", 0, 0},
        ExcludeCase{"InPlaceBackupOfInstallationFile", "sub/x.ini", "$SRC/sub/x.vxinibak", true,
                    "vxinibak", 1, 1},
        ExcludeCase{"InPlaceWithoutExtension", "x.ini", "x.", true, "", 0, 1}),
    [](const ::testing::TestParamInfo<ExcludeCase>& info) { return info.param.name; });

struct FullListCase {
  const char* name;
  const char* selection;
  const char* folder;
  const char* fixedList;
  const char* initial;
  const char* expected;
};

class MakeFullExclusionList : public ToolkitTest,
                              public ::testing::WithParamInterface<FullListCase> {};

// The folder holds a.wlp, b.wlp, c.wlp and files of other types.
TEST_P(MakeFullExclusionList, ListsWhatTheUserDidNotSelectThenTheFixedNames) {
  const FullListCase& c = GetParam();
  for (const char* name : {"a.wlp", "b.wlp", "c.wlp", "notes.txt", "a.wlp.old", "sub/d.wlp"}) {
    WriteFile(S(std::string("profiles/") + name), name);
  }
  StartRun();
  vxStringBase result(c.initial);
  manager_->MakeFullExclusionList(result, c.selection, c.folder, "wlp", c.fixedList);
  EXPECT_EQ(c.expected, result.str());
}

INSTANTIATE_TEST_SUITE_P(
    Cases, MakeFullExclusionList,
    ::testing::Values(
        FullListCase{"NoSelectionGivesFixedList", "", "profiles", "s1.wlp,s2.wlp", "", "s1.wlp,s2.wlp"},
        FullListCase{"NoSelectionReplacesResult", "", "profiles", "s1.wlp", "old", "s1.wlp"},
        FullListCase{"SelectionOfNone", "zz.wlp", "profiles", "s1.wlp,s2.wlp", "",
                     "a.wlp,b.wlp,c.wlp,s1.wlp,s2.wlp"},
        FullListCase{"SelectionOfAll", "c.wlp,a.wlp,b.wlp", "profiles", "s1.wlp", "", "s1.wlp"},
        FullListCase{"SelectionWithBlanksAndCase", " B.WLP , a.wlp", "profiles", "s1.wlp", "",
                     "c.wlp,s1.wlp"},
        FullListCase{"EmptyFixedListLeavesComma", "a.wlp", "profiles", "", "", "b.wlp,c.wlp,"},
        FullListCase{"AppendsToResult", "a.wlp", "profiles", "s1.wlp", "pre", "pre,b.wlp,c.wlp,s1.wlp"},
        FullListCase{"MissingFolderGivesFixedList", "a.wlp", "nosuch", "s1.wlp", "", "s1.wlp"}),
    [](const ::testing::TestParamInfo<FullListCase>& info) { return info.param.name; });

// What the list leaves out is exactly what IsExcludeFile then refuses.
TEST_F(ToolkitTest, FullListAgreesWithIsExcludeFile) {
  for (const char* name : {"keep.llp", "drop.llp", "Sample.llp"}) WriteFile(S(std::string("links/") + name), "x");
  StartRun();
  vxStringBase list;
  manager_->MakeFullExclusionList(list, "keep.llp", "links", "llp", "sample.llp");
  EXPECT_EQ(0, manager_->IsExcludeFile("keep.llp", list, vxStringBase::NullStr, 0));
  EXPECT_EQ(1, manager_->IsExcludeFile("drop.llp", list, vxStringBase::NullStr, 0));
  EXPECT_EQ(1, manager_->IsExcludeFile("Sample.llp", list, vxStringBase::NullStr, 0));
}

TEST(SampleLists, EveryListIsBareNamesOfItsKind) {
  const char* products[] = {"halsuite", "pavsuite", "mirsuite", "log", "obx", "tqrs", "bastion"};
  const char* kinds[] = {"wlp", "prx", "slp", "llp", "alp", "arp", "mss"};
  for (const char* product : products) {
    EXPECT_STRNE("", GetSampleFileList(product, "wlp")) << product;
    for (const char* kind : kinds) {
      const std::string name = std::string("[a-z0-9_]+\\.") + kind;
      const std::regex form("(" + name + "(," + name + ")*)?");
      EXPECT_TRUE(std::regex_match(GetSampleFileList(product, kind), form)) << product << " " << kind;
    }
  }
}

TEST(SampleLists, ReportingServerShipsThreeProfilesAndLookupIgnoresCase) {
  const std::string obx = GetSampleFileList("OBX", "WLP");
  EXPECT_EQ(obx, GetSampleFileList("obx", "wlp"));
  EXPECT_EQ(2, std::count(obx.begin(), obx.end(), ','));
  EXPECT_STREQ("", GetSampleFileList("nosuch", "wlp"));
  EXPECT_STREQ("", GetSampleFileList("obx", "nosuch"));
  EXPECT_STREQ("", GetSampleFileList(nullptr, "wlp"));
}

}  // namespace
}  // namespace vxtest
