// Files the conversion cannot use: each is reported by name, nothing of the customer's is
// overwritten with less, and the other files are converted.

#include <cstdio>
#include <string>
#include <vector>

#include "edition/halden_to_obx.h"
#include "tests/edition/edition_fixture.h"

namespace {

using vxtest::EditionRun;
using vxtest::ReadFile;
using vxtest::WriteFile;

const char kMerged[] = "vxm_log.ini merged with vxm_vxx.ini";

TEST(EditionFailures, UnreadableSettingsStayAsTheyWere) {
  EditionRun run;
  const std::string settings = run.dst() + "/vxm_vxx/vxm_vxx.ini";
  const std::string before = ReadFile(settings);
  const std::string log = run.src() + "/vxm_log/vxm_log.ini";
  WriteFile(log, std::string("[Defaults]\n\0", 12));
  HaldenToOBXHelper(run.manager()).DoVXMLogINIMigrate();
  std::remove(log.c_str());
  HaldenToOBXHelper(run.manager()).DoVXMLogINIMigrate();
  EXPECT_EQ(ReadFile(settings), before);

  vxtest::CopyDataTree("halden", run.src());
  const std::string binary("[defaults]\n\0", 12);
  WriteFile(settings, binary);
  HaldenToOBXHelper(run.manager()).DoVXMLogINIMigrate();
  EXPECT_EQ(ReadFile(settings), binary);
  const std::string error = "Error: Unable to open file:   ";
  EXPECT_EQ(run.NewLog(), (std::vector<std::string>{error + log, kMerged, error + log, kMerged,
                                                    error + settings, kMerged}));
}

TEST(EditionFailures, MissingStandardTemplateConvertsNoTemplate) {
  EditionRun run;
  std::remove((run.dst() + "/vxm_vxx/CompleteSummary.wct").c_str());
  HaldenToOBXHelper(run.manager()).DoHaldenToOBXTemplateFileMigrate();
  EXPECT_FALSE(vxtest::FileExists(run.dst() + "/vxm_vxx/Weekly_vxmigrate.wct"));
  EXPECT_EQ(run.NewLog().back(), "Error: MSS to WCT conversion failed: " + run.src() +
                                     "/vxm_log/datfiles/Weekly.mss to " + run.dst() +
                                     "/vxm_vxx/Weekly_vxmigrate.wct");
}

// "*" names every profile of an option; without the option's file there are none.
TEST(EditionFailures, MissingOptionFileEmptiesTheAllProfilesMark) {
  EditionRun run;
  std::remove((run.dst() + "/vxm_vxx/datfiles/contentgroups/default.ini").c_str());
  HaldenToOBXHelper(run.manager()).DoHaldenToOBXProfileFileMigrate();
  const std::string shop = run.dst() + "/vxm_vxx/datfiles/profiles/shop_vxmigrate.wlp";
  EXPECT_NE(ReadFile(shop).find("\nincludecontentgroups=\n"), std::string::npos);
  const std::vector<std::string> log = run.NewLog();
  EXPECT_EQ(log[log.size() - 2],
            "Error: Advanced option file unavailable - includecontentgroups emptied: " + shop);
}

TEST(EditionFailures, ProfilesNeedTheServerSettingsAndTheirFolder) {
  EditionRun run;
  WriteFile(run.dst() + "/vxm_vxx/vxm_vxx.ini", "[defaults]\nprofilesdir=\n");
  EXPECT_EQ(HaldenToOBXHelper(run.manager()).DoHaldenToOBXProfileFileMigrate(), 0);
  std::remove((run.dst() + "/vxm_vxx/vxm_vxx.ini").c_str());
  EXPECT_EQ(HaldenToOBXHelper(run.manager()).DoHaldenToOBXProfileFileMigrate(), 1);
  EXPECT_EQ(vxtest::ListTree(run.dst() + "/vxm_vxx/datfiles/profiles"), std::vector<std::string>{});
}

}  // namespace
