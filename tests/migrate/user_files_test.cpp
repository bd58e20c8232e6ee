// Marked copies of user files, of the scheduled events that refer to them and of alert profiles:
// names, exclusions, existing copies left alone, no marking twice, events redirected or dropped,
// recipient lists redirected; and the user's own report languages.

#include <string>

#include "migrate/installations_fixture.h"

namespace vxtest {
namespace {

TEST(CopyRenamedUserFiles, CopiesUnderMarkedNamesNeverMarkingTwiceNorReplacing) {
  Installations run;
  // "report_vxmigrate.wlp" was left by an earlier migration into this installation: the current
  // "report.wlp" wins.
  run.WriteSources({"r/report.wlp", "r/report_vxmigrate.wlp", "r/orphan_vxmigrate.wlp",
                    "r/other.wlp", "r/sample.wlp", "r/readme.txt", "r/deeper/inner.wlp"});
  WriteFile(run.Dst("r/other_vxmigrate.rpt"), "migrated before");
  EXPECT_EQ(0, run.manager().CopyRenamedUserFiles("r", "*.wlp", "rpt", "Sample.wlp"));

  EXPECT_EQ((Entries{"r", "r/orphan_vxmigrate.rpt", "r/other_vxmigrate.rpt", "r/report_vxmigrate.rpt"}),
            run.DestinationTree());
  EXPECT_EQ("r/report.wlp", ReadFile(run.Dst("r/report_vxmigrate.rpt")));
  EXPECT_EQ("migrated before", ReadFile(run.Dst("r/other_vxmigrate.rpt")));
  // The destination path is logged, and the "exists" text has a single blank here.
  EXPECT_EQ((Entries{"File copied:  " + run.Dst("r/orphan_vxmigrate.rpt"),
                     "File exists - no copy made: " + run.Dst("r/other_vxmigrate.rpt"),
                     "File copied:  " + run.Dst("r/report_vxmigrate.rpt"),
                     "File exists - no copy made: " + run.Dst("r/report_vxmigrate.rpt")}),
            run.RunLog());
}

TEST(CopyScheduledEventFiles, PointsEventsAtMarkedCopiesAndDropsThoseWhoseSetStayedBehind) {
  Installations run;
  run.WriteSources({"s/usr_sales.wlp", "s/usr_gone.wlp"});
  const std::string nightly = "; nightly\r\n[Main]\r\nSetName = usr_sales\r\nSetExtension = wlp\r\n";
  WriteFile(run.Src("s/a_sales.evt"), nightly);
  WriteFile(run.Src("s/b_gone.evt"), "[Main]\nSetName=usr_gone\nSetExtension=wlp\n");
  WriteFile(run.Src("s/c_other.evt"), "[Main]\nSetName=other\nSetExtension=wlp\n");
  WriteFile(run.Src("s/d_edited.evt"), "[Main]\nSetName=usr_sales\n");
  WriteFile(run.Dst("s/d_edited_vxmigrate.evt"), "edited since");
  // The user files come first: an event is only kept when its set's marked copy is there.
  run.manager().CopyRenamedUserFiles("s", "*.wlp", "wlp", "usr_gone.wlp");
  EXPECT_EQ(0, run.manager().CopyScheduledEventFiles("s", "*.evt", "evt", "usr_*"));

  EXPECT_EQ((Entries{"s", "s/a_sales_vxmigrate.evt", "s/c_other_vxmigrate.evt",
                     "s/d_edited_vxmigrate.evt", "s/usr_sales_vxmigrate.wlp"}),
            run.DestinationTree());
  EXPECT_EQ((Entries{"; nightly\r\n[Main]\r\nSetName = usr_sales_vxmigrate\r\nSetExtension = wlp\r\n",
                     "[Main]\nSetName=other\nSetExtension=wlp\n", "edited since"}),
            (Entries{ReadFile(run.Dst("s/a_sales_vxmigrate.evt")),
                     ReadFile(run.Dst("s/c_other_vxmigrate.evt")),
                     ReadFile(run.Dst("s/d_edited_vxmigrate.evt"))}));
  EXPECT_EQ((Entries{"File copied:  " + run.Dst("s/usr_sales_vxmigrate.wlp"),
                     "Schedule Event copied:  " + run.Dst("s/a_sales_vxmigrate.evt"),
                     "Schedule Event copied:  " + run.Dst("s/c_other_vxmigrate.evt"),
                     "File exists - no copy made:  " + run.Dst("s/d_edited_vxmigrate.evt")}),
            run.RunLog());
}

// Every profile but the samples is copied, selected or not; the selection decides the categories
// of the console's folder, entered under the profiles' own names.
TEST(DoCopyAlertProfiles, CopiesAllButSamplesRedirectsListFilesAndMergesTheConsoleCategories) {
  Installations run(RunOptions{{"-PFAlert:night.alp"}});
  run.WriteSources({"datfiles/alerts/day.alp", "datfiles/alerts/demo.alp"});
  const std::string head = "[Alert]\r\nName=night\r\n[Alert_Pager_List]\r\n";
  // Keys are read from "l0" up to the first one missing; an e-mail list without "l0" has none.
  const std::string tail = "l4=LERT03.lst\r\nl5=/unix/style/lert04.lst\r\n";
  const std::string email = "l8=C:\\lert09.lst\r\n[Alert_Email_List]\r\nl1=C:\\lert05.lst\r\n";
  WriteFile(run.Src("datfiles/alerts/night.alp"),
            head + "l0=C:\\Vantix\\datfiles\\alerts\\lert01.lst\r\nl1=C:\\Vantix\\pager.lst\r\n"
                   "l2=\r\nl3=lert02.txt\r\n" + tail + "l6=D:\\lert07_vxmigrate.lst\r\n" + email);
  WriteFile(run.Dst("datfiles/alerts/day_vxmigrate.alp"), "migrated before");
  WriteFile(run.Src("console_datfiles/alerts/categories.ini"),
            "[main]\nNumberOfCategories=1\nCategory1=Alerts\n"
            "[Alerts]\nNumberOfProfiles=2\nProfile1=C:\\old\\day.alp\nProfile2=C:\\old\\night.alp\n");
  EXPECT_EQ(0, run.manager().DoCopyAlertProfiles("datfiles/alerts", "*.alp", "alp", "demo.alp"));

  EXPECT_EQ((Entries{"console_datfiles", "console_datfiles/alerts",
                     "console_datfiles/alerts/categories.ini", "datfiles", "datfiles/alerts",
                     "datfiles/alerts/day_vxmigrate.alp", "datfiles/alerts/night_vxmigrate.alp"}),
            run.DestinationTree());
  EXPECT_EQ(head + "l0=lert01_vxmigrate.lst\r\nl1=C:\\Vantix\\pager.lst\r\nl2=\r\n"
                   "l3=lert02_vxmigrate.txt\r\n" + tail + "l6=lert07_vxmigrate.lst\r\n" + email,
            ReadFile(run.Dst("datfiles/alerts/night_vxmigrate.alp")));
  EXPECT_EQ("migrated before", ReadFile(run.Dst("datfiles/alerts/day_vxmigrate.alp")));
  // A new categories file: the list of categories first.
  EXPECT_EQ("[main]\nNumberOfCategories=1\nCategory1=Alerts\n[Alerts]\nProfile1=" +
                run.Dst("console_datfiles/alerts/night.alp") + "\nNumberOfProfiles=1\nExpand=\n",
            ReadFile(run.Dst("console_datfiles/alerts/categories.ini")));
  EXPECT_EQ((Entries{"File exists - no copy made:  " + run.Dst("datfiles/alerts/day_vxmigrate.alp"),
                     "File copied:  " + run.Dst("datfiles/alerts/night_vxmigrate.alp"),
                     "categories.ini merged: " + run.Dst("console_datfiles/alerts/")}),
            run.RunLog());
}

// The four languages the new installation ships are never copied; a user's own language replaces
// a file of the same name.
TEST(DoCopyLanguageFiles, CopiesOnlyTheUsersOwnLanguagesIntoTheNewFolder) {
  Installations run;
  run.WriteSources({"lang/english.rpl", "lang/Spanish.rpl", "lang/GERMAN.rpl", "lang/french.rpl",
                    "lang/italian.rpl", "lang/klingon.rpl", "lang/english_uk.rpl",
                    "lang/notes.txt", "lang/old/dutch.rpl"});
  WriteFile(run.Dst("reports/lang/english.rpl"), "new");
  WriteFile(run.Dst("reports/lang/klingon.rpl"), "older");
  EXPECT_EQ(0, run.manager().DoCopyLanguageFiles("lang", "reports/lang"));

  EXPECT_EQ((Entries{"reports", "reports/lang", "reports/lang/english.rpl",
                     "reports/lang/english_uk.rpl", "reports/lang/italian.rpl",
                     "reports/lang/klingon.rpl"}),
            run.DestinationTree());
  EXPECT_EQ("new", ReadFile(run.Dst("reports/lang/english.rpl")));
  EXPECT_EQ("lang/klingon.rpl", ReadFile(run.Dst("reports/lang/klingon.rpl")));
  EXPECT_EQ((Entries{"Language file copied: " + run.Src("lang/english_uk.rpl"),
                     "Language file copied: " + run.Src("lang/italian.rpl"),
                     "Language file copied: " + run.Src("lang/klingon.rpl")}),
            run.RunLog());
}

}  // namespace
}  // namespace vxtest
