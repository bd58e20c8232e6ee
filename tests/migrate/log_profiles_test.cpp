// The migration of the user's selected log and link profiles: what the selection and the samples
// leave behind, data folders under marked names, home-page settings, credentials turned into the
// protected form, profiles that cannot be rewritten, and when the categories are merged.

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "migrate/profiles_fixture.h"

namespace vxtest {
namespace {

using Entries = std::vector<std::string>;

// A log-profile folder with a sample profile, three user profiles and their data folders.
void LayOutLogProfiles(const Installations& run) {
  for (const char* name : {"sample", "sales", "support", "web"}) {
    WriteFile(run.Src(std::string("profiles/") + name + ".wlp"),
              std::string("[Profile]\nName=") + name + "\n");
    WriteFile(run.Src(std::string("profiles/") + name + ".dat/hits.dat"), name);
  }
  WriteFile(run.Src("profiles/sales.dat/history/2019.dat"), "old hits");
}

TEST(DoCopyLogProfiles, CopiesTheSelectionWithItsDataFoldersAndReportsUnknownNames) {
  RunOptions options;
  options.extra = {"-PFLog:sales.wlp, WEB.WLP, ghost.wlp,ghost.wlp"};
  Installations run(options);
  LayOutLogProfiles(run);
  WriteFile(run.Dst("profiles/web_vxmigrate.dat/hits.dat"), "from an earlier run");

  EXPECT_EQ(0, run.manager().DoCopyLogProfiles("profiles", "*.wlp", "wlp", "sample.wlp"));

  EXPECT_EQ((Entries{"profiles", "profiles/sales_vxmigrate.dat",
                     "profiles/sales_vxmigrate.dat/history",
                     "profiles/sales_vxmigrate.dat/history/2019.dat",
                     "profiles/sales_vxmigrate.dat/hits.dat", "profiles/sales_vxmigrate.wlp",
                     "profiles/web_vxmigrate.dat", "profiles/web_vxmigrate.dat/hits.dat",
                     "profiles/web_vxmigrate.wlp"}),
            run.DestinationTree());
  EXPECT_EQ("from an earlier run", ReadFile(run.Dst("profiles/web_vxmigrate.dat/hits.dat")));
  EXPECT_EQ("[Profile]\nName=sales\n", ReadFile(run.Dst("profiles/sales_vxmigrate.wlp")));
  EXPECT_EQ((Entries{"Selected profile not found: ghost.wlp",
                     "File copied:  " + run.Dst("profiles/sales_vxmigrate.wlp"),
                     "File copied:  " + run.Dst("profiles/web_vxmigrate.wlp"),
                     "Folder copied:  " + run.Dst("profiles/sales_vxmigrate.dat/"),
                     "Folder exists - no copy made: " + run.Dst("profiles/web_vxmigrate.dat/")}),
            run.RunLog());
}

TEST(DoCopyLogProfiles, TakesSelectionAndDataFolderSwitchFromTheCommandFile) {
  Installations run;
  LayOutLogProfiles(run);
  WriteFile(run.Root("cmd/migcmd.ini"),
            "[main]\nD1=" + run.Src() + "\nD2=" + run.Dst() +
                "\nP1=pavsuite\nP2=pavsuite\nV1=5.0\nV2=5.5\nFT=No\n"
                "[profiles]\nLog=support.wlp\n");
  vxMigrationManager& manager = run.ManagerFromCommandFile(run.Root("cmd"));
  ASSERT_TRUE(manager.IsValid());

  manager.DoCopyLogProfiles("profiles", "*.wlp", "wlp", "sample.wlp");

  EXPECT_EQ((Entries{"profiles", "profiles/support_vxmigrate.wlp"}), run.DestinationTree());
}

struct HomePageCase {
  const char* name;
  const char* homePage;
  const char* baseDir;
  const char* defaults;
};

class HomePage : public ::testing::TestWithParam<HomePageCase> {};

TEST_P(HomePage, IsSplitIntoFolderAndPage) {
  Installations run;
  WriteFile(run.Src("profiles/site.wlp"),
            std::string("[Profile]\r\nHomePageName=") + GetParam().homePage + "\r\n[Other]\r\nX=1\r\n");

  run.manager().DoCopyLogProfiles("profiles", "*.wlp", "wlp", "");

  EXPECT_EQ(std::string("[Profile]\r\nHomePageName=") + GetParam().homePage +
                "\r\nHomePageDefaults=" + GetParam().defaults +
                "\r\nHomePageBaseDir=" + GetParam().baseDir + "\r\n[Other]\r\nX=1\r\n",
            ReadFile(run.Dst("profiles/site_vxmigrate.wlp")));
}

INSTANTIATE_TEST_SUITE_P(
    Values, HomePage,
    ::testing::Values(HomePageCase{"FolderAndPage", "a/b/index.htm", "a/b", "index.htm"},
                      HomePageCase{"PageOnly", "index.htm", "index.htm", ""},
                      HomePageCase{"FromTheRoot", "/index.htm", "", "index.htm"},
                      HomePageCase{"FolderOnly", "http://host/site/", "http://host/site", ""},
                      HomePageCase{"BackslashesAreNotFolders", "C:\\www\\index.htm",
                                   "C:\\www\\index.htm", ""}),
    [](const ::testing::TestParamInfo<HomePageCase>& info) { return info.param.name; });

TEST(DoCopyLogProfiles, LeavesAProfileItCannotRewriteAsCopiedAndGoesOn) {
  Installations run;
  const std::string binary("[Profile]\nLogFilePassword=x\n\0\x01\x02", 31);
  WriteFile(run.Src("profiles/a_binary.wlp"), binary);
  const std::string longPassword = LegacyEncoded(std::string(600, 'x'));
  ASSERT_EQ(600u, longPassword.size());  // no pad byte ends the encoded text early
  const std::string tooLong =
      "[Profile]\nHomePageName=a/b.htm\nLogFilePassword=" + longPassword + "\n";
  WriteFile(run.Src("profiles/b_long.wlp"), tooLong);
  WriteFile(run.Src("profiles/c_good.wlp"), "[Profile]\nLogFilePassword=" + LegacyEncoded("pw") + "\n");
  WriteFile(run.Src("profiles/sample.wlp"), "[Profile]\n");
  // The new installation's own profile: protected and empty values are written back unchanged.
  const std::string own = "[Profile]\nLogFilePassword=" + Protected("pw") + "\nHomePagePassword=\n";
  WriteFile(run.Dst("profiles/own.wlp"), own);

  run.manager().DoCopyLogProfiles("profiles", "*.wlp", "wlp", "sample.wlp");

  EXPECT_EQ((Entries{"profiles", "profiles/a_binary_vxmigrate.wlp", "profiles/b_long_vxmigrate.wlp",
                     "profiles/c_good_vxmigrate.wlp", "profiles/own.wlp"}),
            run.DestinationTree());
  EXPECT_EQ(own, ReadFile(run.Dst("profiles/own.wlp")));
  EXPECT_EQ(binary, ReadFile(run.Dst("profiles/a_binary_vxmigrate.wlp")));
  EXPECT_EQ(tooLong, ReadFile(run.Dst("profiles/b_long_vxmigrate.wlp")));
  std::string good = ReadFile(run.Dst("profiles/c_good_vxmigrate.wlp"));
  EXPECT_EQ("pw", Decrypted(good.substr(good.find('=') + 1, good.size() - good.find('=') - 2)));
  Entries log = run.RunLog();
  ASSERT_EQ(6u, log.size());
  EXPECT_EQ("Error: Profile is not a valid settings file - left as copied: " +
                run.Dst("profiles/a_binary_vxmigrate.wlp"),
            log[3]);
  EXPECT_EQ("Error: Value too long to protect - left unchanged, characters: 600", log[4]);
  EXPECT_EQ("Error: Value of LogFilePassword cannot be protected - profile left as copied: " +
                run.Dst("profiles/b_long_vxmigrate.wlp"),
            log[5]);
}

struct CategoriesCase {
  const char* name;
  const char* sourceProduct;
  const char* sourceVersion;
  const char* destinationProduct;
  const char* destinationVersion;
  bool merges;
};

class CategoriesVersions : public ::testing::TestWithParam<CategoriesCase> {};

TEST_P(CategoriesVersions, DecideWhetherTheCategoriesAreMerged) {
  RunOptions options;
  options.sourceProduct = GetParam().sourceProduct;
  options.sourceVersion = GetParam().sourceVersion;
  options.destinationProduct = GetParam().destinationProduct;
  options.destinationVersion = GetParam().destinationVersion;
  Installations run(options);
  WriteFile(run.Src("profiles/a.wlp"), "[Profile]\nName=a\n");
  WriteFile(run.Src("profiles/categories.ini"),
            "[main]\nNumberOfCategories=1\nCategory1=All\n[All]\nNumberOfProfiles=1\n"
            "Profile1=C:\\old\\profiles\\a.wlp\n");

  run.manager().DoCopyLogProfiles("profiles", "*.wlp", "wlp", "");

  EXPECT_EQ(GetParam().merges, FileExists(run.Dst("profiles/categories.ini")));
  EXPECT_EQ(GetParam().merges,
            run.RunLog().back() == "categories.ini merged: " + run.Dst("profiles/"));
}

INSTANTIATE_TEST_SUITE_P(
    Versions, CategoriesVersions,
    ::testing::Values(
        CategoriesCase{"LaterMinorNumbers", "pavsuite", "5.7", "halsuite", "7.9", true},
        CategoriesCase{"SourceBelow", "pavsuite", "5.4", "pavsuite", "5.5", false},
        CategoriesCase{"NumbersComparedOneByOne", "pavsuite", "6.0", "pavsuite", "6.5", false},
        CategoriesCase{"LogProductNeedsSix", "log", "5.5", "log", "6.5", false},
        CategoriesCase{"LogProductAtSix", "log", "6.5", "log", "6.5", true},
        CategoriesCase{"FirewallFromThreeOne", "bastion", "3.1", "bastion", "3.2", true}),
    [](const ::testing::TestParamInfo<CategoriesCase>& info) { return info.param.name; });

TEST(DoCopyLinkProfiles, CopiesTheSelectionWithoutDataFoldersOrCredentials) {
  RunOptions options;
  options.extra = {"-PFLink:b.llp"};
  Installations run(options);
  const std::string linkProfile = "[Profile]\nLogFilePassword=" + LegacyEncoded("pw") + "\n";
  WriteFile(run.Src("links/a.llp"), "[Profile]\n");
  WriteFile(run.Src("links/b.llp"), linkProfile);
  WriteFile(run.Src("links/b.dat/hits.dat"), "hits");
  WriteFile(run.Src("links/categories.ini"),
            "[main]\nNumberOfCategories=1\nCategory1=Links\n[Links]\nNumberOfProfiles=2\n"
            "Profile1=/old/links/a.llp\nProfile2=/old/links/b.llp\n");

  EXPECT_EQ(0, run.manager().DoCopyLinkProfiles("links", "*.llp", "llp", ""));

  EXPECT_EQ((Entries{"links", "links/b_vxmigrate.llp", "links/categories.ini"}),
            run.DestinationTree());
  EXPECT_EQ(linkProfile, ReadFile(run.Dst("links/b_vxmigrate.llp")));
  EXPECT_NE(std::string::npos,
            ReadFile(run.Dst("links/categories.ini")).find("=" + run.Dst("links/b_vxmigrate.llp")));
  EXPECT_EQ(std::string::npos, ReadFile(run.Dst("links/categories.ini")).find("a_vxmigrate"));
}

TEST(DoCopyLinkProfiles, LeavesAnInPlaceRunAlone) {
  RunOptions options;
  options.inPlace = true;
  Installations run(options);
  const std::string categories =
      "[main]\nNumberOfCategories=1\nCategory1=Links\n[Links]\nNumberOfProfiles=1\n"
      "Profile1=/old/links/a.llp\n";
  WriteFile(run.Src("links/a.llp"), "[Profile]\n");
  WriteFile(run.Src("links/categories.ini"), categories);
  EXPECT_EQ(0, run.manager().DoCopyLinkProfiles("links", "*.llp", "llp", ""));
  EXPECT_EQ(categories, ReadFile(run.Src("links/categories.ini")));
  EXPECT_EQ(Entries{}, run.RunLog());
}

}  // namespace
}  // namespace vxtest
