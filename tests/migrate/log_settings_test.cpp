// The log-analysis settings rewrites: the old single cookie definition becomes the numbered form
// between the right versions only, and the company table limit follows the old top-list length.

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "migrate/settings_fixture.h"

namespace vxtest {
namespace {

const char kLogSettings[] = "vxm_log/vxm_log.ini";
const char kConverted[] = "New-style cookie created in vxm_log.ini";

std::string OldCookie(const std::string& validate, const std::string& plugin, const char* eol) {
  std::string text = std::string("[Defaults]") + eol + "MaxTopCount=100" + eol + "[Cookie]" + eol +
                     "Enable=1" + eol;
  if (!validate.empty()) text += "Validate=" + validate + eol;
  if (!plugin.empty()) text += "VantixPlugin=" + plugin + eol;
  return text + "CookieText=Session id" + eol + "CookieString=SID" + eol;
}

struct CookieCase {
  const char* name;
  std::string validate;
  std::string plugin;
  std::vector<std::string> cookie0;
};

class CookieConversion : public ::testing::TestWithParam<CookieCase> {};

TEST_P(CookieConversion, GivesTheNumberedDefinition) {
  for (const char* eol : {"\n", "\r\n"}) {
    SettingsRun run("pavsuite", "pavsuite", "5.0", "5.5");
    WriteFile(run.Dst(kLogSettings), OldCookie(GetParam().validate, GetParam().plugin, eol));
    EXPECT_EQ(0, run.manager().DoVXMLogINIChange());
    EXPECT_EQ((std::vector<std::string>{"NumCookies=1", "Global=1"}),
              SectionLines(run.Dst(kLogSettings), "Cookie"));
    EXPECT_EQ(GetParam().cookie0, SectionLines(run.Dst(kLogSettings), "Cookie0"));
    EXPECT_EQ(std::vector<std::string>{kConverted}, run.Logged());
    if (std::string(eol) == "\r\n") {
      // A CRLF file stays one: new lines take the file's own line end.
      std::string text = ReadFile(run.Dst(kLogSettings));
      for (size_t at = text.find('\n'); at != std::string::npos; at = text.find('\n', at + 1)) {
        ASSERT_TRUE(at > 0 && text[at - 1] == '\r') << text;
      }
    }
  }
}

INSTANTIATE_TEST_SUITE_P(
    Cases, CookieConversion,
    ::testing::Values(
        CookieCase{"NamedCookie", "1", "0",
                   {"Name=Default Cookie", "Enabled=1", "Type=2", "Key=SID"}},
        CookieCase{"NotValidated", "0", "1", {"Name=Default Cookie", "Enabled=1", "Type=0"}},
        CookieCase{"ProductPlugin", "1", "1", {"Name=Default Cookie", "Enabled=1", "Type=1"}}),
    [](const ::testing::TestParamInfo<CookieCase>& info) { return info.param.name; });

TEST(CookieConversion, KeepsTheNewInstallationsCountAndEnableValue) {
  SettingsRun run("pavsuite", "pavsuite", "5.0", "5.5");
  WriteFile(run.Dst(kLogSettings),
            "[Cookie]\nNumCookies=3\nEnable=0\nVantixPlugin=1\n[Cookie0]\nName=Mine\n");
  EXPECT_EQ(0, run.manager().DoVXMLogINIChange());
  EXPECT_EQ(std::vector<std::string>{"NumCookies=3"}, SectionLines(run.Dst(kLogSettings), "Cookie"));
  EXPECT_EQ((std::vector<std::string>{"Name=Default Cookie", "Enabled=0", "Type=1"}),
            SectionLines(run.Dst(kLogSettings), "Cookie0"));
}

struct GateCase {
  const char* name;
  const char* sourceProduct;
  const char* destinationProduct;
  const char* sourceVersion;
  const char* destinationVersion;
  bool converts;
};

class CookieVersionGate : public ::testing::TestWithParam<GateCase> {};

TEST_P(CookieVersionGate, ConvertsOnlyFromBeforeToAfterTheMiddleOfALine) {
  const GateCase& c = GetParam();
  SettingsRun run(c.sourceProduct, c.destinationProduct, c.sourceVersion, c.destinationVersion);
  const std::string old = "; cookie settings\r\n[Cookie]\r\nEnable = 1\r\nCookieString=SID\r\n";
  WriteFile(run.Dst(kLogSettings), old);
  EXPECT_EQ(0, run.manager().DoVXMLogINIChange());
  if (c.converts) {
    EXPECT_EQ(std::vector<std::string>{kConverted}, run.Logged());
    EXPECT_NE(old, ReadFile(run.Dst(kLogSettings)));
  } else {
    EXPECT_TRUE(run.Logged().empty());
    EXPECT_EQ(old, ReadFile(run.Dst(kLogSettings)));  // saved, and byte for byte as it was
  }
}

INSTANTIATE_TEST_SUITE_P(
    Cases, CookieVersionGate,
    ::testing::Values(GateCase{"From50To55", "pavsuite", "pavsuite", "5.0", "5.5", true},
                      GateCase{"From55To60", "pavsuite", "pavsuite", "5.5", "6.0", false},
                      GateCase{"From45To55", "pavsuite", "pavsuite", "4.5", "5.5", false},
                      GateCase{"From47To55", "pavsuite", "pavsuite", "4.7", "5.5", false},
                      GateCase{"From50To60", "pavsuite", "pavsuite", "5.0", "6.0", false},
                      GateCase{"LogFrom60To65", "log", "log", "6.0", "6.5", true},
                      GateCase{"IntoLog55", "pavsuite", "log", "5.0", "5.5", false},
                      GateCase{"FromLog60IntoPav55", "log", "pavsuite", "6.0", "5.5", true}),
    [](const ::testing::TestParamInfo<GateCase>& info) { return info.param.name; });

TEST(CookieConversion, FileWithoutOldCookieIsSavedUnchanged) {
  SettingsRun run("pavsuite", "pavsuite", "5.0", "5.5");
  const std::string text = "# comment\n[Cookie]\nNumCookies = 2\n\n[Cookie0]\nName=A ; x\n";
  WriteFile(run.Dst(kLogSettings), text);
  EXPECT_EQ(0, run.manager().DoVXMLogINIChange());
  EXPECT_EQ(text, ReadFile(run.Dst(kLogSettings)));
  EXPECT_TRUE(run.Logged().empty());
}

TEST(LogSettings, MissingFileIsNotCreated) {
  SettingsRun run("pavsuite", "pavsuite", "5.0", "5.5");
  EXPECT_EQ(1, run.manager().DoVXMLogINIChange());
  EXPECT_EQ(1, run.manager().DoTableLimitINIChange());
  EXPECT_FALSE(FileExists(run.Dst(kLogSettings)));
  EXPECT_TRUE(run.Logged().empty());
}

struct LimitCase {
  const char* name;
  const char* defaults;  // the "[Defaults]" section's lines
  const char* limit;
};

class TableLimit : public ::testing::TestWithParam<LimitCase> {};

TEST_P(TableLimit, IsTheNextThousandAboveTheTopCount) {
  SettingsRun run("pavsuite", "pavsuite", "5.0", "5.5");
  WriteFile(run.Dst(kLogSettings), std::string("[Defaults]\n") + GetParam().defaults);
  EXPECT_EQ(0, run.manager().DoTableLimitINIChange());
  EXPECT_EQ(std::vector<std::string>{std::string("TopCompanies=") + GetParam().limit},
            SectionLines(run.Dst(kLogSettings), "MaxTableSizes"));
}

INSTANTIATE_TEST_SUITE_P(
    Cases, TableLimit,
    ::testing::Values(LimitCase{"Missing", "Other=5\n", "1000"},
                      LimitCase{"Empty", "MaxTopCount=\n", "1000"},
                      LimitCase{"Small", "MaxTopCount=250\n", "1000"},
                      LimitCase{"BetweenThousands", "MaxTopCount=2500\n", "3000"},
                      LimitCase{"ExactThousandMovesUp", "MaxTopCount=3000\n", "4000"},
                      LimitCase{"TopItself", "MaxTopCount=99000\n", "99000"},
                      LimitCase{"Large", "MaxTopCount=150000\n", "150000"},
                      LimitCase{"Negative", "MaxTopCount=-2500\n", "1000"},
                      LimitCase{"Garbage", "MaxTopCount=lots\n", "1000"},
                      LimitCase{"HugeIsHeld", "MaxTopCount=99999999999999999999\n", "1000000"}),
    [](const ::testing::TestParamInfo<LimitCase>& info) { return info.param.name; });

TEST(TableLimit, ExistingLimitIsKept) {
  SettingsRun run("pavsuite", "pavsuite", "5.0", "5.5");
  const std::string text = "[Defaults]\r\nMaxTopCount=5000\r\n[MaxTableSizes]\r\nTopCompanies=200\r\n";
  WriteFile(run.Dst(kLogSettings), text);
  EXPECT_EQ(0, run.manager().DoTableLimitINIChange());
  EXPECT_EQ(text, ReadFile(run.Dst(kLogSettings)));
}

}  // namespace
}  // namespace vxtest
