// Whole runs of the shipped host and plug-in over copies of the sample installations, tried the way
// an attacker or a careless user would: every read and write must stay inside the two
// installations, the source must come out byte for byte as it went in, and a folder outside both
// must stay untouched. Also: one run per destination, and plug-ins only from beside the host.

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <filesystem>
#include <string>
#include <thread>

#include "run/host_run.h"
#include "support/test_files.h"

namespace vxtest {
namespace {

// How the host is started: argv[0] ("": the host's path), the current folder, and whether PATH
// stays in the environment.
struct Launch {
  std::string argv0;
  std::string cwd = "/";
  bool keepPath = true;
};

// Waits for a file that another process makes; false after a minute.
bool AwaitFile(const std::string& path) {
  for (int i = 0; i < 6000; ++i) {
    if (FileExists(path)) return true;
    std::this_thread::sleep_for(std::chrono::milliseconds(10));
  }
  return false;
}

// Copies of the sample Halden (src) and OBX (dst) installations beside the host, and a folder
// outside both that holds what an attacker would like to see carried or overwritten.
class Samples : public HostRun {
 public:
  const std::string outside = Path("outside");

  Samples() : HostRun({"halden_to_obx"}) {
    UseSamples();
    WriteFile(outside + "/secret.txt", "10.9.9.0,10.9.9.255,SECRET-DATA-RECORD\n");
    WriteFile(outside + "/secret.wlp", "[Profile]\nLogFilePassword=SECRET-PASSWORD\n");
    MakeDirs(outside + "/profiles");
  }

  // Starts the sample run into destination; its standard output and error go to file out.
  pid_t Start(const std::string& destination, const Launch& launch, const std::string& out) const {
    Lines args = SampleOptions();
    args[1] = "-D2:" + destination;
    args.insert(args.begin(), launch.argv0.empty() ? bin + "/vxmigrate" : launch.argv0);
    const int file = CreateFile(out);
    const pid_t child = StartProcess(bin + "/vxmigrate", args, launch.cwd, file, file,
                                     launch.keepPath);
    close(file);
    return child;
  }
  int RunInto(const std::string& destination, const Launch& launch = Launch()) const {
    return ExitStatus(Start(destination, launch, Path("out.txt")));
  }
  void Link(const std::string& at, const std::string& to) const {
    std::filesystem::remove_all(at);
    ASSERT_EQ(0, symlink(to.c_str(), at.c_str())) << at;
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
    std::filesystem::copy(s.dst, s.src + "/obx2", std::filesystem::copy_options::recursive);
    const Tree source = TreeState(s.src);
    std::string destination = s.outside + "/../src/obx2";
    if (std::string(route) == "link") {
      s.Link(s.Path("lnk"), s.src + "/obx2");
      destination = s.Path("lnk");
    }
    EXPECT_EQ(1, s.RunInto(destination)) << route << s.Out();
    EXPECT_EQ(source, TreeState(s.src)) << route;
    EXPECT_NE(std::string::npos,
              s.Out().find("Error: Destination directory cannot be child of source directory: " +
                              destination + "\n"))
        << s.Out();
  }
}

TEST(Containment, LinksInTheSourceToFilesElsewhereAreLeftOutAndNamed) {
  Samples s;
  s.Link(s.src + "/vxintra.txt", s.outside + "/secret.txt");
  s.Link(s.src + "/vxm_log/datfiles/shadow.wlp", s.outside + "/secret.wlp");
  const Tree source = TreeState(s.src), outside = TreeState(s.outside);
  s.RunInto(s.dst);
  for (const auto& [name, state] : TreeState(s.dst)) EXPECT_FALSE(Has(state, "SECRET")) << name;
  const Lines log = LogEntries(s.dst + "/vxmigrate.log");
  for (const char* name : {"/vxintra.txt", "/vxm_log/datfiles/shadow.wlp"}) {
    const std::string line =
        "Error: Refused to read a file that leads outside the installations: " + s.src + name;
    EXPECT_NE(log.end(), std::find(log.begin(), log.end(), line)) << line;
  }
  EXPECT_EQ(source, TreeState(s.src));
  EXPECT_EQ(outside, TreeState(s.outside));
}

TEST(Containment, FoldersNamedInSettingsFilesCannotClimbOut) {
  for (const bool fromSource : {true, false}) {
    Samples s;
    const std::string escape = "profilesdir=" + ClimbTo(s.outside + "/profiles") + "\n";
    std::string settings = ReadFile(s.dst + "/vxm_vxx/vxm_vxx.ini");
    const size_t key = settings.find("profilesdir=");
    settings.replace(key, settings.find('\n', key) + 1 - key, fromSource ? "" : escape);
    WriteFile(s.dst + "/vxm_vxx/vxm_vxx.ini", settings);
    if (fromSource) {
      std::string old = ReadFile(s.src + "/vxm_log/vxm_log.ini");
      old.insert(old.find('\n', old.find("[Defaults]")) + 1, escape);
      WriteFile(s.src + "/vxm_log/vxm_log.ini", old);
    }
    const Tree source = TreeState(s.src), outside = TreeState(s.outside);
    s.RunInto(s.dst);
    EXPECT_EQ(outside, TreeState(s.outside)) << fromSource;
    EXPECT_EQ(source, TreeState(s.src)) << fromSource;
    const std::string log = ReadFile(s.dst + "/vxmigrate.log");
    EXPECT_NE(std::string::npos,
              log.find("Error: Refused a folder name that climbs out of its installation: "))
        << log;
  }
}

TEST(Containment, LinksInTheDestinationAreNeverWrittenThrough) {
  Samples s;
  WriteFile(s.outside + "/keywords.ini", ReadFile(s.dst + "/keywords.ini"));
  s.Link(s.dst + "/keywords.ini", s.outside + "/keywords.ini");
  s.Link(s.dst + "/adviews.txt", s.src + "/adviews.txt");
  s.Link(s.dst + "/vxm_vxx/datfiles/profiles", s.outside + "/profiles");
  const Tree source = TreeState(s.src), outside = TreeState(s.outside);
  s.RunInto(s.dst);
  EXPECT_EQ(outside, TreeState(s.outside));
  EXPECT_EQ(source, TreeState(s.src));
  const std::string log = ReadFile(s.dst + "/vxmigrate.log");
  EXPECT_NE(std::string::npos, log.find("Error: Refused to write outside the destination "
                                        "installation: " + s.dst + "/vxm_vxx/datfiles/profiles/"))
      << log;
}

TEST(Containment, ASecondRunOnTheSameDestinationIsRefusedWhileTheFirstCompletes) {
  const std::string script = "#!/bin/sh\ntouch started\nwhile [ ! -e go ]; do sleep 0.05; done\n";
  Samples reference;
  WriteFile(reference.dst + "/go", "");
  WriteFile(reference.dst + "/synchinstall.sh", script);
  chmod((reference.dst + "/synchinstall.sh").c_str(), 0755);
  ASSERT_EQ(0, reference.RunInto(reference.dst));

  Samples s;
  WriteFile(s.dst + "/synchinstall.sh", script);
  chmod((s.dst + "/synchinstall.sh").c_str(), 0755);
  const pid_t first = s.Start(s.dst, Launch(), s.Path("first.txt"));
  ASSERT_TRUE(AwaitFile(s.dst + "/started"));  // the first run holds the lock in its script
  const Tree during = TreeState(s.dst);
  EXPECT_EQ(5, s.RunInto(s.dst));
  EXPECT_NE(std::string::npos, s.Out().find("another run is migrating into")) << s.Out();
  EXPECT_EQ(during, TreeState(s.dst));
  WriteFile(s.dst + "/go", "");
  EXPECT_EQ(0, ExitStatus(first));
  // Each run's journal has its own times and inode numbers.
  Tree expected = WithoutBookkeeping(TreeState(reference.dst));
  Tree reached = WithoutBookkeeping(TreeState(s.dst));
  expected.erase("started");
  reached.erase("started");
  EXPECT_EQ(expected, reached);
  EXPECT_EQ(LogEntries(reference.dst + "/vxmigrate.log").size(),
            LogEntries(s.dst + "/vxmigrate.log").size());
}

TEST(Containment, PluginsComeOnlyFromBesideTheRealHost) {
  Samples s;
  // A plug-in for the same products in the folder the host is started from, and a link to the host.
  MakeDirs(s.Path("cwd"));
  WriteFile(s.Path("cwd/aaa.so"), ReadFile(VXM_TEST_PLUGIN_DIR "/p05_halsuite_obx.so"));
  s.Link(s.Path("vxmigrate"), s.bin + "/vxmigrate");
  for (const Launch& launch : {Launch{"vxmigrate", s.Path("cwd"), false},
                               Launch{s.Path("vxmigrate"), s.Path("cwd"), true}}) {
    ASSERT_EQ(0, s.RunInto(s.dst, launch)) << launch.argv0 << s.Out();
    EXPECT_FALSE(FileExists(s.dst + "/plugin_calls.txt")) << launch.argv0;
    char real[4096];
    ASSERT_NE(nullptr, realpath((s.bin + "/vxmigrate").c_str(), real));
    const Lines log = LogEntries(s.dst + "/vxmigrate.log");
    ASSERT_GT(log.size(), 12u);
    EXPECT_EQ(std::string("VXMigrate Executable: ") + real, log[1]);
    EXPECT_EQ(std::string::npos, ReadFile(s.dst + "/vxmigrate.log").find("No appropriate"));
  }
}

TEST(Containment, AnEmptyDestinationWritesNothingInTheCurrentFolder) {
  Samples s;
  MakeDirs(s.Path("cwd"));
  EXPECT_NE(0, s.RunInto("", Launch{"", s.Path("cwd"), true}));
  EXPECT_TRUE(ListTree(s.Path("cwd")).empty());
}

}  // namespace
}  // namespace vxtest
