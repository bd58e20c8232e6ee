// Whole runs of the shipped host and plug-in over copies of the samples: a preview leaves the
// destination exactly as it was and reports what the real run then reports; undo gives back the
// exact tree from before a run, also after a run killed midway; the report shows a planted
// conflict with both values and never a protected value in clear.

#include <gtest/gtest.h>
#include <signal.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <string>

#include "migrate/installations_fixture.h"
#include "run/host_run.h"
#include "support/test_files.h"

namespace vxtest {
namespace {

// The destination as a user sees it: every file's mode and bytes, with mtimes, and without the
// runs' history.
std::map<std::string, std::string> Installation(const std::string& folder, bool withTimes) {
  std::map<std::string, std::string> tree = TreeState(folder);
  for (auto it = tree.begin(); it != tree.end();) {
    if (it->first.compare(0, 10, ".vxmigrate") == 0) {
      it = tree.erase(it);
      continue;
    }
    struct stat st;
    if (withTimes && lstat((folder + "/" + it->first).c_str(), &st) == 0) {
      it->second += " @" + std::to_string(st.st_mtim.tv_sec) + "." + std::to_string(st.st_mtim.tv_nsec);
    }
    ++it;
  }
  return tree;
}

// A user value in both installations' settings, different on each side.
void PlantConflict(const HostRun& run) {
  const std::string obx = run.dst + "/vxm_vxx/vxm_vxx.ini";
  WriteFile(obx, ReadFile(obx) + "[Mail]\nSmtpServer=relay.internal\nSmtpPassword=" +
                     "D94F4859206C3067E5EF5549BC4C8E82D9AB\n");
}

TEST(Preview, LeavesTheDestinationAsItWasAndReportsWhatTheRunThenDoes) {
  HostRun run({"halden_to_obx"});
  run.UseSamples();
  PlantConflict(run);
  const auto before = Installation(run.dst, true);
  Lines options = run.SampleOptions();
  options.push_back("-n");
  ASSERT_EQ(0, run.Run(options)) << run.Err();
  EXPECT_EQ(before, Installation(run.dst, true));
  const std::string preview = run.Out();
  EXPECT_NE(std::string::npos, preview.find("    [Mail] SmtpServer\n      source: mail.example.com\n"
                                            "      kept:   relay.internal\n")) << preview;
  // No scratch copy stays behind.
  for (const std::string& name : ListTree(run.Path(""))) EXPECT_EQ(std::string::npos, name.find("vxpreview"));

  ASSERT_EQ(0, run.Run(run.SampleOptions()));
  ASSERT_EQ(0, run.Run({"--report", run.dst}));
  const std::string real = run.Out();
  // The preview printed the summary and the conflicts of the same report.
  EXPECT_NE(std::string::npos, preview.find(real.substr(0, real.find("Files:\n")))) << real;
  EXPECT_NE(std::string::npos, preview.find(real.substr(real.rfind("Files: ")))) << real;
}

// Lines added right after a section's header line, ending as that line ends (the Halden sample's
// settings end their lines in "\r\n").
std::string WithLinesAfter(const std::string& text, const std::string& header, const Lines& lines) {
  const size_t at = text.find(header);
  const size_t end = at == std::string::npos ? at : text.find('\n', at);
  if (end == std::string::npos) {
    ADD_FAILURE() << header << " not found";
    return text;
  }
  const std::string lineEnd = text[end - 1] == '\r' ? "\r\n" : "\n";
  std::string added;
  for (const std::string& line : lines) added += line + lineEnd;
  return text.substr(0, end + 1) + added + text.substr(end + 1);
}

// Protected values from the source reach the merge as added keys and as conflicts, under names
// that do not say "password": the report must know them by their form.
TEST(Report, NamesConflictsWithBothValuesAndMasksProtectedOnes) {
  HostRun run({"halden_to_obx"});
  run.UseSamples();
  PlantConflict(run);
  const std::string sourceAccount = Protected("stats-account"), sourceRelay = Protected("relay-user"),
                    keptRelay = Protected("kept-user");
  const std::string obx = run.dst + "/vxm_vxx/vxm_vxx.ini";
  WriteFile(obx, WithLinesAfter(ReadFile(obx), "[Mail]", {"RelayUser=" + keptRelay}));
  const std::string halden = run.src + "/vxm_log/vxm_log.ini";
  WriteFile(halden, WithLinesAfter(ReadFile(halden), "[Mail]",
                                   {"SmtpPassword=" + Protected("source-secret"),
                                    "Account=" + sourceAccount, "RelayUser=" + sourceRelay}));
  ASSERT_EQ(0, run.Run(run.SampleOptions()));
  const std::string report = ReadFile(run.dst + "/vxmigrate-report.json");
  for (const char* expected :
       {"{\"section\": \"Mail\", \"key\": \"SmtpServer\", \"source\": \"mail.example.com\", "
        "\"kept\": \"relay.internal\"}",
        "{\"section\": \"Mail\", \"key\": \"Account\", \"value\": \"<protected>\"}",
        "{\"section\": \"Mail\", \"key\": \"RelayUser\", \"source\": \"<protected>\", "
        "\"kept\": \"<protected>\"}",
        "{\"section\": \"Mail\", \"key\": \"SmtpPassword\", \"source\": \"<protected>\", "
        "\"kept\": \"<protected>\"}",
        "{\"path\": \"vxm_vxx/vxm_vxx.ini\", \"action\": \"merged\", "
        "\"source\": \"vxm_log/vxm_log.ini\"}"}) {
    EXPECT_NE(std::string::npos, report.find(expected)) << expected << "\n" << report;
  }
  ASSERT_EQ(0, run.Run({"--report", run.dst}));
  for (const std::string& secret : {sourceAccount, sourceRelay, keptRelay, Protected("source-secret"),
                                    std::string("D94F4859206C3067E5EF5549BC4C8E82D9AB")}) {
    EXPECT_EQ(std::string::npos, report.find(secret)) << secret;
    EXPECT_EQ(std::string::npos, run.Out().find(secret)) << secret;
  }
}

TEST(Undo, GivesBackTheExactTreeAndKeepsTheUndoneLog) {
  HostRun run({"halden_to_obx"});
  run.UseSamples();
  chmod((run.dst + "/keywords.ini").c_str(), 0600);
  const auto before = Installation(run.dst, false);
  ASSERT_EQ(0, run.Run(run.SampleOptions()));
  ASSERT_NE(before, Installation(run.dst, false));
  const std::string log = ReadFile(run.log);
  ASSERT_EQ(0, run.Run({"--list-runs", run.dst}));
  EXPECT_NE(std::string::npos, run.Out().find("000001  ")) << run.Out();
  EXPECT_NE(std::string::npos, run.Out().find("status 0")) << run.Out();
  ASSERT_EQ(0, run.Run({"--undo", run.dst})) << run.Err();
  EXPECT_EQ(before, Installation(run.dst, false));
  EXPECT_EQ(log, ReadFile(run.dst + "/.vxmigrate/runs/000001/vxmigrate.log"));
  EXPECT_EQ(1, run.Run({"--undo", run.dst}));  // nothing left to undo
}

TEST(Undo, RefusesNamingFilesChangedSinceTheRunUnlessForced) {
  HostRun run({"halden_to_obx"});
  run.UseSamples();
  const auto before = Installation(run.dst, false);
  ASSERT_EQ(0, run.Run(run.SampleOptions()));
  WriteFile(run.dst + "/adviews.txt", "edited by hand\n");
  const auto edited = Installation(run.dst, false);
  EXPECT_EQ(1, run.Run({"--undo", run.dst}));
  EXPECT_NE(std::string::npos, run.Err().find("\n  adviews.txt\n")) << run.Err();
  EXPECT_EQ(edited, Installation(run.dst, false));
  ASSERT_EQ(0, run.Run({"--undo", run.dst, "--force"})) << run.Err();
  EXPECT_EQ(before, Installation(run.dst, false));
}

// Killed at whatever point its journal has reached a few changes: undo still gives the tree back.
TEST(Undo, TakesBackARunKilledMidway) {
  for (int changes : {2, 5, 9}) {
    HostRun run({"halden_to_obx"});
    run.UseSamples();
    const auto before = Installation(run.dst, false);
    pid_t child = fork();
    if (child == 0) {
      std::vector<std::string> args = {run.bin + "/vxmigrate"};
      for (const std::string& option : run.SampleOptions()) args.push_back(option);
      args.push_back("-q");
      std::vector<char*> argv;
      for (std::string& arg : args) argv.push_back(arg.data());
      argv.push_back(nullptr);
      execv(argv[0], argv.data());
      _exit(127);
    }
    const std::string journal = run.dst + "/.vxmigrate/runs/000001/journal";
    // Polled for up to a minute (a loaded machine starts the host slowly); a run that ends first
    // is undone as a whole.
    int status = 0;
    bool ended = false;
    for (int i = 0; i < 60000 && !ended; ++i) {
      const std::string text = ReadFile(journal);
      if (std::count(text.begin(), text.end(), '\n') >= changes + 2) break;
      ended = waitpid(child, &status, WNOHANG) == child;
      usleep(1000);
    }
    if (!ended) {
      kill(child, SIGKILL);
      waitpid(child, &status, 0);
    }
    ASSERT_EQ(0, run.Run({"--undo", run.dst})) << changes << run.Err();
    EXPECT_EQ(before, Installation(run.dst, false)) << changes;
  }
}

}  // namespace
}  // namespace vxtest
