// Advanced-option merges: the new installation's entries stay as they are, the old ones it lacks
// are appended without gaps, qualification keys follow their entry's new number, and dynamic pages
// take the version-3 layout.

#include <gtest/gtest.h>

#include <cstdio>
#include <string>
#include <vector>

#include "migrate/installations_fixture.h"

namespace vxtest {
namespace {

const char kGroups[] = "/vxm_vxx/datfiles/contentgroups/default.ini";
const char kPages[] = "/vxm_vxx/datfiles/dynamicpages/default.ini";
const char kSample[] = "/vxm_vxx/datfiles/dynamicpages/sampleparams.txt";
const char kPagesBackslash[] = "\\vxm_vxx\\datfiles\\dynamicpages\\default.ini";
const char kMigrated[] = "Advanced option file migrated: ";

// "[Default]\ncontentgroupprofileCount=<count>\n" (when count is given), then one section per name
// numbered from 0: "profilename=<name>" and "pattern=/<name>/*"; an empty name leaves a gap.
std::string Groups(const char* count, const Entries& names) {
  std::string ini = count ? std::string("[Default]\ncontentgroupprofileCount=") + count + "\n" : "";
  for (size_t i = 0; i < names.size(); ++i) {
    if (names[i].empty()) continue;
    ini += "[contentgroupprofile" + std::to_string(i) + "]\nprofilename=" + names[i] +
           "\npattern=/" + names[i] + "/*\n";
  }
  return ini;
}

int Merge(Installations& run, const char* source = kGroups, const char* destination = kGroups) {
  return run.manager().MergeAdvancedOptionsFiles(source, destination, "contentgroupprofile");
}

TEST(AdvancedOptionsMerge, AppendsMissingEntriesAfterTheLastWithoutGaps) {
  for (bool inPlace : {false, true}) {  // in place the old file is the installer's backup
    Installations run({}, inPlace);
    const std::string backup = run.Dst("vxm_vxx/datfiles/contentgroups/default.vxinibak");
    // Source entry 2 is a gap and entry 6 lies beyond the count. The destination's count was
    // lowered by hand below its section 2, which must not be overwritten.
    WriteFile(inPlace ? backup : run.Src(kGroups),
              Groups("6", {"Shop", "Blog", "", "news", "Shop", "Stale", "Beyond"}));
    const std::string header = "; content groups\n[Default]\ncontentgroupprofileCount=";
    WriteFile(run.Dst(kGroups), header + "2\n" + Groups(nullptr, {"Support", "NEWS", "Stale"}));
    EXPECT_EQ(0, Merge(run));
    // Names compare without case and the destination wins; source entries meet the destination's
    // own entries only, so "Shop" comes twice; the section the count grew over is one of them.
    const std::string merged =
        header + "6\n" + Groups(nullptr, {"Support", "NEWS", "Stale", "Shop", "Blog", "Shop"});
    EXPECT_EQ(merged, ReadFile(run.Dst(kGroups)));
    EXPECT_EQ(Entries{kMigrated + std::string(kGroups)}, run.RunLog());
  }
}

TEST(AdvancedOptionsMerge, CountsAreReadSafely) {
  const char* const cases[][3] = {  // source count, destination count (null: none), count after
      {"2", nullptr, "2"}, {"2", "many", "2"}, {"99999999999999999999", "0", "2"},
      {"0", "0", nullptr}, {"-1", "0", nullptr}};
  for (const auto& c : cases) {
    Installations run;
    WriteFile(run.Src(kGroups), Groups(c[0], {"A", "B"}));
    const std::string destination = c[1] ? Groups(c[1], {}) : "[Default]\n";
    WriteFile(run.Dst(kGroups), destination);
    EXPECT_EQ(0, Merge(run));
    EXPECT_EQ(c[2] ? Groups(c[2], {"A", "B"}) : destination, ReadFile(run.Dst(kGroups))) << c[0];
  }
}

TEST(AdvancedOptionsMerge, MissingFileOnEitherSideChangesNothing) {
  Installations run;
  WriteFile(run.Src("old.ini"), Groups("1", {"A"}));
  WriteFile(run.Dst("new.ini"), Groups("1", {"B"}));
  EXPECT_EQ(1, Merge(run, "/none.ini", "/new.ini"));
  EXPECT_EQ(1, Merge(run, "/old.ini", "/none.ini"));
  EXPECT_EQ(Groups("1", {"B"}), ReadFile(run.Dst("new.ini")));
  EXPECT_FALSE(FileExists(run.Dst("none.ini")));
  EXPECT_TRUE(run.RunLog().empty());
}

TEST(AdvancedOptionsMerge, QualificationKeysFollowTheEntrysNewNumber) {
  const char* const pav = "pavsuite";
  const char* const cases[][5] = {  // products, file name, key, key written
      {pav, pav, kPagesBackslash, "Qualification4URL", "Qualification7URL"},
      {"halsuite", "obx", kPagesBackslash, "Qualification4URL", "Qualification0URL"},
      {"halsuite", "tqrs", kPagesBackslash, "Qualification4URL", "Qualification0URL"},
      {"mirsuite", pav, kPagesBackslash, "Qualification12PageURLx", "Qualification7URLx"},
      // Without "URL" the whole old key follows the number.
      {pav, pav, kPagesBackslash, "Qualification2Page", "Qualification7Qualification2Page"},
      {pav, pav, kPagesBackslash, "QualificationURL", "QualificationURL"},
      {"obx", "obx", kPagesBackslash, "Qualification4URL", "Qualification4URL"},
      {pav, pav, kPages, "Qualification4URL", "Qualification4URL"}};
  for (const auto& c : cases) {
    Installations run(RunArgs(c[0], c[1], "5.0", "5.5"));
    WriteFile(run.Src(kPages), std::string("[Default]\nqueryprofileCount=1\n[queryprofile0]\n") +
                                   "profilename=P\nQualification=all\n" + c[3] + "=/a.asp\n");
    // Seven entries counted (their sections long gone): the added entry becomes number 7.
    WriteFile(run.Dst(kPages), "[Default]\nqueryprofileCount=7\n");
    EXPECT_EQ(0, run.manager().MergeAdvancedOptionsFiles(c[2], c[2], "queryprofile"));
    EXPECT_EQ(std::string("[Default]\nqueryprofileCount=8\n[queryprofile7]\nprofilename=P\n") +
                  "Qualification=all\n" + c[4] + "=/a.asp\n",
              ReadFile(run.Dst(kPages)));
  }
}

// --- The reporting-server list ---

const char kOldQueryEntries[] =
    "[default]\nqueryprofilecount=3\n"
    "[queryprofile0]\npage=/cat.asp\nmapfile=cat.map\nparameter=id\nprofilename=Cat\n"
    "profileid=p1\npagetype=1\nisregexp=0\ndisplayparm=Name\nunused=dropped\n"
    "[queryprofile1]\nprofilename=Mine too\nprofileid=P2\n";

// In place, from the installer's backup (side by side, the obx_to_obx sample run shows it).
TEST(ReportingServerOptions, ConvertsDynamicPagesFromVersion3On) {
  Installations run(RunArgs("halsuite", "obx", "5.5", "3.0"), true);
  WriteFile(run.Dst("vxm_vxx/datfiles/dynamicpages/default.vxinibak"), kOldQueryEntries);
  WriteFile(run.Dst(kPages), "[default]\nqueryprofilecount=1\n[queryprofile0]\nprofileid=p2\n");
  EXPECT_EQ(0, run.manager().DoOBXMergeAdvancedOptionsFiles());
  // "P2" is the destination's "p2"; the old keys the new layout has no place for are dropped.
  EXPECT_EQ("[default]\nqueryprofilecount=2\n[queryprofile0]\nprofileid=p2\n[queryprofile1]\n"
            "qualification0url=/cat.asp\nmapfile0=cat.map\nmapfile1=\nparameter0=id\n"
            "parameter1=\nprofilename=Cat\nprofileid=p1\nprofileversion=2\npagetype=1\n"
            "numparams=1\nisregexp=0\ndisplayparm=Name\ndisplayparm1=\n",
            ReadFile(run.Dst(kPages)));
  EXPECT_EQ(Entries{kMigrated + std::string(kPages)}, run.RunLog());
}

TEST(ReportingServerOptions, BeforeVersion3MergesEveryKindAndDynamicPagesAsTheyAre) {
  Installations run(RunArgs("halsuite", "obx", "5.5", "2.9"));
  std::string counts = "[Default]\n", entries;
  for (const char* prefix : {"contentgroupprofile", "pathsanalysisprofile", "urlreplacementprofile",
                             "adcampaignprofile", "productprofile", "categoryprofile"}) {
    counts += std::string(prefix) + "Count=1\n";
    entries += std::string("[") + prefix + "0]\nprofilename=" + prefix + "\n";
  }
  Entries logged;
  for (const char* kind : {"contentgroups", "pathsanalysis", "urlreplacement", "tradequill"}) {
    const std::string file = std::string("vxm_vxx/datfiles/") + kind + "/default.ini";
    WriteFile(run.Src(file), counts + entries);
    WriteFile(run.Dst(file), "[Default]\n");
    logged.push_back(kMigrated + ("/" + file));
  }
  logged.insert(logged.end(), 2, logged.back());  // the trade file holds three kinds
  logged.push_back(kMigrated + std::string(kPages));
  const std::string entry = "[queryprofile0]\nprofilename=Q\nQualification0URL=/a\n";
  WriteFile(run.Src(kPages), "[Default]\nqueryprofileCount=1\n" + entry);
  WriteFile(run.Dst(kPages), "[Default]\nqueryprofileCount=0\n");
  EXPECT_EQ(0, run.manager().DoOBXMergeAdvancedOptionsFiles());
  EXPECT_EQ(logged, run.RunLog());
  // Each file gains only its own kinds.
  EXPECT_EQ("[Default]\nadcampaignprofileCount=1\nproductprofileCount=1\ncategoryprofileCount=1\n"
            "[adcampaignprofile0]\nprofilename=adcampaignprofile\n[productprofile0]\n"
            "profilename=productprofile\n[categoryprofile0]\nprofilename=categoryprofile\n",
            ReadFile(run.Dst("vxm_vxx/datfiles/tradequill/default.ini")));
  EXPECT_EQ("[Default]\nqueryprofileCount=1\n" + entry, ReadFile(run.Dst(kPages)));
}

TEST(ReportingServerOptions, MissingDestinationPagesAreCopiedWithSamplesNeverOverwritten) {
  for (bool samplesExist : {false, true}) {
    Installations run(RunArgs("halsuite", "obx", "5.5", "3.0"));
    WriteFile(run.Src(kPages), kOldQueryEntries);
    WriteFile(run.Src(kSample), "old\n");
    if (samplesExist) WriteFile(run.Dst(kSample), "new\n");
    EXPECT_EQ(0, run.manager().DoOBXMergeAdvancedOptionsFiles());
    EXPECT_EQ(kOldQueryEntries, ReadFile(run.Dst(kPages)));
    EXPECT_EQ(samplesExist ? "new\n" : "old\n", ReadFile(run.Dst(kSample)));
    Entries logged = {
        "INI file doesn't exist - file being copied: <src>" + std::string(kPages),
        "TXT file doesn't exist - file being copied: <src>" + std::string(kSample)};
    logged.resize(samplesExist ? 1 : 2);
    EXPECT_EQ(logged, run.RunLog());
    // From version 3 on, old dynamic pages that cannot be read are a failure.
    std::remove(run.Src(kPages + 1).c_str());
    EXPECT_EQ(1, run.manager().DoOBXMergeAdvancedOptionsFiles());
  }
}

}  // namespace
}  // namespace vxtest
