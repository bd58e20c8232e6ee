// Profiles of one OBX installation copied into another under "_vxmigrate" names, with their report
// and database folders when the run carries profile data.

#include <gtest/gtest.h>

#include <cstdio>
#include <memory>
#include <string>
#include <vector>

#include "migrate/driver_fixture.h"
#include "migrate/manager.h"
#include "migrate/sample_lists.h"
#include "support/test_files.h"

namespace {

using vxtest::ListTree;
using vxtest::ReadFile;
using vxtest::WriteFile;

class ObxRun {
 public:
  explicit ObxRun(const std::string& profilesDir, std::vector<std::string> extra = {}) {
    WriteFile(src() + "/vxm_vxx/vxm_vxx.ini", "[defaults]\nprofilesdir=" + profilesDir + "\n");
    WriteFile(dst() + "/vxm_vxx/vxm_vxx.ini", "[defaults]\nprofilesdir=\n");
    std::vector<std::string> args = {root_.Path("bin/vxmigrate"), "-D1:" + src(), "-D2:" + dst(),
                                      "-P1:obx", "-P2:obx", "-V1:3.0", "-V2:3.5"};
    args.insert(args.end(), extra.begin(), extra.end());
    manager_ = vxtest::MakeManager(args);
    mark_ = vxtest::LogEntries(dst() + "/vxmigrate.log").size();
  }
  std::string src() const { return root_.Path("src"); }
  std::string dst() const { return root_.Path("dst"); }
  vxMigrationManager* manager() { return manager_.get(); }
  std::vector<std::string> NewLog() {
    std::vector<std::string> all = vxtest::LogEntries(dst() + "/vxmigrate.log");
    return std::vector<std::string>(all.begin() + mark_, all.end());
  }

  // Two profiles of the user's (one with report and database folders) and the edition's samples.
  void WriteProfiles() {
    const std::string folder = src() + "/vxm_vxx/datfiles/profiles/";
    WriteFile(folder + "shop.wlp", "[profile]\nName=Shop\n");
    WriteFile(folder + "intranet.wlp", "[profile]\nondemandreports=1\n");
    std::string samples = std::string(GetSampleFileList("obx", "wlp")) + ",";
    for (size_t comma; (comma = samples.find(',')) != std::string::npos;) {
      WriteFile(folder + samples.substr(0, comma), "[profile]\n");
      samples.erase(0, comma + 1);
    }
    WriteFile(src() + "/vxm_vxx/datfiles/reports/shop.wlp/index.htm", "<html/>");
    WriteFile(src() + "/vxm_vxx/datfiles/databases/shop/visits.db", "data");
  }

 private:
  vxtest::TempDir root_;
  std::unique_ptr<vxMigrationManager> manager_;
  size_t mark_ = 0;
};

class ObxProfilesFT : public testing::TestWithParam<const char*> {};

TEST_P(ObxProfilesFT, CopiesDataFoldersOnlyWhenAsked) {
  const std::string ft = GetParam();
  ObxRun run("", ft.empty() ? std::vector<std::string>{} : std::vector<std::string>{"-FT:" + ft});
  run.WriteProfiles();
  EXPECT_EQ(run.manager()->DoCopyOBXProfiles(), 0);
  const std::string to = run.dst() + "/vxm_vxx/datfiles/";
  const bool data = ft != "N";
  std::vector<std::string> log;
  for (const char* name : {"intranet", "shop"}) {
    log.push_back("Profile copied: " + to + "profiles/" + name + "_vxmigrate.wlp");
    if (!data) continue;
    log.push_back("Report folder copied: " + to + "reports/" + name + "_vxmigrate.wlp");
    log.push_back("Database folder copied: " + to + "databases/" + name + "_vxmigrate");
  }
  EXPECT_EQ(run.NewLog(), log);
  std::vector<std::string> tree = {"profiles", "profiles/intranet_vxmigrate.wlp",
                                   "profiles/shop_vxmigrate.wlp"};
  if (data) {
    tree = {"databases", "databases/shop_vxmigrate", "databases/shop_vxmigrate/visits.db",
            tree[0], tree[1], tree[2], "reports", "reports/shop_vxmigrate.wlp",
            "reports/shop_vxmigrate.wlp/index.htm"};
  }
  EXPECT_EQ(ListTree(to), tree);
  // A profile travelling without its folders makes its reports on demand unless it said otherwise.
  EXPECT_EQ(ReadFile(to + "profiles/shop_vxmigrate.wlp"),
            data ? "[profile]\nName=Shop\n" : "[profile]\nName=Shop\nondemandreports=0\n");
  EXPECT_EQ(ReadFile(to + "profiles/intranet_vxmigrate.wlp"), "[profile]\nondemandreports=1\n");
}

INSTANTIATE_TEST_SUITE_P(Values, ObxProfilesFT, testing::Values("", "Y", "yes", "N"));

struct FolderCase {
  const char* profilesDir;
  const char* folder;  // where the source's profiles are; "" when the value is refused
};

class ObxProfilesFolder : public testing::TestWithParam<FolderCase> {};

TEST_P(ObxProfilesFolder, AcceptsOnlyFoldersInsideTheInstallation) {
  ObxRun run(GetParam().profilesDir, {"-FT:N"});
  const std::string folder = *GetParam().folder ? GetParam().folder : "profiles";
  WriteFile(run.src() + "/" + folder + "/p.wlp", "[profile]\nondemandreports=1\n");
  EXPECT_EQ(run.manager()->DoCopyOBXProfiles(), 0);
  EXPECT_EQ(ListTree(run.dst() + "/vxm_vxx/datfiles/profiles"),
            *GetParam().folder ? std::vector<std::string>{"p_vxmigrate.wlp"}
                               : std::vector<std::string>{});
}

INSTANTIATE_TEST_SUITE_P(
    Cases, ObxProfilesFolder,
    testing::Values(FolderCase{"", "vxm_vxx/datfiles/profiles"}, FolderCase{"./profiles", "profiles"},
                    FolderCase{".x\\profiles", ".x/profiles"}, FolderCase{"ab", "ab"},
                    FolderCase{".\\profiles", ""}, FolderCase{"/data/profiles", ""},
                    FolderCase{"../profiles", ""}));

// A copy already there is the user's: it is neither redone nor logged. Without either settings
// file nothing is copied, nor in place.
TEST(ObxProfiles, LeavesExistingCopiesAndRefusesWithoutSettings) {
  ObxRun run("");
  run.WriteProfiles();
  const std::string mine = run.dst() + "/vxm_vxx/datfiles/profiles/shop_vxmigrate.wlp";
  WriteFile(mine, "mine");
  run.manager()->DoCopyOBXProfiles();
  EXPECT_EQ(ReadFile(mine), "mine");
  EXPECT_EQ(run.NewLog().size(), 3u);  // the intranet profile and its two folders

  auto inPlace = vxtest::MakeManager({run.src() + "/vxmigrate", "-D1:" + run.src(),
                                      "-D2:" + run.src(), "-P1:obx", "-P2:obx", "-V1:3.0",
                                      "-V2:3.5"});
  const std::vector<std::string> before = ListTree(run.src());
  EXPECT_EQ(inPlace->DoCopyOBXProfiles(), 0);
  EXPECT_EQ(ListTree(run.src()), before);

  std::remove((run.src() + "/vxm_vxx/vxm_vxx.ini").c_str());
  EXPECT_EQ(run.manager()->DoCopyOBXProfiles(), 1);
  std::remove((run.dst() + "/vxm_vxx/vxm_vxx.ini").c_str());
  EXPECT_EQ(run.manager()->DoCopyOBXProfiles(), 1);
}

}  // namespace
