// One Halden file converted under one destination version and source product: the line the OBX
// file must then hold (or must not hold, for a line written "!text").

#include <string>

#include "edition/halden_to_obx.h"
#include "tests/edition/edition_fixture.h"

namespace {

enum Step { kLogSettings, kTemplates, kProfiles };

struct Case {
  Step step;
  const char* version;
  const char* product;
  const char* halden;  // the content of the Halden file the step reads
  const char* line;
};

const char* HaldenFile(Step step) {
  return step == kLogSettings ? "/vxm_log/vxm_log.ini"
         : step == kTemplates ? "/vxm_log/datfiles/Daily.mss"
                              : "/vxm_log/datfiles/site.wlp";
}

const char* OBXFile(Step step) {
  return step == kLogSettings ? "/vxm_vxx/vxm_vxx.ini"
         : step == kTemplates ? "/vxm_vxx/Daily_vxmigrate.wct"
                              : "/vxm_vxx/datfiles/profiles/site_vxmigrate.wlp";
}

class EditionCase : public testing::TestWithParam<Case> {};

TEST_P(EditionCase, WritesTheLine) {
  const Case& c = GetParam();
  vxtest::EditionRun run(c.version, {}, c.product);
  vxtest::WriteFile(run.src() + HaldenFile(c.step), vxtest::ExpandCredentials(c.halden));
  HaldenToOBXHelper helper(run.manager());
  if (c.step == kLogSettings) helper.DoVXMLogINIMigrate();
  if (c.step == kTemplates) helper.DoHaldenToOBXTemplateFileMigrate();
  if (c.step == kProfiles) helper.DoHaldenToOBXProfileFileMigrate();
  const std::string text = "\n" + vxtest::ReadFile(run.dst() + OBXFile(c.step)) + "\n";
  const std::string line = vxtest::ExpandCredentials(c.line);
  if (line[0] == '!') {
    EXPECT_EQ(text.find("\n" + line.substr(1)), std::string::npos) << text;
  } else {
    EXPECT_NE(text.find("\n" + line + "\n"), std::string::npos) << text;
  }
}

// A template whose one report section is a graph.
#define GRAPH_TEMPLATE                                                   \
  "[SaveAs]\nSaveReportAs=d.htm\n[content]\nSection0_ItemType=1\n" \
  "Section0_Name=TopPages_SectionItem\n"

INSTANTIATE_TEST_SUITE_P(
    LogSettings, EditionCase,
    testing::Values(
        Case{kLogSettings, "3.0", "halsuite", "[Defaults]\nDownloadTypes={exe,1} zip\n",
             "DownloadTypes={exe,1} {zip,0} "},
        Case{kLogSettings, "3.0", "halsuite", "[Defaults]\nDownloadTypes=\n",
             "DownloadTypes={exe,0}"},
        Case{kLogSettings, "3.0", "halsuite", "[Defaults]\nTitleCacheLifespan=86399\n",
             "TitleCacheLifespan=0"},
        Case{kLogSettings, "3.0", "halsuite", "[Defaults]\nTitleCacheLifespan=259200\n",
             "TitleCacheLifespan=3"},
        Case{kLogSettings, "3.0", "halsuite", "[Defaults]\nTitleCacheLifespan=soon\n",
             "TitleCacheLifespan=0"},
        Case{kLogSettings, "3.0", "halsuite", "[Defaults]\n", "TitleCacheLifespan=0"},
        Case{kLogSettings, "3.0", "halsuite", "[cookie]\nvantixplugin=0\n", "validatetype=1"},
        Case{kLogSettings, "3.0", "halsuite", "[cookie]\nvantixplugin=yes\n", "validatetype=1"},
        Case{kLogSettings, "3.0", "halsuite", "[Defaults]\nUseGlobalSubProfileFilters=1\n",
             "!useglobal"}));

// Spreadsheets came with version 3; the last three characters decide, in any letter case. A
// graph type outside the table is a line graph.
INSTANTIATE_TEST_SUITE_P(
    Templates, EditionCase,
    testing::Values(
        Case{kTemplates, "2.5", "halsuite", "[SaveAs]\nSaveReportAs=d.doc\n", "[general]"},
        Case{kTemplates, "2.5", "halsuite", "[SaveAs]\nSaveReportAs=d.xls\n", "![general]"},
        Case{kTemplates, "3.0", "halsuite", "[SaveAs]\nSaveReportAs=D.HTM\n", "[general]"},
        Case{kTemplates, "3.0", "halsuite", "[SaveAs]\nSaveReportAs=d.txt\n", "![general]"},
        Case{kTemplates, "3.0", "halsuite", "[SaveAs]\nSaveReportAs=htm\n", "![general]"},
        Case{kTemplates, "3.0", "halsuite", "[SaveAs]\nSaveReportAs=d.xls\n", "[general]"},
        Case{kTemplates, "3.0", "halsuite", GRAPH_TEMPLATE, "graphtype=SINGLEBAR"},
        Case{kTemplates, "3.0", "halsuite", GRAPH_TEMPLATE "Section0_GraphType=8\n",
             "graphtype=MULTILINE"},
        Case{kTemplates, "3.0", "halsuite", GRAPH_TEMPLATE "Section0_GraphType=\n",
             "graphtype=MULTILINE"}));

// Early OBX versions read the home page user name in clear, later ones only in protected form;
// major and minor number are each compared by themselves, so 2.9 counts as late. Warehouses are
// a Tradequill matter.
INSTANTIATE_TEST_SUITE_P(
    Profiles, EditionCase,
    testing::Values(
        Case{kProfiles, "3.1", "halsuite", "[Profile]\nHomePageUsername={legacy:web}\n",
             "HomePageUsername=web"},
        Case{kProfiles, "3.1.a", "halsuite", "[Profile]\nHomePageUsername={legacy:web}\n",
             "HomePageUsername=web"},
        Case{kProfiles, "2.1", "halsuite", "[Profile]\nHomePageUsername={legacy:web}\n",
             "HomePageUsername=web"},
        Case{kProfiles, "2.9", "halsuite", "[Profile]\nHomePageUsername={legacy:web}\n",
             "HomePageUsername={protected:web}"},
        Case{kProfiles, "4.0", "halsuite", "[Profile]\nHomePageUsername={protected:web}\n",
             "HomePageUsername={protected:web}"},
        Case{kProfiles, "3.0", "halsuite", "[Profile]\nHomePageName=/index.html\n",
             "HomePageDefaults=index.html\nHomePageBaseDir="},
        Case{kProfiles, "3.0", "tradeq",
             "[Profile]\nLogFilePath=warehouse:Sales\nLogFileUsername={legacy:dw}\n"
             "LogFilePassword={legacy:pw}\n",
             "[wdwexport]\nwarehousedsn=Sales\nwarehouseusername=dw\n"
             "warehousepassword={protected:pw}"},
        Case{kProfiles, "3.0", "halsuite", "[Profile]\nLogFilePath=warehouse:Sales\n",
             "![wdwexport]"}));

}  // namespace
