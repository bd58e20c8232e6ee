// A real manager over fresh installation folders for the settings-merge tests, with the run log's
// entries written after the manager's own header.

#ifndef VXMIGRATE_TESTS_MIGRATE_SETTINGS_FIXTURE_H_
#define VXMIGRATE_TESTS_MIGRATE_SETTINGS_FIXTURE_H_

#include <algorithm>
#include <memory>
#include <string>
#include <vector>

#include "migrate/driver_fixture.h"

namespace vxtest {

class SettingsRun {
 public:
  // A run "<tmp>/src" -> "<tmp>/dst" between the given products and versions; in place both
  // folders are "<tmp>/inst".
  explicit SettingsRun(const std::string& p1 = "pavsuite", const std::string& p2 = "pavsuite",
                       const std::string& v1 = "5.0", const std::string& v2 = "5.5",
                       bool inPlace = false)
      : src_(root_.Path(inPlace ? "inst" : "src")), dst_(root_.Path(inPlace ? "inst" : "dst")) {
    MakeDirs(src_);
    MakeDirs(dst_);
    manager_ = MakeManager({root_.Path("vxmigrate"), "-D1:" + src_, "-D2:" + dst_,
                            "-P1:" + p1, "-P2:" + p2, "-V1:" + v1, "-V2:" + v2});
    header_ = LogEntries(dst_ + "/vxmigrate.log").size();
  }
  SettingsRun(const SettingsRun&) = delete;
  SettingsRun& operator=(const SettingsRun&) = delete;

  vxMigrationManager& manager() { return *manager_; }
  std::string Src(const std::string& relative) const { return src_ + "/" + relative; }
  std::string Dst(const std::string& relative) const { return dst_ + "/" + relative; }

  // Entries the operations logged, in order.
  std::vector<std::string> Logged() const {
    const std::vector<std::string> all = LogEntries(dst_ + "/vxmigrate.log");
    return std::vector<std::string>(all.begin() + std::min(header_, all.size()), all.end());
  }

 private:
  TempDir root_;
  std::string src_;
  std::string dst_;
  std::unique_ptr<vxMigrationManager> manager_;
  size_t header_ = 0;
};

}  // namespace vxtest

#endif  // VXMIGRATE_TESTS_MIGRATE_SETTINGS_FIXTURE_H_
