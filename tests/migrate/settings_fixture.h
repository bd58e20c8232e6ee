// A real manager over fresh installation folders for the settings-merge tests, with the run log's
// entries written after the manager's own header.

#ifndef VXMIGRATE_TESTS_MIGRATE_SETTINGS_FIXTURE_H_
#define VXMIGRATE_TESTS_MIGRATE_SETTINGS_FIXTURE_H_

#include <algorithm>
#include <memory>
#include <string>
#include <vector>

#include "foundation/inifile/ini_file.h"
#include "migrate/driver_fixture.h"
#include "migrate/manager.h"
#include "support/test_files.h"

namespace vxtest {

// "key=value" for each property of a section of an INI file, in file order; {"<none>"} when the
// section is absent.
inline std::vector<std::string> SectionLines(const std::string& path, const std::string& section) {
  vxMappedINIFile file(path.c_str());
  if (file.Open(1) != 0) return {"<unreadable>"};
  const INILineList* list = file.GetPropertyList(section.c_str());
  if (list == nullptr) return {"<none>"};
  std::vector<std::string> lines;
  for (const INILine* line : *list) lines.push_back(line->m_key.str() + "=" + line->m_value.str());
  return lines;
}

class SettingsRun {
 public:
  // A side-by-side run "<tmp>/src" -> "<tmp>/dst" between the given products and versions.
  SettingsRun(const std::string& p1, const std::string& p2, const std::string& v1,
              const std::string& v2, bool inPlace = false)
      : source_(root_.Path(inPlace ? "inst" : "src")),
        destination_(root_.Path(inPlace ? "inst" : "dst")) {
    MakeDirs(source_);
    MakeDirs(destination_);
    manager_ = MakeManager({root_.Path("vxmigrate"), "-D1:" + source_, "-D2:" + destination_,
                            "-P1:" + p1, "-P2:" + p2, "-V1:" + v1, "-V2:" + v2});
    header_ = LogEntries(destination_ + "/vxmigrate.log").size();
  }
  // Both folders are "<tmp>/inst".
  static std::unique_ptr<SettingsRun> InPlace(const std::string& p1, const std::string& p2,
                                              const std::string& v1, const std::string& v2) {
    return std::make_unique<SettingsRun>(p1, p2, v1, v2, true);
  }

  SettingsRun(const SettingsRun&) = delete;
  SettingsRun& operator=(const SettingsRun&) = delete;

  vxMigrationManager& manager() { return *manager_; }
  std::string Src(const std::string& relative) const { return source_ + "/" + relative; }
  std::string Dst(const std::string& relative) const { return destination_ + "/" + relative; }

  // Entries the operations logged, in order.
  std::vector<std::string> Logged() const {
    std::vector<std::string> all = LogEntries(destination_ + "/vxmigrate.log");
    all.erase(all.begin(), all.begin() + static_cast<long>(std::min(header_, all.size())));
    return all;
  }

 private:
  TempDir root_;
  std::string source_;
  std::string destination_;
  std::unique_ptr<vxMigrationManager> manager_;
  size_t header_ = 0;
};

}  // namespace vxtest

#endif  // VXMIGRATE_TESTS_MIGRATE_SETTINGS_FIXTURE_H_
