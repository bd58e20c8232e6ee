// Whole runs of the shipped host and plug-in over copies of the sample installations, tried the way
// an attacker or a careless user would: every read and write must stay inside the two
// installations, the source must come out byte for byte as it went in, and a folder outside both
// must stay untouched. Also: one run per destination, and plug-ins only from beside the host.

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cstdlib>
#include <string>
#include <thread>

#include "run/host_run.h"
#include "support/test_files.h"

namespace vxtest {
namespace {

// How the host is started: argv[0], the current folder, and whether PATH stays in the environment.
struct Launch {
  std::string argv0 = VXM_HOST_EXE;
  std::string cwd = "/";
  bool keepPath = true;
};

pid_t StartHost(const Lines& options, const Launch& launch, const std::string& out) {
  Lines args = {launch.argv0};
  args.insert(args.end(), options.begin(), options.end());
  const int file = CreateFile(out);
  const pid_t child = StartProcess(VXM_HOST_EXE, args, launch.cwd, file, file, launch.keepPath);
  close(file);
  return child;
}

// Waits for a file that another process makes; false after a minute.
bool AwaitFile(const std::string& path) {
  for (int i = 0; i < 6000; ++i) {
    if (FileExists(path)) return true;
    std::this_thread::sleep_for(std::chrono::milliseconds(10));
  }
  return false;
}

// Copies of the sample Halden (source) and OBX (destination) installations, and a folder outside
// both that holds what an attacker would like to see carried or overwritten.
class Samples {
  TempDir root_;  // first: the paths below are made from it

 public:
  const std::string halden = root_.Path("halden"), obx = root_.Path("obx");
  const std::string outside = root_.Path("outside");

  Samples() {
    for (const char* name : {"halden", "obx"}) {
      const std::string command =
          std::string("cp -a '") + VXM_SOURCE_DIR + "/samples/" + name + "' '" + root_.Path(name) + "'";
      EXPECT_EQ(0, system(command.c_str()));
    }
    WriteFile(outside + "/secret.txt", "10.9.9.0,10.9.9.255,SECRET-DATA-RECORD\n");
    WriteFile(outside + "/secret.wlp", "[Profile]\nLogFilePassword=SECRET-PASSWORD\n");
    MakeDirs(outside + "/profiles");
  }

  std::string Path(const std::string& relative) const { return root_.Path(relative); }
  Lines Options(const std::string& destination) const {
    return {"-D1:" + halden, "-D2:" + destination, "-P1:halsuite", "-P2:obx", "-V1:5.5",
            "-V2:3.0"};
  }
  int Run(const std::string& destination, const Launch& launch = Launch()) const {
    return ExitStatus(StartHost(Options(destination), launch, Path("out.txt")));
  }
  std::string Output() const { return ReadFile(Path("out.txt")); }
  void Link(const std::string& at, const std::string& to) const {
    unlink(at.c_str());
    ASSERT_EQ(0, symlink(to.c_str(), at.c_str())) << at;
  }
  // True when a file below folder holds text.
  static bool AnyFileHolds(const std::string& folder, const std::string& text) {
    for (const auto& [name, state] : TreeState(folder)) {
      if (state.find(text) != std::string::npos) return true;
    }
    return false;
  }
};

// A climb from any folder up to the root, then down to target: "../../../.." + target.
std::string ClimbTo(const std::string& target) {
  std::string climb;
  for (int i = 0; i < 40; ++i) climb += "../";
  return climb + target.substr(1);
}

TEST(Containment, ADestinationThatReachesIntoTheSourceIsRefusedAndNothingIsWritten) {
  for (const char* route : {"link", "dots"}) {
    Samples s;
    ASSERT_EQ(0, system(("cp -a '" + s.obx + "' '" + s.halden + "/obx2'").c_str()));
    const Tree source = TreeState(s.halden);
    std::string destination = s.outside + "/../halden/obx2";
    if (std::string(route) == "link") {
      s.Link(s.Path("lnk"), s.halden + "/obx2");
      destination = s.Path("lnk");
    }
    EXPECT_EQ(1, s.Run(destination)) << route << s.Output();
    EXPECT_EQ(source, TreeState(s.halden)) << route;
    EXPECT_NE(std::string::npos,
              s.Output().find("Error: Destination directory cannot be child of source directory: " +
                              destination + "\n"))
        << s.Output();
  }
}

TEST(Containment, LinksInTheSourceToFilesElsewhereAreLeftOutAndNamed) {
  Samples s;
  s.Link(s.halden + "/vxintra.txt", s.outside + "/secret.txt");
  s.Link(s.halden + "/vxm_log/datfiles/shadow.wlp", s.outside + "/secret.wlp");
  const Tree source = TreeState(s.halden), outside = TreeState(s.outside);
  s.Run(s.obx);
  EXPECT_FALSE(Samples::AnyFileHolds(s.obx, "SECRET"));
  const Lines log = LogEntries(s.obx + "/vxmigrate.log");
  for (const char* name : {"/vxintra.txt", "/vxm_log/datfiles/shadow.wlp"}) {
    const std::string line =
        "Error: Refused to read a file that leads outside the installations: " + s.halden + name;
    EXPECT_NE(log.end(), std::find(log.begin(), log.end(), line)) << line;
  }
  EXPECT_EQ(source, TreeState(s.halden));
  EXPECT_EQ(outside, TreeState(s.outside));
}

TEST(Containment, FoldersNamedInSettingsFilesCannotClimbOut) {
  for (const bool fromSource : {true, false}) {
    Samples s;
    const std::string escape = "profilesdir=" + ClimbTo(s.outside + "/profiles") + "\n";
    std::string settings = ReadFile(s.obx + "/vxm_vxx/vxm_vxx.ini");
    const size_t key = settings.find("profilesdir=");
    settings.replace(key, settings.find('\n', key) + 1 - key, fromSource ? "" : escape);
    WriteFile(s.obx + "/vxm_vxx/vxm_vxx.ini", settings);
    if (fromSource) {
      std::string old = ReadFile(s.halden + "/vxm_log/vxm_log.ini");
      old.insert(old.find('\n', old.find("[Defaults]")) + 1, escape);
      WriteFile(s.halden + "/vxm_log/vxm_log.ini", old);
    }
    const Tree source = TreeState(s.halden), outside = TreeState(s.outside);
    s.Run(s.obx);
    EXPECT_EQ(outside, TreeState(s.outside)) << fromSource;
    EXPECT_EQ(source, TreeState(s.halden)) << fromSource;
    const std::string log = ReadFile(s.obx + "/vxmigrate.log");
    EXPECT_NE(std::string::npos,
              log.find("Error: Refused a folder name that climbs out of its installation: "))
        << log;
  }
}

TEST(Containment, LinksInTheDestinationAreNeverWrittenThrough) {
  Samples s;
  WriteFile(s.outside + "/keywords.ini", ReadFile(s.obx + "/keywords.ini"));
  s.Link(s.obx + "/keywords.ini", s.outside + "/keywords.ini");
  s.Link(s.obx + "/adviews.txt", s.halden + "/adviews.txt");
  ASSERT_EQ(0, system(("rm -rf '" + s.obx + "/vxm_vxx/datfiles/profiles'").c_str()));
  s.Link(s.obx + "/vxm_vxx/datfiles/profiles", s.outside + "/profiles");
  const Tree source = TreeState(s.halden), outside = TreeState(s.outside);
  s.Run(s.obx);
  EXPECT_EQ(outside, TreeState(s.outside));
  EXPECT_EQ(source, TreeState(s.halden));
  const std::string log = ReadFile(s.obx + "/vxmigrate.log");
  EXPECT_NE(std::string::npos, log.find("Error: Refused to write outside the destination "
                                        "installation: " + s.obx + "/vxm_vxx/datfiles/profiles/"))
      << log;
}

TEST(Containment, ASecondRunOnTheSameDestinationIsRefusedWhileTheFirstCompletes) {
  const std::string script = "#!/bin/sh\ntouch started\nwhile [ ! -e go ]; do sleep 0.05; done\n";
  Samples reference;
  WriteFile(reference.obx + "/go", "");
  WriteFile(reference.obx + "/synchinstall.sh", script);
  chmod((reference.obx + "/synchinstall.sh").c_str(), 0755);
  ASSERT_EQ(0, reference.Run(reference.obx));

  Samples s;
  WriteFile(s.obx + "/synchinstall.sh", script);
  chmod((s.obx + "/synchinstall.sh").c_str(), 0755);
  const pid_t first = StartHost(s.Options(s.obx), Launch(), s.Path("first.txt"));
  ASSERT_TRUE(AwaitFile(s.obx + "/started"));  // the first run holds the lock in its script
  const Tree during = TreeState(s.obx);
  EXPECT_EQ(5, s.Run(s.obx));
  EXPECT_NE(std::string::npos, s.Output().find("another run is migrating into")) << s.Output();
  EXPECT_EQ(during, TreeState(s.obx));
  WriteFile(s.obx + "/go", "");
  EXPECT_EQ(0, ExitStatus(first));
  // Each run's journal has its own times and inode numbers.
  Tree expected = WithoutBookkeeping(TreeState(reference.obx));
  Tree reached = WithoutBookkeeping(TreeState(s.obx));
  expected.erase("started");
  reached.erase("started");
  EXPECT_EQ(expected, reached);
  EXPECT_EQ(LogEntries(reference.obx + "/vxmigrate.log").size(),
            LogEntries(s.obx + "/vxmigrate.log").size());
}

TEST(Containment, PluginsComeOnlyFromBesideTheRealHost) {
  Samples s;
  // A plug-in for the same products in the folder the host is started from, and a link to the host.
  MakeDirs(s.Path("cwd"));
  WriteFile(s.Path("cwd/aaa.so"), ReadFile(VXM_TEST_PLUGIN_DIR "/p05_halsuite_obx.so"));
  s.Link(s.Path("vxmigrate"), VXM_HOST_EXE);
  for (const Launch& launch : {Launch{"vxmigrate", s.Path("cwd"), false},
                               Launch{s.Path("vxmigrate"), s.Path("cwd"), true}}) {
    ASSERT_EQ(0, s.Run(s.obx, launch)) << launch.argv0 << s.Output();
    EXPECT_FALSE(FileExists(s.obx + "/plugin_calls.txt")) << launch.argv0;
    char real[4096];
    ASSERT_NE(nullptr, realpath(VXM_HOST_EXE, real));
    const Lines log = LogEntries(s.obx + "/vxmigrate.log");
    ASSERT_GT(log.size(), 12u);
    EXPECT_EQ(std::string("VXMigrate Executable: ") + real, log[1]);
    EXPECT_EQ(std::string::npos, ReadFile(s.obx + "/vxmigrate.log").find("No appropriate"));
  }
}

TEST(Containment, AnEmptyDestinationWritesNothingInTheCurrentFolder) {
  Samples s;
  MakeDirs(s.Path("cwd"));
  EXPECT_NE(0, s.Run("", Launch{VXM_HOST_EXE, s.Path("cwd"), true}));
  EXPECT_TRUE(ListTree(s.Path("cwd")).empty());
}

}  // namespace
}  // namespace vxtest
