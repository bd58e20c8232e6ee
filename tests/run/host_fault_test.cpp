// Whole runs of each shipped plug-in over its samples in which the N-th call that changes a file
// fails, as on a full disk (ENOSPC) or a failing device (EIO) alternately, for every N of an
// undisturbed run (a test-only LD_PRELOAD shim counts them; VXM_FAULT_TEST_POINTS: "all" or how
// many, spread evenly). The run must say so, leave each destination file as before, as after, or
// at a whole version the undisturbed run put in place, keep the source, and a re-run must finish.

#include <errno.h>
#include <gtest/gtest.h>

#include <cstdio>
#include <string>
#include <vector>

#include "run/countdown_run.h"
#include "run/host_run.h"
#include "support/test_files.h"

namespace vxtest {
namespace {

const std::vector<std::string> kCommandFile = {"-cmd:./migcmd.ini"};

// What the shim noted of the call it failed: "<call>\t<path>\n"; both "" when it noted none.
std::pair<std::string, std::string> FailedCall(const std::string& noteFile) {
  const std::string note = ReadFile(noteFile);
  const size_t tab = note.find('\t');
  if (tab == std::string::npos) return {"", ""};
  return {note.substr(0, tab), note.substr(tab + 1, note.find('\n') - tab - 1)};
}

bool HasLine(const std::string& text, const std::string& start) {
  return text.rfind(start, 0) == 0 || text.find("\n" + start) != std::string::npos;
}

int FailureCount() {
  return testing::UnitTest::GetInstance()->current_test_info()->result()->total_part_count();
}

class HostFault : public testing::TestWithParam<const char*> {};

TEST_P(HostFault, EveryFailedWriteIsReportedAndLeavesOldOrFinishedFiles) {
  SampleRun run(GetParam());
  const std::string source = run.Path(run.source), destination = run.Path(run.destination);
  const PristineInstallations installations(Source("samples/" + run.source),
                                            Source("samples/" + run.destination),
                                            run.Path("pristine"), source, destination);
  const std::string countFile = run.Path("changes.txt"), noteFile = run.Path("failed.txt");
  const std::string versionsFolder = run.Path("versions");
  MakeDirs(versionsFolder);

  // The undisturbed run: its result, its exit status and how many changes it makes.
  installations.Reset();
  const int finishedStatus = UnderCountdown(countFile, {{"VXM_VERSIONS_DIR", versionsFolder}},
                                            [&] { return run.Run(kCommandFile); });
  const Versions versions = KeptVersions(versionsFolder, destination);
  ASSERT_EQ(0, finishedStatus) << run.Err();
  const Tree after = WithoutBookkeeping(TreeState(destination));
  const long total = CountedChanges(countFile);
  ASSERT_GT(total, 0) << "the shim counted no change";

  long injected = 0, passed = 0, absorbedCount = 0;
  for (long point : CountdownPoints(total, "VXM_FAULT_TEST_POINTS", "all")) {
    const int error = point % 2 == 1 ? ENOSPC : EIO;
    installations.Reset();
    std::remove(noteFile.c_str());
    const int status = UnderCountdown(run.Path("unused.txt"),
                                      {{"VXM_FAIL_AT", std::to_string(point)},
                                       {"VXM_FAIL_ERRNO", std::to_string(error)},
                                       {"VXM_FAULT_NOTE_FILE", noteFile}},
                                      [&] { return run.Run(kCommandFile); });
    const auto [call, path] = FailedCall(noteFile);
    SCOPED_TRACE("change " + std::to_string(point) + " of " + std::to_string(total) + " failed (" +
                 call + " " + path + ", " + (error == ENOSPC ? "ENOSPC" : "EIO") + ")");
    ++injected;
    const int failuresBefore = FailureCount();
    ASSERT_FALSE(call.empty()) << "the run never reached the change";

    const Tree disturbed = TreeState(destination);
    // A failure the run worked around (a kept copy of an old file made another way) leaves the
    // whole result and needs no report.
    const bool absorbed =
        status == 0 && Differences(after, WithoutBookkeeping(disturbed)).empty();
    if (!absorbed) {
      EXPECT_GT(status, 0) << "exit status " << status << "\n" << run.Err();
      const std::string err = run.Err();
      EXPECT_TRUE(HasLine(err, "Error: ") || HasLine(err, "vxmigrate: "))
          << "nothing on standard error:\n" << err;
      const std::string logPath = destination + "/vxmigrate.log";
      // A run stopped before its log could be opened has only standard error to tell.
      if (path != logPath && FileExists(logPath)) {
        EXPECT_NE(std::string::npos, ReadFile(logPath).find("  Error: "))
            << "no \"Error: \" entry in the log";
      }
    }
    absorbedCount += absorbed ? 1 : 0;
    const std::vector<std::string> misfits =
        Misfits(installations.DestinationState(), after, disturbed, versions);
    EXPECT_TRUE(misfits.empty()) << "files neither as before nor as after the run:"
                                 << Listed(misfits);
    // Only a failed removal may leave a temporary file behind (the one it was removing).
    if (call != "unlink" && call != "unlinkat") {
      EXPECT_EQ(std::vector<std::string>(), TemporaryFiles(disturbed)) << "temporary files left";
    }
    EXPECT_EQ(installations.SourceState(), TreeState(source)) << "the source changed";

    EXPECT_EQ(finishedStatus, run.Run(kCommandFile)) << run.Err();
    const Tree rerun = TreeState(destination);
    EXPECT_EQ(std::vector<std::string>(), TemporaryFiles(rerun)) << "temporary files left";
    const std::vector<std::string> differences = Differences(after, WithoutBookkeeping(rerun));
    EXPECT_TRUE(differences.empty()) << "the re-run's result differs:" << Listed(differences);
    if (FailureCount() == failuresBefore) ++passed;
  }
  printf("%s: %ld write-side calls in an undisturbed run, %ld fault points injected, %ld passed"
         " (%ld of them worked around by the run)\n",
         GetParam(), total, injected, passed, absorbedCount);
}

INSTANTIATE_TEST_SUITE_P(ShippedPlugins, HostFault, testing::ValuesIn(kShippedPlugins),
                         [](const testing::TestParamInfo<const char*>& info) {
                           return std::string(info.param);
                         });

}  // namespace
}  // namespace vxtest
