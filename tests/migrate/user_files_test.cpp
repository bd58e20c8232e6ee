// Marked copies of user files, of the scheduled events that refer to them and of alert profiles:
// names, exclusions, existing copies left alone, no marking twice, events redirected or dropped,
// recipient lists redirected; and the user's own report languages.

#include <string>

#include "migrate/installations_fixture.h"

namespace vxtest {
namespace {

// "r_vxmigrate.wlp" was left by an earlier migration into this installation: "r.wlp" wins. An
// event is kept only when the marked copy of its set is there. The destination path is logged,
// and the user files' "exists" text has a single blank.
TEST(CopyRenamedUserFiles, CopiesUnderMarkedNamesNeverMarkingTwiceNorReplacingAndEventsFollow) {
  Installations run;
  run.WriteSources({"s/r.wlp", "s/r_vxmigrate.wlp", "s/orphan_vxmigrate.wlp", "s/other.wlp",
                    "s/sample.wlp", "s/usr_x.wlp", "s/usr_gone.wlp", "s/readme.txt",
                    "s/deeper/inner.wlp"});
  WriteFile(run.Dst("s/other_vxmigrate.rpt"), "migrated before");
  WriteFile(run.Src("s/a.evt"), "; nightly\r\n[Main]\r\nSetName = usr_x\r\nSetExtension = rpt\r\n");
  WriteFile(run.Src("s/b.evt"), "[Main]\nSetName=usr_gone\nSetExtension=rpt\n");
  WriteFile(run.Src("s/c.evt"), "[Main]\nSetName=other\nSetExtension=rpt\n");
  WriteFile(run.Src("s/d.evt"), "[Main]\nSetName=usr_x\n");
  WriteFile(run.Dst("s/d_vxmigrate.evt"), "edited since");
  EXPECT_EQ(0, run.manager().CopyRenamedUserFiles("s", "*.wlp", "rpt", "Sample.wlp, usr_gone.wlp"));
  EXPECT_EQ(0, run.manager().CopyScheduledEventFiles("s", "*.evt", "evt", "usr_*"));

  EXPECT_EQ((Entries{"s", "s/a_vxmigrate.evt", "s/c_vxmigrate.evt", "s/d_vxmigrate.evt",
                     "s/orphan_vxmigrate.rpt", "s/other_vxmigrate.rpt", "s/r_vxmigrate.rpt",
                     "s/usr_x_vxmigrate.rpt"}),
            run.DestinationTree());
  EXPECT_EQ((Entries{"s/r.wlp", "migrated before",
                     "; nightly\r\n[Main]\r\nSetName = usr_x_vxmigrate\r\nSetExtension = rpt\r\n",
                     "[Main]\nSetName=other\nSetExtension=rpt\n", "edited since"}),
            run.ReadDst({"s/r_vxmigrate.rpt", "s/other_vxmigrate.rpt", "s/a_vxmigrate.evt",
                         "s/c_vxmigrate.evt", "s/d_vxmigrate.evt"}));
  EXPECT_EQ((Entries{"File copied:  <dst>/s/orphan_vxmigrate.rpt",
                     "File exists - no copy made: <dst>/s/other_vxmigrate.rpt",
                     "File copied:  <dst>/s/r_vxmigrate.rpt",
                     "File exists - no copy made: <dst>/s/r_vxmigrate.rpt",
                     "File copied:  <dst>/s/usr_x_vxmigrate.rpt",
                     "Schedule Event copied:  <dst>/s/a_vxmigrate.evt",
                     "Schedule Event copied:  <dst>/s/c_vxmigrate.evt",
                     "File exists - no copy made:  <dst>/s/d_vxmigrate.evt"}),
            run.RunLog());
}

// Every profile but the samples is copied, selected or not; the selection decides the entries in
// the console folder's categories, under the profiles' own names. Recipient list keys are read
// from "l0" up to the first one missing, so an e-mail list without "l0" has none.
TEST(DoCopyAlertProfiles, CopiesAllButSamplesRedirectsListFilesAndMergesTheConsoleCategories) {
  Installations run({"-PFAlert:night.alp"});
  run.WriteSources({"datfiles/day.alp", "datfiles/demo.alp"});
  const std::string head = "[Alert]\r\nName=night\r\n[Alert_Pager_List]\r\n";
  const std::string kept = "l1=C:\\V\\pager.lst\r\nl2=\r\n";
  const std::string mid = "l4=LERT03.lst\r\nl5=/u/lert04.lst\r\n";
  const std::string tail = "l8=C:\\lert09.lst\r\n[Alert_Email_List]\r\nl1=C:\\lert05.lst\r\n";
  WriteFile(run.Src("datfiles/night.alp"), head + "l0=C:\\V\\datfiles\\lert01.lst\r\n" + kept +
                                               "l3=lert02.txt\r\n" + mid +
                                               "l6=D:\\lert07_vxmigrate.lst\r\n" + tail);
  WriteFile(run.Dst("datfiles/day_vxmigrate.alp"), "migrated before");
  WriteFile(run.Src("console_datfiles/categories.ini"),
            "[main]\nNumberOfCategories=1\nCategory1=Alerts\n[Alerts]\nNumberOfProfiles=2\n"
            "Profile1=C:\\old\\day.alp\nProfile2=C:\\old\\night.alp\n");
  EXPECT_EQ(0, run.manager().DoCopyAlertProfiles("datfiles", "*.alp", "alp", "demo.alp"));

  EXPECT_EQ((Entries{"console_datfiles", "console_datfiles/categories.ini", "datfiles",
                     "datfiles/day_vxmigrate.alp", "datfiles/night_vxmigrate.alp"}),
            run.DestinationTree());
  EXPECT_EQ((Entries{head + "l0=lert01_vxmigrate.lst\r\n" + kept + "l3=lert02_vxmigrate.txt\r\n" +
                         mid + "l6=lert07_vxmigrate.lst\r\n" + tail,
                     "migrated before",
                     "[main]\nNumberOfCategories=1\nCategory1=Alerts\n[Alerts]\n"
                     "Profile1=<dst>/console_datfiles/night.alp\nNumberOfProfiles=1\nExpand=\n"}),
            run.ReadDst({"datfiles/night_vxmigrate.alp", "datfiles/day_vxmigrate.alp",
                         "console_datfiles/categories.ini"}));
  EXPECT_EQ((Entries{"File exists - no copy made:  <dst>/datfiles/day_vxmigrate.alp",
                     "File copied:  <dst>/datfiles/night_vxmigrate.alp",
                     "categories.ini merged: <dst>/console_datfiles/"}),
            run.RunLog());
}

// The four languages the new installation ships are never copied; a user's own language replaces
// a file of the same name.
TEST(DoCopyLanguageFiles, CopiesOnlyTheUsersOwnLanguagesIntoTheNewFolder) {
  Installations run;
  run.WriteSources({"lang/english.rpl", "lang/Spanish.rpl", "lang/GERMAN.rpl", "lang/french.rpl",
                    "lang/italian.rpl", "lang/klingon.rpl", "lang/english_uk.rpl",
                    "lang/notes.txt", "lang/old/dutch.rpl"});
  WriteFile(run.Dst("new/english.rpl"), "new");
  WriteFile(run.Dst("new/klingon.rpl"), "older");
  EXPECT_EQ(0, run.manager().DoCopyLanguageFiles("lang", "new"));

  EXPECT_EQ((Entries{"new", "new/english.rpl", "new/english_uk.rpl", "new/italian.rpl",
                     "new/klingon.rpl"}),
            run.DestinationTree());
  EXPECT_EQ((Entries{"new", "lang/klingon.rpl"}),
            run.ReadDst({"new/english.rpl", "new/klingon.rpl"}));
  EXPECT_EQ((Entries{"Language file copied: <src>/lang/english_uk.rpl",
                     "Language file copied: <src>/lang/italian.rpl",
                     "Language file copied: <src>/lang/klingon.rpl"}),
            run.RunLog());
}

}  // namespace
}  // namespace vxtest
