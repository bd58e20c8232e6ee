// Halden log-analysis profiles copied into the OBX profile folder and rewritten there.

#include <cstdio>
#include <string>
#include <vector>

#include "edition/halden_to_obx.h"
#include "foundation/inifile/ini_file.h"
#include "tests/edition/edition_fixture.h"

namespace {

using vxtest::EditionRun;
using vxtest::FileExists;
using vxtest::Protected;
using vxtest::ReadFile;
using vxtest::WriteFile;

const char kProfiles[] = "/vxm_vxx/datfiles/profiles/";

std::string Value(const std::string& path, const char* section, const char* key) {
  vxMappedINIFile file(path.c_str());
  if (file.Open(1) != 0) return "<unreadable>";
  vxStringBase value;
  return file.GetVal(section, key, value) == 0 ? value.str() : "<absent>";
}

TEST(EditionProfiles, ConvertsServersCredentialsAndOptions) {
  EditionRun run;
  EXPECT_EQ(HaldenToOBXHelper(run.manager()).DoHaldenToOBXProfileFileMigrate(), 0);
  const std::string from = run.src() + "/vxm_log/datfiles/";
  const std::string to = run.dst() + kProfiles;
  EXPECT_EQ(vxtest::ListTree(to), (std::vector<std::string>{"cluster_vxmigrate.wlp",
                                                            "corrupt_vxmigrate.wlp",
                                                            "shop_vxmigrate.wlp"}));
  EXPECT_EQ(run.NewLog(),
            (std::vector<std::string>{
                "Profile file copied: " + from + "cluster.wlp to " + to + "cluster_vxmigrate.wlp",
                "Error: Unable to open file:   " + to + "corrupt_vxmigrate.wlp",
                "** OBX does not support new day/time filters - MUST manually change: "
                "Weekend visitors",
                "** OBX does not support new day/time filters - MUST manually change: Night owls",
                "Profile file copied: " + from + "shop.wlp to " + to + "shop_vxmigrate.wlp"}));

  EXPECT_EQ(ReadFile(to + "shop_vxmigrate.wlp"),
            "[Profile]\nName=Example Shop\nIsServerCluster=0\nServerName=web1.example.com\n"
            "LogFilePath=/var/log/shop/access.log\nLogFileUserName=shopuser\n"
            "LogFilePassword=" + Protected("s3cret") +
            "\nHomePageName=/srv/www/shop/index.html\nHomePageUsername=webadmin\n"
            "HomePagePassword=" + Protected("pw") +
            "\nIncludeQueries=Y\nincludecontentgroups=4 \nincludepathsanalysisprofiles=\n"
            "HomePageDefaults=index.html\nHomePageBaseDir=/srv/www/shop\nIncludeQueryStrings=Y\n\n"
            "[Filter1]\nName=Weekend visitors\nDayTimeEnabled=1\n\n"
            "[Filter2]\nName=All traffic\nDayTimeEnabled=0\n\n[Filter3]\nName=Night owls\n");
  // Cluster servers get sections of their own; every file of a "|" list loses its scheme, and an
  // empty piece keeps its number.
  EXPECT_EQ(ReadFile(to + "cluster_vxmigrate.wlp"),
            "[Profile]\nName=Web cluster\nIsServerCluster=1\nHomePageName=index.html\n"
            "includecontentgroups=7\nHomePageDefaults=\nHomePageBaseDir=index.html\n"
            "[server1]\nservername=node1.example.com\nlogfilepath1=/var/log/web/node1.log\n"
            "logfilepath2=/var/log/web/node1.log.1\n"
            "[server2]\nservername=ftp.example.com\nlogfileusername=ftpuser\n"
            "logfilepassword=" + Protected("ftppass") +
            "\nlogfilepath1=ftp://ftp.example.com/logs/access.log\n"
            "[server3]\nservername=node3.example.com\nlogfilepath1=/var/log/web/a.log\n"
            "logfilepath3=/var/log/web/c.log\n");
  // An unreadable profile is left as the user's copy.
  EXPECT_EQ(ReadFile(to + "corrupt_vxmigrate.wlp"), ReadFile(from + "corrupt.wlp"));
}

TEST(EditionProfiles, SecondRunMakesNoCopy) {
  EditionRun run;
  HaldenToOBXHelper(run.manager()).DoHaldenToOBXProfileFileMigrate();
  const std::string to = run.dst() + kProfiles;
  WriteFile(to + "shop_vxmigrate.wlp", "[Profile]\nName=edited\n");
  run.NewLog();
  HaldenToOBXHelper(run.manager()).DoHaldenToOBXProfileFileMigrate();
  EXPECT_EQ(ReadFile(to + "shop_vxmigrate.wlp"), "[Profile]\nName=edited\n");
  EXPECT_EQ(run.NewLog(), (std::vector<std::string>{
                              "File exists - no copy made:  " + to + "cluster_vxmigrate.wlp",
                              "File exists - no copy made:  " + to + "corrupt_vxmigrate.wlp",
                              "File exists - no copy made:  " + to + "shop_vxmigrate.wlp"}));
}

TEST(EditionProfiles, OnlySelectedProfilesTravel) {
  EditionRun run("3.0", {"-PFLog:shop.wlp"});
  HaldenToOBXHelper(run.manager()).DoHaldenToOBXProfileFileMigrate();
  EXPECT_EQ(vxtest::ListTree(run.dst() + kProfiles),
            std::vector<std::string>{"shop_vxmigrate.wlp"});
}

TEST(EditionProfiles, MissingOptionFileEmptiesTheAllProfilesMark) {
  EditionRun run;
  std::remove((run.dst() + "/vxm_vxx/datfiles/contentgroups/default.ini").c_str());
  HaldenToOBXHelper(run.manager()).DoHaldenToOBXProfileFileMigrate();
  const std::string shop = run.dst() + kProfiles + "shop_vxmigrate.wlp";
  EXPECT_EQ(Value(shop, "Profile", "includecontentgroups"), "");
  const std::vector<std::string> log = run.NewLog();
  EXPECT_EQ(log[log.size() - 2],
            "Error: Advanced option file unavailable - includecontentgroups emptied: " + shop);
}

TEST(EditionProfiles, NoServerSettingsNoProfiles) {
  EditionRun run;
  std::remove((run.dst() + "/vxm_vxx/vxm_vxx.ini").c_str());
  EXPECT_EQ(HaldenToOBXHelper(run.manager()).DoHaldenToOBXProfileFileMigrate(), 1);
  WriteFile(run.dst() + "/vxm_vxx/vxm_vxx.ini", "[defaults]\nprofilesdir=\n");
  EXPECT_EQ(HaldenToOBXHelper(run.manager()).DoHaldenToOBXProfileFileMigrate(), 0);
  EXPECT_EQ(vxtest::ListTree(run.dst() + kProfiles), std::vector<std::string>{});
}

struct VersionCase {
  const char* version;
  bool plain;
};

class EditionHomePageUser : public testing::TestWithParam<VersionCase> {};

// Early OBX versions read the home page user name in clear, later ones only in protected form;
// major and minor number are each compared by themselves, so 2.9 counts as late.
TEST_P(EditionHomePageUser, FollowsTheDestinationVersion) {
  EditionRun run(GetParam().version);
  HaldenToOBXHelper(run.manager()).DoHaldenToOBXProfileFileMigrate();
  EXPECT_EQ(Value(run.dst() + kProfiles + "shop_vxmigrate.wlp", "Profile", "HomePageUsername"),
            GetParam().plain ? std::string("webadmin") : Protected("webadmin"));
}

INSTANTIATE_TEST_SUITE_P(Versions, EditionHomePageUser,
                         testing::Values(VersionCase{"2.1", true}, VersionCase{"3.1", true},
                                         VersionCase{"2.9", false},
                                         VersionCase{"3.1.a", true}, VersionCase{"3.2", false},
                                         VersionCase{"4.0", false}, VersionCase{"4.1", false}));

class EditionWarehouse : public testing::TestWithParam<const char*> {};

TEST_P(EditionWarehouse, MovesIntoItsOwnSectionForTradequillOnly) {
  EditionRun run("3.0", {}, GetParam());
  WriteFile(run.src() + "/vxm_log/datfiles/sales.wlp",
            "[Profile]\nLogFilePath=warehouse:SalesDW\nLogFileUsername=" + vxtest::Legacy("dw") +
                "\nLogFilePassword=" + vxtest::Legacy("dwpass") + "\n");
  HaldenToOBXHelper(run.manager()).DoHaldenToOBXProfileFileMigrate();
  const std::string sales = run.dst() + kProfiles + "sales_vxmigrate.wlp";
  const bool tradequill = std::string(GetParam()) == "tradeq";
  EXPECT_EQ(Value(sales, "wdwexport", "warehousedsn"), tradequill ? "SalesDW" : "<absent>");
  EXPECT_EQ(Value(sales, "Profile", "iswarehouse"), tradequill ? "1" : "<absent>");
  if (tradequill) {
    EXPECT_EQ(Value(sales, "wdwexport", "warehouseusername"), "dw");
    EXPECT_EQ(Value(sales, "wdwexport", "warehousepassword"), Protected("dwpass"));
  }
}

INSTANTIATE_TEST_SUITE_P(Products, EditionWarehouse, testing::Values("tradeq", "halsuite"));

}  // namespace
