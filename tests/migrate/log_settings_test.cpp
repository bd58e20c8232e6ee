// The main settings merge and the log-analysis settings rewrites that follow it (the old single
// cookie definition becomes the numbered form between the right versions only, and the company
// table limit follows the old top-list length), and the search-engine merge: the new
// installation's engines keep their numbers and gain the old settings, engines only the old
// installation has are appended under fresh numbers.

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "migrate/installations_fixture.h"

namespace vxtest {
namespace {

const char kLogSettings[] = "vxm_log/vxm_log.ini";
const char kConverted[] = "New-style cookie created in vxm_log.ini";
// A pavsuite run from 5.0 to 5.5, across the cookie change.
const Entries kUpgrade = RunArgs("pavsuite", "pavsuite", "5.0", "5.5");

// In place the old file is the installer's backup. The new value wins; the old file's other
// settings are added, as the log_to_log sample run shows side by side.
TEST(MainSettingsMerge, MergesTheInPlaceBackupThenConvertsCookies) {
  Installations run(kUpgrade, true);
  WriteFile(run.Dst("vantix.vxinibak"), "[Main]\r\nLanguage=German\r\nPort=81\r\n[Old]\r\nA=1\r\n");
  WriteFile(run.Dst("vantix.ini"), "; new\r\n[Main]\r\nPort=8080\r\n");
  WriteFile(run.Dst(kLogSettings), "[Cookie]\nEnable=1\n");
  EXPECT_EQ(0, run.manager().DoVantixINIMerge());
  EXPECT_EQ("; new\r\n[Main]\r\nPort=8080\r\nLanguage=German\r\n[Old]\r\nA=1\r\n",
            ReadFile(run.Dst("vantix.ini")));
  EXPECT_EQ((Entries{"INI file merged: <src>/vantix.vxinibak", kConverted}), run.RunLog());
}

TEST(MainSettingsMerge, MissingFilesAreNotCreatedAndMissingDestinationTakesACopy) {
  Installations run(kUpgrade);
  EXPECT_EQ(0, run.manager().DoVantixINIMerge());
  EXPECT_EQ(1, run.manager().DoVXMLogINIChange());
  EXPECT_EQ(1, run.manager().DoTableLimitINIChange());
  EXPECT_EQ(Entries{"vxmigrate.log"}, ListTree(run.Dst()));
  WriteFile(run.Src("vantix.ini"), "[Main]\nPort=81\n");
  WriteFile(run.Dst(kLogSettings), "[Cookie]\nEnable=1\n");
  EXPECT_EQ(0, run.manager().DoVantixINIMerge());
  EXPECT_EQ("[Main]\nPort=81\n", ReadFile(run.Dst("vantix.ini")));
  EXPECT_EQ((Entries{"INI file doesn't exist - file being copied: <src>/vantix.ini", kConverted}),
            run.RunLog());
}

// "[Cookie]" and the given lines, each "|" standing for the line end under test.
std::string CookieFile(const char* lines, const std::string& eol) {
  std::string text = std::string("[Cookie]|") + lines;
  for (size_t at; (at = text.find('|')) != std::string::npos;) text.replace(at, 1, eol);
  return text;
}

TEST(CookieConversion, GivesTheNumberedDefinitionInTheFilesOwnLineEnds) {
  // The [Cookie] section's lines, and the file after the conversion (null: saved unchanged).
  const char* const cases[][2] = {
      {"Enable=1|Validate=1|VantixPlugin=0|CookieText=Session id|CookieString=SID|",
       "NumCookies=1|Global=1|[Cookie0]|Name=Default Cookie|Enabled=1|Type=2|Key=SID|"},
      {"Enable=1|Validate=0|VantixPlugin=1|CookieString=SID|",
       "NumCookies=1|Global=1|[Cookie0]|Name=Default Cookie|Enabled=1|Type=0|"},
      // The new installation's count is kept.
      {"NumCookies=3|Enable=0|VantixPlugin=1|[Cookie0]|Name=Mine|",
       "NumCookies=3|[Cookie0]|Name=Default Cookie|Enabled=0|Type=1|"},
      {"NumCookies = 2||[Cookie0]|Name=A ; x|", nullptr},
  };
  for (const auto& c : cases) {
    for (const char* eol : {"\n", "\r\n"}) {
      Installations run(kUpgrade);
      WriteFile(run.Dst(kLogSettings), CookieFile(c[0], eol));
      EXPECT_EQ(0, run.manager().DoVXMLogINIChange());
      EXPECT_EQ(CookieFile(c[1] ? c[1] : c[0], eol), ReadFile(run.Dst(kLogSettings)));
      EXPECT_EQ(Entries(c[1] ? 1 : 0, kConverted), run.RunLog());
    }
  }
}

TEST(CookieConversion, OnlyFromBeforeToAfterTheMiddleOfALine) {
  const char* const pav = "pavsuite";
  const char* const cases[][5] = {  // products, versions, and whether the cookie is converted
      {pav, pav, "5.0", "5.5", "yes"},     {pav, pav, "5.5", "6.0", nullptr},
      {pav, pav, "4.7", "5.5", nullptr},   {pav, pav, "5.0", "6.0", nullptr},
      {"log", "log", "6.0", "6.5", "yes"}, {pav, "log", "5.0", "5.5", nullptr},
      {"log", pav, "6.0", "5.5", "yes"}};
  const std::string old = "; cookie settings\r\n[Cookie]\r\nEnable = 1\r\nCookieString=SID\r\n";
  for (const auto& c : cases) {
    SCOPED_TRACE(std::string(c[0]) + " " + c[2] + " -> " + c[1] + " " + c[3]);
    Installations run(RunArgs(c[0], c[1], c[2], c[3]));
    WriteFile(run.Dst(kLogSettings), old);
    EXPECT_EQ(0, run.manager().DoVXMLogINIChange());
    EXPECT_EQ(Entries(c[4] ? 1 : 0, kConverted), run.RunLog());
    // Saved without change, the file stays byte for byte as it was.
    EXPECT_EQ(c[4] != nullptr, old != ReadFile(run.Dst(kLogSettings)));
  }
}

TEST(TableLimit, IsTheNextThousandAboveTheTopCountUnlessAlreadySet) {
  // The [Defaults] section's lines, and the limit added (null: none). An exact thousand moves a
  // step up.
  const char* const cases[][2] = {
      {"Other=5", "1000"}, {"MaxTopCount=250", "1000"}, {"MaxTopCount=2500", "3000"},
      {"MaxTopCount=3000", "4000"}, {"MaxTopCount=99000", "99000"}, {"MaxTopCount=-2500", "1000"},
      {"MaxTopCount=150000", "150000"}, {"MaxTopCount=lots", "1000"},
      {"MaxTopCount=99999999999999999999", "1000000"},
      {"MaxTopCount=5000\r\n[MaxTableSizes]\r\nTopCompanies=200", nullptr},
  };
  for (const auto& c : cases) {
    Installations run(kUpgrade);
    const std::string text = std::string("[Defaults]\r\n") + c[0] + "\r\n";
    WriteFile(run.Dst(kLogSettings), text);
    EXPECT_EQ(0, run.manager().DoTableLimitINIChange());
    EXPECT_EQ(c[1] ? text + "[MaxTableSizes]\r\nTopCompanies=" + c[1] + "\r\n" : text,
              ReadFile(run.Dst(kLogSettings)));
  }
}

TEST(KeywordMerge, KeepsNumbersUpdatesKnownEnginesAndAppendsNewOnes) {
  Installations run(kUpgrade);
  WriteFile(run.Src("keywords.ini"),
            "[SearchEngines]\r\nEngine1=AltaVista\r\nEngine2=Google\r\nEngine3=\r\n"
            "[AltaVista]\r\nDomain=altavista.com\r\nQuery=q\r\n"
            "[Google]\r\nQuery=search\r\nLegacy=1\r\n");
  WriteFile(run.Dst("keywords.ini"),
            "; search engines of this installation\n[SearchEngines]\nEngine1=Google\n"
            "Engine3=Bing\n\n[Google]\nDomain=google.\nQuery=q\nCharset=utf-8\n\n"
            "[Bing]\nDomain=bing.com\nQuery=q\n");
  EXPECT_EQ(0, run.manager().DoKeywordINIMerge());
  // The old settings win for the keys the old file holds; the new file's other keys and its
  // comment and layout stay. The added engine's number is the next free one: Engine3 is taken.
  EXPECT_EQ("; search engines of this installation\n[SearchEngines]\nEngine1=Google\n"
            "Engine3=Bing\nEngine4=AltaVista\n\n[Google]\nDomain=google.\nQuery=search\n"
            "Charset=utf-8\nLegacy=1\n\n[Bing]\nDomain=bing.com\nQuery=q\n"
            "[AltaVista]\nDomain=altavista.com\nQuery=q\n",
            ReadFile(run.Dst("keywords.ini")));
  EXPECT_EQ(Entries{"keywords.ini merged"}, run.RunLog());
}

TEST(KeywordMerge, RefusesWithoutEnginesOnEitherSide) {
  const char* const engines = "[SearchEngines]\nEngine1=A\n";
  const char* const cases[][2] = {  // source, destination; null: no file
      {nullptr, engines}, {engines, nullptr}, {"[A]\nx=1\n", engines}, {engines, "[B]\nx=1\n"}};
  for (const auto& c : cases) {
    Installations run(kUpgrade);
    if (c[0] != nullptr) WriteFile(run.Src("keywords.ini"), c[0]);
    if (c[1] != nullptr) WriteFile(run.Dst("keywords.ini"), c[1]);
    EXPECT_EQ(1, run.manager().DoKeywordINIMerge());
    EXPECT_EQ(c[1] != nullptr ? c[1] : "<missing>", ReadFile(run.Dst("keywords.ini")));
    EXPECT_TRUE(run.RunLog().empty());
  }
}

}  // namespace
}  // namespace vxtest
