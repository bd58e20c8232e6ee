// The run sequence inside one process: the current folder around the install script, and a run
// with no plug-ins at all.

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <string>
#include <vector>

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

TEST(RunSequence, NoPluginsStillEndsWithTheMessageAndThePointer) {
  TempDir root;
  auto manager = MakeRun(root, "log", "log", "6.0", "6.5");
  EXPECT_EQ(0, manager->DoMigration());
  std::vector<std::string> log = LogEntries(root.Path("dst/vxmigrate.log"));
  ASSERT_GE(log.size(), 3u);
  EXPECT_EQ("Looking for Synch Install Script: " + root.Path("dst/synchinstall.sh"), log[log.size() - 3]);
  EXPECT_EQ(0u, log[log.size() - 2].find("Error: No appropriate migration libraries found."));
  EXPECT_EQ("** See VXMigrate Log File for details:  " + root.Path("dst/vxmigrate.log"), log.back());
}

TEST(RunSequence, InvalidRunHasNoLogAndSetsNothing) {
  TempDir root;
  MakeDirs(root.Path("dst"));
  auto manager = MakeManager({root.Path("bin/vxmigrate"), "-D2:" + root.Path("dst"), "-P1:log",
                              "-P2:log", "-V1:6.0", "-V2:6.5", "-cmd:" + root.Path("none.ini")});
  EXPECT_FALSE(manager->IsValid());
  EXPECT_EQ(nullptr, manager->GetLog());
  EXPECT_FALSE(FileExists(root.Path("dst/vxmigrate.log")));
  manager->Log("ignored without a log");  // must not crash
}

}  // namespace
}  // namespace vxtest
