// Whole migrations through the vxmigrate host process with real plug-ins beside it: plug-in
// choice, version ranges, command files, refusals, the install script and the log's exact texts.

#include <gtest/gtest.h>
#include <sys/stat.h>

#include <filesystem>
#include <memory>
#include <string>
#include <vector>

#include "foundation/files/shared_lib.h"
#include "run/host_run.h"
#include "support/live_process.h"
#include "support/test_files.h"

namespace vxtest {
namespace {

const char kNoPlugin[] =
    "Error: No appropriate migration libraries found.  There may not be support for the products "
    "or versions being migrated.  Check the readme file for more info.";

TEST(HostRun, ChoosesThePluginAndWritesTheWholeLogInOrder) {
  struct {
    Lines plugins;
    bool ranges;      // false: no vxmigrate.ini beside the host
    Lines options;    // P1, P2, V1, V2
    std::string ran;  // the plug-in that must run, "" for none
  } cases[] = {
      {{"p05_halsuite_obx", "p10_pavsuite", "p20_pavsuite"}, true,
       {"pavsuite", "PAVSUITE", "5.0", "5.5"}, "p10"},
      {{"p10_pavsuite"}, true, {"tradeq", "tradeq", "2.0", "2.1"}, ""},
      {{"p15_log_without_migrate", "p30_log"}, true, {"log", "log", "6.0", "6.1"}, ""},  // search ends
      {{"p10_pavsuite"}, true, {"pavsuite", "pavsuite", "3.9", "5.5"}, ""},
      {{"p10_pavsuite"}, true, {"pavsuite", "pavsuite", "5.0", "6.6"}, ""},
      {{"p10_pavsuite"}, true, {"pavsuite", "pavsuite", "4.0", "6.5"}, "p10"},  // bounds are inclusive
      {{"p10_pavsuite", "p20_pavsuite"}, false, {"pavsuite", "pavsuite", "5.0", "5.5"}, ""}};
  for (const auto& c : cases) {
    const Lines& o = c.options;
    SCOPED_TRACE(::testing::PrintToString(c.plugins) + ::testing::PrintToString(o));
    HostRun run(c.plugins, c.ranges);
    // Two .so files that are not shared objects come first: they are skipped.
    WriteFile(run.bin + "/a_text_file.so", "this is not a library\n");
    WriteFile(run.bin + "/b_truncated.so",
              ReadFile(VXM_TEST_PLUGIN_DIR "/p20_pavsuite.so").substr(0, 300));
    // No plug-in run is exit status 3, and the summary says which files did not load.
    EXPECT_EQ(c.ran.empty() ? 3 : 0, run.Run(run.Options(o))) << run.Err();
    const std::string out = run.Out();
    EXPECT_EQ(c.ran.empty(), out.find("could not be loaded: " + run.bin + "/a_text_file.so") !=
                                 std::string::npos) << out;
    EXPECT_NE(std::string::npos, out.find("Log:                  " + run.log + "\n")) << out;
    // The header's last entry, "\r\n\r\n", spans three lines.
    Lines log = {"VXMigrate Log File: " + run.log, "VXMigrate Executable: " + run.bin + "/vxmigrate",
                 "Source Path: " + run.src, "Destination Path: " + run.dst, "Source Version: " + o[2],
                 "Destination Version: " + o[3], "Source Product: " + o[0],
                 "Destination Product: " + o[1], "\r", "\r", ""};
    if (!c.ranges) {
      log.push_back("Error: Unable to open file:   " + run.bin + "/vxmigrate.ini");
      log.push_back("Error: Can't open vxmigrate.ini - make sure it's present and isn't read only");
    }
    if (!c.ran.empty()) log.push_back("Test plug-in ran: " + c.ran);
    log.push_back("Looking for Synch Install Script: " + run.Script());
    if (c.ran.empty()) log.push_back(kNoPlugin);
    log.push_back(run.Pointer());
    EXPECT_EQ(log, LogEntries(run.log));
    std::string call = c.ran + " " + run.src + " " + run.dst + " " + o[2] + " " + o[3] + " 1 1 FT=\n";
    EXPECT_EQ(c.ran.empty() ? "<missing>" : call, ReadFile(run.dst + "/plugin_calls.txt"));
  }
}

// With no executable found, the current folder's listing gives bare names; they load from there.
TEST(HostRun, PluginNamedWithoutAFolderLoadsFromTheCurrentFolder) {
  const std::filesystem::path previous = std::filesystem::current_path();
  std::filesystem::current_path(VXM_TEST_PLUGIN_DIR);
  EXPECT_NE(nullptr, vxSharedLib("p10_pavsuite.so").ProcAddr("MigrateInitialize"));
  std::filesystem::current_path(previous);
}

TEST(HostRun, CommandFileIsFoundByEachRoute) {
  // Where the file lies (under the test root) and the "-cmd" value, if any ("$ROOT/": the root).
  for (const Lines& route : std::vector<Lines>{{"bin/migcmd.ini"},
                                               {"cmds/migcmd.ini", "$ROOT/cmds"},
                                               {"cmds/migcmd.ini", "$ROOT/cmds/"},
                                               {"bin/other.ini", "other.ini"},
                                               {"cmds/run1.ini", "$ROOT/cmds/run1.ini"}}) {
    HostRun run({"p10_pavsuite"});
    WriteFile(run.Path(route[0]), "[main]\nD1=" + run.src + "\nD2=" + run.dst + "\nP1=pavsuite\n"
                                  "P2=pavsuite\nV1=5.0\nV2=5.5\nFT=N\n[profiles]\nLog=a.wlp\n");
    Lines options = {"-V1:1.0"};  // the command file overwrites it
    if (route.size() > 1) options.push_back("-cmd:" + Expand(route[1], {{"$ROOT/", run.Path("")}}));
    EXPECT_EQ(0, run.Run(options)) << route.back() << run.Err();
    EXPECT_EQ("p10 " + run.src + " " + run.dst + " 5.0 5.5 1 1 FT=N\n",
              ReadFile(run.dst + "/plugin_calls.txt"));
  }
}

TEST(HostRun, RefusalsEndWithTheirMessageAndResultOne) {
  const std::string child = "Error: Destination directory cannot be child of source directory: $DST";
  // Source and destination (under the test root), P1, V1, V2, the log line before the pointer.
  // The text check also refuses a sibling whose name continues the source's; a destination really
  // inside the source is refused without a log there (see the containment tests).
  for (const Lines& c : std::vector<Lines>{
           {"src", "srcx/new", "pavsuite", "5.0", "5.5", child},
           {"src/", "srcx/new", "pavsuite", "5.0", "5.5", child},
           {"nosuch", "dst", "pavsuite", "5.0", "5.5", "Error: Source directory does not exist:  $SRC"},
           {"src", "dst", "pavsuite", "5.1", "5.0",
            "Error: Cannot migrate because source version greater than destination version"}}) {
    HostRun run({"p10_pavsuite"});
    std::string source = run.Path(c[0]), destination = run.Path(c[1]);
    std::string log = destination + "/vxmigrate.log";
    MakeDirs(destination);
    EXPECT_EQ(1, run.Run({"-D1:" + source, "-D2:" + destination, "-P1:" + c[2], "-P2:pavsuite",
                          "-V1:" + c[3], "-V2:" + c[4]})) << c[5];
    Lines entries = LogEntries(log);
    entries.insert(entries.begin(), 2, "");
    EXPECT_EQ(Lines({Expand(c[5], {{"$DST", destination}, {"$SRC", source}}),
                     "** See VXMigrate Log File for details:  " + log}),
              Lines(entries.end() - 2, entries.end()));
    EXPECT_FALSE(FileExists(destination + "/plugin_calls.txt"));
  }
}

TEST(HostRun, RunningReportingServerRefusesTheRunUntilItIsGone) {
  HostRun run({"p05_halsuite_obx"});
  auto server = std::make_unique<LiveProcess>();
  WriteFile(run.dst + "/vxrs.pid", std::to_string(server->pid()) + "\n");
  EXPECT_EQ(1, run.Run(run.Options({"halsuite", "obx", "5.5", "3.5"})));
  EXPECT_EQ(Lines({"Error: Cannot migrate while Halden Engine Server is running - shut down to migrate",
                   run.Pointer()}), run.Body());
  server.reset();
  EXPECT_EQ(0, run.Run(run.Options({"halsuite", "obx", "5.5", "3.5"})));
  EXPECT_TRUE(FileExists(run.dst + "/plugin_calls.txt"));
}

TEST(HostRun, InstallScriptRunsInTheDestinationAndIsLogged) {
  HostRun run({"p10_pavsuite"});
  std::string script = run.Script();
  WriteFile(script, "#!/bin/sh\npwd > script_ran_in.txt\nexit 3\n");
  chmod(script.c_str(), 0755);
  // The script's own status is not the run's.
  EXPECT_EQ(0, run.Run(run.Options({"pavsuite", "pavsuite", "5.0", "5.5"})));
  EXPECT_EQ(run.dst + "\n", ReadFile(run.dst + "/script_ran_in.txt"));
  EXPECT_EQ(Lines({"Test plug-in ran: p10", "Looking for Synch Install Script: " + script,
                   "Executing Synch Install Script: " + script, "Spawning Script: ./synchinstall.sh",
                   "Done executing Synch Install Script.", run.Pointer()}),
            run.Body());
}

}  // namespace
}  // namespace vxtest
