// The main settings merge: the old "vantix.ini" (its backup in an in-place run) is merged into the
// new one, and the log-analysis settings change runs after it whatever became of the merge.

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "migrate/settings_fixture.h"

namespace vxtest {
namespace {

const char kOldCookie[] = "[Cookie]\nEnable=1\nValidate=0\n";
const char kConverted[] = "New-style cookie created in vxm_log.ini";

TEST(MainSettingsMerge, SideBySideMergesTheOldFileThenConvertsCookies) {
  SettingsRun run("pavsuite", "pavsuite", "5.0", "5.5");
  WriteFile(run.Src("vantix.ini"), "[Main]\r\nLanguage=German\r\nPort=81\r\n[Old]\r\nA=1\r\n");
  WriteFile(run.Dst("vantix.ini"), "; new\r\n[Main]\r\nPort=8080\r\n");
  WriteFile(run.Dst("vxm_log/vxm_log.ini"), kOldCookie);
  EXPECT_EQ(0, run.manager().DoVantixINIMerge());

  const std::string merged = ReadFile(run.Dst("vantix.ini"));
  EXPECT_EQ(0u, merged.find("; new\r\n[Main]\r\nPort=8080\r\n"));  // the new value wins
  EXPECT_NE(std::string::npos, merged.find("Language=German\r\n"));
  EXPECT_NE(std::string::npos, merged.find("[Old]\r\nA=1"));
  EXPECT_EQ((std::vector<std::string>{"INI file merged: " + run.Src("vantix.ini"), kConverted}),
            run.Logged());
}

TEST(MainSettingsMerge, InPlaceReadsTheBackup) {
  auto run = SettingsRun::InPlace("pavsuite", "pavsuite", "5.0", "5.5");
  WriteFile(run->Dst("vantix.vxinibak"), "[Main]\nLanguage=German\nPort=81\n");
  WriteFile(run->Dst("vantix.ini"), "[Main]\nPort=8080\n");
  EXPECT_EQ(0, run->manager().DoVantixINIMerge());
  EXPECT_EQ("[Main]\nPort=8080\nLanguage=German\n", ReadFile(run->Dst("vantix.ini")));
  EXPECT_EQ(std::vector<std::string>{"INI file merged: " + run->Dst("vantix.vxinibak")},
            run->Logged());
}

TEST(MainSettingsMerge, MissingDestinationTakesACopy) {
  SettingsRun run("pavsuite", "pavsuite", "5.0", "5.5");
  WriteFile(run.Src("vantix.ini"), "[Main]\nPort=81\n");
  EXPECT_EQ(0, run.manager().DoVantixINIMerge());
  EXPECT_EQ("[Main]\nPort=81\n", ReadFile(run.Dst("vantix.ini")));
  EXPECT_EQ(std::vector<std::string>{"INI file doesn't exist - file being copied: " +
                                     run.Src("vantix.ini")},
            run.Logged());
}

TEST(MainSettingsMerge, CookiesConvertEvenWithoutMainSettings) {
  SettingsRun run("pavsuite", "pavsuite", "5.0", "5.5");
  WriteFile(run.Dst("vxm_log/vxm_log.ini"), kOldCookie);
  EXPECT_EQ(0, run.manager().DoVantixINIMerge());
  EXPECT_FALSE(FileExists(run.Dst("vantix.ini")));
  EXPECT_EQ(std::vector<std::string>{kConverted}, run.Logged());
}

}  // namespace
}  // namespace vxtest
