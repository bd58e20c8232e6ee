// One selected log-analysis profile on its whole way from the old installation into the new one:
// listed, tested against the samples and the selection, copied under its marked name, its
// credentials protected, written back, logged, and entered in the new categories file.

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "migrate/profiles_fixture.h"

namespace vxtest {
namespace {

using Entries = std::vector<std::string>;

TEST(RoadOfOneFile, ASelectedLogProfileArrivesProtectedAndCategorised) {
  RunOptions options;
  options.sourceVersion = "5.5";
  options.destinationProduct = "halsuite";
  options.destinationVersion = "6.5";
  options.extra = {"-PFLog:Sales.wlp"};
  Installations run(options);

  const std::string legacyPassword = LegacyEncoded("Tr0ub4dor&3");
  const std::string legacyUser = LegacyEncoded("logreader");
  WriteFile(run.Src("profiles/sales.wlp"),
            "[Profile]\r\n"
            "Name=Sales web site\r\n"
            "HomePageName=reports/sales/index.htm\r\n"
            "LogFileUsername=" + legacyUser + "\r\n"
            "LogFilePassword=" + legacyPassword + "\r\n"
            "\r\n"
            "[Logs]\r\n"
            "Log1=ftp://logs.example.com/access.log\r\n");
  WriteFile(run.Src("profiles/sales.dat/hits.dat"), "hits");
  WriteFile(run.Src("profiles/support.wlp"), "[Profile]\r\nName=Support\r\n");
  WriteFile(run.Src("profiles/demo.wlp"), "[Profile]\r\nName=Demo\r\n");
  WriteFile(run.Src("profiles/categories.ini"),
            "[main]\r\nNumberOfCategories=1\r\nCategory1=Web sites\r\n"
            "[Web sites]\r\nNumberOfProfiles=3\r\n"
            "Profile1=C:\\Vantix\\profiles\\demo.wlp\r\n"
            "Profile2=C:\\Vantix\\profiles\\sales.wlp\r\n"
            "Profile3=C:\\Vantix\\profiles\\support.wlp\r\n"
            "Expand=1\r\n");
  WriteFile(run.Dst("profiles/demo.wlp"), "[Profile]\r\nName=New demo\r\n");
  WriteFile(run.Dst("profiles/categories.ini"),
            "[main]\r\nNumberOfCategories=1\r\nCategory1=Samples\r\n"
            "[Samples]\r\nNumberOfProfiles=1\r\nProfile1=" + run.Dst("profiles/demo.wlp") +
                "\r\nExpand=0\r\n");

  EXPECT_EQ(0, run.manager().DoCopyLogProfiles("profiles", "*.wlp", "wlp", "demo.wlp"));

  // Only the selected profile came, under its marked name, with its data folder.
  EXPECT_EQ((Entries{"profiles", "profiles/categories.ini", "profiles/demo.wlp",
                     "profiles/sales_vxmigrate.dat", "profiles/sales_vxmigrate.dat/hits.dat",
                     "profiles/sales_vxmigrate.wlp"}),
            run.DestinationTree());
  EXPECT_EQ("[Profile]\r\nName=New demo\r\n", ReadFile(run.Dst("profiles/demo.wlp")));

  // Its credentials are protected values that decrypt to the old clear texts; everything else
  // is as it was, with the home page split into folder and page.
  const std::string profile = ReadFile(run.Dst("profiles/sales_vxmigrate.wlp"));
  const std::string passwordKey = "LogFilePassword=";
  const size_t passwordAt = profile.find(passwordKey) + passwordKey.size();
  const std::string password = profile.substr(passwordAt, profile.find('\r', passwordAt) - passwordAt);
  const std::string userKey = "LogFileUsername=";
  const size_t userAt = profile.find(userKey) + userKey.size();
  const std::string user = profile.substr(userAt, profile.find('\r', userAt) - userAt);
  ASSERT_GT(password.size(), 4u);
  EXPECT_EQ("D9", password.substr(0, 2));
  EXPECT_EQ("AB", password.substr(password.size() - 2));
  EXPECT_NE(legacyPassword, password);
  EXPECT_EQ("Tr0ub4dor&3", Decrypted(password));
  EXPECT_EQ("logreader", Decrypted(user));
  EXPECT_EQ("[Profile]\r\n"
            "Name=Sales web site\r\n"
            "HomePageName=reports/sales/index.htm\r\n"
            "LogFileUsername=" + user + "\r\n"
            "LogFilePassword=" + password + "\r\n"
            "HomePageDefaults=index.htm\r\n"
            "HomePageBaseDir=reports/sales\r\n"
            "\r\n"
            "[Logs]\r\n"
            "Log1=ftp://logs.example.com/access.log\r\n",
            profile);

  // The new categories file keeps its own category and gains the old one, listing the copy only.
  EXPECT_EQ("[main]\r\nNumberOfCategories=2\r\nCategory1=Samples\r\nCategory2=Web sites\r\n"
            "[Samples]\r\nNumberOfProfiles=1\r\nProfile1=" + run.Dst("profiles/demo.wlp") +
                "\r\nExpand=0\r\n"
                "[Web sites]\r\nProfile1=" + run.Dst("profiles/sales_vxmigrate.wlp") +
                "\r\nNumberOfProfiles=1\r\nExpand=1\r\n",
            ReadFile(run.Dst("profiles/categories.ini")));

  EXPECT_EQ((Entries{"File copied:  " + run.Dst("profiles/sales_vxmigrate.wlp"),
                     "Folder copied:  " + run.Dst("profiles/sales_vxmigrate.dat/"),
                     "categories.ini merged: " + run.Dst("profiles/")}),
            run.RunLog());
}

TEST(RoadOfOneFile, ASecondRunLeavesEverythingAsTheFirstMadeIt) {
  RunOptions options;
  options.extra = {"-PFLog:sales.wlp"};
  Installations run(options);
  WriteFile(run.Src("profiles/sales.wlp"),
            "[Profile]\nLogFilePassword=" + LegacyEncoded("pw") + "\n");
  WriteFile(run.Src("profiles/categories.ini"),
            "[main]\nNumberOfCategories=1\nCategory1=All\n[All]\nNumberOfProfiles=1\n"
            "Profile1=/old/profiles/sales.wlp\n");
  run.manager().DoCopyLogProfiles("profiles", "*.wlp", "wlp", "");
  const std::string profile = ReadFile(run.Dst("profiles/sales_vxmigrate.wlp"));
  const std::string categories = ReadFile(run.Dst("profiles/categories.ini"));

  run.manager().DoCopyLogProfiles("profiles", "*.wlp", "wlp", "");

  EXPECT_EQ(profile, ReadFile(run.Dst("profiles/sales_vxmigrate.wlp")));
  EXPECT_EQ(categories, ReadFile(run.Dst("profiles/categories.ini")));
  EXPECT_EQ((Entries{"profiles", "profiles/categories.ini", "profiles/sales_vxmigrate.wlp"}),
            run.DestinationTree());
}

}  // namespace
}  // namespace vxtest
