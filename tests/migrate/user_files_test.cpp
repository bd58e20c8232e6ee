// Marked copies of user files and the scheduled events that refer to them: names, the exclusion
// list, existing copies left alone, no marking twice, events redirected or dropped.

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "migrate/profiles_fixture.h"

namespace vxtest {
namespace {

using Entries = std::vector<std::string>;

TEST(CopyRenamedUserFiles, CopiesUnderMarkedNamesNeverMarkingTwiceNorReplacing) {
  Installations run;
  WriteFile(run.Src("reports/report.wlp"), "report");
  // Left by an earlier migration into this installation: the current file above wins.
  WriteFile(run.Src("reports/report_vxmigrate.wlp"), "left over");
  WriteFile(run.Src("reports/orphan_vxmigrate.wlp"), "never adopted");
  WriteFile(run.Src("reports/other.wlp"), "other, old");
  WriteFile(run.Src("reports/sample.wlp"), "sample");
  WriteFile(run.Src("reports/readme.txt"), "not listed");
  WriteFile(run.Src("reports/deeper/inner.wlp"), "not listed either");
  WriteFile(run.Dst("reports/other_vxmigrate.rpt"), "other, already migrated");

  EXPECT_EQ(0, run.manager().CopyRenamedUserFiles("reports", "*.wlp", "rpt", "Sample.wlp"));

  EXPECT_EQ((Entries{"reports", "reports/orphan_vxmigrate.rpt", "reports/other_vxmigrate.rpt",
                     "reports/report_vxmigrate.rpt"}),
            run.DestinationTree());
  EXPECT_EQ("report", ReadFile(run.Dst("reports/report_vxmigrate.rpt")));
  EXPECT_EQ("other, already migrated", ReadFile(run.Dst("reports/other_vxmigrate.rpt")));
  // The destination path is logged, and the "exists" text has a single blank here.
  EXPECT_EQ((Entries{"File copied:  " + run.Dst("reports/orphan_vxmigrate.rpt"),
                     "File exists - no copy made: " + run.Dst("reports/other_vxmigrate.rpt"),
                     "File copied:  " + run.Dst("reports/report_vxmigrate.rpt"),
                     "File exists - no copy made: " + run.Dst("reports/report_vxmigrate.rpt")}),
            run.RunLog());
}

TEST(CopyScheduledEventFiles, PointsEventsAtMarkedCopiesAndDropsThoseWhoseSetStayedBehind) {
  Installations run;
  WriteFile(run.Src("sched/usr_sales.wlp"), "[Profile]\n");
  WriteFile(run.Src("sched/usr_gone.wlp"), "[Profile]\n");
  WriteFile(run.Src("sched/a_sales.evt"),
            "; nightly\r\n[Main]\r\nSetName = usr_sales\r\nSetExtension = wlp\r\nHour=2\r\n");
  WriteFile(run.Src("sched/b_gone.evt"), "[Main]\nSetName=usr_gone\nSetExtension=wlp\n");
  WriteFile(run.Src("sched/c_other.evt"), "[Main]\nSetName=other\nSetExtension=wlp\n");
  WriteFile(run.Src("sched/d_edited.evt"), "[Main]\nSetName=usr_sales\n");
  WriteFile(run.Dst("sched/d_edited_vxmigrate.evt"), "[Main]\nSetName=edited since\n");
  // The user files come first: an event is only kept when its set's marked copy is there.
  run.manager().CopyRenamedUserFiles("sched", "*.wlp", "wlp", "usr_gone.wlp");

  EXPECT_EQ(0, run.manager().CopyScheduledEventFiles("sched", "*.evt", "evt", "usr_*"));

  EXPECT_EQ((Entries{"sched", "sched/a_sales_vxmigrate.evt", "sched/c_other_vxmigrate.evt",
                     "sched/d_edited_vxmigrate.evt", "sched/usr_sales_vxmigrate.wlp"}),
            run.DestinationTree());
  EXPECT_EQ("; nightly\r\n[Main]\r\nSetName = usr_sales_vxmigrate\r\nSetExtension = wlp\r\nHour=2\r\n",
            ReadFile(run.Dst("sched/a_sales_vxmigrate.evt")));
  EXPECT_EQ("[Main]\nSetName=other\nSetExtension=wlp\n",
            ReadFile(run.Dst("sched/c_other_vxmigrate.evt")));
  EXPECT_EQ("[Main]\nSetName=edited since\n", ReadFile(run.Dst("sched/d_edited_vxmigrate.evt")));
  EXPECT_EQ((Entries{"File copied:  " + run.Dst("sched/usr_sales_vxmigrate.wlp"),
                     "Schedule Event copied:  " + run.Dst("sched/a_sales_vxmigrate.evt"),
                     "Schedule Event copied:  " + run.Dst("sched/c_other_vxmigrate.evt"),
                     "File exists - no copy made:  " + run.Dst("sched/d_edited_vxmigrate.evt")}),
            run.RunLog());
}

}  // namespace
}  // namespace vxtest
