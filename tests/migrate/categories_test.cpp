// The categories merge: the destination's categories and entries keep their numbers, the old ones
// are appended pointing at the profiles' new names, duplicates (also within the source) are caught
// ignoring case while category names compare byte for byte, and the source's "Expand" wins.

#include <string>

#include "migrate/installations_fixture.h"

namespace vxtest {
namespace {

TEST(MergeCategoriesINIFile, AppendsOldCategoriesAndEntriesAfterTheDestinationsOwn) {
  Installations run;
  const std::string folder = run.Dst("profiles/");
  WriteFile(run.Dst("profiles/categories.ini"),
            "[main]\nNumberOfCategories=2\nCategory1=Sales\nCategory2=Web\n"
            "[Sales]\nNumberOfProfiles=1\nProfile1=" + folder + "A_VXMIGRATE.WLP\nExpand=0\n"
            "[Web]\nNumberOfProfiles=0\n");
  WriteFile(run.Src("profiles/categories.ini"),
            "[main]\nNumberOfCategories=4\nCategory1=Sales\nCategory2=Support\nCategory3=sales\n"
            "Category4=Samples\n"
            "[Sales]\nNumberOfProfiles=5\nProfile1=C:\\Vantix\\profiles\\a.wlp\n"
            "Profile2=C:\\Vantix\\profiles\\b.wlp\nProfile3=/opt/vantix/profiles/B.wlp\n"
            "Profile4=C:\\Vantix\\profiles\\sample.wlp\nProfile5=c.wlp\nExpand=1\n"
            "[Support]\nNumberOfProfiles=2\nProfile1=C:\\Vantix\\profiles\\d.wlp\n"
            "Profile2=/opt/vantix/profiles/e_vxmigrate.wlp\n"
            "[Samples]\nNumberOfProfiles=1\nProfile1=C:\\Vantix\\profiles\\Sample.wlp\nExpand=1\n");
  run.manager().MergeCategoriesINIFile("profiles", "*.wlp", "wlp", "x.wlp, sample.wlp", false);

  EXPECT_EQ("[main]\nNumberOfCategories=5\nCategory1=Sales\nCategory2=Web\n"
            "Category3=Support\nCategory4=sales\nCategory5=Samples\n"
            "[Sales]\nNumberOfProfiles=3\nProfile1=" + folder + "A_VXMIGRATE.WLP\nExpand=1\n"
            "Profile2=" + folder + "b_vxmigrate.wlp\nProfile3=" + folder + "c_vxmigrate.wlp\n"
            "[Web]\nNumberOfProfiles=0\n"
            "[Support]\nProfile1=" + folder + "d_vxmigrate.wlp\nProfile2=" + folder +
            "e_vxmigrate.wlp\nNumberOfProfiles=2\nExpand=\n"
            "[Samples]\nNumberOfProfiles=0\nExpand=1\n",
            ReadFile(run.Dst("profiles/categories.ini")));
  EXPECT_EQ((Entries{"categories.ini merged: " + folder}), run.RunLog());
}

// Without a source file nothing happens; an unreadable file on either side is reported and
// nothing is written.
TEST(MergeCategoriesINIFile, NeverReplacesAnUnreadableCategoriesFileNorWorksWithoutASource) {
  Installations run;
  const std::string good = "[main]\nNumberOfCategories=1\nCategory1=A\n[A]\nProfile1=a.wlp\n";
  const std::string binary("[main]\nNumberOfCategories=1\0\xff", 30);
  WriteFile(run.Src("p1/categories.ini"), good);
  WriteFile(run.Dst("p1/categories.ini"), binary);
  WriteFile(run.Src("p2/categories.ini"), binary);
  WriteFile(run.Dst("p2/categories.ini"), good);
  WriteFile(run.Dst("p3/categories.ini"), good);
  for (const char* folder : {"p1", "p2", "p3", "p4"}) {
    run.manager().MergeCategoriesINIFile(folder, "*.wlp", "wlp", "", false);
  }
  EXPECT_EQ((Entries{"p1", "p1/categories.ini", "p2", "p2/categories.ini", "p3",
                     "p3/categories.ini"}),
            run.DestinationTree());
  EXPECT_EQ((Entries{binary, good, good}),
            (Entries{ReadFile(run.Dst("p1/categories.ini")), ReadFile(run.Dst("p2/categories.ini")),
                     ReadFile(run.Dst("p3/categories.ini"))}));
  EXPECT_EQ((Entries{"Error: categories.ini cannot be read - not merged: " + run.Dst("p1/categories.ini"),
                     "Error: categories.ini cannot be read - not merged: " + run.Src("p2/categories.ini")}),
            run.RunLog());
}

// Counts far beyond the entries present, gaps, entries beyond the count and a key written twice:
// the counts on disk decide, and the destination's stale entry beyond its count is taken over.
TEST(MergeCategoriesINIFile, TakesTheCountsOnDiskAsTheListsLengthAndKeepsNamesWhenAsked) {
  Installations run;
  WriteFile(run.Dst("profiles/categories.ini"),
            "[main]\nNumberOfCategories=1\nCategory1=A\nCategory2=B\n"
            "[A]\nNumberOfProfiles=1\nProfile1=/x/a.wlp\nProfile2=/x/stale.wlp\n");
  WriteFile(run.Src("profiles/categories.ini"),
            "[main]\nNumberOfCategories=2000000000\nCategory1=A\nCategory3=B\n"
            "[A]\nNumberOfProfiles=3\nProfile3=n.wlp\nProfile1=m.wlp\nProfile4=beyond.wlp\n"
            "profile1=second spelling.wlp\nExpand=1\n");
  run.manager().MergeCategoriesINIFile("profiles", "*.wlp", "wlp", "", true);

  const std::string folder = run.Dst("profiles/");
  EXPECT_EQ("[main]\nNumberOfCategories=2\nCategory1=A\nCategory2=B\n"
            "[A]\nNumberOfProfiles=3\nProfile1=/x/a.wlp\nProfile2=" + folder + "m.wlp\n"
            "Profile3=" + folder + "n.wlp\nExpand=1\n[B]\nNumberOfProfiles=0\nExpand=\n",
            ReadFile(run.Dst("profiles/categories.ini")));
}

}  // namespace
}  // namespace vxtest
