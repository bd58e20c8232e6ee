// Builds the hash set behind vxExclusionSet with the same walk over the list that IsExcludeFile
// makes for every file.

#include "migrate/internal/exclusion_set.h"

#include "foundation/files/file_manager.h"
#include "migrate/manager.h"

vxExclusionSet::vxExclusionSet(vxMigrationManager& manager, const vxStringBase& list,
                               const vxStringBase& inPlaceExtension, int fromInstallation) {
  if (list.isEmpty()) return;
  const bool inPlace = manager.IsInPlaceMigrate();
  unsigned int position = 0;
  // A comma at the very end ends the walk: no empty name is taken after it.
  while (position != vxStringBase::BadIndex && position < list.length()) {
    vxStringBase name;
    position = list.subString(',', name, position, list.length() - 1);
    name.stripWhite(vxStringBase::kBoth);
    if (inPlace && name.find(".ini", 0, true) != vxStringBase::BadIndex) {
      // In place the backups stand beside the files: "x.ini" names "x." + the given extension.
      name.cut(4);
      name.append('.');
      name.append(inPlaceExtension);
    }
    if (fromInstallation != 0) {
      vxStringBase path;
      vxFileManager::MakePath(path, manager.GetSourceDirectory(), vxStringBase::NullStr, name);
      name = path;
    }
    folded_.insert(vxFoldCase(name.view()));
  }
}

bool vxExclusionSet::Contains(const vxStringBase& file) const {
  if (folded_.empty()) return false;
  return folded_.count(vxFoldCase(file.view())) != 0;
}
