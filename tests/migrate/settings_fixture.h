// A real manager over fresh installation folders for the settings-merge tests, with the run log's
// entries written after the manager's own header.

#ifndef VXMIGRATE_TESTS_MIGRATE_SETTINGS_FIXTURE_H_
#define VXMIGRATE_TESTS_MIGRATE_SETTINGS_FIXTURE_H_

#include <memory>
#include <string>
#include <vector>

#include "migrate/manager.h"
#include "support/test_files.h"

namespace vxtest {

class SettingsRun {
 public:
  // A side-by-side run "<tmp>/src" -> "<tmp>/dst" between the given products and versions.
  SettingsRun(const std::string& p1, const std::string& p2, const std::string& v1,
              const std::string& v2)
      : SettingsRun(p1, p2, v1, v2, false) {}

  // inPlace: both folders are "<tmp>/inst".
  static std::unique_ptr<SettingsRun> InPlace(const std::string& p1, const std::string& p2,
                                              const std::string& v1, const std::string& v2) {
    return std::unique_ptr<SettingsRun>(new SettingsRun(p1, p2, v1, v2, true));
  }

  SettingsRun(const SettingsRun&) = delete;
  SettingsRun& operator=(const SettingsRun&) = delete;

  vxMigrationManager& manager() { return *manager_; }
  std::string Src(const std::string& relative) const { return source_ + "/" + relative; }
  std::string Dst(const std::string& relative) const { return destination_ + "/" + relative; }

  // Entries the operations logged, in order.
  std::vector<std::string> Logged() const {
    std::vector<std::string> all = LogEntries(destination_ + "/vxmigrate.log");
    if (all.size() <= header_) return {};
    return std::vector<std::string>(all.begin() + static_cast<long>(header_), all.end());
  }

 private:
  SettingsRun(const std::string& p1, const std::string& p2, const std::string& v1,
              const std::string& v2, bool inPlace)
      : source_(root_.Path(inPlace ? "inst" : "src")),
        destination_(root_.Path(inPlace ? "inst" : "dst")) {
    MakeDirs(source_);
    MakeDirs(destination_);
    MakeDirs(root_.Path("bin"));
    std::vector<std::string> args = {root_.Path("bin/vxmigrate"), "-D1:" + source_,
                                     "-D2:" + destination_,       "-P1:" + p1,
                                     "-P2:" + p2,                 "-V1:" + v1,
                                     "-V2:" + v2};
    std::vector<char*> argv;
    for (std::string& arg : args) argv.push_back(&arg[0]);
    argv.push_back(nullptr);
    manager_ = std::make_unique<vxMigrationManager>(static_cast<int>(args.size()), argv.data());
    header_ = LogEntries(destination_ + "/vxmigrate.log").size();
  }

  TempDir root_;
  std::string source_;
  std::string destination_;
  std::unique_ptr<vxMigrationManager> manager_;
  size_t header_ = 0;
};

}  // namespace vxtest

#endif  // VXMIGRATE_TESTS_MIGRATE_SETTINGS_FIXTURE_H_
