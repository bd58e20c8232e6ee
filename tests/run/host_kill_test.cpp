// The shipped Halden-to-OBX plug-in's run killed with SIGKILL right before one of its file changes
// (a test-only LD_PRELOAD shim counts them down): each destination file must be as before or as
// after an uninterrupted run, and a re-run must finish with no temporary file left.
// VXM_KILL_TEST_POINTS: how many points, spread evenly (default 16; "all"). VXM_KILL_TEST_FILES: a
// generated installation of about that many files (bench/make_installation.sh) instead of samples.

#include <gtest/gtest.h>

#include <cstdlib>
#include <string>
#include <vector>

#include "run/countdown_run.h"
#include "run/host_run.h"
#include "support/test_files.h"

namespace vxtest {
namespace {

// The installations of the kill runs: the shipped samples, or a generated pair of about
// VXM_KILL_TEST_FILES files.
PristineInstallations KeptInstallations(const HostRun& run) {
  const char* files = getenv("VXM_KILL_TEST_FILES");
  std::string source = VXM_SOURCE_DIR "/samples/halden", destination = VXM_SOURCE_DIR "/samples/obx";
  if (files != nullptr) {
    source = run.Path("generated/halden");
    destination = run.Path("generated/obx");
    const std::string command = "bash " VXM_SOURCE_DIR "/bench/make_installation.sh " +
                                std::string(files) + " " + source + " " + destination;
    EXPECT_EQ(0, std::system(command.c_str())) << command;
  }
  return PristineInstallations(source, destination, run.Path("pristine"), run.src, run.dst);
}

TEST(HostKill, EveryKillLeavesOldOrFinishedFilesAndARerunFinishesClean) {
  HostRun run({"halden_to_obx"});
  const PristineInstallations installations = KeptInstallations(run);
  const std::string countFile = run.Path("changes.txt");

  // The uninterrupted run: its result, its exit status and how many changes it makes.
  installations.Reset();
  const int finishedStatus =
      UnderCountdown(countFile, {}, [&] { return run.Run(run.SampleOptions()); });
  ASSERT_GE(finishedStatus, 0) << run.Err();
  const Tree after = WithoutBookkeeping(TreeState(run.dst));
  const long total = CountedChanges(countFile);
  ASSERT_GT(total, 0) << "the shim counted no change";
  ASSERT_NE(installations.DestinationState(), TreeState(run.dst)) << "the run changed nothing";

  for (long point : CountdownPoints(total, "VXM_KILL_TEST_POINTS", "16")) {
    SCOPED_TRACE("killed before change " + std::to_string(point) + " of " + std::to_string(total));
    installations.Reset();
    const std::string before = std::to_string(point);
    ASSERT_EQ(-1, UnderCountdown(run.Path("unused.txt"), {{"VXM_KILL_BEFORE", before}},
                                 [&] { return run.Run(run.SampleOptions()); }))
        << "the run was not killed";
    const std::vector<std::string> misfits =
        Misfits(installations.DestinationState(), after, TreeState(run.dst));
    EXPECT_TRUE(misfits.empty()) << "files neither as before nor as after the run:"
                                 << Listed(misfits);

    EXPECT_EQ(finishedStatus, run.Run(run.SampleOptions())) << run.Err();
    const Tree rerun = TreeState(run.dst);
    EXPECT_EQ(std::vector<std::string>(), TemporaryFiles(rerun)) << "temporary files left";
    const std::vector<std::string> differences = Differences(after, WithoutBookkeeping(rerun));
    EXPECT_TRUE(differences.empty()) << "the second run's result differs:" << Listed(differences);
    EXPECT_EQ(installations.SourceState(), TreeState(run.src)) << "the source changed";
  }
}

}  // namespace
}  // namespace vxtest
