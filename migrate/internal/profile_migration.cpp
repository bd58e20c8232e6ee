// The selection, exclusion and version steps shared by the log, link and alert profile migrations.

#include "migrate/internal/profile_migration.h"

#include <string>
#include <unordered_set>

#include "foundation/files/file_info.h"
#include "foundation/files/file_manager.h"
#include "migrate/manager.h"

namespace {

// Product numbers with their own categories versions.
const int kLogProductID = 6;
const int kFirewallProductID = 8;

// Logs each name of the selection (a list in exclusion form) that names no profile of the folder,
// once, in the selection's order. Names compare as the exclusion test compares them.
void LogUnknownSelections(vxMigrationManager& manager, const vxStringBase& selection,
                          const vxStringBase& folder, const vxStringBase& extension) {
  vxStringBase path;
  vxFileManager::MakePath(path, manager.GetSourceDirectory(), folder, 0);
  std::string pattern = "*.";
  pattern.append(extension.str());
  vxFileInfoList files;
  vxFileManager::GetFileList(path, pattern.c_str(), files, 0);
  std::unordered_set<std::string> present;
  for (const vxFileInfo& file : files) present.insert(vxFoldCase(file.GetFilename().Filename().view()));

  std::unordered_set<std::string> reported;
  unsigned int position = 0;
  while (position != vxStringBase::BadIndex && position < selection.length()) {
    vxStringBase name;
    position = selection.subString(',', name, position, selection.length() - 1);
    name.stripWhite(vxStringBase::kBoth);
    if (name.isEmpty()) continue;
    std::string folded = vxFoldCase(name.view());
    if (present.count(folded) != 0 || !reported.insert(folded).second) continue;
    manager.Log("Error: Selected profile not found: ", name.c_str());
  }
}

}  // namespace

vxStringBase MakeProfileExclusions(vxMigrationManager& manager, const vxStringBase& selection,
                                   const char* folder, const char* extension,
                                   const char* fixedList) {
  const vxStringBase relative(folder);
  const vxStringBase type(extension);
  if (!selection.isEmpty()) LogUnknownSelections(manager, selection, relative, type);
  vxStringBase exclusions;
  manager.MakeFullExclusionList(exclusions, selection, relative, type.c_str(),
                                fixedList == nullptr ? "" : fixedList);
  return exclusions;
}

bool ReachesVersion(const vxVersionDescriptor* version, int major, int minor) {
  return version != nullptr && version->m_major >= major && version->m_minor >= minor;
}

void CategoriesVersion(int productID, bool firewallCounts, int& major, int& minor) {
  major = 5;
  minor = 5;
  if (productID == kLogProductID) major = 6;
  if (firewallCounts && productID == kFirewallProductID) {
    major = 3;
    minor = 1;
  }
}

bool BothKeepCategories(vxMigrationManager& manager, bool firewallCounts) {
  int major = 0;
  int minor = 0;
  CategoriesVersion(manager.GetSourceProductID(), firewallCounts, major, minor);
  if (!ReachesVersion(manager.GetSourceVersionDescriptor(), major, minor)) return false;
  CategoriesVersion(manager.GetDestinationProductID(), firewallCounts, major, minor);
  return ReachesVersion(manager.GetDestinationVersionDescriptor(), major, minor);
}

void SplitHomePage(vxMappedINIFile& profile) {
  const vxStringBase home = profile.GetVal("Profile", "HomePageName");
  if (home.isEmpty()) return;
  const unsigned int slash = home.rfind('/');
  vxStringBase baseDir(home);
  vxStringBase defaults;
  if (slash != vxStringBase::BadIndex) {
    defaults = home.subString(slash + 1, vxStringBase::BadIndex);
    baseDir = slash == 0 ? vxStringBase() : home.subString(0, slash - 1);
  }
  profile.SetVal("Profile", "HomePageDefaults", defaults);
  profile.SetVal("Profile", "HomePageBaseDir", baseDir);
}
