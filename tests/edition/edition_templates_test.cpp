// Report templates of the Halden edition converted into OBX templates.

#include <cstdio>
#include <string>
#include <vector>

#include "edition/halden_to_obx.h"
#include "foundation/inifile/ini_file.h"
#include "tests/edition/edition_fixture.h"

namespace {

using vxtest::EditionRun;
using vxtest::FileExists;
using vxtest::ReadFile;
using vxtest::WriteFile;

std::string Value(const std::string& path, const char* section, const char* key) {
  vxMappedINIFile file(path.c_str());
  if (file.Open(1) != 0) return "<unreadable>";
  return file.GetVal(section, key).str();
}

TEST(EditionTemplates, ConvertsUserTemplatesOnly) {
  EditionRun run;
  HaldenToOBXHelper(run.manager()).DoHaldenToOBXTemplateFileMigrate();
  const std::string from = run.src() + "/vxm_log/datfiles/";
  const std::string to = run.dst() + "/vxm_vxx/";
  EXPECT_EQ(vxtest::ListTree(to),
            (std::vector<std::string>{"CompleteSummary.wct", "Monthly_vxmigrate.wct",
                                      "Referrers_vxmigrate.wct", "Weekly_vxmigrate.wct",
                                      "datfiles", "datfiles/contentgroups",
                                      "datfiles/contentgroups/default.ini", "datfiles/dynamicpages",
                                      "datfiles/dynamicpages/default.ini", "datfiles/pathsanalysis",
                                      "datfiles/pathsanalysis/default.ini", "datfiles/profiles",
                                      "vxm_vxx.ini"}));
  EXPECT_EQ(run.NewLog(),
            (std::vector<std::string>{
                "Error: Unable to open file:   " + from + "Broken.mss",
                "Error: MSS to WCT report section left out: Visitors_SectionItem in " + from +
                    "Monthly.mss",
                "MSS to WCT conversion: " + from + "Monthly.mss to " + to + "Monthly_vxmigrate.wct",
                "** OBX version does not support Spanish language reports - changed to English",
                "MSS to WCT conversion: " + from + "Referrers.mss to " + to +
                    "Referrers_vxmigrate.wct",
                "MSS to WCT conversion: " + from + "Weekly.mss to " + to + "Weekly_vxmigrate.wct"}));

  // Only the objects the report sections name are switched on; a table section without
  // sub-elements carries its element count into them.
  EXPECT_EQ(ReadFile(to + "Weekly_vxmigrate.wct"),
            "[general]\nversion=2.0\ndescription=Weekly traffic for the shop\n"
            "reportstyle=Corporate\nreportlanguage=./vxm_vxx/template/german.rpl\n\n"
            "[content]\nreportobjects=8\nhelpcards=Y\n\n"
            "[Object1]\nname=TopPagesChapter\ntype=CHAPTER\ninclude=Y\n\n"
            "[Object2]\nname=TopPagesGraph\ntype=Graph\ninclude=Y\ngraphtype=SINGLEPIE\n"
            "graphelements=10\n\n"
            "[Object3]\nname=TopPagesTable\ntype=Table\ninclude=Y\ntableelements1=25\n"
            "tableelements2=5\n\n"
            "[Object4]\nname=TopEntryPageChapter\ntype=CHAPTER\ninclude=Y\n\n"
            "[Object5]\nname=TopEntryPageTable\ntype=Table\ninclude=Y\ntableelements1=15\n"
            "tableelements2=15\n\n"
            "[Object6]\nname=BrowsersGraph\ntype=Graph\ninclude=Y\ngraphtype=MULTILINE\n"
            "graphelements=8\n\n"
            "[Object7]\nname=ReferrersTable\ntype=Table\ninclude=N\ntableelements1=20\n\n"
            "[Object8]\nname=TopPagesByHourGraph\ntype=Graph\ninclude=N\ngraphtype=MULTILINE\n"
            "graphelements=24\n");
  EXPECT_EQ(Value(to + "Referrers_vxmigrate.wct", "general", "reportlanguage"),
            "./vxm_vxx/template/english.rpl");
  EXPECT_EQ(Value(to + "Referrers_vxmigrate.wct", "Object7", "include"), "Y");
  EXPECT_EQ(Value(to + "Monthly_vxmigrate.wct", "general", "reportlanguage"),
            "./vxm_vxx/template/english.rpl");
  // A graph section without a graph type converts its item type "1" instead.
  EXPECT_EQ(Value(to + "Monthly_vxmigrate.wct", "Object2", "graphtype"), "SINGLEBAR");
  EXPECT_EQ(Value(to + "Monthly_vxmigrate.wct", "Object3", "include"), "N");
}

TEST(EditionTemplates, NeverReplacesAnEarlierConversion) {
  EditionRun run;
  HaldenToOBXHelper(run.manager()).DoHaldenToOBXTemplateFileMigrate();
  const std::string weekly = run.dst() + "/vxm_vxx/Weekly_vxmigrate.wct";
  WriteFile(weekly, "[general]\ndescription=edited by the user\n");
  run.NewLog();
  HaldenToOBXHelper(run.manager()).DoHaldenToOBXTemplateFileMigrate();
  EXPECT_EQ(ReadFile(weekly), "[general]\ndescription=edited by the user\n");
  for (const std::string& entry : run.NewLog()) {
    EXPECT_EQ(entry.find("MSS to WCT conversion"), std::string::npos) << entry;
  }
}

TEST(EditionTemplates, MissingStandardTemplateConvertsNothing) {
  EditionRun run;
  std::remove((run.dst() + "/vxm_vxx/CompleteSummary.wct").c_str());
  HaldenToOBXHelper(run.manager()).DoHaldenToOBXTemplateFileMigrate();
  EXPECT_FALSE(FileExists(run.dst() + "/vxm_vxx/Weekly_vxmigrate.wct"));
  const std::string from = run.src() + "/vxm_log/datfiles/Weekly.mss";
  EXPECT_EQ(run.NewLog().back(), "Error: MSS to WCT conversion failed: " + from + " to " +
                                     run.dst() + "/vxm_vxx/Weekly_vxmigrate.wct");
}

struct FormCase {
  const char* version;
  const char* saveAs;
  bool converted;
};

class EditionTemplateForms : public testing::TestWithParam<FormCase> {};

TEST_P(EditionTemplateForms, ConvertsOnlyFormsTheDestinationKnows) {
  EditionRun run(GetParam().version, {}, "halsuite", false);
  vxtest::WriteOBXInstallation(run.dst());
  WriteFile(run.src() + "/vxm_log/datfiles/Daily.mss",
            std::string("[SaveAs]\nSaveReportAs=") + GetParam().saveAs + "\n");
  HaldenToOBXHelper(run.manager()).DoHaldenToOBXTemplateFileMigrate();
  EXPECT_EQ(FileExists(run.dst() + "/vxm_vxx/Daily_vxmigrate.wct"), GetParam().converted);
}

INSTANTIATE_TEST_SUITE_P(Cases, EditionTemplateForms,
                         testing::Values(FormCase{"2.5", "daily.htm", true},
                                         FormCase{"2.5", "daily.doc", true},
                                         FormCase{"2.5", "daily.xls", false},
                                         FormCase{"3.0", "daily.xls", true},
                                         FormCase{"3.0", "DAILY.HTM", true},
                                         FormCase{"3.0", "daily.txt", false},
                                         FormCase{"3.0", "htm", false},
                                         FormCase{"3.0", "", false}));

TEST(EditionTemplates, GraphTypeNames) {
  EditionRun run("3.0", {}, "halsuite", false);
  HaldenToOBXHelper helper(run.manager());
  const char* const expected[] = {"MULTISTACKED", "SINGLEBAR", "MULTIBAR",  "SINGLEPIE",
                                  "MULTIAREA",    "MULTILINE", "MULTIHBAR", "MULTIHSTACKED"};
  for (int i = 0; i < 8; ++i) {
    vxStringBase value(std::to_string(i).c_str());
    helper.GetGraphTypeFromIndex(value);
    EXPECT_EQ(value.str(), expected[i]);
  }
  for (const char* other : {"9", "", "01", "3 "}) {
    vxStringBase value(other);
    helper.GetGraphTypeFromIndex(value);
    EXPECT_EQ(value.str(), "MULTILINE") << other;
  }
}

TEST(EditionTemplates, StandardTemplatesAreRecognisedInAnyCase) {
  EditionRun run("3.0", {}, "halsuite", false);
  HaldenToOBXHelper helper(run.manager());
  for (const char* name : {"CompleteSummary_htm.mss", "toppages_DOC.mss", "BROWSERS_XLS.MSS",
                           "/any/folder/Referrers_txt.mss"}) {
    vxFilename file(name);
    EXPECT_EQ(helper.IsValidMSSFile(file), 0) << name;
  }
  for (const char* name : {"Weekly.mss", "TopPages_pdf.mss", "TopPages.mss", "xTopPages_doc.mss"}) {
    vxFilename file(name);
    EXPECT_EQ(helper.IsValidMSSFile(file), 1) << name;
  }
}

}  // namespace
