// The Halden log settings merged into the OBX server settings, and the folder-wide INI merge.

#include <cstdio>
#include <string>
#include <vector>

#include "edition/halden_to_obx.h"
#include "tests/edition/edition_fixture.h"

namespace {

using vxtest::EditionRun;
using vxtest::ReadFile;
using vxtest::WriteFile;

TEST(EditionLogSettings, MergesAndConvertsIntoServerSettings) {
  EditionRun run;
  HaldenToOBXHelper(run.manager()).DoVXMLogINIMigrate();
  EXPECT_EQ(ReadFile(run.dst() + "/vxm_vxx/vxm_vxx.ini"),
            "; OBX reporting server settings\n[defaults]\nprofilesdir=vxm_vxx/datfiles/profiles\n"
            "DownloadTypes={exe,0} {zip,0} {pdf,1} {msi,0} \nTitleCacheLifespan=2\n"
            "DocumentTypes={htm,0} {html,0} {asp,0} \nUseGlobalSubProfileFilters=0\n"
            "MaxTopCount=2500\nuseglobalcontentgroups=0\nuseglobalpathsanalysisprofiles=0\n"
            "useglobalquerystrings=0\n\n[cookie]\nvalidatetype=0\nvantixplugin=1\n"
            "CookieString=SHOPSID\n\n[server]\nPort=8088\n[Mail]\nSmtpServer=mail.example.com\n");
  EXPECT_EQ(run.NewLog(), std::vector<std::string>{"vxm_log.ini merged with vxm_vxx.ini"});
}

struct KeyCase {
  const char* halden;  // the Halden file
  const char* line;    // a line the server settings must hold; "!key" when no line may set key
};

class EditionLogSettingsKeys : public testing::TestWithParam<KeyCase> {};

TEST_P(EditionLogSettingsKeys, ConvertsOneKey) {
  EditionRun run("3.0", {}, "halsuite", false);
  WriteFile(run.src() + "/vxm_log/vxm_log.ini", GetParam().halden);
  WriteFile(run.dst() + "/vxm_vxx/vxm_vxx.ini", "[defaults]\nDownloadTypes={exe,0}\n");
  HaldenToOBXHelper(run.manager()).DoVXMLogINIMigrate();
  const std::string settings = "\n" + ReadFile(run.dst() + "/vxm_vxx/vxm_vxx.ini");
  const std::string line = GetParam().line;
  if (line[0] == '!') {
    EXPECT_EQ(settings.find("\n" + line.substr(1) + "="), std::string::npos) << settings;
  } else {
    EXPECT_NE(settings.find("\n" + line + "\n"), std::string::npos) << settings;
  }
}

INSTANTIATE_TEST_SUITE_P(
    Cases, EditionLogSettingsKeys,
    testing::Values(
        KeyCase{"[Defaults]\nDownloadTypes={exe,1} zip\n", "DownloadTypes={exe,1} {zip,0} "},
        KeyCase{"[Defaults]\nDownloadTypes=\n", "DownloadTypes={exe,0}"},
        KeyCase{"[Defaults]\nDocumentTypes=htm\n", "DocumentTypes={htm,0} "},
        KeyCase{"[Defaults]\nTitleCacheLifespan=86399\n", "TitleCacheLifespan=0"},
        KeyCase{"[Defaults]\nTitleCacheLifespan=259200\n", "TitleCacheLifespan=3"},
        KeyCase{"[Defaults]\nMaxTopCount=1\n", "TitleCacheLifespan=0"},
        KeyCase{"[Defaults]\nTitleCacheLifespan=soon\n", "TitleCacheLifespan=0"},
        KeyCase{"[cookie]\nvantixplugin=0\n", "validatetype=1"},
        KeyCase{"[cookie]\nvantixplugin=yes\n", "validatetype=1"},
        KeyCase{"[cookie]\nvantixplugin=1\n", "validatetype=0"},
        KeyCase{"[cookie]\nCookieString=x\n", "!validatetype"},
        KeyCase{"[Defaults]\nUseGlobalSubProfileFilters=1\n", "!useglobalquerystrings"},
        KeyCase{"[Defaults]\nUseGlobalSubProfileFilters=0\n", "useglobalpathsanalysisprofiles=0"}));

TEST(EditionLogSettings, MissingHaldenFileLeavesServerSettingsUntouched) {
  EditionRun run;
  const std::string before = ReadFile(run.dst() + "/vxm_vxx/vxm_vxx.ini");
  std::remove((run.src() + "/vxm_log/vxm_log.ini").c_str());
  HaldenToOBXHelper(run.manager()).DoVXMLogINIMigrate();
  EXPECT_EQ(ReadFile(run.dst() + "/vxm_vxx/vxm_vxx.ini"), before);
  EXPECT_EQ(run.NewLog(),
            (std::vector<std::string>{
                "Error: Unable to open file:   " + run.src() + "/vxm_log/vxm_log.ini",
                "vxm_log.ini merged with vxm_vxx.ini"}));
}

TEST(EditionLogSettings, UnreadableServerSettingsAreNeverReplaced) {
  EditionRun run;
  const std::string binary("[defaults]\n\0\0", 13);
  WriteFile(run.dst() + "/vxm_vxx/vxm_vxx.ini", binary);
  HaldenToOBXHelper(run.manager()).DoVXMLogINIMigrate();
  EXPECT_EQ(ReadFile(run.dst() + "/vxm_vxx/vxm_vxx.ini"), binary);
  EXPECT_EQ(run.NewLog().front(),
            "Error: Unable to open file:   " + run.dst() + "/vxm_vxx/vxm_vxx.ini");
}

TEST(EditionLogSettings, MergesEveryINIFileOfAFolder) {
  EditionRun run;
  WriteFile(run.src() + "/lang/a.ini", "[s]\nold=1\n");
  WriteFile(run.src() + "/lang/b.ini", "[s]\nk=2\n");
  WriteFile(run.src() + "/lang/notes.txt", "x");
  WriteFile(run.dst() + "/lang/a.ini", "[s]\nnew=1\n");
  HaldenToOBXHelper(run.manager())
      .DoMergeINIFilesInFolder(vxStringBase((run.src() + "/lang").c_str()),
                               vxStringBase((run.dst() + "/lang").c_str()));
  EXPECT_EQ(ReadFile(run.dst() + "/lang/a.ini"), "[s]\nnew=1\nold=1\n");
  EXPECT_EQ(ReadFile(run.dst() + "/lang/b.ini"), "[s]\nk=2\n");
  EXPECT_FALSE(vxtest::FileExists(run.dst() + "/lang/notes.txt"));
}

}  // namespace
