// Profiles of one OBX installation copied into another under "_vxmigrate" names, with their report
// and database folders when the run carries profile data.

#include <gtest/gtest.h>

#include <algorithm>
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

const char kProfiles[] = "/vxm_vxx/datfiles/profiles/";

class ObxRun {
 public:
  explicit ObxRun(const std::string& profilesDir, std::vector<std::string> extra = {}) {
    vxtest::MakeDirs(src());
    vxtest::MakeDirs(dst());
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

  // Two profiles of the user's (one with its report and database folders) and the samples.
  void WriteProfiles(const std::string& folder) {
    WriteFile(folder + "/shop.wlp", "[profile]\nName=Shop\n");
    WriteFile(folder + "/intranet.wlp", "[profile]\nName=Intranet\nondemandreports=1\n");
    const std::string samples = GetSampleFileList("obx", "wlp");
    for (size_t at = 0; at < samples.size();) {
      const size_t comma = std::min(samples.find(',', at), samples.size());
      WriteFile(folder + "/" + samples.substr(at, comma - at), "[profile]\nName=Sample\n");
      at = comma + 1;
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
  ObxRun run("", ft == "<absent>" ? std::vector<std::string>{}
                                   : std::vector<std::string>{"-FT:" + ft});
  run.WriteProfiles(run.src() + "/vxm_vxx/datfiles/profiles");
  EXPECT_EQ(run.manager()->DoCopyOBXProfiles(), 0);
  const std::string to = run.dst() + "/vxm_vxx/datfiles/";
  const bool data = ft != "N";
  std::vector<std::string> expectedTree;
  std::vector<std::string> expectedLog = {"Profile copied: " + to + "profiles/intranet_vxmigrate.wlp"};
  if (data) {
    expectedTree = {"databases", "databases/shop_vxmigrate", "databases/shop_vxmigrate/visits.db",
                    "profiles", "profiles/intranet_vxmigrate.wlp", "profiles/shop_vxmigrate.wlp",
                    "reports", "reports/shop_vxmigrate.wlp", "reports/shop_vxmigrate.wlp/index.htm"};
    expectedLog.push_back("Report folder copied: " + to + "reports/intranet_vxmigrate.wlp");
    expectedLog.push_back("Database folder copied: " + to + "databases/intranet_vxmigrate");
  } else {
    expectedTree = {"profiles", "profiles/intranet_vxmigrate.wlp", "profiles/shop_vxmigrate.wlp"};
  }
  expectedLog.push_back("Profile copied: " + to + "profiles/shop_vxmigrate.wlp");
  if (data) {
    expectedLog.push_back("Report folder copied: " + to + "reports/shop_vxmigrate.wlp");
    expectedLog.push_back("Database folder copied: " + to + "databases/shop_vxmigrate");
  }
  EXPECT_EQ(ListTree(to), expectedTree);
  EXPECT_EQ(run.NewLog(), expectedLog);
  // A profile travelling without its folders makes its reports on demand unless it said otherwise.
  EXPECT_EQ(ReadFile(to + "profiles/shop_vxmigrate.wlp"),
            data ? "[profile]\nName=Shop\n" : "[profile]\nName=Shop\nondemandreports=0\n");
  EXPECT_EQ(ReadFile(to + "profiles/intranet_vxmigrate.wlp"),
            "[profile]\nName=Intranet\nondemandreports=1\n");
}

INSTANTIATE_TEST_SUITE_P(Values, ObxProfilesFT, testing::Values("<absent>", "Y", "yes", "N"));

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
  EXPECT_EQ(ListTree(run.dst() + kProfiles),
            *GetParam().folder ? std::vector<std::string>{"p_vxmigrate.wlp"}
                               : std::vector<std::string>{});
}

INSTANTIATE_TEST_SUITE_P(
    Cases, ObxProfilesFolder,
    testing::Values(FolderCase{"", "vxm_vxx/datfiles/profiles"}, FolderCase{"./profiles", "profiles"},
                    FolderCase{".x\\profiles", ".x/profiles"}, FolderCase{"ab", "ab"},
                    FolderCase{".\\profiles", ""}, FolderCase{"/data/profiles", ""},
                    FolderCase{"../profiles", ""}));

TEST(ObxProfiles, NeverRedoesACopy) {
  ObxRun run("");
  run.WriteProfiles(run.src() + "/vxm_vxx/datfiles/profiles");
  WriteFile(run.dst() + kProfiles + "shop_vxmigrate.wlp", "mine");
  run.manager()->DoCopyOBXProfiles();
  EXPECT_EQ(ReadFile(run.dst() + kProfiles + "shop_vxmigrate.wlp"), "mine");
  for (const std::string& entry : run.NewLog()) {
    EXPECT_EQ(entry.find("shop_vxmigrate"), std::string::npos) << entry;
  }
}

TEST(ObxProfiles, RefusesWithoutSettingsAndInPlace) {
  ObxRun missing("");
  std::remove((missing.src() + "/vxm_vxx/vxm_vxx.ini").c_str());
  EXPECT_EQ(missing.manager()->DoCopyOBXProfiles(), 1);
  std::remove((missing.dst() + "/vxm_vxx/vxm_vxx.ini").c_str());
  EXPECT_EQ(missing.manager()->DoCopyOBXProfiles(), 1);

  vxtest::TempDir root;
  WriteFile(root.Path("vxm_vxx/datfiles/profiles/shop.wlp"), "[profile]\n");
  WriteFile(root.Path("vxm_vxx/vxm_vxx.ini"), "[defaults]\n");
  auto inPlace = vxtest::MakeManager({root.Path("vxmigrate"), "-D1:" + root.path(),
                                      "-D2:" + root.path(), "-P1:obx", "-P2:obx", "-V1:3.0",
                                      "-V2:3.5"});
  EXPECT_EQ(inPlace->DoCopyOBXProfiles(), 0);
  EXPECT_FALSE(vxtest::FileExists(root.Path("vxm_vxx/datfiles/profiles/shop_vxmigrate.wlp")));
}

}  // namespace
