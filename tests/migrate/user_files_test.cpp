// Marked copies of user files and the scheduled events that refer to them: names, the exclusion
// list, existing copies left alone, no marking twice, events redirected or dropped.

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "migrate/profiles_fixture.h"

namespace vxtest {
namespace {

using Entries = std::vector<std::string>;

TEST(CopyRenamedUserFiles, CopiesUnderMarkedNamesAndKeepsExistingCopies) {
  Installations run;
  WriteFile(run.Src("reports/report.wlp"), "report");
  WriteFile(run.Src("reports/other.wlp"), "other, old");
  WriteFile(run.Src("reports/sample.wlp"), "sample");
  WriteFile(run.Src("reports/readme.txt"), "not listed");
  WriteFile(run.Src("reports/deeper/inner.wlp"), "not listed either");
  WriteFile(run.Dst("reports/other_vxmigrate.wlp"), "other, already migrated");

  EXPECT_EQ(0, run.manager().CopyRenamedUserFiles("reports", "*.wlp", "wlp", "Sample.wlp"));

  EXPECT_EQ((Entries{"reports", "reports/other_vxmigrate.wlp", "reports/report_vxmigrate.wlp"}),
            run.DestinationTree());
  EXPECT_EQ("report", ReadFile(run.Dst("reports/report_vxmigrate.wlp")));
  EXPECT_EQ("other, already migrated", ReadFile(run.Dst("reports/other_vxmigrate.wlp")));
  // The destination path is logged, and the "exists" text has a single blank here.
  EXPECT_EQ((Entries{"File exists - no copy made: " + run.Dst("reports/other_vxmigrate.wlp"),
                     "File copied:  " + run.Dst("reports/report_vxmigrate.wlp")}),
            run.RunLog());
}

TEST(CopyRenamedUserFiles, ASecondRunChangesNothing) {
  Installations run;
  WriteFile(run.Src("reports/report.wlp"), "report");
  run.manager().CopyRenamedUserFiles("reports", "*.wlp", "wlp", nullptr);
  WriteFile(run.Src("reports/report.wlp"), "report, edited after the first run");

  run.manager().CopyRenamedUserFiles("reports", "*.wlp", "wlp", nullptr);

  EXPECT_EQ("report", ReadFile(run.Dst("reports/report_vxmigrate.wlp")));
  EXPECT_EQ((Entries{"File copied:  " + run.Dst("reports/report_vxmigrate.wlp"),
                     "File exists - no copy made: " + run.Dst("reports/report_vxmigrate.wlp")}),
            run.RunLog());
}

TEST(CopyRenamedUserFiles, NeverMarksAMarkedCopyTwice) {
  Installations run;
  // A source that was itself the destination of an earlier migration still holds marked copies.
  WriteFile(run.Src("reports/report.wlp"), "current");
  WriteFile(run.Src("reports/report_vxmigrate.wlp"), "left over");
  WriteFile(run.Src("reports/orphan_vxmigrate.wlp"), "never adopted");

  run.manager().CopyRenamedUserFiles("reports", "*.wlp", "wlp", "");

  EXPECT_EQ((Entries{"reports", "reports/orphan_vxmigrate.wlp", "reports/report_vxmigrate.wlp"}),
            run.DestinationTree());
  // The user's current file is listed before its leftover marked copy, so it wins.
  EXPECT_EQ("current", ReadFile(run.Dst("reports/report_vxmigrate.wlp")));
  EXPECT_EQ("never adopted", ReadFile(run.Dst("reports/orphan_vxmigrate.wlp")));
  EXPECT_EQ((Entries{"File copied:  " + run.Dst("reports/orphan_vxmigrate.wlp"),
                     "File copied:  " + run.Dst("reports/report_vxmigrate.wlp"),
                     "File exists - no copy made: " + run.Dst("reports/report_vxmigrate.wlp")}),
            run.RunLog());
}

TEST(CopyRenamedUserFiles, TakesTheCallersExtension) {
  Installations run;
  WriteFile(run.Src("keys/words.txt"), "keywords");
  WriteFile(run.Src("keys/archive.tar.gz"), "archive");

  run.manager().CopyRenamedUserFiles("keys", "*", "bak", "");

  EXPECT_EQ((Entries{"keys", "keys/archive.tar_vxmigrate.bak", "keys/words_vxmigrate.bak"}),
            run.DestinationTree());
}

// The scheduler's folder holds the user's profiles and the events that run them.
class ScheduledEvents : public ::testing::Test {
 protected:
  void SetUp() override {
    WriteFile(run_.Src("sched/usr_sales.wlp"), "[Profile]\n");
    WriteFile(run_.Src("sched/usr_gone.wlp"), "[Profile]\n");
    WriteFile(run_.Src("sched/a_sales.evt"),
              "; nightly\r\n[Main]\r\nSetName = usr_sales\r\nSetExtension = wlp\r\nHour=2\r\n");
    WriteFile(run_.Src("sched/b_gone.evt"), "[Main]\nSetName=usr_gone\nSetExtension=wlp\n");
    WriteFile(run_.Src("sched/c_other.evt"), "[Main]\nSetName=other\nSetExtension=wlp\n");
    WriteFile(run_.Src("sched/d_empty.evt"), "[Main]\nSetName=\n");
    // The user files come first: an event is only kept when its set's marked copy is there.
    run_.manager().CopyRenamedUserFiles("sched", "*.wlp", "wlp", "usr_gone.wlp");
  }

  Installations run_;
};

TEST_F(ScheduledEvents, PointsEventsAtMarkedCopiesAndDropsThoseWhoseSetStayedBehind) {
  EXPECT_EQ(0, run_.manager().CopyScheduledEventFiles("sched", "*.evt", "evt", "usr_*"));

  EXPECT_EQ((Entries{"sched", "sched/a_sales_vxmigrate.evt", "sched/c_other_vxmigrate.evt",
                     "sched/d_empty_vxmigrate.evt", "sched/usr_sales_vxmigrate.wlp"}),
            run_.DestinationTree());
  EXPECT_EQ("; nightly\r\n[Main]\r\nSetName = usr_sales_vxmigrate\r\nSetExtension = wlp\r\nHour=2\r\n",
            ReadFile(run_.Dst("sched/a_sales_vxmigrate.evt")));
  EXPECT_EQ("[Main]\nSetName=other\nSetExtension=wlp\n",
            ReadFile(run_.Dst("sched/c_other_vxmigrate.evt")));
  EXPECT_EQ((Entries{"File copied:  " + run_.Dst("sched/usr_sales_vxmigrate.wlp"),
                     "Schedule Event copied:  " + run_.Dst("sched/a_sales_vxmigrate.evt"),
                     "Schedule Event copied:  " + run_.Dst("sched/c_other_vxmigrate.evt"),
                     "Schedule Event copied:  " + run_.Dst("sched/d_empty_vxmigrate.evt")}),
            run_.RunLog());
}

TEST_F(ScheduledEvents, WithAnEmptyPrefixEveryNamedSetCounts) {
  run_.manager().CopyScheduledEventFiles("sched", "*.evt", "evt", "*");

  // "other" has no marked copy, so its event goes as well.
  EXPECT_EQ((Entries{"sched", "sched/a_sales_vxmigrate.evt", "sched/d_empty_vxmigrate.evt",
                     "sched/usr_sales_vxmigrate.wlp"}),
            run_.DestinationTree());
}

TEST_F(ScheduledEvents, LeavesAnEventCopiedByAnEarlierRunAlone) {
  WriteFile(run_.Dst("sched/a_sales_vxmigrate.evt"), "[Main]\nSetName=edited by the user\n");

  run_.manager().CopyScheduledEventFiles("sched", "a_*.evt", "evt", "usr_*");

  EXPECT_EQ("[Main]\nSetName=edited by the user\n",
            ReadFile(run_.Dst("sched/a_sales_vxmigrate.evt")));
  EXPECT_EQ("File exists - no copy made:  " + run_.Dst("sched/a_sales_vxmigrate.evt"),
            run_.RunLog().back());
}

TEST(CopyScheduledEventFiles, EventOfAnAlreadyMarkedSetIsNotMarkedAgain) {
  Installations run;
  WriteFile(run.Src("sched/usr_old_vxmigrate.wlp"), "[Profile]\n");
  WriteFile(run.Src("sched/e.evt"), "[Main]\nSetName=usr_old_vxmigrate\nSetExtension=wlp\n");
  run.manager().CopyRenamedUserFiles("sched", "*.wlp", "wlp", "");

  run.manager().CopyScheduledEventFiles("sched", "*.evt", "evt", "usr_*");

  EXPECT_EQ("[Main]\nSetName=usr_old_vxmigrate\nSetExtension=wlp\n",
            ReadFile(run.Dst("sched/e_vxmigrate.evt")));
}

}  // namespace
}  // namespace vxtest
