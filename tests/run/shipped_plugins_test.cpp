// The shipped plug-ins through the real host, each on copies of its sample installations
// (samples/), started with its command file from the folder that holds the copies. The
// destination, log included, must come out as tests/run/golden/<plug-in> holds it; the source
// must stay byte for byte; a fresh destination comes out the same; and a second run over the
// migrated destination changes nothing but the run's records.

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <string>
#include <vector>

#include "run/host_run.h"
#include "support/test_files.h"

namespace vxtest {
namespace {

namespace fs = std::filesystem;

class ShippedPlugin : public ::testing::TestWithParam<const char*> {};

// With VXM_UPDATE_GOLDEN=1 the test writes the golden files instead of comparing with them; their
// diff is then reviewed before it is committed. A second run over the migrated destination (the
// customer starts the migration twice) must not add a copy of anything nor grow or change a file.
TEST_P(ShippedPlugin, MigratesItsSamplesAsTheGoldenFilesShowAndASecondRunChangesNothing) {
  const std::string goldenFolder = Source("tests/run/golden/") + GetParam();
  const Tree golden = FilesBelow(goldenFolder);
  for (int fresh = 0; fresh < 2; ++fresh) {
    SampleRun run(GetParam());
    const Tree source = FilesBelow(run.Path(run.source));
    ASSERT_EQ(0, run.Run()) << run.Err();
    const Tree migrated = run.Destination();
    if (getenv("VXM_UPDATE_GOLDEN") != nullptr) {
      fs::remove_all(goldenFolder);
      for (const auto& [name, content] : migrated) WriteFile(goldenFolder + "/" + name, content);
      return;
    }
    EXPECT_EQ(migrated, golden);
    EXPECT_EQ(FilesBelow(run.Path(run.source)), source);
    if (fresh == 0) continue;
    const std::string destination = run.Path(run.destination);
    const Tree first = WithoutBookkeeping(TreeState(destination));
    ASSERT_EQ(0, run.Run()) << run.Err();
    EXPECT_EQ(WithoutBookkeeping(TreeState(destination)), first);
  }
}

// A server already at version 3 upgraded again: the library's OBX conversion serves only sources
// before version 3, so the plug-in says so and merges the query profiles as they are; converting
// them would have emptied their pages.
TEST(ObxUpgrade, FromVersionThreeKeepsQueryProfilesWhole) {
  SampleRun run("obx_to_obx");
  ASSERT_EQ(0, run.Run()) << run.Err();  // obx-2.5 into obx (3.0)
  fs::copy(Source("samples/obx"), run.Path("obx-3.1"), fs::copy_options::recursive);
  WriteFile(run.Path("migcmd.ini"),
            "[main]\nD1=obx\nD2=obx-3.1\nP1=obx\nP2=obx\nV1=3.0\nV2=3.1\n\n[profiles]\nLog=\n");
  ASSERT_EQ(0, run.Run()) << run.Err();

  const std::string pages = "/vxm_vxx/datfiles/dynamicpages/default.ini";
  EXPECT_EQ(ReadFile(run.Path("obx-3.1" + pages)), ReadFile(run.Path("obx" + pages)));
  const std::vector<std::string> log = LogEntries(run.Path("obx-3.1/vxmigrate.log"));
  EXPECT_NE(std::find(log.begin(), log.end(),
                      "No functions exist for migration of specified products - check names, "
                      "versions"),
            log.end());
}

INSTANTIATE_TEST_SUITE_P(Samples, ShippedPlugin, ::testing::ValuesIn(kShippedPlugins));

}  // namespace
}  // namespace vxtest
