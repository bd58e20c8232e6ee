// The shipped plug-ins through the real host, each on copies of its sample installations
// (samples/), started with its command file from the folder that holds the copies. The
// destination, log included, must come out as tests/run/golden/<plug-in> holds it; the source
// must stay byte for byte; a fresh destination comes out the same; and a second run over the
// migrated destination changes nothing but the log.

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/wait.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <map>
#include <string>
#include <vector>

#include "run/sample_run.h"
#include "support/test_files.h"

namespace vxtest {
namespace {

namespace fs = std::filesystem;

std::string GoldenFolder(const std::string& plugin) {
  return Source("tests/run/golden/" + plugin);
}

// With VXM_UPDATE_GOLDEN=1 the test writes the golden files instead of comparing with them; their
// diff is then reviewed before it is committed.
void WriteGolden(const std::string& plugin, const Tree& files) {
  fs::remove_all(GoldenFolder(plugin));
  for (const auto& [name, content] : files) WriteFile(GoldenFolder(plugin) + "/" + name, content);
}

class ShippedPlugin : public ::testing::TestWithParam<const char*> {};
class ShippedPluginAgain : public ::testing::TestWithParam<const char*> {};

TEST_P(ShippedPlugin, MigratesItsSamplesAsTheGoldenFilesShow) {
  const bool update = getenv("VXM_UPDATE_GOLDEN") != nullptr;
  const Tree golden = FilesBelow(GoldenFolder(GetParam()));
  for (int fresh = 0; fresh < 2; ++fresh) {
    SampleRun run(GetParam());
    const Tree source = FilesBelow(run.Path(run.source));
    ASSERT_EQ(0, run.Run()) << ReadFile(run.Path("out.txt"));
    const Tree migrated = run.Destination();
    if (update) {
      WriteGolden(GetParam(), migrated);
      return;
    }
    EXPECT_EQ(migrated, golden);
    EXPECT_EQ(FilesBelow(run.Path(run.source)), source);
  }
}

// Running again over a migrated destination (the customer starts the migration twice) must not
// add a second copy of anything nor grow a file.
TEST_P(ShippedPluginAgain, SecondRunChangesOnlyTheLog) {
  SampleRun run(GetParam());
  ASSERT_EQ(0, run.Run()) << ReadFile(run.Path("out.txt"));
  Tree first = FilesBelow(run.Path(run.destination));
  ASSERT_EQ(0, run.Run()) << ReadFile(run.Path("out.txt"));
  Tree second = FilesBelow(run.Path(run.destination));
  first.erase("vxmigrate.log");
  second.erase("vxmigrate.log");
  EXPECT_EQ(second, first);
}

// A server already at version 3 upgraded again: the library's OBX conversion serves only sources
// before version 3, so the plug-in says so and merges the query profiles as they are; converting
// them would have emptied their pages.
TEST(ObxUpgrade, FromVersionThreeKeepsQueryProfilesWhole) {
  SampleRun run("obx_to_obx");
  ASSERT_EQ(0, run.Run()) << ReadFile(run.Path("out.txt"));  // obx-2.5 into obx (3.0)
  fs::copy(Source("samples/obx"), run.Path("obx-3.1"), fs::copy_options::recursive);
  WriteFile(run.Path("migcmd.ini"),
            "[main]\nD1=obx\nD2=obx-3.1\nP1=obx\nP2=obx\nV1=3.0\nV2=3.1\n\n[profiles]\nLog=\n");
  ASSERT_EQ(0, run.Run()) << ReadFile(run.Path("out.txt"));

  const std::string pages = "/vxm_vxx/datfiles/dynamicpages/default.ini";
  EXPECT_EQ(ReadFile(run.Path("obx-3.1" + pages)), ReadFile(run.Path("obx" + pages)));
  const std::vector<std::string> log = LogEntries(run.Path("obx-3.1/vxmigrate.log"));
  EXPECT_NE(std::find(log.begin(), log.end(),
                      "No functions exist for migration of specified products - check names, "
                      "versions"),
            log.end());
}

INSTANTIATE_TEST_SUITE_P(Samples, ShippedPlugin, ::testing::ValuesIn(kShippedPlugins));
INSTANTIATE_TEST_SUITE_P(Samples, ShippedPluginAgain, ::testing::ValuesIn(kShippedPlugins));

}  // namespace
}  // namespace vxtest
