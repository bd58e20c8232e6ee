// The migration of the user's selected log and link profiles: what the selection and the samples
// leave behind, data folders under marked names, home-page settings, credentials turned into the
// protected form, profiles that cannot be rewritten, and when the categories are merged.

#include <string>

#include "migrate/installations_fixture.h"

namespace vxtest {
namespace {

// A log-profile folder with a sample profile, three user profiles and their data folders.
void LayOutLogProfiles(const Installations& run) {
  for (const std::string name : {"sample", "sales", "support", "web"}) {
    WriteFile(run.Src("profiles/" + name + ".wlp"), "[Profile]\nName=" + name + "\n");
    WriteFile(run.Src("profiles/" + name + ".dat/hits.dat"), name);
  }
  WriteFile(run.Src("profiles/sales.dat/history/2019.dat"), "old hits");
}

TEST(DoCopyLogProfiles, CopiesTheSelectionWithItsDataFoldersAndReportsUnknownNames) {
  Installations run(RunOptions{{"-PFLog:sales.wlp, WEB.WLP, ghost.wlp,ghost.wlp"}});
  LayOutLogProfiles(run);
  WriteFile(run.Dst("profiles/web_vxmigrate.dat/hits.dat"), "from an earlier run");
  EXPECT_EQ(0, run.manager().DoCopyLogProfiles("profiles", "*.wlp", "wlp", "sample.wlp"));

  EXPECT_EQ((Entries{"profiles", "profiles/sales_vxmigrate.dat", "profiles/sales_vxmigrate.dat/history",
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
  WriteFile(run.Root("cmd/migcmd.ini"), "[main]\nD1=" + run.Src() + "\nD2=" + run.Dst() +
                                            "\nP1=pavsuite\nP2=pavsuite\nV1=5.0\nV2=5.5\nFT=No\n"
                                            "[profiles]\nLog=support.wlp\n");
  run.ManagerFromCommandFile(run.Root("cmd")).DoCopyLogProfiles("profiles", "*.wlp", "wlp", "");
  EXPECT_EQ((Entries{"profiles", "profiles/support_vxmigrate.wlp"}), run.DestinationTree());
}

TEST(DoCopyLogProfiles, SplitsTheHomePageIntoFolderAndPage) {
  struct Case {
    const char* homePage;
    const char* baseDir;
    const char* defaults;
  };
  const Case cases[] = {{"a/b/index.htm", "a/b", "index.htm"},
                        {"index.htm", "index.htm", ""},
                        {"/index.htm", "", "index.htm"},
                        {"http://host/site/", "http://host/site", ""},
                        {"C:\\www\\index.htm", "C:\\www\\index.htm", ""}};  // no folders
  Installations run;
  for (size_t i = 0; i < 5; ++i) {
    WriteFile(run.Src("profiles/site" + std::to_string(i) + ".wlp"),
              std::string("[Profile]\r\nHomePageName=") + cases[i].homePage + "\r\n[Other]\r\nX=1\r\n");
  }
  run.manager().DoCopyLogProfiles("profiles", "*.wlp", "wlp", "");
  for (size_t i = 0; i < 5; ++i) {
    EXPECT_EQ(std::string("[Profile]\r\nHomePageName=") + cases[i].homePage +
                  "\r\nHomePageDefaults=" + cases[i].defaults + "\r\nHomePageBaseDir=" +
                  cases[i].baseDir + "\r\n[Other]\r\nX=1\r\n",
              ReadFile(run.Dst("profiles/site" + std::to_string(i) + "_vxmigrate.wlp")));
  }
}

TEST(DoCopyLogProfiles, ProtectsCredentialsAndLeavesAProfileItCannotRewriteAsCopied) {
  Installations run;
  const std::string binary("[Profile]\nLogFilePassword=x\n\0\x01\x02", 31);
  WriteFile(run.Src("profiles/a_binary.wlp"), binary);
  const std::string longPassword = LegacyEncoded(std::string(600, 'x'));
  ASSERT_EQ(600u, longPassword.size());  // no pad byte ends the encoded text early
  const std::string tooLong = "[Profile]\nHomePageName=a/b.htm\nLogFilePassword=" + longPassword + "\n";
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
  const std::string good = ReadFile(run.Dst("profiles/c_good_vxmigrate.wlp"));
  EXPECT_EQ("pw", Decrypted(good.substr(good.find('=') + 1, good.size() - good.find('=') - 2)));
  EXPECT_EQ((Entries{"File copied:  " + run.Dst("profiles/a_binary_vxmigrate.wlp"),
                     "File copied:  " + run.Dst("profiles/b_long_vxmigrate.wlp"),
                     "File copied:  " + run.Dst("profiles/c_good_vxmigrate.wlp"),
                     "Error: Profile is not a valid settings file - left as copied: " +
                         run.Dst("profiles/a_binary_vxmigrate.wlp"),
                     "Error: Value too long to protect - left unchanged, characters: 600",
                     "Error: Value of LogFilePassword cannot be protected - profile left as copied: " +
                         run.Dst("profiles/b_long_vxmigrate.wlp")}),
            run.RunLog());
}

TEST(DoCopyLogProfiles, MergesTheCategoriesOnlyWhenBothVersionsKeepThem) {
  struct Case {
    const char* sourceProduct;
    const char* sourceVersion;
    const char* destinationProduct;
    const char* destinationVersion;
    bool merges;
  };
  const Case cases[] = {{"pavsuite", "5.7", "halsuite", "7.9", true},
                        {"pavsuite", "5.4", "pavsuite", "5.5", false},
                        {"pavsuite", "6.0", "pavsuite", "6.5", false},  // numbers compared one by one
                        {"log", "5.5", "log", "6.5", false},
                        {"log", "6.5", "log", "6.5", true},
                        {"bastion", "3.1", "bastion", "3.2", true}};
  for (const Case& c : cases) {
    SCOPED_TRACE(std::string(c.sourceProduct) + " " + c.sourceVersion + " to " +
                 c.destinationProduct + " " + c.destinationVersion);
    Installations run(RunOptions{{}, false, c.sourceProduct, c.sourceVersion, c.destinationProduct,
                                 c.destinationVersion});
    WriteFile(run.Src("profiles/a.wlp"), "[Profile]\nName=a\n");
    WriteFile(run.Src("profiles/categories.ini"),
              "[main]\nNumberOfCategories=1\nCategory1=All\n[All]\nProfile1=C:\\old\\a.wlp\n");
    run.manager().DoCopyLogProfiles("profiles", "*.wlp", "wlp", "");
    EXPECT_EQ(c.merges, FileExists(run.Dst("profiles/categories.ini")));
    EXPECT_EQ(c.merges, run.RunLog().back() == "categories.ini merged: " + run.Dst("profiles/"));
  }
}

TEST(DoCopyLinkProfiles, CopiesTheSelectionWithoutDataFoldersOrCredentials) {
  Installations run(RunOptions{{"-PFLink:b.llp"}});
  const std::string linkProfile = "[Profile]\nLogFilePassword=" + LegacyEncoded("pw") + "\n";
  WriteFile(run.Src("links/a.llp"), "[Profile]\n");
  WriteFile(run.Src("links/b.llp"), linkProfile);
  WriteFile(run.Src("links/b.dat/hits.dat"), "hits");
  WriteFile(run.Src("links/categories.ini"),
            "[main]\nNumberOfCategories=1\nCategory1=Links\n[Links]\nNumberOfProfiles=2\n"
            "Profile1=/old/links/a.llp\nProfile2=/old/links/b.llp\n");
  EXPECT_EQ(0, run.manager().DoCopyLinkProfiles("links", "*.llp", "llp", ""));

  EXPECT_EQ((Entries{"links", "links/b_vxmigrate.llp", "links/categories.ini"}), run.DestinationTree());
  EXPECT_EQ(linkProfile, ReadFile(run.Dst("links/b_vxmigrate.llp")));
  EXPECT_EQ("[main]\nNumberOfCategories=1\nCategory1=Links\n[Links]\nProfile1=" +
                run.Dst("links/b_vxmigrate.llp") + "\nNumberOfProfiles=1\nExpand=\n",
            ReadFile(run.Dst("links/categories.ini")));
}

}  // namespace
}  // namespace vxtest
