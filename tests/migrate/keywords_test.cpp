// Search-engine merges: the new installation's engines keep their numbers and gain the old
// settings; engines only the old installation has are appended under fresh numbers.

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "migrate/settings_fixture.h"

namespace vxtest {
namespace {

const char kNewKeywords[] =
    "; search engines of this installation\n"
    "[SearchEngines]\n"
    "Engine1=Google\n"
    "Engine2=Bing\n"
    "\n"
    "[Google]\n"
    "Domain=google.\n"
    "Query=q\n"
    "Charset=utf-8\n"
    "\n"
    "[Bing]\n"
    "Domain=bing.com\n"
    "Query=q\n";

TEST(KeywordMerge, KeepsNumbersUpdatesKnownEnginesAndAppendsNewOnes) {
  SettingsRun run("pavsuite", "pavsuite", "5.0", "5.5");
  WriteFile(run.Src("keywords.ini"),
            "[SearchEngines]\r\nEngine1=AltaVista\r\nEngine2=Google\r\nEngine3=\r\n"
            "[AltaVista]\r\nDomain=altavista.com\r\nQuery=q\r\n"
            "[Google]\r\nQuery=search\r\nLegacy=1\r\n");
  WriteFile(run.Dst("keywords.ini"), kNewKeywords);
  EXPECT_EQ(0, run.manager().DoKeywordINIMerge());

  const std::string merged = run.Dst("keywords.ini");
  EXPECT_EQ((std::vector<std::string>{"Engine1=Google", "Engine2=Bing", "Engine3=AltaVista"}),
            SectionLines(merged, "SearchEngines"));
  // The old settings win for the keys the old file holds; the new file's other keys stay.
  EXPECT_EQ((std::vector<std::string>{"Domain=google.", "Query=search", "Charset=utf-8", "Legacy=1"}),
            SectionLines(merged, "Google"));
  EXPECT_EQ((std::vector<std::string>{"Domain=bing.com", "Query=q"}), SectionLines(merged, "Bing"));
  EXPECT_EQ((std::vector<std::string>{"Domain=altavista.com", "Query=q"}),
            SectionLines(merged, "AltaVista"));
  EXPECT_EQ(std::vector<std::string>{"keywords.ini merged"}, run.Logged());

  // The untouched start of the file is kept byte for byte, comment included.
  const std::string text = ReadFile(merged);
  EXPECT_EQ(0u, text.find("; search engines of this installation\n[SearchEngines]\n"
                          "Engine1=Google\nEngine2=Bing\n"));
  EXPECT_NE(std::string::npos, text.find("\n[Bing]\nDomain=bing.com\nQuery=q\n"));
}

TEST(KeywordMerge, AddedEngineNeverTakesAnExistingNumber) {
  SettingsRun run("pavsuite", "pavsuite", "5.0", "5.5");
  WriteFile(run.Src("keywords.ini"), "[SearchEngines]\nEngine1=Lycos\nEngine2=Excite\n");
  WriteFile(run.Dst("keywords.ini"), "[SearchEngines]\nEngine2=Google\nEngine3=Bing\n");
  EXPECT_EQ(0, run.manager().DoKeywordINIMerge());
  EXPECT_EQ((std::vector<std::string>{"Engine2=Google", "Engine3=Bing", "Engine4=Lycos",
                                      "Engine5=Excite"}),
            SectionLines(run.Dst("keywords.ini"), "SearchEngines"));
  EXPECT_EQ(std::vector<std::string>{"<none>"}, SectionLines(run.Dst("keywords.ini"), "Lycos"));
}

TEST(KeywordMerge, NamesCompareExactly) {
  SettingsRun run("pavsuite", "pavsuite", "5.0", "5.5");
  WriteFile(run.Src("keywords.ini"), "[SearchEngines]\nEngine1=google\nEngine2=Bing\nEngine3=Bing\n");
  WriteFile(run.Dst("keywords.ini"), "[SearchEngines]\nEngine1=Google\n");
  EXPECT_EQ(0, run.manager().DoKeywordINIMerge());
  // The known names are those of the new file only: an engine the old file lists twice comes
  // twice, as the old file had it.
  EXPECT_EQ((std::vector<std::string>{"Engine1=Google", "Engine2=google", "Engine3=Bing",
                                      "Engine4=Bing"}),
            SectionLines(run.Dst("keywords.ini"), "SearchEngines"));
}

struct RefusalCase {
  const char* name;
  const char* source;       // null: no file
  const char* destination;  // null: no file
};

class KeywordRefusal : public ::testing::TestWithParam<RefusalCase> {};

TEST_P(KeywordRefusal, LeavesTheDestinationAlone) {
  SettingsRun run("pavsuite", "pavsuite", "5.0", "5.5");
  if (GetParam().source != nullptr) WriteFile(run.Src("keywords.ini"), GetParam().source);
  if (GetParam().destination != nullptr) WriteFile(run.Dst("keywords.ini"), GetParam().destination);
  EXPECT_EQ(1, run.manager().DoKeywordINIMerge());
  EXPECT_EQ(GetParam().destination != nullptr ? GetParam().destination : "<missing>",
            ReadFile(run.Dst("keywords.ini")));
  EXPECT_TRUE(run.Logged().empty());
}

INSTANTIATE_TEST_SUITE_P(
    Cases, KeywordRefusal,
    ::testing::Values(
        RefusalCase{"NoSource", nullptr, "[SearchEngines]\nEngine1=A\n"},
        RefusalCase{"NoDestination", "[SearchEngines]\nEngine1=A\n", nullptr},
        RefusalCase{"SourceWithoutEngines", "[A]\nx=1\n", "[SearchEngines]\nEngine1=B\n"},
        RefusalCase{"DestinationWithoutEngines", "[SearchEngines]\nEngine1=A\n", "[B]\nx=1\n"}),
    [](const ::testing::TestParamInfo<RefusalCase>& info) { return info.param.name; });

}  // namespace
}  // namespace vxtest
