// Whole migrations through the vxmigrate host process with real plug-ins beside it: plug-in
// choice, version ranges, command files, refusals, the install script and the log's exact texts.

#include <gtest/gtest.h>
#include <unistd.h>

#include <string>
#include <utility>
#include <vector>

#include "foundation/files/shared_lib.h"
#include "run/host_fixture.h"
#include "support/live_process.h"
#include "support/test_files.h"

namespace vxtest {
namespace {

const char kNoPlugin[] =
    "Error: No appropriate migration libraries found.  There may not be support for the products "
    "or versions being migrated.  Check the readme file for more info.";

std::vector<std::string> Header(const HostRun& run, const std::string& p1, const std::string& p2,
                                const std::string& v1, const std::string& v2) {
  return {"VXMigrate Log File: " + run.Log(),
          "VXMigrate Executable: " + run.bin() + "/vxmigrate",
          "Source Path: " + run.src(),
          "Destination Path: " + run.dst(),
          "Source Version: " + v1,
          "Destination Version: " + v2,
          "Source Product: " + p1,
          "Destination Product: " + p2,
          "\r",
          "\r"};
}

// The log's entries after the header (the header's last entry, "\r\n\r\n", spans three lines).
std::vector<std::string> Body(const HostRun& run) {
  std::vector<std::string> entries = LogEntries(run.Log());
  if (entries.size() < 11) return entries;
  return std::vector<std::string>(entries.begin() + 11, entries.end());
}

std::vector<std::string> ScriptLines(const HostRun& run) {
  return {"Looking for Synch Install Script: " + run.dst() + "/synchinstall.sh"};
}

TEST(HostRun, FirstFittingPluginRunsAndTheLogReadsInOrder) {
  HostRun run({"p05_halsuite_obx", "p10_pavsuite", "p20_pavsuite"});
  HostResult result = run.Run(run.RunOptions("pavsuite", "PAVSUITE", "5.0", "5.5"));
  EXPECT_EQ(0, result.exitCode) << result.err;
  EXPECT_EQ("VXMigrate log: " + run.Log() + "\n", result.out);

  std::vector<std::string> entries = LogEntries(run.Log());
  std::vector<std::string> header = Header(run, "pavsuite", "PAVSUITE", "5.0", "5.5");
  ASSERT_GE(entries.size(), header.size() + 1);
  EXPECT_EQ(header, std::vector<std::string>(entries.begin(), entries.begin() + header.size()));
  EXPECT_EQ("", entries[header.size()]);  // the blank line the "\r\n\r\n" entry ends with

  std::vector<std::string> expected = {"Test plug-in ran: p10"};
  for (const std::string& line : ScriptLines(run)) expected.push_back(line);
  expected.push_back("** See VXMigrate Log File for details:  " + run.Log());
  EXPECT_EQ(expected, Body(run));
  EXPECT_EQ("p10 " + run.src() + " " + run.dst() + " 5.0 5.5 1 1 FT=\n",
            ReadFile(run.dst() + "/plugin_calls.txt"));
}

TEST(HostRun, NoFittingPluginStillRunsTheScriptStepAndSucceeds) {
  HostRun run({"p10_pavsuite"});
  HostResult result = run.Run(run.RunOptions("tradeq", "tradeq", "2.0", "2.1"));
  EXPECT_EQ(0, result.exitCode);
  std::vector<std::string> expected = ScriptLines(run);
  expected.push_back(kNoPlugin);
  expected.push_back("** See VXMigrate Log File for details:  " + run.Log());
  EXPECT_EQ(expected, Body(run));
  EXPECT_FALSE(FileExists(run.dst() + "/plugin_calls.txt"));
}

TEST(HostRun, PluginWithoutMigrateEndsTheSearch) {
  HostRun run({"p15_log_without_migrate", "p30_log"});
  HostResult result = run.Run(run.RunOptions("log", "log", "6.0", "6.1"));
  EXPECT_EQ(0, result.exitCode);
  EXPECT_FALSE(FileExists(run.dst() + "/plugin_calls.txt"));
  EXPECT_EQ(kNoPlugin, Body(run).at(1));
}

TEST(HostRun, VersionsOutsideTheRangesSkipThePlugin) {
  HostRun run({"p10_pavsuite"});
  HostResult result = run.Run(run.RunOptions("pavsuite", "pavsuite", "3.9", "5.5"));
  EXPECT_EQ(0, result.exitCode);
  EXPECT_FALSE(FileExists(run.dst() + "/plugin_calls.txt"));
  EXPECT_EQ(kNoPlugin, Body(run).at(1));
  // Both bounds are inclusive.
  HostRun edge({"p10_pavsuite"});
  edge.Run(edge.RunOptions("pavsuite", "pavsuite", "4.0", "6.5"));
  EXPECT_TRUE(FileExists(edge.dst() + "/plugin_calls.txt"));
}

TEST(HostRun, MissingRangeFileStopsTheSearchWithItsMessages) {
  HostRun run({"p10_pavsuite", "p20_pavsuite"}, nullptr);
  HostResult result = run.Run(run.RunOptions("pavsuite", "pavsuite", "5.0", "5.5"));
  EXPECT_EQ(0, result.exitCode);
  std::vector<std::string> expected = {
      "Error: Unable to open file:   " + run.bin() + "/vxmigrate.ini",
      "Error: Can't open vxmigrate.ini - make sure it's present and isn't read only"};
  for (const std::string& line : ScriptLines(run)) expected.push_back(line);
  expected.push_back(kNoPlugin);
  expected.push_back("** See VXMigrate Log File for details:  " + run.Log());
  EXPECT_EQ(expected, Body(run));
}

TEST(HostRun, SomethingThatIsNotASharedObjectIsSkipped) {
  HostRun run({"p10_pavsuite"});
  WriteFile(run.bin() + "/a_text_file.so", "this is not a library\n");
  WriteFile(run.bin() + "/b_truncated.so", ReadFile(std::string(VXM_TEST_PLUGIN_DIR) +
                                                    "/p20_pavsuite.so").substr(0, 300));
  HostResult result = run.Run(run.RunOptions("pavsuite", "pavsuite", "5.0", "5.5"));
  EXPECT_EQ(0, result.exitCode) << result.err;
  EXPECT_EQ("p10", ReadFile(run.dst() + "/plugin_calls.txt").substr(0, 3));
}

// With no executable found, the current folder's listing gives bare names; they load from there.
TEST(HostRun, PluginNamedWithoutAFolderLoadsFromTheCurrentFolder) {
  char previous[4096];
  ASSERT_NE(nullptr, getcwd(previous, sizeof previous));
  ASSERT_EQ(0, chdir(VXM_TEST_PLUGIN_DIR));
  {
    vxSharedLib library("p10_pavsuite.so");
    EXPECT_NE(nullptr, library.ProcAddr("MigrateInitialize")) << library.LoadError().str();
  }
  ASSERT_EQ(0, chdir(previous));
}

TEST(HostRun, IncompleteCommandLinePrintsUsageAndWritesNoLog) {
  HostRun run({"p10_pavsuite"});
  std::vector<std::string> options = run.RunOptions("pavsuite", "pavsuite", "5.0", "5.5");
  options.erase(options.begin() + 4);  // no -V1
  HostResult result = run.Run(options);
  EXPECT_EQ(1, result.exitCode);
  for (const char* option : {"-D1", "-D2", "-P1", "-P2", "-V1", "-V2", "-FT", "-cmd", "-PFLog",
                             "-PFProxy", "-PFStream", "-PFLink", "-PFAlert"}) {
    EXPECT_NE(std::string::npos, result.err.find(option)) << option;
  }
  EXPECT_EQ("", result.out);
  EXPECT_FALSE(FileExists(run.Log()));
  // An unknown destination product is just as incomplete.
  HostResult unknown = run.Run(run.RunOptions("pavsuite", "nosuch", "5.0", "5.5"));
  EXPECT_EQ(1, unknown.exitCode);
  EXPECT_FALSE(FileExists(run.Log()));
}

// Where the command file is looked for, by the value of "-cmd".
struct CommandFileRoute {
  const char* name;
  const char* fileLocation;  // relative to the test root
  const char* cmdOption;     // "" for none; "$ROOT" is replaced by the test root
};

class HostCommandFile : public ::testing::TestWithParam<CommandFileRoute> {};

TEST_P(HostCommandFile, SuppliesTheMissingOptions) {
  const CommandFileRoute& route = GetParam();
  HostRun run({"p10_pavsuite"});
  WriteFile(run.Path(route.fileLocation),
            "[main]\nD1=" + run.src() + "\nD2=" + run.dst() +
                "\nP1=pavsuite\nP2=pavsuite\nV1=5.0\nV2=5.5\nFT=N\n[profiles]\nLog=a.wlp\n");
  std::vector<std::string> options = {"-V1:ignored"};
  std::string cmd = route.cmdOption;
  if (!cmd.empty()) {
    size_t root = cmd.find("$ROOT");
    if (root != std::string::npos) cmd.replace(root, 5, run.Path("").substr(0, run.Path("").size() - 1));
    options.push_back("-cmd:" + cmd);
  }
  HostResult result = run.Run(options);
  EXPECT_EQ(0, result.exitCode) << result.err;
  EXPECT_EQ("p10 " + run.src() + " " + run.dst() + " 5.0 5.5 1 1 FT=N\n",
            ReadFile(run.dst() + "/plugin_calls.txt"));
}

INSTANTIATE_TEST_SUITE_P(
    Routes, HostCommandFile,
    ::testing::Values(CommandFileRoute{"ModuleFolder", "bin/migcmd.ini", ""},
                      CommandFileRoute{"Folder", "cmds/migcmd.ini", "$ROOT/cmds"},
                      CommandFileRoute{"FolderWithSlash", "cmds/migcmd.ini", "$ROOT/cmds/"},
                      CommandFileRoute{"BareNameInModuleFolder", "bin/other.ini", "other.ini"},
                      CommandFileRoute{"FullPath", "cmds/run1.ini", "$ROOT/cmds/run1.ini"}),
    [](const ::testing::TestParamInfo<CommandFileRoute>& info) { return info.param.name; });

TEST(HostRun, UnreadableCommandFileLeavesTheRunInvalid) {
  HostRun run({"p10_pavsuite"});
  HostResult result = run.Run({"-cmd:" + run.Path("nowhere/migcmd.ini")});
  EXPECT_EQ(1, result.exitCode);
  EXPECT_FALSE(FileExists(run.Log()));
}

struct Refusal {
  const char* name;
  const char* source;       // relative to the test root
  const char* destination;  // relative to the test root
  const char* p1;
  const char* p2;
  const char* v1;
  const char* v2;
  const char* message;      // the log line before the pointer line ($SRC, $DST: the folders)
};

class HostRefusal : public ::testing::TestWithParam<Refusal> {};

TEST_P(HostRefusal, EndsWithItsMessageAndResultOne) {
  const Refusal& refusal = GetParam();
  HostRun run({"p10_pavsuite"});
  std::string source = run.Path(refusal.source);
  std::string destination = run.Path(refusal.destination);
  MakeDirs(destination);
  HostResult result = run.Run({"-D1:" + source, "-D2:" + destination, std::string("-P1:") + refusal.p1,
                               std::string("-P2:") + refusal.p2, std::string("-V1:") + refusal.v1,
                               std::string("-V2:") + refusal.v2});
  EXPECT_EQ(1, result.exitCode);
  std::string message = refusal.message;
  for (const auto& [mark, text] : {std::pair<std::string, std::string>{"$DST", destination},
                                   std::pair<std::string, std::string>{"$SRC", source}}) {
    size_t at = message.find(mark);
    if (at != std::string::npos) message.replace(at, mark.size(), text);
  }
  std::vector<std::string> entries = LogEntries(destination + "/vxmigrate.log");
  ASSERT_GE(entries.size(), 2u);
  EXPECT_EQ(message, entries[entries.size() - 2]);
  EXPECT_EQ("** See VXMigrate Log File for details:  " + destination + "/vxmigrate.log",
            entries.back());
  EXPECT_FALSE(FileExists(destination + "/plugin_calls.txt"));
}

INSTANTIATE_TEST_SUITE_P(
    Checks, HostRefusal,
    ::testing::Values(
        Refusal{"DestinationInsideSource", "src", "src/new", "pavsuite", "pavsuite", "5.0", "5.5",
                "Error: Destination directory cannot be child of source directory: $DST"},
        Refusal{"DestinationInsideSourceWithSlash", "src/", "src/new", "pavsuite", "pavsuite", "5.0",
                "5.5", "Error: Destination directory cannot be child of source directory: $DST"},
        Refusal{"MissingSource", "nosuch", "dst", "pavsuite", "pavsuite", "5.0", "5.5",
                "Error: Source directory does not exist:  $SRC"},
        Refusal{"UnknownSourceProduct", "src", "dst", "nosuch", "pavsuite", "5.0", "5.5",
                "Error: Incorrect source product"},
        Refusal{"OlderDestination", "src", "dst", "pavsuite", "pavsuite", "5.1", "5.0",
                "Error: Cannot migrate because source version greater than destination version"}),
    [](const ::testing::TestParamInfo<Refusal>& info) { return info.param.name; });

TEST(HostRun, MissingDestinationIsReportedOnStandardError) {
  HostRun run({"p10_pavsuite"});
  std::vector<std::string> options = run.RunOptions("pavsuite", "pavsuite", "5.0", "5.5");
  options[1] = "-D2:" + run.Path("nowhere");
  HostResult result = run.Run(options);
  EXPECT_EQ(1, result.exitCode);
  EXPECT_EQ("vxmigrate: cannot write the log " + run.Path("nowhere") + "/vxmigrate.log\n", result.err);
}

TEST(HostRun, RunningReportingServerRefusesTheRun) {
  HostRun run({"p05_halsuite_obx"});
  HostResult result;
  {
    LiveProcess server;
    WriteFile(run.dst() + "/vxrs.pid", std::to_string(server.pid()) + "\n");
    result = run.Run(run.RunOptions("halsuite", "obx", "5.5", "3.5"));
  }
  EXPECT_EQ(1, result.exitCode);
  std::vector<std::string> body = Body(run);
  ASSERT_EQ(2u, body.size());
  EXPECT_EQ("Error: Cannot migrate while Halden Engine Server is running - shut down to migrate",
            body[0]);
  // Once the server is gone the same run goes through.
  HostResult again = run.Run(run.RunOptions("halsuite", "obx", "5.5", "3.5"));
  EXPECT_EQ(0, again.exitCode);
  EXPECT_TRUE(FileExists(run.dst() + "/plugin_calls.txt"));
}

TEST(HostRun, InstallScriptRunsInTheDestinationAndTheFolderIsRestored) {
  HostRun run({"p10_pavsuite"});
  WriteFile(run.dst() + "/synchinstall.sh", "#!/bin/sh\npwd > script_ran_in.txt\nexit 3\n");
  chmod((run.dst() + "/synchinstall.sh").c_str(), 0755);
  HostResult result = run.Run(run.RunOptions("pavsuite", "pavsuite", "5.0", "5.5"));
  EXPECT_EQ(0, result.exitCode);  // the script's own status is not the run's
  EXPECT_EQ(run.dst() + "\n", ReadFile(run.dst() + "/script_ran_in.txt"));
  std::string script = run.dst() + "/synchinstall.sh";
  std::vector<std::string> expected = {"Test plug-in ran: p10",
                                       "Looking for Synch Install Script: " + script,
                                       "Executing Synch Install Script: " + script,
                                       "Spawning Script: ./synchinstall.sh",
                                       "Done executing Synch Install Script.",
                                       "** See VXMigrate Log File for details:  " + run.Log()};
  EXPECT_EQ(expected, Body(run));
}

}  // namespace
}  // namespace vxtest
