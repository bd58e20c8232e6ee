// Running-server detection through real pid files and real processes.

#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <string>

#include "migrate/driver_fixture.h"
#include "support/live_process.h"

namespace vxtest {
namespace {

pid_t ExitedProcessPid() {
  pid_t pid = fork();
  if (pid == 0) _exit(0);
  waitpid(pid, nullptr, 0);
  return pid;
}

TEST(ReadPid, ReadsTheLeadingNumberOfTheFirstNineteenBytes) {
  TempDir root;
  auto manager = MakeRun(root, "pavsuite", "pavsuite", "5.0", "5.5");
  WriteFile(root.Path("pid"), "  4321\n");
  EXPECT_EQ(4321, manager->readPid(root.Path("pid").c_str()));
  WriteFile(root.Path("pid"), "garbage");
  EXPECT_EQ(0, manager->readPid(root.Path("pid").c_str()));
  WriteFile(root.Path("pid"), "");
  EXPECT_EQ(0, manager->readPid(root.Path("pid").c_str()));
  WriteFile(root.Path("pid"), "0000000000000000001234");  // digits past byte 19 are not read
  EXPECT_EQ(1, manager->readPid(root.Path("pid").c_str()));
  EXPECT_EQ(-1, manager->readPid(root.Path("missing").c_str()));
  EXPECT_EQ(-1, manager->readPid(root.path().c_str()));  // a folder cannot be read
  EXPECT_FALSE(manager->sendNullSignal(-1));
  EXPECT_TRUE(manager->sendNullSignal(getpid()));
}

struct PidFileCase {
  const char* name;
  const char* content;  // "$LIVE": a live process, "$EXITED": one that has ended
  int running;
};

class EnginePidFile : public ::testing::TestWithParam<PidFileCase> {};

TEST_P(EnginePidFile, DecidesWhetherTheServerRuns) {
  TempDir root;
  auto manager = MakeRun(root, "tqrs", "tqrs", "3.0", "3.0");
  LiveProcess live;
  std::string content = GetParam().content;
  if (content == "$LIVE") content = std::to_string(live.pid());
  if (content == "$EXITED") content = std::to_string(ExitedProcessPid());
  if (GetParam().content != nullptr && std::string(GetParam().content) != "$MISSING") {
    WriteFile(root.Path("dst/tqrs.pid"), content);
  }
  vxVersionDescriptor version("3.0");
  EXPECT_EQ(GetParam().running, manager->CheckEngineRunning(21, version, 0));
  std::string last = LogEntries(root.Path("dst/vxmigrate.log")).back();
  EXPECT_EQ(GetParam().running == 1,
            last == "Error: Cannot migrate while Tradequill Engine Server is running - shut down to migrate");
}

INSTANTIATE_TEST_SUITE_P(Cases, EnginePidFile,
                         ::testing::Values(PidFileCase{"Live", "$LIVE", 1},
                                           PidFileCase{"Exited", "$EXITED", 0},
                                           PidFileCase{"Missing", "$MISSING", 0},
                                           // Not a number reads as 0: our own process group answers.
                                           PidFileCase{"Garbage", "garbage", 1},
                                           PidFileCase{"Empty", "", 1}),
                         [](const ::testing::TestParamInfo<PidFileCase>& info) { return info.param.name; });

TEST(ServerChecks, PidFileNamesFollowProductAndVersion) {
  TempDir root;
  auto manager = MakeRun(root, "tqrs", "obx", "3.0", "3.1");
  LiveProcess live;
  std::string pid = std::to_string(live.pid());
  vxVersionDescriptor v30("3.0");
  vxVersionDescriptor v31("3.1");

  WriteFile(root.Path("src/tqrs.pid"), pid);  // product 21 before 3.1, source side
  EXPECT_EQ(1, manager->CheckEngineRunning(21, v30, 1));
  EXPECT_EQ(0, manager->CheckEngineRunning(21, v31, 1));  // 3.1 reads "vxtq.pid"
  WriteFile(root.Path("src/vxtq.pid"), pid);
  EXPECT_EQ(1, manager->CheckEngineRunning(21, v31, 1));
  EXPECT_EQ(0, manager->CheckEngineRunning(21, v31, 0));  // the destination has none

  WriteFile(root.Path("dst/vxrs_ui.pid"), pid);
  EXPECT_EQ(1, manager->CheckInterfaceRunning(20, v31, 0));
  EXPECT_EQ(0, manager->CheckInterfaceRunning(20, v30, 0));  // before 3.1: "vxinterface.pid"
  EXPECT_EQ("Error: Cannot migrate while Halden Interface Server is running - shut down to migrate",
            LogEntries(root.Path("dst/vxmigrate.log")).back());

  WriteFile(root.Path("dst/vxinterface.pid"), pid);
  EXPECT_EQ(1, manager->CheckInterfaceRunning(21, v30, 0));
  EXPECT_EQ(0, manager->CheckEngineRunning(1, v30, 0));  // products without servers

  // A source "folder" that is really a file holding a live pid is still no server.
  WriteFile(root.Path("srcfile"), pid);
  auto fileSource = MakeManager({root.Path("bin/vxmigrate"), "-D1:" + root.Path("srcfile"),
                                 "-D2:" + root.Path("dst"), "-P1:pavsuite", "-P2:pavsuite",
                                 "-V1:5.0", "-V2:5.5"});
  EXPECT_EQ(0, fileSource->CheckEngineRunning(1, v30, 1));
  EXPECT_EQ(0, fileSource->CheckInterfaceRunning(1, v30, 1));
}

TEST(ServerChecks, TheRunChecksDestinationEngineFirst) {
  TempDir root;
  auto manager = MakeRun(root, "tqrs", "obx", "3.2", "3.2");
  LiveProcess live;
  WriteFile(root.Path("src/vxtq.pid"), std::to_string(live.pid()));
  WriteFile(root.Path("dst/vxrs_ui.pid"), std::to_string(live.pid()));
  EXPECT_EQ(1, manager->DoCheckMigrateValidity());
  // The source engine is found before the destination interface.
  EXPECT_EQ("Error: Cannot migrate while Tradequill Engine Server is running - shut down to migrate",
            LogEntries(root.Path("dst/vxmigrate.log")).back());
}

}  // namespace
}  // namespace vxtest
