// Profile copying over the whole tree: never replacing, data folders one level deep unless "FT"
// says no, exclusions by installation-relative path, the top folder last; and the in-place guard of
// every copying operation of the profile toolkit.

#include <gtest/gtest.h>

#include <functional>
#include <string>
#include <vector>

#include "migrate/profiles_fixture.h"

namespace vxtest {
namespace {

using Entries = std::vector<std::string>;

// Profiles in the top folder and two levels below, data folders beside some of them.
void LayOutSourceTree(const Installations& run) {
  WriteFile(run.Src("top.wlp"), "[Profile]\nName=top\n");
  WriteFile(run.Src("top.dat/hits.dat"), "top hits");
  WriteFile(run.Src("a/x.wlp"), "[Profile]\nName=x\n");
  WriteFile(run.Src("a/x.dat/hits.dat"), "x hits");
  WriteFile(run.Src("a/x.dat/history/2019.dat"), "too deep");
  WriteFile(run.Src("a/notes.txt"), "not a profile");
  WriteFile(run.Src("b/c/y.wlp"), "[Profile]\nName=y old\n");
  WriteFile(run.Src("b/c/y.dat/hits.dat"), "y hits");
}

TEST(CopyAllProfilesOfType, CopiesTheTreeKeepsInstalledProfilesAndVisitsTheTopFolderLast) {
  Installations run;
  LayOutSourceTree(run);
  WriteFile(run.Src("a/skip.wlp"), "[Profile]\n");
  WriteFile(run.Dst("b/c/y.wlp"), "[Profile]\nName=y new\n");

  // Names are relative to the installation, blanks around them and case do not count.
  EXPECT_EQ(0, run.manager().CopyAllProfilesOfType("wlp", " A/SKIP.wlp , skip.wlp"));

  EXPECT_EQ((Entries{"a", "a/x.dat", "a/x.dat/hits.dat", "a/x.wlp", "b", "b/c", "b/c/y.wlp",
                     "top.dat", "top.dat/hits.dat", "top.wlp"}),
            run.DestinationTree());
  EXPECT_EQ("[Profile]\nName=y new\n", ReadFile(run.Dst("b/c/y.wlp")));
  EXPECT_EQ("x hits", ReadFile(run.Dst("a/x.dat/hits.dat")));
  EXPECT_EQ((Entries{"File copied:  " + run.Src("a/x.wlp"),
                     "Folder copied:  " + run.Src("a/x.dat/*.*"),
                     "File exists - no copy made:  " + run.Src("b/c/y.wlp"),
                     "File copied:  " + run.Src("top.wlp"),
                     "Folder copied:  " + run.Src("top.dat/*.*")}),
            run.RunLog());
}

struct DataFolderCase {
  const char* name;
  std::vector<std::string> options;
  bool copiesDataFolders;
};

class DataFolderSwitch : public ::testing::TestWithParam<DataFolderCase> {};

TEST_P(DataFolderSwitch, DecidesWhetherDataFoldersTravel) {
  RunOptions options;
  options.extra = GetParam().options;
  Installations run(options);
  LayOutSourceTree(run);

  // Every type listed, whatever the (unused) option.
  EXPECT_EQ(0, run.manager().CopyProfilesOfTypes("txt,wlp", 0xffffffffu));

  EXPECT_TRUE(FileExists(run.Dst("a/notes.txt")));
  EXPECT_TRUE(FileExists(run.Dst("top.wlp")));
  EXPECT_EQ(GetParam().copiesDataFolders, FileExists(run.Dst("top.dat/hits.dat")));
  EXPECT_EQ(GetParam().copiesDataFolders, FileExists(run.Dst("a/x.dat/hits.dat")));
}

INSTANTIATE_TEST_SUITE_P(
    Values, DataFolderSwitch,
    ::testing::Values(DataFolderCase{"Absent", {}, true}, DataFolderCase{"Empty", {"-FT:"}, true},
                      DataFolderCase{"LowerCaseYes", {"-FT:yes"}, true},
                      DataFolderCase{"N", {"-FT:N"}, false}, DataFolderCase{"True", {"-FT:true"}, false}),
    [](const ::testing::TestParamInfo<DataFolderCase>& info) { return info.param.name; });

// Every copying operation of the profile toolkit leaves an in-place run alone: nothing is copied,
// created or logged, whatever the arguments.
struct InPlaceCase {
  const char* name;
  std::function<int(vxMigrationManager&)> operation;
};

class InPlaceRun : public ::testing::TestWithParam<InPlaceCase> {};

TEST_P(InPlaceRun, CopiesAndLogsNothing) {
  RunOptions options;
  options.inPlace = true;
  Installations run(options);
  LayOutSourceTree(run);
  WriteFile(run.Src("profiles/a.wlp"), "[Profile]\nLogFilePassword=abc\n");
  WriteFile(run.Src("profiles/categories.ini"), "[main]\nNumberOfCategories=0\n");
  WriteFile(run.Src("lang/italian.rpl"), "ciao");
  Entries before = ListTree(run.Src());

  EXPECT_EQ(0, GetParam().operation(run.manager()));

  Entries after;
  for (const std::string& name : ListTree(run.Src())) {
    if (name != "vxmigrate.log") after.push_back(name);
  }
  EXPECT_EQ(before, after);
  EXPECT_EQ("[Profile]\nLogFilePassword=abc\n", ReadFile(run.Src("profiles/a.wlp")));
  EXPECT_EQ(Entries{}, run.RunLog());
}

INSTANTIATE_TEST_SUITE_P(
    Operations, InPlaceRun,
    ::testing::Values(
        InPlaceCase{"CopyProfilesOfTypes",
                    [](vxMigrationManager& m) { return m.CopyProfilesOfTypes("wlp", 0); }},
        InPlaceCase{"CopyAllProfilesOfType",
                    [](vxMigrationManager& m) {
                      return m.CopyAllProfilesOfType("wlp", vxStringBase::NullStr);
                    }},
        InPlaceCase{"CopyRenamedUserFiles",
                    [](vxMigrationManager& m) {
                      return m.CopyRenamedUserFiles("profiles", "*.wlp", "wlp", "");
                    }},
        InPlaceCase{"CopyScheduledEventFiles",
                    [](vxMigrationManager& m) {
                      return m.CopyScheduledEventFiles("profiles", "*.wlp", "wlp", "*");
                    }},
        InPlaceCase{"DoCopyLanguageFiles",
                    [](vxMigrationManager& m) { return m.DoCopyLanguageFiles("lang", "lang2"); }},
        InPlaceCase{"DoCopyLogProfiles",
                    [](vxMigrationManager& m) {
                      return m.DoCopyLogProfiles("profiles", "*.wlp", "wlp", "");
                    }},
        InPlaceCase{"DoCopyAlertProfiles",
                    [](vxMigrationManager& m) {
                      return m.DoCopyAlertProfiles("profiles", "*.wlp", "wlp", "");
                    }}),
    [](const ::testing::TestParamInfo<InPlaceCase>& info) { return info.param.name; });

}  // namespace
}  // namespace vxtest
