// The run sequence inside one process: the current folder around the install script.

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <string>

#include "migrate/driver_fixture.h"

namespace vxtest {
namespace {

std::string CurrentFolder() {
  char buffer[4096];
  return getcwd(buffer, sizeof buffer) != nullptr ? buffer : "";
}

TEST(RunSequence, InstallScriptRunsInTheDestinationAndTheFolderComesBack) {
  TempDir root;
  auto manager = MakeRun(root, "log", "log", "6.0", "6.5");
  WriteFile(root.Path("dst/synchinstall.sh"), "#!/bin/sh\npwd > ran_in.txt\n");
  chmod(root.Path("dst/synchinstall.sh").c_str(), 0755);
  std::string before = CurrentFolder();
  EXPECT_EQ(0, manager->DoMigration());
  EXPECT_EQ(before, CurrentFolder());
  EXPECT_EQ(root.Path("dst") + "\n", ReadFile(root.Path("dst/ran_in.txt")));
}

}  // namespace
}  // namespace vxtest
