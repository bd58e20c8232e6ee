// The migration of the user's selected log and link profiles: what the selection and the samples
// leave behind, data folders under marked names, home-page settings, credentials turned into the
// protected form, profiles that cannot be rewritten, and when the categories are merged.

#include <string>

#include "migrate/installations_fixture.h"

namespace vxtest {
namespace {

// A log-profile folder with a sample profile, three user profiles and their data folders.
void LayOutLogProfiles(const Installations& run) {
  run.WriteSources({"p/sample.wlp", "p/sales.wlp", "p/support.wlp", "p/web.wlp", "p/sample.dat/h",
                    "p/sales.dat/h", "p/sales.dat/history/2019", "p/support.dat/h", "p/web.dat/h"});
}

TEST(DoCopyLogProfiles, CopiesTheSelectionWithItsDataFoldersAndReportsUnknownNames) {
  Installations run(RunOptions{{"-PFLog:sales.wlp, WEB.WLP, ghost.wlp,ghost.wlp"}});
  LayOutLogProfiles(run);
  WriteFile(run.Dst("p/web_vxmigrate.dat/h"), "from an earlier run");
  EXPECT_EQ(0, run.manager().DoCopyLogProfiles("p", "*.wlp", "wlp", "sample.wlp"));

  EXPECT_EQ((Entries{"p", "p/sales_vxmigrate.dat", "p/sales_vxmigrate.dat/h",
                     "p/sales_vxmigrate.dat/history", "p/sales_vxmigrate.dat/history/2019",
                     "p/sales_vxmigrate.wlp", "p/web_vxmigrate.dat", "p/web_vxmigrate.dat/h",
                     "p/web_vxmigrate.wlp"}),
            run.DestinationTree());
  EXPECT_EQ((Entries{"from an earlier run", "p/sales.wlp", "p/sales.dat/history/2019"}),
            run.ReadDst({"p/web_vxmigrate.dat/h", "p/sales_vxmigrate.wlp",
                         "p/sales_vxmigrate.dat/history/2019"}));
  EXPECT_EQ((Entries{"Selected profile not found: ghost.wlp",
                     "File copied:  <dst>/p/sales_vxmigrate.wlp",
                     "File copied:  <dst>/p/web_vxmigrate.wlp",
                     "Folder copied:  <dst>/p/sales_vxmigrate.dat/",
                     "Folder exists - no copy made: <dst>/p/web_vxmigrate.dat/"}),
            run.RunLog());
}

TEST(DoCopyLogProfiles, TakesSelectionAndDataFolderSwitchFromTheCommandFile) {
  Installations run;
  LayOutLogProfiles(run);
  WriteFile(run.Src("migcmd.ini"), "[main]\nD1=" + run.Src() + "\nD2=" + run.Dst() +
                                       "\nP1=pavsuite\nP2=pavsuite\nV1=5.0\nV2=5.5\nFT=No\n"
                                       "[profiles]\nLog=support.wlp\n");
  run.ManagerFromCommandFile(run.Src()).DoCopyLogProfiles("p", "*.wlp", "wlp", "");
  EXPECT_EQ((Entries{"p", "p/support_vxmigrate.wlp"}), run.DestinationTree());
}

TEST(DoCopyLogProfiles, SplitsTheHomePageIntoFolderAndPage) {
  struct Case { std::string homePage, baseDir, defaults; };
  const Case cases[] = {{"a/b/index.htm", "a/b", "index.htm"},
                        {"index.htm", "index.htm", ""},
                        {"/index.htm", "", "index.htm"},
                        {"http://host/site/", "http://host/site", ""},
                        {"C:\\www\\index.htm", "C:\\www\\index.htm", ""}};  // no folders
  Installations run;
  for (const Case& c : cases) {
    WriteFile(run.Src("p/" + std::to_string(&c - cases) + ".wlp"),
              "[Profile]\r\nHomePageName=" + c.homePage + "\r\n[Other]\r\nX=1\r\n");
  }
  run.manager().DoCopyLogProfiles("p", "*.wlp", "wlp", "");
  for (const Case& c : cases) {
    EXPECT_EQ("[Profile]\r\nHomePageName=" + c.homePage + "\r\nHomePageDefaults=" + c.defaults +
                  "\r\nHomePageBaseDir=" + c.baseDir + "\r\n[Other]\r\nX=1\r\n",
              ReadFile(run.Dst("p/" + std::to_string(&c - cases) + "_vxmigrate.wlp")));
  }
}

TEST(DoCopyLogProfiles, ProtectsCredentialsAndLeavesAProfileItCannotRewriteAsCopied) {
  Installations run;
  const std::string binary("[Profile]\nLogFilePassword=x\n\0\x01\x02", 31);
  const std::string longPassword = LegacyEncoded(std::string(600, 'x'));
  ASSERT_EQ(600u, longPassword.size());  // no pad byte ends the encoded text early
  const std::string tooLong = "[Profile]\nHomePageName=a/b.htm\nLogFilePassword=" + longPassword + "\n";
  WriteFile(run.Src("p/a.wlp"), binary);
  WriteFile(run.Src("p/b.wlp"), tooLong);
  WriteFile(run.Src("p/c.wlp"), "[Profile]\nLogFilePassword=" + LegacyEncoded("pw") + "\n");
  WriteFile(run.Src("p/sample.wlp"), "[Profile]\n");
  // The new installation's own profile: protected and empty values are written back unchanged.
  const std::string own = "[Profile]\nLogFilePassword=" + Protected("pw") + "\nHomePagePassword=\n";
  WriteFile(run.Dst("p/own.wlp"), own);
  run.manager().DoCopyLogProfiles("p", "*.wlp", "wlp", "sample.wlp");

  EXPECT_EQ((Entries{"p", "p/a_vxmigrate.wlp", "p/b_vxmigrate.wlp", "p/c_vxmigrate.wlp", "p/own.wlp"}),
            run.DestinationTree());
  EXPECT_EQ((Entries{own, binary, tooLong}),
            run.ReadDst({"p/own.wlp", "p/a_vxmigrate.wlp", "p/b_vxmigrate.wlp"}));
  const std::string good = ReadFile(run.Dst("p/c_vxmigrate.wlp"));
  EXPECT_EQ("pw", Decrypted(good.substr(good.find('=') + 1, good.size() - good.find('=') - 2)));
  EXPECT_EQ((Entries{"File copied:  <dst>/p/a_vxmigrate.wlp", "File copied:  <dst>/p/b_vxmigrate.wlp",
                     "File copied:  <dst>/p/c_vxmigrate.wlp",
                     "Error: Profile is not a valid settings file - left as copied: "
                     "<dst>/p/a_vxmigrate.wlp",
                     "Error: Value too long to protect - left unchanged, characters: 600",
                     "Error: Value of LogFilePassword cannot be protected - profile left as copied: "
                     "<dst>/p/b_vxmigrate.wlp"}),
            run.RunLog());
}

TEST(DoCopyLogProfiles, MergesTheCategoriesOnlyWhenBothVersionsKeepThem) {
  struct Case { const char *sourceProduct, *sourceVersion, *destinationProduct, *destinationVersion;
                bool merges; };
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
    run.WriteSources({"p/a.wlp"});
    WriteFile(run.Src("p/categories.ini"), "[main]\nNumberOfCategories=0\n");
    run.manager().DoCopyLogProfiles("p", "*.wlp", "wlp", "");
    EXPECT_EQ(c.merges, FileExists(run.Dst("p/categories.ini")));
    EXPECT_EQ(c.merges, run.RunLog().back() == "categories.ini merged: <dst>/p/");
  }
}

TEST(DoCopyLinkProfiles, CopiesTheSelectionWithoutDataFoldersOrCredentials) {
  Installations run(RunOptions{{"-PFLink:b.llp"}});
  const std::string linkProfile = "[Profile]\nLogFilePassword=" + LegacyEncoded("pw") + "\n";
  WriteFile(run.Src("l/b.llp"), linkProfile);
  run.WriteSources({"l/a.llp", "l/b.dat/h"});
  WriteFile(run.Src("l/categories.ini"), "[main]\nNumberOfCategories=1\nCategory1=L\n[L]\n"
                                         "NumberOfProfiles=2\nProfile1=/old/a.llp\nProfile2=/old/b.llp\n");
  EXPECT_EQ(0, run.manager().DoCopyLinkProfiles("l", "*.llp", "llp", ""));

  EXPECT_EQ((Entries{"l", "l/b_vxmigrate.llp", "l/categories.ini"}), run.DestinationTree());
  EXPECT_EQ((Entries{linkProfile, "[main]\nNumberOfCategories=1\nCategory1=L\n[L]\nProfile1="
                                  "<dst>/l/b_vxmigrate.llp\nNumberOfProfiles=1\nExpand=\n"}),
            run.ReadDst({"l/b_vxmigrate.llp", "l/categories.ini"}));
}

}  // namespace
}  // namespace vxtest
