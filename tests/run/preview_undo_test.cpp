// Whole runs of the shipped host and plug-in over copies of the samples: a preview leaves the
// destination exactly as it was and reports what the real run then reports; undo gives back the
// exact tree from before a run, also after a run killed midway; the report shows a planted
// conflict with both values and never a protected value in clear.

#include <fcntl.h>
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <string>

#include "migrate/installations_fixture.h"
#include "run/host_run.h"
#include "run/sample_run.h"
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

// Starts the host with args (args[0] its path) in folder, its output thrown away; and kills it
// once the journal holds records lines, unless it ended first (then the run is undone whole).
void KillWhenJournalHas(const std::string& folder, Lines args, const std::string& journal,
                        int records) {
  pid_t child = fork();
  if (child == 0) {
    std::vector<char*> argv;
    for (std::string& arg : args) argv.push_back(arg.data());
    argv.push_back(nullptr);
    int null = open("/dev/null", O_WRONLY);
    if (null < 0 || dup2(null, 1) < 0 || dup2(null, 2) < 0 || chdir(folder.c_str()) != 0) _exit(126);
    execv(argv[0], argv.data());
    _exit(127);
  }
  ASSERT_GT(child, 0);
  // Polled for up to a minute (a loaded machine starts the host slowly).
  int status = 0;
  for (int i = 0; i < 60000; ++i) {
    const std::string text = ReadFile(journal);
    if (std::count(text.begin(), text.end(), '\n') >= records) break;
    if (waitpid(child, &status, WNOHANG) == child) return;
    usleep(1000);
  }
  kill(child, SIGKILL);
  waitpid(child, &status, 0);
}

// Killed at whatever point its journal has reached a few changes: undo still gives the tree back.
TEST(Undo, TakesBackARunKilledMidway) {
  for (int changes : {2, 5, 9}) {
    HostRun run({"halden_to_obx"});
    run.UseSamples();
    const auto before = Installation(run.dst, false);
    Lines args = {run.bin + "/vxmigrate"};
    for (const std::string& option : run.SampleOptions()) args.push_back(option);
    KillWhenJournalHas(run.Path(""), args, run.dst + "/.vxmigrate/runs/000001/journal", changes + 2);
    ASSERT_EQ(0, run.Run({"--undo", run.dst})) << changes << run.Err();
    EXPECT_EQ(before, Installation(run.dst, false)) << changes;
  }
}

// Each shipped plug-in on copies of its samples, started with its command file's run as a whole
// command line.
class EveryShippedPlugin : public ::testing::TestWithParam<const char*> {};

TEST_P(EveryShippedPlugin, PreviewLeavesTheDestinationAsItWasAndReportsWhatTheRunDoes) {
  SampleRun run(GetParam());
  const std::string dst = run.Path(run.destination);
  const auto before = Installation(dst, true);
  Lines preview = run.RunOptions();
  preview.insert(preview.end(), {"-n", "-v"});  // -v: the whole report, as --report shows it
  ASSERT_EQ(0, run.Run(preview)) << run.Err();
  EXPECT_EQ(before, Installation(dst, true));
  const std::string title =
      "Preview of the migration into " + run.destination + " (nothing there was changed):\n";
  const size_t at = run.Out().find(title);
  ASSERT_NE(std::string::npos, at) << run.Out();
  const std::string previewed = run.Out().substr(at + title.size());
  for (const std::string& name : ListTree(run.Path(""))) {
    EXPECT_EQ(std::string::npos, name.find("vxpreview")) << name;
  }

  ASSERT_EQ(0, run.Run(run.RunOptions())) << run.Err();
  ASSERT_EQ(0, run.Run({"--report", run.destination})) << run.Err();
  EXPECT_EQ(run.Out(), previewed);
  EXPECT_NE(std::string::npos, previewed.find("Files:\n  ")) << previewed;
}

TEST_P(EveryShippedPlugin, UndoGivesBackTheTreeFromBeforeTheRun) {
  SampleRun run(GetParam());
  const std::string dst = run.Path(run.destination);
  const auto before = Installation(dst, false);
  ASSERT_EQ(0, run.Run(run.RunOptions())) << run.Err();
  ASSERT_NE(before, Installation(dst, false));
  ASSERT_EQ(0, run.Run({"--undo", run.destination})) << run.Err();
  EXPECT_EQ(before, Installation(dst, false));
}

TEST_P(EveryShippedPlugin, UndoGivesBackTheTreeFromBeforeARunKilledMidway) {
  SampleRun run(GetParam());
  const std::string dst = run.Path(run.destination);
  const auto before = Installation(dst, false);
  Lines args = {run.Path("bin/vxmigrate")};
  for (const std::string& option : run.RunOptions()) args.push_back(option);
  KillWhenJournalHas(run.Path(""), args, dst + "/.vxmigrate/runs/000001/journal", 6);
  ASSERT_EQ(0, run.Run({"--undo", run.destination})) << run.Err();
  EXPECT_EQ(before, Installation(dst, false));
}

INSTANTIATE_TEST_SUITE_P(Samples, EveryShippedPlugin, ::testing::ValuesIn(kShippedPlugins));

}  // namespace
}  // namespace vxtest
