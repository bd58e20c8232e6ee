// Alert profiles: every profile but the samples is copied as a marked copy, recipient lists are
// pointed at the marked copies of the alert system's list files, and the categories of the
// console's folder are merged with the profiles' own names.

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "migrate/profiles_fixture.h"

namespace vxtest {
namespace {

using Entries = std::vector<std::string>;

TEST(DoCopyAlertProfiles, CopiesAllButSamplesAndRedirectsTheAlertSystemsListFiles) {
  RunOptions options;
  options.extra = {"-PFAlert:night.alp"};  // the selection does not limit the copies
  Installations run(options);
  WriteFile(run.Src("datfiles/alerts/day.alp"), "[Alert]\nName=day\n");
  WriteFile(run.Src("datfiles/alerts/demo.alp"), "[Alert]\nName=sample\n");
  WriteFile(run.Src("datfiles/alerts/night.alp"),
            "[Alert]\r\nName=night\r\n"
            "[Alert_Pager_List]\r\n"
            "l0=C:\\Vantix\\datfiles\\alerts\\lert01.lst\r\n"
            "l1=C:\\Vantix\\pager.lst\r\n"
            "l2=\r\n"
            "l3=lert02.txt\r\n"
            "l4=LERT03.lst\r\n"
            "l5=/unix/style/lert04.lst\r\n"
            "l6=D:\\lert07_vxmigrate.lst\r\n"
            "l8=C:\\lert09.lst\r\n"
            "[Alert_Email_List]\r\n"
            "l1=C:\\lert05.lst\r\n");
  WriteFile(run.Dst("datfiles/alerts/day_vxmigrate.alp"), "[Alert]\nName=day, migrated before\n");

  EXPECT_EQ(0, run.manager().DoCopyAlertProfiles("datfiles/alerts", "*.alp", "alp", "demo.alp"));

  EXPECT_EQ((Entries{"datfiles", "datfiles/alerts", "datfiles/alerts/day_vxmigrate.alp",
                     "datfiles/alerts/night_vxmigrate.alp"}),
            run.DestinationTree());
  // Keys are read from "l0" up to the first one missing; an e-mail list without "l0" has none.
  EXPECT_EQ("[Alert]\r\nName=night\r\n"
            "[Alert_Pager_List]\r\n"
            "l0=lert01_vxmigrate.lst\r\n"
            "l1=C:\\Vantix\\pager.lst\r\n"
            "l2=\r\n"
            "l3=lert02_vxmigrate.txt\r\n"
            "l4=LERT03.lst\r\n"
            "l5=/unix/style/lert04.lst\r\n"
            "l6=lert07_vxmigrate.lst\r\n"
            "l8=C:\\lert09.lst\r\n"
            "[Alert_Email_List]\r\n"
            "l1=C:\\lert05.lst\r\n",
            ReadFile(run.Dst("datfiles/alerts/night_vxmigrate.alp")));
  EXPECT_EQ("[Alert]\nName=day, migrated before\n",
            ReadFile(run.Dst("datfiles/alerts/day_vxmigrate.alp")));
  EXPECT_EQ((Entries{"File exists - no copy made:  " + run.Dst("datfiles/alerts/day_vxmigrate.alp"),
                     "File copied:  " + run.Dst("datfiles/alerts/night_vxmigrate.alp")}),
            run.RunLog());
}

TEST(DoCopyAlertProfiles, MergesTheConsoleCategoriesWithTheSelectedProfilesUnrenamed) {
  RunOptions options;
  options.extra = {"-PFAlert:night.alp"};
  Installations run(options);
  WriteFile(run.Src("datfiles/alerts/day.alp"), "[Alert]\n");
  WriteFile(run.Src("datfiles/alerts/night.alp"), "[Alert]\n");
  WriteFile(run.Src("console_datfiles/alerts/categories.ini"),
            "[main]\nNumberOfCategories=1\nCategory1=Alerts\n"
            "[Alerts]\nNumberOfProfiles=2\nProfile1=C:\\old\\day.alp\nProfile2=C:\\old\\night.alp\n");

  run.manager().DoCopyAlertProfiles("datfiles/alerts", "*.alp", "alp", "");

  // A new file: the list of categories first, the selected profile under its own name.
  EXPECT_EQ("[main]\nNumberOfCategories=1\nCategory1=Alerts\n[Alerts]\nProfile1=" +
                run.Dst("console_datfiles/alerts/night.alp") + "\nNumberOfProfiles=1\nExpand=\n",
            ReadFile(run.Dst("console_datfiles/alerts/categories.ini")));
  EXPECT_EQ("categories.ini merged: " + run.Dst("console_datfiles/alerts/"), run.RunLog().back());
}

}  // namespace
}  // namespace vxtest
