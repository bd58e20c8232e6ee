// Advanced options of the Halden edition carried into the OBX edition: the shared sub-profiles are
// merged by the manager, the dynamic-page query profiles converted here into the layout of the
// destination's version. Numbered walks follow the sections the files hold, so a damaged count
// cannot make them run for ever.

#include <algorithm>
#include <cstdint>
#include <string>
#include <unordered_set>
#include <vector>

#include "edition/edition_util.h"
#include "edition/halden_to_obx.h"
#include "foundation/files/file_manager.h"
#include "migrate/failed_copy.h"
#include "migrate/manager.h"

namespace {

const char kSourceDynamicPages[] = "\\vxm_log\\datfiles\\dynamicpages\\default.ini";
const char kDestinationDynamicPages[] = "\\vxm_vxx\\datfiles\\dynamicpages\\default.ini";

struct MergedOption {
  const char* source;
  const char* destination;
  const char* prefix;
};

const MergedOption kMergedOptions[] = {
    {"\\vxm_log\\datfiles\\contentgroups\\default.ini",
     "\\vxm_vxx\\datfiles\\contentgroups\\default.ini", "ContentGroupProfile"},
    {"\\vxm_log\\datfiles\\pathsanalysis\\default.ini",
     "\\vxm_vxx\\datfiles\\pathsanalysis\\default.ini", "PathsAnalysisProfile"},
    {"\\vxm_log\\datfiles\\urlreplacement\\default.ini",
     "\\vxm_vxx\\datfiles\\urlreplacement\\default.ini", "URLReplacementProfile"},
    {"\\vxm_log\\datfiles\\tradequill\\default.ini", "\\vxm_vxx\\datfiles\\tradequill\\default.ini",
     "AdCampaignProfile"},
    {"\\vxm_log\\datfiles\\tradequill\\default.ini", "\\vxm_vxx\\datfiles\\tradequill\\default.ini",
     "ProductProfile"},
    {"\\vxm_log\\datfiles\\tradequill\\default.ini", "\\vxm_vxx\\datfiles\\tradequill\\default.ini",
     "CategoryProfile"},
};

// The numbers n, ascending, of the sections named prefix + n (n written in plain decimal, prefix
// compared ignoring case) with n below limit. The same numbers a walk n = 0 .. limit - 1 asking for
// each section would find, without walking numbers the file does not hold.
std::vector<int64_t> NumberedSections(const vxMappedINIFile& file, const char* prefix,
                                      int64_t limit) {
  std::vector<int64_t> numbers;
  const std::string lead(prefix);
  for (const vxStringBase& name : file.GetSectionNames()) {
    const std::string& text = name.str();
    if (text.size() <= lead.size() || text.size() > lead.size() + 18) continue;
    if (!vxEqualsIgnoreCase(std::string_view(text).substr(0, lead.size()), lead)) continue;
    const std::string digits = text.substr(lead.size());
    if (digits.find_first_not_of("0123456789") != std::string::npos) continue;
    if (digits.size() > 1 && digits[0] == '0') continue;  // "07" is not how 7 is named
    const int64_t number = std::stoll(digits);
    if (number < limit) numbers.push_back(number);
  }
  std::sort(numbers.begin(), numbers.end());
  numbers.erase(std::unique(numbers.begin(), numbers.end()), numbers.end());
  return numbers;
}

// The in-place installer has already replaced the old file; its backup beside it holds the values.
vxStringBase InPlaceBackup(const vxStringBase& path) {
  vxStringBase backup(path);
  if (backup.endsWith(".ini", false)) {
    backup.cut(4);
    backup.append(".vxinibak");
  }
  return backup;
}

}  // namespace

int HaldenToOBXHelper::DoMergeAdvancedOptionsFiles() {
  for (const MergedOption& option : kMergedOptions) {
    manager_->MergeAdvancedOptionsFiles(option.source, option.destination, option.prefix);
  }

  vxStringBase destinationPath;
  vxFileManager::MakePath(destinationPath, destinationFolder_, kDestinationDynamicPages, 1);

  if (DestinationMajor(manager_) < 3) {
    // The old layout: numbered "QueryProfile" sections with the page in "Page".
    vxStringBase sourcePath;
    vxFileManager::MakePath(sourcePath, sourceFolder_, kSourceDynamicPages, 1);
    if (manager_->IsInPlaceMigrate()) sourcePath = InPlaceBackup(sourcePath);
    vxMappedINIFile source(sourcePath);
    if (source.Open(0) != 0) return 1;
    vxMappedINIFile destination(destinationPath);
    if (destination.Open(1) != 0) return 1;

    const vxStringBase countKey("QueryProfileCount");
    const int64_t sourceCount = source.GetVal("Default", countKey).asLong();
    const int64_t destinationCount = destination.GetVal("Default", countKey).asLong();

    // Profiles the destination holds already, by id (ignoring case), as the file stood before.
    std::unordered_set<std::string> knownIds;
    for (int64_t j : NumberedSections(destination, "QueryProfile", destinationCount)) {
      knownIds.insert(vxFoldCase(
          destination.GetVal(vxStringBase(NumberedName("QueryProfile", j)), "ProfileID").view()));
    }

    int64_t next = destinationCount;
    int added = 0;  // logged once the file is written
    for (int64_t i : NumberedSections(source, "QueryProfile", sourceCount)) {
      const INILineList* lines =
          source.GetPropertyList(vxStringBase(NumberedName("QueryProfile", i)));
      if (lines == nullptr) continue;
      // The qualification carries the profile's own number.
      const vxStringBase url = source.GetVal(lines, vxStringBase(
          "Qualification" + std::to_string(i) + "URL"));
      const vxStringBase parameter = source.GetVal(lines, "Parameter0");
      const vxStringBase mapFile = source.GetVal(lines, "MapFile0");
      const vxStringBase& id = source.GetVal(lines, "ProfileID");
      if (knownIds.count(vxFoldCase(id.view())) != 0) continue;

      // A section at or above the count (a count lowered by hand) is one of the destination's own
      // profiles: it is never mixed with an added one, and the added profile takes the next number.
      while (destination.HasSection(vxStringBase(NumberedName("QueryProfile", next)))) {
        knownIds.insert(vxFoldCase(
            destination.GetVal(vxStringBase(NumberedName("QueryProfile", next)), "ProfileID")
                .view()));
        ++next;
      }
      const std::string section = NumberedName("QueryProfile", next);
      destination.AddMapSection(section.c_str(), lines);
      destination.SetVal(vxStringBase(section), "Page", url);
      destination.SetVal(vxStringBase(section), "Parameter", parameter);
      destination.SetVal(vxStringBase(section), "MapFile", mapFile);
      destination.SetVal("Default", countKey, vxStringBase(std::to_string(next + 1)));
      ++added;
      ++next;
    }
    if (!vxWroteBack(*manager_, destination)) return 1;
    for (int i = 0; i < added; ++i) {
      manager_->Log("Advanced option file migrated: ", kSourceDynamicPages);
    }
    return 0;
  }

  // The new layout: lower-case names, the page in "qualification0url".
  manager_->MergeAdvancedOptionsFiles(kSourceDynamicPages, kDestinationDynamicPages,
                                      "queryprofile");
  vxMappedINIFile destination(destinationPath);
  if (destination.Open(1) != 0) return 1;
  const int64_t count = destination.GetVal("default", "queryprofilecount").asLong();
  for (int64_t i : NumberedSections(destination, "queryprofile", count)) {
    const vxStringBase section(NumberedName("queryprofile", i));
    if (!destination.GetVal(section, "qualification0url").isEmpty()) continue;
    for (int q = 0; q <= 99; ++q) {
      const vxStringBase qualification =
          destination.GetVal(section, vxStringBase(NumberedName("qualification", q) + "url"));
      if (!qualification.isEmpty()) {
        destination.SetVal(section, "qualification0url", qualification);
        break;
      }
    }
  }
  const vxStringBase migrated(destinationPath);
  if (!vxWroteBack(*manager_, destination)) return 1;
  manager_->Log("Advanced option file migrated: ", migrated.c_str());
  return 0;
}
