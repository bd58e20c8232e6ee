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

TEST(RunSequence, ALinkInPlaceOfTheLogIsReplacedNotFollowed) {
  TempDir root;
  WriteFile(root.Path("src/keep.txt"), "customer data\n");
  MakeDirs(root.Path("dst"));
  ASSERT_EQ(0, symlink(root.Path("src/keep.txt").c_str(), root.Path("dst/vxmigrate.log").c_str()));
  auto manager = MakeRun(root, "log", "log", "6.0", "6.5");
  EXPECT_EQ("customer data\n", ReadFile(root.Path("src/keep.txt")));
  struct stat st;
  ASSERT_EQ(0, lstat(root.Path("dst/vxmigrate.log").c_str(), &st));
  EXPECT_TRUE(S_ISREG(st.st_mode));
  EXPECT_EQ(11u, LogEntries(root.Path("dst/vxmigrate.log")).size());  // the header
}

}  // namespace
}  // namespace vxtest
