// Host runs under the test-only write countdown shim (tests/shims/write_countdown.c), which kills
// the host before, or fails, the N-th call of a run that changes a file, and the comparisons of a
// destination tree after such a run with the trees before and after an undisturbed run.

#ifndef VXMIGRATE_TESTS_RUN_COUNTDOWN_RUN_H_
#define VXMIGRATE_TESTS_RUN_COUNTDOWN_RUN_H_

#include <fnmatch.h>
#include <stdlib.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <functional>
#include <iterator>
#include <map>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include "run/host_run.h"
#include "support/process_state.h"
#include "support/test_files.h"

namespace vxtest {

// Every whole version a run put in place, by name below its destination, as Tree holds them.
using Versions = std::map<std::string, std::set<std::string>>;

// run's result, run with the shim in the hosts it starts and settings (VXM_KILL_BEFORE, ...) in
// their environment; the shim writes the number of changes a run made to countFile at a normal
// exit. It comes first in the host process, ahead of the address sanitizer's runtime in the
// sanitized build, which must be told to accept that.
inline int UnderCountdown(const std::string& countFile,
                          const std::map<std::string, std::string>& settings,
                          const std::function<int()>& run) {
  ScopedEnvironment environment;
  environment.Set("LD_PRELOAD", VXM_COUNTDOWN_SHIM);
  environment.Set("VXM_COUNT_FILE", countFile);
  const char* asan = getenv("ASAN_OPTIONS");
  environment.Set("ASAN_OPTIONS",
                  std::string(asan != nullptr ? asan : "") + ":verify_asan_link_order=0");
  for (const auto& [name, value] : settings) environment.Set(name, value);
  return run();
}

// The number a countdown run wrote to countFile; 0 when it wrote none.
inline long CountedChanges(const std::string& countFile) {
  return std::atol(ReadFile(countFile).c_str());
}

// The versions the shim kept in folder (VXM_VERSIONS_DIR) of files below destination.
inline Versions KeptVersions(const std::string& folder, const std::string& destination) {
  Versions versions;
  char* real = realpath(destination.c_str(), nullptr);
  const std::string root = std::string(real != nullptr ? real : destination.c_str()) + "/";
  free(real);
  const std::string index = ReadFile(folder + "/index");
  for (size_t at = 0, end; (end = index.find('\n', at)) != std::string::npos; at = end + 1) {
    const std::string line = index.substr(at, end - at);
    const size_t tab = line.find('\t');
    const std::string path = tab == std::string::npos ? "" : line.substr(tab + 1);
    if (path.rfind(root, 0) != 0) continue;
    versions[path.substr(root.size())].insert(ReadFile(folder + "/" + line.substr(0, tab)));
  }
  return versions;
}

inline bool IsTemporaryName(const std::string& relative) {
  const std::string name = relative.substr(relative.rfind('/') + 1);
  return fnmatch(".*.vxtmp.*", name.c_str(), 0) == 0;
}

// Names whose entry differs between the two trees, or that only one of them has.
inline std::vector<std::string> Differences(const Tree& expected, const Tree& actual) {
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

// Entries of a disturbed run's destination that are neither as before nor as after an undisturbed
// run (nor, given versions, one of the whole versions the undisturbed run put in place on its
// way): a file with other bytes, one the finished run does not have, or one lost that both runs
// keep. Temporary files are left out: a run may leave them, the next run removes them.
inline std::vector<std::string> Misfits(const Tree& before, const Tree& after,
                                        const Tree& disturbed, const Versions& versions = {}) {
  std::vector<std::string> names;
  for (const auto& [name, state] : disturbed) {
    if (IsBookkeeping(name) || IsTemporaryName(name)) continue;
    auto old = before.find(name), finished = after.find(name);
    auto passed = versions.find(name);
    const bool asBefore = old != before.end() && old->second == state;
    const bool asAfter = finished != after.end() && finished->second == state;
    const bool onTheWay = passed != versions.end() && passed->second.count(state) != 0;
    if (!asBefore && !asAfter && !onTheWay) names.push_back(name);
  }
  for (const auto& [name, state] : before) {
    if (!IsBookkeeping(name) && after.count(name) != 0 && disturbed.count(name) == 0) {
      names.push_back(name + " (lost)");
    }
  }
  return names;
}

inline std::vector<std::string> TemporaryFiles(const Tree& tree) {
  std::vector<std::string> names;
  for (const auto& [name, state] : tree) {
    if (IsTemporaryName(name)) names.push_back(name);
  }
  return names;
}

// Points 1..total to disturb a run at, as the environment variable setting asks: "all", or a
// number of them spread evenly with the first and the last (fallback when it is unset).
inline std::vector<long> CountdownPoints(long total, const char* setting,
                                         const std::string& fallback) {
  const char* value = getenv(setting);
  const std::string wanted = value != nullptr ? value : fallback;
  const long count =
      wanted == "all" ? total : std::min(total, std::max(2L, std::atol(wanted.c_str())));
  std::vector<long> points;
  for (long i = 0; i < count; ++i) {
    const long point = count == total ? i + 1 : 1 + (total - 1) * i / (count - 1);
    if (points.empty() || points.back() != point) points.push_back(point);
  }
  return points;
}

// Two installations a run starts from, kept aside so that every run starts from the same bytes:
// Reset puts fresh copies at liveSource and liveDestination.
class PristineInstallations {
 public:
  PristineInstallations(const std::string& source, const std::string& destination,
                        const std::string& aside, const std::string& liveSource,
                        const std::string& liveDestination)
      : copies_{{aside + "/source", liveSource}, {aside + "/destination", liveDestination}} {
    CopyTree(source, copies_[0].first);
    CopyTree(destination, copies_[1].first);
    sourceState_ = TreeState(copies_[0].first);
    destinationState_ = TreeState(copies_[1].first);
  }

  void Reset() const {
    for (const auto& [kept, live] : copies_) {
      std::filesystem::remove_all(live);
      CopyTree(kept, live);
    }
  }
  const Tree& SourceState() const { return sourceState_; }
  const Tree& DestinationState() const { return destinationState_; }

 private:
  static void CopyTree(const std::string& from, const std::string& to) {
    namespace fs = std::filesystem;
    fs::create_directories(fs::path(to).parent_path());
    fs::copy(from, to, fs::copy_options::recursive | fs::copy_options::copy_symlinks);
  }

  const std::pair<std::string, std::string> copies_[2];  // kept aside, live
  Tree sourceState_, destinationState_;
};

// The first dozen names, one an indented line, for a failure message.
inline std::string Listed(const std::vector<std::string>& names) {
  std::string text;
  for (size_t i = 0; i < names.size() && i < 12; ++i) text += "\n  " + names[i];
  if (names.size() > 12) text += "\n  ... " + std::to_string(names.size() - 12) + " more";
  return text;
}

}  // namespace vxtest

#endif  // VXMIGRATE_TESTS_RUN_COUNTDOWN_RUN_H_
