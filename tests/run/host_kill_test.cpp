// Whole runs of the shipped Halden-to-OBX plug-in killed with SIGKILL right before one of their
// file changes (a test-only LD_PRELOAD shim counts them down): whatever the point, every destination
// file must be as before the run or exactly as after an uninterrupted one, and a second run must
// reach the uninterrupted result with no temporary file left behind.
// VXM_KILL_TEST_POINTS: how many kill points, spread evenly over the run (default 16; "all": every
// change). VXM_KILL_TEST_FILES: a generated installation of about that many files (see
// bench/make_installation.sh) instead of the shipped samples.

#include <fnmatch.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <iterator>
#include <map>
#include <string>
#include <vector>

#include "run/host_run.h"
#include "support/process_state.h"
#include "support/test_files.h"

namespace vxtest {
namespace {

namespace fs = std::filesystem;
using Tree = std::map<std::string, std::string>;

const char kLog[] = "vxmigrate.log";

// The shim in the host, set to kill before change killBefore (0: never) and to write the number
// of changes made to countFile at a normal exit. The shim comes first in the host process, ahead
// of the address sanitizer's runtime in the sanitized build, which must be told to accept that.
void UseShim(ScopedEnvironment& environment, long killBefore, const std::string& countFile) {
  environment.Set("LD_PRELOAD", VXM_KILL_SHIM);
  environment.Set("VXM_KILL_BEFORE", std::to_string(killBefore));
  environment.Set("VXM_KILL_COUNT_FILE", countFile);
  const char* asan = getenv("ASAN_OPTIONS");
  environment.Set("ASAN_OPTIONS",
                  std::string(asan != nullptr ? asan : "") + ":verify_asan_link_order=0");
}

bool IsTemporaryName(const std::string& relative) {
  const std::string name = relative.substr(relative.rfind('/') + 1);
  return fnmatch(".*.vxtmp.*", name.c_str(), 0) == 0;
}

// The run's own bookkeeping: its log, its report and its undo journal, which every run changes.
bool IsBookkeeping(const std::string& name) {
  return name == kLog || name == "vxmigrate-report.json" || name.rfind(".vxmigrate", 0) == 0;
}

Tree WithoutLog(Tree tree) {
  for (auto entry = tree.begin(); entry != tree.end();) {
    entry = IsBookkeeping(entry->first) ? tree.erase(entry) : std::next(entry);
  }
  return tree;
}

// Names whose entry differs between the two trees, or that only one of them has.
std::vector<std::string> Differences(const Tree& expected, const Tree& actual) {
  std::vector<std::string> names;
  for (const auto& [name, state] : expected) {
    auto found = actual.find(name);
    if (found == actual.end() || found->second != state) names.push_back(name);
  }
  for (const auto& [name, state] : actual) {
    if (expected.count(name) == 0) names.push_back(name + " (not expected)");
  }
  return names;
}

// Entries of a killed run's destination that are neither as before nor as after the run: a file
// with other bytes, one the finished run does not have, or one lost that both runs keep.
// Temporary files are left out: a run may leave them, the next run removes them.
std::vector<std::string> Misfits(const Tree& before, const Tree& after, const Tree& killed) {
  std::vector<std::string> names;
  for (const auto& [name, state] : killed) {
    if (IsBookkeeping(name) || IsTemporaryName(name)) continue;
    auto old = before.find(name), finished = after.find(name);
    const bool asBefore = old != before.end() && old->second == state;
    const bool asAfter = finished != after.end() && finished->second == state;
    if (!asBefore && !asAfter) names.push_back(name);
  }
  for (const auto& [name, state] : before) {
    if (!IsBookkeeping(name) && after.count(name) != 0 && killed.count(name) == 0) {
      names.push_back(name + " (lost)");
    }
  }
  return names;
}

std::vector<std::string> TemporaryFiles(const Tree& tree) {
  std::vector<std::string> names;
  for (const auto& [name, state] : tree) {
    if (IsTemporaryName(name)) names.push_back(name);
  }
  return names;
}

// Kill points 1..total: every one, or count of them spread evenly with the first and last.
std::vector<long> KillPoints(long total) {
  const char* setting = getenv("VXM_KILL_TEST_POINTS");
  const std::string wanted = setting != nullptr ? setting : "16";
  const long count =
      wanted == "all" ? total : std::min(total, std::max(2L, std::atol(wanted.c_str())));
  std::vector<long> points;
  for (long i = 0; i < count; ++i) {
    const long point = count == total ? i + 1 : 1 + (total - 1) * i / (count - 1);
    if (points.empty() || points.back() != point) points.push_back(point);
  }
  return points;
}

// The installations a run starts from, kept aside so that every run starts from the same bytes.
class Installations {
 public:
  explicit Installations(const HostRun& run) : run_(run) {
    MakeDirs(run_.Path("pristine"));
    const char* files = getenv("VXM_KILL_TEST_FILES");
    if (files != nullptr) {
      const std::string command = "bash " VXM_SOURCE_DIR "/bench/make_installation.sh " +
                                  std::string(files) + " " + pristineSource_ + " " +
                                  pristineDestination_;
      EXPECT_EQ(0, std::system(command.c_str())) << command;
    } else {
      fs::copy(VXM_SOURCE_DIR "/samples/halden", pristineSource_, fs::copy_options::recursive);
      fs::copy(VXM_SOURCE_DIR "/samples/obx", pristineDestination_, fs::copy_options::recursive);
    }
    sourceState_ = TreeState(pristineSource_);
    destinationState_ = TreeState(pristineDestination_);
  }

  // Puts fresh copies of both installations in place of the run's source and destination.
  void Reset() const {
    for (const auto& [from, to] : {std::pair(pristineSource_, run_.src),
                                   std::pair(pristineDestination_, run_.dst)}) {
      fs::remove_all(to);
      fs::copy(from, to, fs::copy_options::recursive | fs::copy_options::copy_symlinks);
    }
  }
  const Tree& SourceState() const { return sourceState_; }
  const Tree& DestinationState() const { return destinationState_; }

 private:
  const HostRun& run_;
  const std::string pristineSource_ = run_.Path("pristine/halden");
  const std::string pristineDestination_ = run_.Path("pristine/obx");
  Tree sourceState_, destinationState_;
};

std::string Listed(const std::vector<std::string>& names) {
  std::string text;
  for (size_t i = 0; i < names.size() && i < 12; ++i) text += "\n  " + names[i];
  if (names.size() > 12) text += "\n  ... " + std::to_string(names.size() - 12) + " more";
  return text;
}

// The host killed right before each of a run's file changes (a handful spread over the run here;
// every one with VXM_KILL_TEST_POINTS=all): each destination file is as before or as after an
// uninterrupted run, and a re-run finishes the job with no temporary file left.
TEST(HostKill, EveryKillLeavesOldOrFinishedFilesAndARerunFinishesClean) {
  HostRun run({"halden_to_obx"});
  Installations installations(run);
  const std::string countFile = run.Path("changes.txt");

  // The uninterrupted run: its result, its exit status and how many changes it makes.
  installations.Reset();
  int finishedStatus;
  {
    ScopedEnvironment environment;
    UseShim(environment, 0, countFile);
    finishedStatus = run.Run(run.SampleOptions());
  }
  ASSERT_GE(finishedStatus, 0) << run.Err();
  const Tree after = WithoutLog(TreeState(run.dst));
  const long total = std::atol(ReadFile(countFile).c_str());
  ASSERT_GT(total, 0) << "the shim counted no change";
  ASSERT_NE(installations.DestinationState(), TreeState(run.dst)) << "the run changed nothing";

  for (long point : KillPoints(total)) {
    SCOPED_TRACE("killed before change " + std::to_string(point) + " of " + std::to_string(total));
    installations.Reset();
    {
      ScopedEnvironment environment;
      UseShim(environment, point, run.Path("unused.txt"));
      ASSERT_EQ(-1, run.Run(run.SampleOptions())) << "the run was not killed";
    }
    const std::vector<std::string> misfits =
        Misfits(installations.DestinationState(), after, TreeState(run.dst));
    EXPECT_TRUE(misfits.empty()) << "files neither as before nor as after the run:"
                                 << Listed(misfits);

    EXPECT_EQ(finishedStatus, run.Run(run.SampleOptions())) << run.Err();
    const Tree rerun = TreeState(run.dst);
    EXPECT_EQ(std::vector<std::string>(), TemporaryFiles(rerun)) << "temporary files left";
    const std::vector<std::string> differences = Differences(after, WithoutLog(rerun));
    EXPECT_TRUE(differences.empty()) << "the second run's result differs:" << Listed(differences);
    EXPECT_EQ(installations.SourceState(), TreeState(run.src)) << "the source changed";
  }
}

}  // namespace
}  // namespace vxtest
