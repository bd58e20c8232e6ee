// The user's own report languages are carried over; the four shipped ones never are.

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "migrate/profiles_fixture.h"

namespace vxtest {
namespace {

using Entries = std::vector<std::string>;

TEST(DoCopyLanguageFiles, CopiesOnlyTheUsersOwnLanguagesIntoTheNewFolder) {
  Installations run;
  for (const char* shipped : {"english", "Spanish", "GERMAN", "french"}) {
    WriteFile(run.Src(std::string("lang/") + shipped + ".rpl"), "shipped");
  }
  WriteFile(run.Src("lang/italian.rpl"), "ciao");
  WriteFile(run.Src("lang/klingon.rpl"), "nuqneH");
  WriteFile(run.Src("lang/english_uk.rpl"), "cheers");
  WriteFile(run.Src("lang/notes.txt"), "not a language");
  WriteFile(run.Src("lang/old/dutch.rpl"), "not descended into");
  WriteFile(run.Dst("reports/lang/english.rpl"), "new english");
  WriteFile(run.Dst("reports/lang/klingon.rpl"), "older klingon");

  EXPECT_EQ(0, run.manager().DoCopyLanguageFiles("lang", "reports/lang"));

  EXPECT_EQ((Entries{"reports", "reports/lang", "reports/lang/english.rpl",
                     "reports/lang/english_uk.rpl", "reports/lang/italian.rpl",
                     "reports/lang/klingon.rpl"}),
            run.DestinationTree());
  EXPECT_EQ("new english", ReadFile(run.Dst("reports/lang/english.rpl")));
  // A language file of the same name is replaced: the user's translation is the one to keep.
  EXPECT_EQ("nuqneH", ReadFile(run.Dst("reports/lang/klingon.rpl")));
  EXPECT_EQ((Entries{"Language file copied: " + run.Src("lang/english_uk.rpl"),
                     "Language file copied: " + run.Src("lang/italian.rpl"),
                     "Language file copied: " + run.Src("lang/klingon.rpl")}),
            run.RunLog());
}

}  // namespace
}  // namespace vxtest
