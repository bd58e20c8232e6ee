// Advanced-option merges: the new installation's entries stay as they are, the old ones it lacks
// are appended without gaps, qualification keys follow their entry's new number, and dynamic pages
// take the version-3 layout.

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "migrate/settings_fixture.h"

namespace vxtest {
namespace {

const char kGroups[] = "/vxm_vxx/datfiles/contentgroups/default.ini";
const char kPages[] = "/vxm_vxx/datfiles/dynamicpages/default.ini";
const char kSample[] = "/vxm_vxx/datfiles/dynamicpages/sampleparams.txt";
const char kPagesBackslash[] = "\\vxm_vxx\\datfiles\\dynamicpages\\default.ini";

// "[default]\n<prefix>Count=<count>\n" (when count is given) and one section per name, numbered
// from first: "profilename=<name>" and "pattern=/<name>/*".
std::string Entries(const std::string& prefix, const char* count, std::vector<std::string> names,
                    int first = 0) {
  std::string text;
  if (count != nullptr) text = "[Default]\n" + prefix + "Count=" + count + "\n";
  for (const std::string& name : names) {
    if (!name.empty()) {
      text += "[" + prefix + std::to_string(first) + "]\nprofilename=" + name + "\npattern=/" +
              name + "/*\n";
    }
    ++first;
  }
  return text;
}

std::vector<std::string> Entry(const std::string& name) {
  return {"profilename=" + name, "pattern=/" + name + "/*"};
}

int Merge(SettingsRun& run, const char* prefix = "contentgroupprofile") {
  return run.manager().MergeAdvancedOptionsFiles(kGroups, kGroups, prefix);
}

TEST(AdvancedOptionsMerge, AppendsMissingEntriesAfterTheLastWithoutGaps) {
  SettingsRun run("pavsuite", "pavsuite", "5.0", "5.5");
  // Source entry 2 is missing from its numbered run; entry 6 lies beyond the count. The second
  // "Shop" is added too: source entries are compared with the destination's own entries only.
  WriteFile(run.Src(kGroups),
            Entries("contentgroupprofile", "6", {"Shop", "Blog", "", "news", "Shop", "Mail", "Beyond"}));
  const std::string destination =
      "; content groups\n[Default]\ncontentgroupprofileCount=2\n" +
      Entries("contentgroupprofile", nullptr, {"Support", "NEWS"});
  WriteFile(run.Dst(kGroups), destination);
  EXPECT_EQ(0, Merge(run));

  const std::string merged = run.Dst(kGroups);
  EXPECT_EQ(std::vector<std::string>{"contentgroupprofileCount=6"}, SectionLines(merged, "Default"));
  const char* expected[] = {"Support", "NEWS", "Shop", "Blog", "Shop", "Mail"};  // "news" dropped
  for (int i = 0; i < 6; ++i) {
    EXPECT_EQ(Entry(expected[i]), SectionLines(merged, "contentgroupprofile" + std::to_string(i)));
  }
  EXPECT_EQ(std::vector<std::string>{"<none>"}, SectionLines(merged, "contentgroupprofile6"));
  EXPECT_EQ(std::vector<std::string>{std::string("Advanced option file migrated: ") + kGroups},
            run.Logged());

  // The new installation's text stays as it was, but for the count; added entries follow it.
  std::string kept = destination;
  kept.replace(kept.find("Count=2"), 7, "Count=6");
  const std::string text = ReadFile(merged);
  EXPECT_EQ(kept, text.substr(0, kept.size()));
  // Written and read back without change, the merged file stays byte-identical.
  vxMappedINIFile reopened(merged.c_str());
  ASSERT_EQ(0, reopened.Open(1));
  ASSERT_EQ(0, reopened.Close(1));
  EXPECT_EQ(text, ReadFile(merged));
}

TEST(AdvancedOptionsMerge, SectionBeyondTheCountIsNeverOverwritten) {
  SettingsRun run("pavsuite", "pavsuite", "5.0", "5.5");
  WriteFile(run.Src(kGroups), Entries("contentgroupprofile", "2", {"Stale", "New"}));
  // Entry 1 sits beyond a count of 1: a hand edit lowered the count.
  WriteFile(run.Dst(kGroups), Entries("contentgroupprofile", "1", {"A", "Stale"}));
  EXPECT_EQ(0, Merge(run));
  const std::string merged = run.Dst(kGroups);
  // "Stale" was not an entry when it was compared; then the count grew over the old section.
  EXPECT_EQ(Entry("A"), SectionLines(merged, "contentgroupprofile0"));
  EXPECT_EQ(Entry("Stale"), SectionLines(merged, "contentgroupprofile1"));
  EXPECT_EQ(Entry("Stale"), SectionLines(merged, "contentgroupprofile2"));
  EXPECT_EQ(Entry("New"), SectionLines(merged, "contentgroupprofile3"));
  EXPECT_EQ(std::vector<std::string>{"contentgroupprofileCount=4"}, SectionLines(merged, "Default"));
}

struct CountCase {
  const char* name;
  const char* sourceCount;       // null: no count key
  const char* destinationCount;  // null: no count key
  int added;                     // entries appended, numbered from 0
};

class AdvancedOptionsCount : public ::testing::TestWithParam<CountCase> {};

TEST_P(AdvancedOptionsCount, IsReadSafely) {
  SettingsRun run("pavsuite", "pavsuite", "5.0", "5.5");
  WriteFile(run.Src(kGroups), Entries("contentgroupprofile", GetParam().sourceCount, {"A", "B"}));
  const std::string destination =
      GetParam().destinationCount == nullptr
          ? "[Default]\nother=1\n"
          : "[Default]\ncontentgroupprofileCount=" + std::string(GetParam().destinationCount) + "\n";
  WriteFile(run.Dst(kGroups), destination);
  EXPECT_EQ(0, Merge(run));
  if (GetParam().added == 0) {
    EXPECT_EQ(destination, ReadFile(run.Dst(kGroups)));
    return;
  }
  EXPECT_EQ("contentgroupprofileCount=" + std::to_string(GetParam().added),
            SectionLines(run.Dst(kGroups), "Default").back());
  EXPECT_EQ(Entry("A"), SectionLines(run.Dst(kGroups), "contentgroupprofile0"));
}

INSTANTIATE_TEST_SUITE_P(
    Cases, AdvancedOptionsCount,
    ::testing::Values(CountCase{"NoDestinationCount", "2", nullptr, 2},
                      CountCase{"GarbageDestinationCount", "2", "many", 2},
                      CountCase{"HugeSourceCount", "99999999999999999999", "0", 2},
                      CountCase{"ZeroSourceCount", "0", "0", 0},
                      CountCase{"NegativeSourceCount", "-1", "0", 0}),
    [](const ::testing::TestParamInfo<CountCase>& info) { return info.param.name; });

TEST(AdvancedOptionsMerge, MissingFileOnEitherSideChangesNothing) {
  SettingsRun run("pavsuite", "pavsuite", "5.0", "5.5");
  const std::string entries = Entries("contentgroupprofile", "1", {"A"});
  WriteFile(run.Dst(kGroups), entries);
  EXPECT_EQ(1, Merge(run));
  EXPECT_EQ(entries, ReadFile(run.Dst(kGroups)));
  WriteFile(run.Src(kGroups), entries);
  EXPECT_EQ(1, run.manager().MergeAdvancedOptionsFiles(kGroups, "/elsewhere/default.ini",
                                                       "contentgroupprofile"));
  EXPECT_FALSE(FileExists(run.Dst("elsewhere/default.ini")));
  EXPECT_TRUE(run.Logged().empty());
}

TEST(AdvancedOptionsMerge, InPlaceRunReadsTheBackup) {
  auto run = SettingsRun::InPlace("pavsuite", "pavsuite", "5.5", "5.5");
  WriteFile(run->Dst("vxm_vxx/datfiles/contentgroups/default.vxinibak"),
            Entries("contentgroupprofile", "2", {"Mine", "Shared"}));
  WriteFile(run->Dst(kGroups), Entries("contentgroupprofile", "1", {"Shared"}));
  EXPECT_EQ(0, Merge(*run));
  EXPECT_EQ(Entry("Mine"), SectionLines(run->Dst(kGroups), "contentgroupprofile1"));
  EXPECT_EQ(std::vector<std::string>{"contentgroupprofileCount=2"},
            SectionLines(run->Dst(kGroups), "Default"));
}

struct QualificationCase {
  const char* name;
  const char* sourceProduct;
  const char* destinationProduct;
  const char* file;
  const char* key;
  const char* written;
};

class QualificationKeys : public ::testing::TestWithParam<QualificationCase> {};

TEST_P(QualificationKeys, FollowTheEntrysNewNumber) {
  const QualificationCase& c = GetParam();
  SettingsRun run(c.sourceProduct, c.destinationProduct, "5.0", "5.5");
  WriteFile(run.Src(kPages), std::string("[Default]\nqueryprofileCount=1\n[queryprofile0]\n") +
                                 "profilename=P\nQualification=all\n" + c.key + "=/a.asp\n");
  // Seven entries counted (their sections long gone): the added entry becomes number 7.
  WriteFile(run.Dst(kPages), "[Default]\nqueryprofileCount=7\n");
  EXPECT_EQ(0, run.manager().MergeAdvancedOptionsFiles(c.file, c.file, "queryprofile"));
  EXPECT_EQ((std::vector<std::string>{"profilename=P", "Qualification=all",
                                      std::string(c.written) + "=/a.asp"}),
            SectionLines(run.Dst(kPages), "queryprofile7"));
}

INSTANTIATE_TEST_SUITE_P(
    Cases, QualificationKeys,
    ::testing::Values(
        QualificationCase{"Url", "pavsuite", "pavsuite", kPagesBackslash, "Qualification4URL",
                          "Qualification7URL"},
        QualificationCase{"UrlIntoObx", "halsuite", "obx", kPagesBackslash, "Qualification4URL",
                          "Qualification0URL"},
        QualificationCase{"TextFromUrlOn", "mirsuite", "pavsuite", kPagesBackslash,
                          "Qualification12PageURLx", "Qualification7URLx"},
        QualificationCase{"WithoutUrlTheWholeKey", "pavsuite", "pavsuite", kPagesBackslash,
                          "Qualification2Page", "Qualification7Qualification2Page"},
        QualificationCase{"SixteenCharactersStay", "pavsuite", "pavsuite", kPagesBackslash,
                          "QualificationURL", "QualificationURL"},
        QualificationCase{"OtherSourceProductStays", "obx", "obx", kPagesBackslash,
                          "Qualification4URL", "Qualification4URL"},
        QualificationCase{"ForwardSlashNameStays", "pavsuite", "pavsuite", kPages,
                          "Qualification4URL", "Qualification4URL"}),
    [](const ::testing::TestParamInfo<QualificationCase>& info) { return info.param.name; });

// --- The reporting-server list ---

const std::vector<std::string> kQueryEntryP1 = {
    "qualification0url=/cat.asp", "mapfile0=cat.map", "mapfile1=",      "parameter0=id",
    "parameter1=",                "profilename=Cat",  "profileid=p1",   "profileversion=2",
    "pagetype=1",                 "numparams=1",      "isregexp=0",     "displayparm=Name",
    "displayparm1="};

std::string OldQueryEntries() {
  return "[default]\nqueryprofilecount=3\n"
         "[queryprofile0]\npage=/cat.asp\nmapfile=cat.map\nparameter=id\nprofilename=Cat\n"
         "profileid=p1\npagetype=1\nisregexp=0\ndisplayparm=Name\nunused=dropped\n"
         "[queryprofile1]\nprofilename=Mine too\nprofileid=P2\n"
         "[queryprofile2]\nprofileid=p3\n";
}

TEST(ReportingServerOptions, ConvertsDynamicPagesFromVersion3On) {
  SettingsRun run("halsuite", "obx", "5.5", "3.0");
  WriteFile(run.Src(kPages), OldQueryEntries());
  WriteFile(run.Dst(kPages), "[default]\nqueryprofilecount=1\n[queryprofile0]\nprofileid=p2\n");
  EXPECT_EQ(0, run.manager().DoOBXMergeAdvancedOptionsFiles());

  const std::string merged = run.Dst(kPages);
  EXPECT_EQ(std::vector<std::string>{"queryprofilecount=3"}, SectionLines(merged, "default"));
  EXPECT_EQ(kQueryEntryP1, SectionLines(merged, "queryprofile1"));
  std::vector<std::string> p3 = {"qualification0url=", "mapfile0=", "mapfile1=", "parameter0=",
                                 "parameter1=", "profilename=", "profileid=p3",
                                 "profileversion=2", "pagetype=", "numparams=1", "isregexp=",
                                 "displayparm=", "displayparm1="};
  EXPECT_EQ(p3, SectionLines(merged, "queryprofile2"));
  EXPECT_EQ(std::vector<std::string>{std::string("Advanced option file migrated: ") + kPages},
            run.Logged());
}

TEST(ReportingServerOptions, BeforeVersion3DynamicPagesMergeAsTheyAre) {
  SettingsRun run("halsuite", "obx", "5.5", "2.9");
  WriteFile(run.Src(kPages), "[Default]\nqueryprofileCount=1\n[queryprofile0]\nprofilename=Q\n"
                             "Qualification0URL=/a\n");
  WriteFile(run.Dst(kPages), "[Default]\nqueryprofileCount=0\n");
  EXPECT_EQ(0, run.manager().DoOBXMergeAdvancedOptionsFiles());
  EXPECT_EQ((std::vector<std::string>{"profilename=Q", "Qualification0URL=/a"}),
            SectionLines(run.Dst(kPages), "queryprofile0"));
}

TEST(ReportingServerOptions, MergesEveryKindInOrder) {
  SettingsRun run("halsuite", "obx", "5.5", "3.1");
  const char* kinds[] = {"contentgroups", "pathsanalysis", "urlreplacement", "tradequill"};
  std::string counts = "[Default]\n";
  std::string entries;
  for (const char* prefix : {"contentgroupprofile", "pathsanalysisprofile", "urlreplacementprofile",
                             "adcampaignprofile", "productprofile", "categoryprofile"}) {
    counts += std::string(prefix) + "Count=1\n";
    entries += std::string("[") + prefix + "0]\nprofilename=" + prefix + "\n";
  }
  for (const char* kind : kinds) {
    WriteFile(run.Src(std::string("vxm_vxx/datfiles/") + kind + "/default.ini"), counts + entries);
    WriteFile(run.Dst(std::string("vxm_vxx/datfiles/") + kind + "/default.ini"), "[Default]\n");
  }
  WriteFile(run.Src(kPages), OldQueryEntries());
  WriteFile(run.Dst(kPages), "");
  EXPECT_EQ(0, run.manager().DoOBXMergeAdvancedOptionsFiles());

  const std::string migrated = "Advanced option file migrated: /vxm_vxx/datfiles/";
  EXPECT_EQ((std::vector<std::string>{
                migrated + "contentgroups/default.ini", migrated + "pathsanalysis/default.ini",
                migrated + "urlreplacement/default.ini", migrated + "tradequill/default.ini",
                migrated + "tradequill/default.ini", migrated + "tradequill/default.ini",
                migrated + "dynamicpages/default.ini"}),
            run.Logged());
  // Each file gains only its own families.
  EXPECT_EQ(std::vector<std::string>{"contentgroupprofileCount=1"},
            SectionLines(run.Dst("vxm_vxx/datfiles/contentgroups/default.ini"), "Default"));
  EXPECT_EQ((std::vector<std::string>{"adcampaignprofileCount=1", "productprofileCount=1",
                                      "categoryprofileCount=1"}),
            SectionLines(run.Dst("vxm_vxx/datfiles/tradequill/default.ini"), "Default"));
  EXPECT_EQ(kQueryEntryP1, SectionLines(run.Dst(kPages), "queryprofile0"));
}

TEST(ReportingServerOptions, MissingDestinationPagesAreCopiedWithTheirSamples) {
  SettingsRun run("halsuite", "obx", "5.5", "3.0");
  WriteFile(run.Src(kPages), OldQueryEntries());
  WriteFile(run.Src(kSample), "id,name\n");
  EXPECT_EQ(0, run.manager().DoOBXMergeAdvancedOptionsFiles());
  EXPECT_EQ(OldQueryEntries(), ReadFile(run.Dst(kPages)));
  EXPECT_EQ("id,name\n", ReadFile(run.Dst(kSample)));
  EXPECT_EQ((std::vector<std::string>{
                "INI file doesn't exist - file being copied: " + run.Src(kPages + 1),
                "TXT file doesn't exist - file being copied: " + run.Src(kSample + 1)}),
            run.Logged());
}

TEST(ReportingServerOptions, ExistingSamplesAreKept) {
  SettingsRun run("halsuite", "obx", "5.5", "3.0");
  WriteFile(run.Src(kPages), OldQueryEntries());
  WriteFile(run.Src(kSample), "old\n");
  WriteFile(run.Dst(kSample), "new\n");
  EXPECT_EQ(0, run.manager().DoOBXMergeAdvancedOptionsFiles());
  EXPECT_EQ("new\n", ReadFile(run.Dst(kSample)));
  EXPECT_EQ(1u, run.Logged().size());
}

TEST(ReportingServerOptions, MissingSourcePagesFailAfterTheOtherKinds) {
  SettingsRun run("halsuite", "obx", "5.5", "3.0");
  WriteFile(run.Src(kGroups), Entries("contentgroupprofile", "1", {"G"}));
  WriteFile(run.Dst(kGroups), "");
  WriteFile(run.Dst(kPages), "[default]\n");
  EXPECT_EQ(1, run.manager().DoOBXMergeAdvancedOptionsFiles());
  EXPECT_EQ(Entry("G"), SectionLines(run.Dst(kGroups), "contentgroupprofile0"));
  EXPECT_EQ("[default]\n", ReadFile(run.Dst(kPages)));
}

TEST(ReportingServerOptions, InPlaceConversionReadsTheBackup) {
  auto run = SettingsRun::InPlace("obx", "obx", "3.0", "3.0");
  WriteFile(run->Dst("vxm_vxx/datfiles/dynamicpages/default.vxinibak"), OldQueryEntries());
  WriteFile(run->Dst(kPages), "[default]\nqueryprofilecount=0\n");
  EXPECT_EQ(0, run->manager().DoOBXMergeAdvancedOptionsFiles());
  EXPECT_EQ(kQueryEntryP1, SectionLines(run->Dst(kPages), "queryprofile0"));
  EXPECT_EQ(std::vector<std::string>{"queryprofilecount=3"},
            SectionLines(run->Dst(kPages), "default"));
}

}  // namespace
}  // namespace vxtest
