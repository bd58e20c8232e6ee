// Profiles of one OBX installation copied into another under "_vxmigrate" names, with their report
// and database folders when the run carries profile data; the edition's samples stay behind.

#include <gtest/gtest.h>

#include <cstdio>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include "migrate/installations_fixture.h"
#include "migrate/sample_lists.h"
#include "support/test_files.h"

namespace vxtest {
namespace {

// An OBX 3.0 source whose settings name profilesDir, beside an OBX 3.5 destination.
class ObxRun : public Installations {
 public:
  explicit ObxRun(const std::string& profilesDir, const Entries& extra = {}, bool inPlace = false)
      : Installations(RunArgs("obx", "obx", "3.0", "3.5", extra), inPlace) {
    WriteFile(Dst("vxm_vxx/vxm_vxx.ini"), "[defaults]\nprofilesdir=\n");
    WriteFile(Src("vxm_vxx/vxm_vxx.ini"), "[defaults]\nprofilesdir=" + profilesDir + "\n");
  }

  // Two profiles of the user's (one with report and database folders) and the edition's samples.
  void WriteProfiles() {
    WriteFile(Src("vxm_vxx/datfiles/profiles/shop.wlp"), "[profile]\nName=Shop\n");
    WriteFile(Src("vxm_vxx/datfiles/profiles/intranet.wlp"), "[profile]\nondemandreports=1\n");
    std::istringstream samples(GetSampleFileList("obx", "wlp"));
    for (std::string name; std::getline(samples, name, ',');) {
      WriteFile(Src("vxm_vxx/datfiles/profiles/" + name), "[profile]\n");
    }
    WriteFile(Src("vxm_vxx/datfiles/reports/shop.wlp/index.htm"), "<html/>");
    WriteFile(Src("vxm_vxx/datfiles/databases/shop/visits.db"), "data");
  }
};

// Without its folders a profile makes its reports on demand unless it says otherwise. (With them,
// the copies are as the obx_to_obx sample run leaves them; "FT" is read by one rule for all.)
TEST(ObxProfiles, WithoutDataFoldersTheCopiesReportOnDemand) {
  ObxRun run("", {"-FT:N"});
  run.WriteProfiles();
  EXPECT_EQ(run.manager().DoCopyOBXProfiles(), 0);
  const std::string to = "vxm_vxx/datfiles/profiles/";
  EXPECT_EQ(run.RunLog(), (Entries{"Profile copied: <dst>/" + to + "intranet_vxmigrate.wlp",
                                   "Profile copied: <dst>/" + to + "shop_vxmigrate.wlp"}));
  EXPECT_EQ(ListTree(run.Dst("vxm_vxx/datfiles")),
            (Entries{"profiles", "profiles/intranet_vxmigrate.wlp", "profiles/shop_vxmigrate.wlp"}));
  EXPECT_EQ(run.ReadDst({to + "shop_vxmigrate.wlp", to + "intranet_vxmigrate.wlp"}),
            (Entries{"[profile]\nName=Shop\nondemandreports=0\n", "[profile]\nondemandreports=1\n"}));
}

// The source's profile folder must lie inside its installation ("" when the value is refused).
class ObxProfilesFolder : public testing::TestWithParam<std::pair<const char*, std::string>> {};

TEST_P(ObxProfilesFolder, AcceptsOnlyFoldersInsideTheInstallation) {
  const auto& [profilesDir, folder] = GetParam();
  ObxRun run(profilesDir, {"-FT:N"});
  WriteFile(run.Src((folder.empty() ? "profiles" : folder) + "/p.wlp"), "[profile]\n");
  EXPECT_EQ(run.manager().DoCopyOBXProfiles(), 0);
  EXPECT_EQ(ListTree(run.Dst("vxm_vxx/datfiles/profiles")),
            folder.empty() ? Entries{} : Entries{"p_vxmigrate.wlp"});
}

INSTANTIATE_TEST_SUITE_P(Cases, ObxProfilesFolder, testing::Values(
    std::pair("", "vxm_vxx/datfiles/profiles"), std::pair("./profiles", "profiles"),
    std::pair(".x\\profiles", ".x/profiles"), std::pair("ab", "ab"), std::pair(".\\profiles", ""),
    std::pair("/data/profiles", ""), std::pair("../profiles", "")));

// A copy already there is the user's: it is neither redone nor logged. Nothing is copied in place,
// nor without either settings file.
TEST(ObxProfiles, LeavesExistingCopiesAndRefusesWithoutSettings) {
  ObxRun run("");
  run.WriteProfiles();
  const std::string mine = run.Dst("vxm_vxx/datfiles/profiles/shop_vxmigrate.wlp");
  WriteFile(mine, "mine");
  run.manager().DoCopyOBXProfiles();
  EXPECT_EQ(ReadFile(mine), "mine");
  EXPECT_EQ(run.RunLog().size(), 3u);  // the intranet profile and its two folders

  ObxRun inPlace("", {}, true);
  inPlace.WriteProfiles();
  inPlace.manager();
  const Entries before = ListTree(inPlace.Src());
  EXPECT_EQ(inPlace.manager().DoCopyOBXProfiles(), 0);
  EXPECT_EQ(ListTree(inPlace.Src()), before);

  std::remove(run.Src("vxm_vxx/vxm_vxx.ini").c_str());
  EXPECT_EQ(run.manager().DoCopyOBXProfiles(), 1);
  std::remove(run.Dst("vxm_vxx/vxm_vxx.ini").c_str());
  EXPECT_EQ(run.manager().DoCopyOBXProfiles(), 1);
}

}  // namespace
}  // namespace vxtest
