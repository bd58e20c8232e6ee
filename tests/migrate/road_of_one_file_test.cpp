// One selected log-analysis profile on its whole way from the old installation into the new one:
// listed, tested against the samples and the selection, copied under its marked name, its
// credentials protected, written back, logged, and entered in the new categories file; and a
// second run that leaves everything as the first made it.

#include <string>

#include "migrate/installations_fixture.h"

namespace vxtest {
namespace {

// The value of key in a profile with CRLF line ends.
std::string Value(const std::string& profile, const std::string& key) {
  const size_t at = profile.find("\n" + key + "=") + key.size() + 2;
  return profile.substr(at, profile.find('\r', at) - at);
}

TEST(RoadOfOneFile, ASelectedLogProfileArrivesProtectedAndCategorisedOnceAndForAll) {
  Installations run(RunOptions{{"-PFLog:Sales.wlp"}, false, "pavsuite", "5.5", "halsuite", "6.5"});
  const std::string legacyPassword = LegacyEncoded("Tr0ub4dor&3");
  const std::string head = "[Profile]\r\nName=Sales web site\r\nHomePageName=reports/sales/index.htm\r\n";
  const std::string logs = "\r\n[Logs]\r\nLog1=ftp://logs.example.com/access.log\r\n";
  WriteFile(run.Src("profiles/sales.wlp"), head + "LogFileUsername=" + LegacyEncoded("logreader") +
                                               "\r\nLogFilePassword=" + legacyPassword + "\r\n" + logs);
  WriteFile(run.Src("profiles/sales.dat/hits.dat"), "hits");
  WriteFile(run.Src("profiles/support.wlp"), "[Profile]\r\nName=Support\r\n");
  WriteFile(run.Src("profiles/demo.wlp"), "[Profile]\r\nName=Demo\r\n");
  WriteFile(run.Src("profiles/categories.ini"),
            "[main]\r\nNumberOfCategories=1\r\nCategory1=Web sites\r\n[Web sites]\r\n"
            "NumberOfProfiles=3\r\nProfile1=C:\\Vantix\\profiles\\demo.wlp\r\n"
            "Profile2=C:\\Vantix\\profiles\\sales.wlp\r\nProfile3=C:\\Vantix\\profiles\\support.wlp\r\n"
            "Expand=1\r\n");
  WriteFile(run.Dst("profiles/demo.wlp"), "[Profile]\r\nName=New demo\r\n");
  const std::string samples = "[main]\r\nNumberOfCategories=1\r\nCategory1=Samples\r\n[Samples]\r\n"
                              "NumberOfProfiles=1\r\nProfile1=" + run.Dst("profiles/demo.wlp") +
                              "\r\nExpand=0\r\n";
  WriteFile(run.Dst("profiles/categories.ini"), samples);
  EXPECT_EQ(0, run.manager().DoCopyLogProfiles("profiles", "*.wlp", "wlp", "demo.wlp"));

  // Only the selected profile came, under its marked name, with its data folder.
  const Entries tree = {"profiles", "profiles/categories.ini", "profiles/demo.wlp",
                        "profiles/sales_vxmigrate.dat", "profiles/sales_vxmigrate.dat/hits.dat",
                        "profiles/sales_vxmigrate.wlp"};
  EXPECT_EQ(tree, run.DestinationTree());
  EXPECT_EQ("[Profile]\r\nName=New demo\r\n", ReadFile(run.Dst("profiles/demo.wlp")));
  // Its credentials are protected values of the old clear texts; everything else is as it was,
  // with the home page split into folder and page.
  const std::string profile = ReadFile(run.Dst("profiles/sales_vxmigrate.wlp"));
  const std::string password = Value(profile, "LogFilePassword");
  const std::string user = Value(profile, "LogFileUsername");
  ASSERT_GT(password.size(), 4u);
  EXPECT_EQ("D9", password.substr(0, 2));
  EXPECT_EQ("AB", password.substr(password.size() - 2));
  EXPECT_NE(legacyPassword, password);
  EXPECT_EQ("Tr0ub4dor&3", Decrypted(password));
  EXPECT_EQ("logreader", Decrypted(user));
  EXPECT_EQ(head + "LogFileUsername=" + user + "\r\nLogFilePassword=" + password +
                "\r\nHomePageDefaults=index.htm\r\nHomePageBaseDir=reports/sales\r\n" + logs,
            profile);
  // The new categories file keeps its own category and gains the old one, listing the copy only.
  const std::string categories =
      "[main]\r\nNumberOfCategories=2\r\nCategory1=Samples\r\nCategory2=Web sites\r\n" +
      samples.substr(samples.find("[Samples]")) + "[Web sites]\r\nProfile1=" +
      run.Dst("profiles/sales_vxmigrate.wlp") + "\r\nNumberOfProfiles=1\r\nExpand=1\r\n";
  EXPECT_EQ(categories, ReadFile(run.Dst("profiles/categories.ini")));
  EXPECT_EQ((Entries{"File copied:  " + run.Dst("profiles/sales_vxmigrate.wlp"),
                     "Folder copied:  " + run.Dst("profiles/sales_vxmigrate.dat/"),
                     "categories.ini merged: " + run.Dst("profiles/")}),
            run.RunLog());

  // A second run finds its earlier copies and changes nothing.
  run.manager().DoCopyLogProfiles("profiles", "*.wlp", "wlp", "demo.wlp");
  EXPECT_EQ(tree, run.DestinationTree());
  EXPECT_EQ(profile, ReadFile(run.Dst("profiles/sales_vxmigrate.wlp")));
  EXPECT_EQ(categories, ReadFile(run.Dst("profiles/categories.ini")));
}

}  // namespace
}  // namespace vxtest
