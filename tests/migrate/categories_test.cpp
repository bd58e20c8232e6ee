// The categories merge: the destination's categories and entries keep their numbers, the old ones
// are appended pointing at the profiles' new names, duplicates (also within the source) are caught
// ignoring case while category names compare byte for byte, and the source's "Expand" wins.

#include <string>

#include "migrate/installations_fixture.h"

namespace vxtest {
namespace {

TEST(MergeCategoriesINIFile, AppendsOldCategoriesAndEntriesAfterTheDestinationsOwn) {
  Installations run;
  WriteFile(run.Dst("p/categories.ini"),
            "[main]\nNumberOfCategories=2\nCategory1=Sales\nCategory2=Web\n[Sales]\n"
            "NumberOfProfiles=1\nProfile1=" + run.Dst("p/A_VXMIGRATE.WLP") + "\nExpand=0\n"
            "[Web]\nNumberOfProfiles=0\n");
  WriteFile(run.Src("p/categories.ini"),
            "[main]\nNumberOfCategories=4\nCategory1=Sales\nCategory2=Support\nCategory3=sales\n"
            "Category4=Samples\n[Sales]\nNumberOfProfiles=5\nProfile1=C:\\V\\p\\a.wlp\n"
            "Profile2=C:\\V\\p\\b.wlp\nProfile3=/opt/v/p/B.wlp\nProfile4=C:\\V\\p\\sample.wlp\n"
            "Profile5=c.wlp\nExpand=1\n[Support]\nNumberOfProfiles=2\nProfile1=C:\\V\\p\\d.wlp\n"
            "Profile2=/opt/v/p/e_vxmigrate.wlp\n"
            "[Samples]\nNumberOfProfiles=1\nProfile1=C:\\V\\p\\Sample.wlp\nExpand=1\n");
  run.manager().MergeCategoriesINIFile("p", "*.wlp", "wlp", "x.wlp, sample.wlp", false);

  EXPECT_EQ((Entries{"[main]\nNumberOfCategories=5\nCategory1=Sales\nCategory2=Web\n"
                     "Category3=Support\nCategory4=sales\nCategory5=Samples\n"
                     "[Sales]\nNumberOfProfiles=3\nProfile1=<dst>/p/A_VXMIGRATE.WLP\nExpand=1\n"
                     "Profile2=<dst>/p/b_vxmigrate.wlp\nProfile3=<dst>/p/c_vxmigrate.wlp\n"
                     "[Web]\nNumberOfProfiles=0\n[Support]\nProfile1=<dst>/p/d_vxmigrate.wlp\n"
                     "Profile2=<dst>/p/e_vxmigrate.wlp\nNumberOfProfiles=2\nExpand=\n"
                     "[Samples]\nNumberOfProfiles=0\nExpand=1\n"}),
            run.ReadDst({"p/categories.ini"}));
  EXPECT_EQ((Entries{"categories.ini merged: <dst>/p/"}), run.RunLog());
}

// Without a source file nothing happens; an unreadable file on either side is reported and
// nothing is written.
TEST(MergeCategoriesINIFile, NeverReplacesAnUnreadableCategoriesFileNorWorksWithoutASource) {
  Installations run;
  const std::string good = "[main]\nNumberOfCategories=1\nCategory1=A\n[A]\nProfile1=a.wlp\n";
  const std::string binary("[main]\nNumberOfCategories=1\0\xff", 30);
  for (const char* name : {"p1/categories.ini", "p2/categories.ini"}) {
    WriteFile(run.Src(name), name[1] == '1' ? good : binary);
    WriteFile(run.Dst(name), name[1] == '1' ? binary : good);
  }
  WriteFile(run.Dst("p3/categories.ini"), good);
  for (const char* folder : {"p1", "p2", "p3", "p4"}) {
    run.manager().MergeCategoriesINIFile(folder, "*.wlp", "wlp", "", false);
  }
  EXPECT_EQ((Entries{"p1", "p1/categories.ini", "p2", "p2/categories.ini", "p3",
                     "p3/categories.ini"}),
            run.DestinationTree());
  EXPECT_EQ((Entries{binary, good, good}),
            run.ReadDst({"p1/categories.ini", "p2/categories.ini", "p3/categories.ini"}));
  EXPECT_EQ((Entries{"Error: categories.ini cannot be read - not merged: <dst>/p1/categories.ini",
                     "Error: categories.ini cannot be read - not merged: <src>/p2/categories.ini"}),
            run.RunLog());
}

// Counts far beyond the entries present, gaps, entries beyond the count and a key written twice:
// the counts on disk decide, and the destination's stale entry beyond its count is taken over.
TEST(MergeCategoriesINIFile, TakesTheCountsOnDiskAsTheListsLengthAndKeepsNamesWhenAsked) {
  Installations run;
  WriteFile(run.Dst("p/categories.ini"),
            "[main]\nNumberOfCategories=1\nCategory1=A\nCategory2=B\n"
            "[A]\nNumberOfProfiles=1\nProfile1=/x/a.wlp\nProfile2=/x/stale.wlp\n");
  WriteFile(run.Src("p/categories.ini"),
            "[main]\nNumberOfCategories=2000000000\nCategory1=A\nCategory3=B\n"
            "[A]\nNumberOfProfiles=3\nProfile3=n.wlp\nProfile1=m.wlp\nProfile4=beyond.wlp\n"
            "profile1=second spelling.wlp\nExpand=1\n");
  run.manager().MergeCategoriesINIFile("p", "*.wlp", "wlp", "", true);
  EXPECT_EQ((Entries{"[main]\nNumberOfCategories=2\nCategory1=A\nCategory2=B\n[A]\n"
                     "NumberOfProfiles=3\nProfile1=/x/a.wlp\nProfile2=<dst>/p/m.wlp\n"
                     "Profile3=<dst>/p/n.wlp\nExpand=1\n[B]\nNumberOfProfiles=0\nExpand=\n"}),
            run.ReadDst({"p/categories.ini"}));
}

}  // namespace
}  // namespace vxtest
