// The edition converter over installations as customers have them. Each folder of
// tests/edition/data holds a Halden source ("halden"), an OBX destination ("obx") and the
// destination as the conversion must leave it, log included ("expected"); data files write
// credentials as "{legacy:text}" and "{protected:text}", expanded to the forms the products store.

#include <gtest/gtest.h>

#include <filesystem>
#include <map>
#include <string>
#include <tuple>
#include <vector>

#include "edition/halden_to_obx.h"
#include "migrate/installations_fixture.h"
#include "support/test_files.h"

namespace vxtest {
namespace {

namespace fs = std::filesystem;
using Tree = std::map<std::string, std::string>;

std::string ExpandCredentials(std::string text) {
  for (size_t at; (at = text.find("{legacy:")) != std::string::npos ||
                  (at = text.find("{protected:")) != std::string::npos;) {
    const size_t colon = text.find(':', at), end = text.find('}', at);
    const std::string plain = text.substr(colon + 1, end - colon - 1);
    text.replace(at, end + 1 - at,
                 text[at + 1] == 'l' ? LegacyEncoded(plain) : Protected(plain));
  }
  return text;
}

// Every file below folder by relative name; a data folder's with their credentials expanded.
Tree FilesBelow(const std::string& folder, bool data = false) {
  Tree files;
  for (const std::string& name : ListTree(folder)) {
    if (fs::is_directory(folder + "/" + name)) continue;
    const std::string text = ReadFile(folder + "/" + name);
    files[name] = data ? ExpandCredentials(text) : text;
  }
  return files;
}

std::string DataPath(const std::string& name) {
  return std::string(VXM_SOURCE_DIR) + "/tests/edition/data/" + name;
}
Tree Data(const std::string& folder) { return FilesBelow(DataPath(folder), true); }

// A data folder's Halden installation (version 5.5 of product) and its OBX installation (version).
class Conversion : public Installations {
 public:
  explicit Conversion(const std::string& data, const std::string& version = "3.0",
                      const std::vector<std::string>& extra = {},
                      const std::string& product = "halsuite")
      : Installations(RunArgs(product, "obx", "5.5", version, extra)) {
    for (const auto& [name, text] : Data(data + "/halden")) WriteFile(Src(name), text);
    for (const auto& [name, text] : Data(data + "/obx")) WriteFile(Dst(name), text);
  }

  HaldenToOBXHelper Converter() { return HaldenToOBXHelper(&manager()); }

  // The log entries since the last call, one a line, the two folders written <src> and <dst>.
  std::string NewLog() {
    const std::vector<std::string> entries = RunLog();
    std::string text;
    for (size_t i = mark_; i < entries.size(); ++i) text += entries[i] + "\n";
    mark_ = entries.size();
    return text;
  }

  // The destination's files, its log holding the entries since the last NewLog.
  Tree Converted() {
    Tree files = FilesBelow(Dst());
    files["vxmigrate.log"] = NewLog();
    return files;
  }

 private:
  size_t mark_ = 0;
};

// The installation holds a sample profile, standard templates in odd letter case, an unreadable
// template and an unreadable profile (copied as it is). A profile and the OBX standard template are
// symbolic links: the copies are files of their own and nothing is written through a link. Two
// fresh destinations come out alike, and a second run over one converts nothing.
TEST(EditionConversion, WholeInstallation) {
  const Tree expected = Data("installation/expected");
  Tree again = expected;
  again["vxmigrate.log"] = ReadFile(DataPath("installation/second_run.log"));
  again.erase("vxm_vxx/vxm_vxx.ini");  // the settings are merged again
  for (int fresh = 0; fresh < 2; ++fresh) {
    Conversion run("installation");
    fs::create_symlink(run.Src("shared/mirror.conf"), run.Src("vxm_log/datfiles/mirror.wlp"));
    fs::create_directory(run.Dst("shared"));
    fs::rename(run.Dst("vxm_vxx/CompleteSummary.wct"), run.Dst("shared/standard.wct"));
    fs::create_symlink(run.Dst("shared/standard.wct"), run.Dst("vxm_vxx/CompleteSummary.wct"));
    const Tree source = FilesBelow(run.Src());
    EXPECT_EQ(run.Converter().DoHaldenToOBXMigrate(), 0);
    EXPECT_EQ(run.Converted(), expected);
    EXPECT_EQ(FilesBelow(run.Src()), source);
    run.Converter().DoHaldenToOBXMigrate();
    Tree second = run.Converted();
    second.erase("vxm_vxx/vxm_vxx.ini");
    EXPECT_EQ(second, again);
  }
}

TEST(EditionConversion, OnlySelectedProfilesTravel) {
  Conversion run("installation", "3.0", {"-PFLog:shop.wlp"});
  run.Converter().DoHaldenToOBXProfileFileMigrate();
  EXPECT_EQ(ListTree(run.Dst("vxm_vxx/datfiles/profiles")),
            std::vector<std::string>{"shop_vxmigrate.wlp"});
}

struct Step {
  const char* halden;  // the file of the installation the step reads, replaced by the case's
  const char* obx;     // the file it writes
  int (HaldenToOBXHelper::*run)();
};
const Step kSettings{"vxm_log/vxm_log.ini", "vxm_vxx/vxm_vxx.ini",
                     &HaldenToOBXHelper::DoVXMLogINIMigrate};
const Step kTemplate{"vxm_log/datfiles/Daily.mss", "vxm_vxx/Daily_vxmigrate.wct",
                     &HaldenToOBXHelper::DoHaldenToOBXTemplateFileMigrate};
const Step kProfile{"vxm_log/datfiles/site.wlp", "vxm_vxx/datfiles/profiles/site_vxmigrate.wlp",
                    &HaldenToOBXHelper::DoHaldenToOBXProfileFileMigrate};

// One step under one destination version: the line the OBX file must then hold, or must not hold
// for a line written "!text".
struct Case {
  const Step* step;
  const char* version;
  const char* halden;
  const char* line;
  const char* product = "halsuite";
};

class EditionStep : public testing::TestWithParam<Case> {};

TEST_P(EditionStep, WritesTheLine) {
  const Case& c = GetParam();
  Conversion run("installation", c.version, {}, c.product);
  WriteFile(run.Src(c.step->halden), ExpandCredentials(c.halden));
  (run.Converter().*c.step->run)();
  const std::string text = "\n" + ReadFile(run.Dst(c.step->obx)) + "\n";
  const std::string line = ExpandCredentials(c.line);
  if (line[0] == '!') {
    EXPECT_EQ(text.find("\n" + line.substr(1)), std::string::npos) << text;
  } else {
    EXPECT_NE(text.find("\n" + line + "\n"), std::string::npos) << text;
  }
}

// A template whose one report section is a graph.
#define GRAPH                                                      \
  "[SaveAs]\nSaveReportAs=d.htm\n[content]\nSection0_ItemType=1\n" \
  "Section0_Name=TopPages_SectionItem\n"
#define HOME_USER "[Profile]\nHomePageUsername="

// Cache lifespans are whole days; the cookie check flag is inverted. Spreadsheets came with OBX
// version 3, the last three characters of the output name deciding in any letter case. Early OBX
// versions read the home page user name in clear, later ones protected; major and minor number are
// each compared by themselves, so 2.9 counts as late. Warehouses are a Tradequill matter.
INSTANTIATE_TEST_SUITE_P(Cases, EditionStep, testing::Values(
    Case{&kSettings, "3.0", "[Defaults]\nDownloadTypes=\n", "DownloadTypes={exe,0}"},
    Case{&kSettings, "3.0", "[Defaults]\nTitleCacheLifespan=86399\n", "TitleCacheLifespan=0"},
    Case{&kSettings, "3.0", "[Defaults]\nTitleCacheLifespan=soon\n", "TitleCacheLifespan=0"},
    Case{&kSettings, "3.0", "[Defaults]\n", "TitleCacheLifespan=0"},
    Case{&kSettings, "3.0", "[cookie]\nvantixplugin=0\n", "validatetype=1"},
    Case{&kSettings, "3.0", "[cookie]\nvantixplugin=yes\n", "validatetype=1"},
    Case{&kSettings, "3.0", "[Defaults]\nUseGlobalSubProfileFilters=1\n", "!useglobal"},
    Case{&kTemplate, "2.5", "[SaveAs]\nSaveReportAs=d.doc\n", "[general]"},
    Case{&kTemplate, "2.5", "[SaveAs]\nSaveReportAs=d.xls\n", "![general]"},
    Case{&kTemplate, "3.0", "[SaveAs]\nSaveReportAs=D.HTM\n", "[general]"},
    Case{&kTemplate, "3.0", "[SaveAs]\nSaveReportAs=htm\n", "![general]"},
    Case{&kTemplate, "3.0", GRAPH "Section0_GraphType=8\n", "include=Y\ngraphtype=MULTILINE"},
    Case{&kTemplate, "3.0", GRAPH "Section0_GraphType=\n", "include=Y\ngraphtype=MULTILINE"},
    Case{&kProfile, "3.1.a", HOME_USER "{legacy:web}\n", "HomePageUsername=web"},
    Case{&kProfile, "2.9", HOME_USER "{legacy:web}\n", "HomePageUsername={protected:web}"},
    Case{&kProfile, "4.0", HOME_USER "{protected:web}\n", "HomePageUsername={protected:web}"},
    Case{&kProfile, "3.0",
         "[Profile]\nLogFilePath=warehouse:Sales\nLogFileUsername={legacy:dw}\n"
         "LogFilePassword={legacy:pw}\n",
         "[wdwexport]\nwarehousedsn=Sales\nwarehouseusername=dw\nwarehousepassword={protected:pw}",
         "tradeq"},
    Case{&kProfile, "3.0", "[Profile]\nLogFilePath=warehouse:Sales\n", "![wdwexport]"},
    // The server's and the warehouse's user names are two keys that differ in case alone.
    Case{&kProfile, "3.0",
         "[Profile]\nLogFilePath=warehouse:Sales\nLogFileUserName={legacy:srv}\n"
         "LogFileUsername={legacy:dw}\n",
         "LogFileUserName=srv\nLogFileUsername={legacy:dw}", "tradeq"},
    Case{&kProfile, "3.0",
         "[Profile]\nLogFilePath=warehouse:Sales\nLogFileUserName={legacy:srv}\n"
         "LogFileUsername={legacy:dw}\n",
         "warehouseusername=dw", "tradeq"},
    // A file URL loses its scheme; a drive letter path keeps no leading slash, an absolute path
    // keeps its own. So do the paths of each cluster server.
    Case{&kProfile, "3.0", "[Profile]\nLogFilePath=file:///C:/logs/a.log\n",
         "LogFilePath=C:/logs/a.log"},
    Case{&kProfile, "3.0", "[Profile]\nLogFilePath=file:///var/log/a.log\n",
         "LogFilePath=/var/log/a.log"},
    Case{&kProfile, "3.0",
         "[Profile]\nIsServerCluster=1\nServerName=n1\n"
         "LogFilePath=file:///d:/l/a.log|file:///var/b.log\n",
         "logfilepath1=d:/l/a.log\nlogfilepath2=/var/b.log"}));

// Dynamic-page query profiles take the destination version's layout: before 3 the Halden profiles
// whose id the OBX file lacks are added, from 3 on each profile's first qualification is filled.
// Without the OBX file nothing is written.
class EditionPages : public testing::TestWithParam<std::tuple<std::string, const char*, int>> {};

TEST_P(EditionPages, TakeTheDestinationsLayout) {
  const auto& [data, version, result] = GetParam();
  Conversion run(data, version);
  EXPECT_EQ(run.Converter().DoMergeAdvancedOptionsFiles(), result);
  EXPECT_EQ(run.Converted(), Data(data + "/expected"));
}

INSTANTIATE_TEST_SUITE_P(Cases, EditionPages,
                         testing::Values(std::tuple("pages_v2", "2.5", 0),
                                         std::tuple("pages_v2_taken", "2.5", 0),
                                         std::tuple("pages_v3", "3.0", 0),
                                         std::tuple("pages_missing", "2.0", 1),
                                         std::tuple("pages_missing", "3.0", 1)));

// A settings file that cannot be read, or a missing Halden one, is reported and nothing is written.
TEST(EditionFailures, UnreadableSettingsStayAsTheyWere) {
  Conversion run("installation");
  const std::string settings = run.Dst("vxm_vxx/vxm_vxx.ini"), log = run.Src("vxm_log/vxm_log.ini");
  const std::string before = ReadFile(settings), binary("[defaults]\n\0", 12);
  WriteFile(log, binary);
  run.Converter().DoVXMLogINIMigrate();
  fs::remove(log);
  run.Converter().DoVXMLogINIMigrate();
  EXPECT_EQ(ReadFile(settings), before);
  WriteFile(log, "[Defaults]\nMaxTopCount=10\n");
  WriteFile(settings, binary);
  run.Converter().DoVXMLogINIMigrate();
  EXPECT_EQ(ReadFile(settings), binary);
  const std::string source = "Error: Unable to open file:   <src>/vxm_log/vxm_log.ini\n";
  const std::string merged = "vxm_log.ini merged with vxm_vxx.ini\n";
  EXPECT_EQ(run.NewLog(), source + merged + source + merged +
                              "Error: Unable to open file:   <dst>/vxm_vxx/vxm_vxx.ini\n" + merged);
}

TEST(EditionFailures, MissingStandardTemplateConvertsNoTemplate) {
  Conversion run("installation");
  fs::remove(run.Dst("vxm_vxx/CompleteSummary.wct"));
  run.Converter().DoHaldenToOBXTemplateFileMigrate();
  EXPECT_FALSE(FileExists(run.Dst("vxm_vxx/Weekly_vxmigrate.wct")));
  EXPECT_EQ(run.NewLog(), ReadFile(DataPath("installation/without_standard_template.log")));
}

// "*" names every profile of an option; without the option's file there are none.
TEST(EditionFailures, MissingOptionFileEmptiesTheAllProfilesMark) {
  Conversion run("installation");
  fs::remove(run.Dst("vxm_vxx/datfiles/contentgroups/default.ini"));
  run.Converter().DoHaldenToOBXProfileFileMigrate();
  const std::string shop = run.Dst("vxm_vxx/datfiles/profiles/shop_vxmigrate.wlp");
  EXPECT_NE(ReadFile(shop).find("\nincludecontentgroups=\n"), std::string::npos);
  EXPECT_EQ(run.NewLog(), ReadFile(DataPath("installation/without_content_groups.log")));
}

TEST(EditionFailures, ProfilesNeedTheServerSettingsAndTheirFolder) {
  Conversion run("installation");
  WriteFile(run.Dst("vxm_vxx/vxm_vxx.ini"), "[defaults]\nprofilesdir=\n");
  EXPECT_EQ(run.Converter().DoHaldenToOBXProfileFileMigrate(), 0);
  fs::remove(run.Dst("vxm_vxx/vxm_vxx.ini"));
  EXPECT_EQ(run.Converter().DoHaldenToOBXProfileFileMigrate(), 1);
  EXPECT_EQ(ListTree(run.Dst("vxm_vxx/datfiles/profiles")), std::vector<std::string>{});
}

}  // namespace
}  // namespace vxtest
