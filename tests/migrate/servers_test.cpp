// Running-server detection through real pid files and real processes.

#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <string>
#include <utility>
#include <vector>

#include "migrate/installations_fixture.h"
#include "support/live_process.h"

namespace vxtest {
namespace {

const char kEngineRuns[] =
    "Error: Cannot migrate while Tradequill Engine Server is running - shut down to migrate";

TEST(ReadPid, ReadsTheLeadingNumberOfTheFirstNineteenBytes) {
  Installations run;
  vxMigrationManager& manager = run.manager();
  for (const auto& [content, pid] : std::vector<std::pair<const char*, int>>{
           {"  4321\n", 4321}, {"garbage", 0}, {"", 0}, {"0000000000000000001234", 1}}) {
    WriteFile(run.Src("pid"), content);
    EXPECT_EQ(pid, manager.readPid(run.Src("pid").c_str())) << content;
  }
  EXPECT_EQ(-1, manager.readPid(run.Src("missing").c_str()));
  EXPECT_EQ(-1, manager.readPid(run.Src().c_str()));  // a folder cannot be read
  EXPECT_FALSE(manager.sendNullSignal(-1));
  EXPECT_TRUE(manager.sendNullSignal(getpid()));
}

TEST(ServerChecks, PidFileDecidesWhetherTheServerRuns) {
  LiveProcess live;
  pid_t exited = fork();
  if (exited == 0) _exit(0);
  waitpid(exited, nullptr, 0);
  // Not a number reads as 0: our own process group answers. "<none>": no pid file.
  for (const auto& [content, running] : std::vector<std::pair<std::string, int>>{
           {std::to_string(live.pid()), 1}, {std::to_string(exited), 0}, {"<none>", 0}, {"garbage", 1},
           {"", 1}}) {
    Installations run(RunArgs("tqrs", "tqrs", "3.0", "3.0"));
    if (content != "<none>") WriteFile(run.Dst("tqrs.pid"), content);
    EXPECT_EQ(running, run.manager().CheckEngineRunning(21, vxVersionDescriptor("3.0"), 0))
        << content;
    EXPECT_EQ(running == 1, LogEntries(run.Dst("vxmigrate.log")).back() == kEngineRuns);
  }
}

TEST(ServerChecks, PidFileNamesFollowProductAndVersion) {
  Installations run(RunArgs("tqrs", "obx", "3.0", "3.1"));
  vxMigrationManager& manager = run.manager();
  LiveProcess live;
  std::string pid = std::to_string(live.pid());
  vxVersionDescriptor v30("3.0"), v31("3.1");
  WriteFile(run.Src("tqrs.pid"), pid);  // product 21 before 3.1, source side
  EXPECT_EQ(1, manager.CheckEngineRunning(21, v30, 1));
  EXPECT_EQ(0, manager.CheckEngineRunning(21, v31, 1));  // 3.1 reads "vxtq.pid"
  WriteFile(run.Src("vxtq.pid"), pid);
  EXPECT_EQ(1, manager.CheckEngineRunning(21, v31, 1));
  EXPECT_EQ(0, manager.CheckEngineRunning(21, v31, 0));  // the destination has none
  WriteFile(run.Dst("vxrs_ui.pid"), pid);
  EXPECT_EQ(1, manager.CheckInterfaceRunning(20, v31, 0));
  EXPECT_EQ(0, manager.CheckInterfaceRunning(20, v30, 0));  // before 3.1: "vxinterface.pid"
  EXPECT_EQ("Error: Cannot migrate while Halden Interface Server is running - shut down to migrate",
            run.RunLog().back());
  WriteFile(run.Dst("vxinterface.pid"), pid);
  EXPECT_EQ(1, manager.CheckInterfaceRunning(21, v30, 0));
  EXPECT_EQ(0, manager.CheckEngineRunning(1, v30, 0));  // products without servers
  // A source "folder" that is really a file holding a live pid is still no server.
  WriteFile(run.Src("file"), pid);
  auto fileSource = MakeManager({"vxmigrate", "-D1:" + run.Src("file"), "-D2:" + run.Dst(),
                                 "-P1:pavsuite", "-P2:pavsuite", "-V1:5.0", "-V2:5.5"});
  EXPECT_EQ(0, fileSource->CheckEngineRunning(1, v30, 1));
  EXPECT_EQ(0, fileSource->CheckInterfaceRunning(1, v30, 1));
}

// A run checks the source engine before the destination interface.
TEST(ServerChecks, TheRunChecksTheSourceEngineFirst) {
  Installations run(RunArgs("tqrs", "obx", "3.2", "3.2"));
  LiveProcess live;
  WriteFile(run.Src("vxtq.pid"), std::to_string(live.pid()));
  WriteFile(run.Dst("vxrs_ui.pid"), std::to_string(live.pid()));
  EXPECT_EQ(1, run.manager().DoCheckMigrateValidity());
  EXPECT_EQ(kEngineRuns, run.RunLog().back());
}

}  // namespace
}  // namespace vxtest
