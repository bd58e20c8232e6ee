// Exclusion lists: which files of the source installation a copy leaves behind. A list is names
// separated by ","; blanks around a name do not count, an empty name names nothing, and names
// match ignoring ASCII case. Nothing here touches the disk except the folder listing of
// MakeFullExclusionList.

#include "migrate/exclusion_index.h"

#include "foundation/files/file_info.h"
#include "foundation/files/file_manager.h"
#include "migrate/manager.h"

namespace {

const char kIniMark[] = ".ini";
const unsigned int kIniMarkLength = 4;

// Hands out the raw names of list in order; a comma at the very end starts no further name.
class ExclusionListWalk {
 public:
  explicit ExclusionListWalk(const vxStringBase& list) : list_(list) {}

  bool Next(vxStringBase& name) {
    if (position_ == vxStringBase::BadIndex || position_ >= list_.length()) return false;
    position_ = list_.subString(',', name, position_, list_.length() - 1);
    return true;
  }

 private:
  const vxStringBase& list_;
  unsigned int position_ = 0;
};

// Turns one raw name of an exclusion list into the text a file is compared with: blanks around it
// dropped, ".ini" replaced in an in-place run, joined to the source folder when fromInstallation
// is nonzero. False for a name that is empty after stripping: it names no file.
bool vxExclusionCandidate(vxMigrationManager& manager, vxStringBase name,
                          const vxStringBase& inPlaceExtension, int fromInstallation,
                          vxStringBase& candidate) {
  name.stripWhite(vxStringBase::kBoth);
  if (name.isEmpty()) return false;
  // In place, the installer has already put the new version's "x.ini" where the old one was, and
  // the list's "x.ini" stands for the old file kept under another extension. The name is assumed
  // to end in ".ini" wherever the mark appears in it.
  if (manager.IsInPlaceMigrate() && name.find(kIniMark, 0, true) != vxStringBase::BadIndex) {
    name.cut(kIniMarkLength);
    name.append('.');
    name.append(inPlaceExtension);
  }
  if (fromInstallation == 0) {
    candidate = name;
  } else {
    vxFileManager::MakePath(candidate, manager.GetSourceDirectory(), vxStringBase::NullStr, name);
  }
  return true;
}

}  // namespace

vxExclusionIndex::vxExclusionIndex(vxMigrationManager& manager, const vxStringBase& list,
                                   const vxStringBase& inPlaceExtension, int fromInstallation) {
  ExclusionListWalk walk(list);
  vxStringBase name;
  vxStringBase candidate;
  while (walk.Next(name)) {
    if (vxExclusionCandidate(manager, name, inPlaceExtension, fromInstallation, candidate)) {
      names_.insert(vxFoldCase(candidate.view()));
    }
  }
}

bool vxExclusionIndex::Contains(const vxStringBase& file) const {
  return !names_.empty() && names_.count(vxFoldCase(file.view())) != 0;
}

// One question costs one walk of the list; callers with many files build a vxExclusionIndex.
int vxMigrationManager::IsExcludeFile(const vxStringBase& file, const vxStringBase& list,
                                      const vxStringBase& inPlaceExtension, int fromInstallation) {
  ExclusionListWalk walk(list);
  vxStringBase name;
  vxStringBase candidate;
  while (walk.Next(name)) {
    if (vxExclusionCandidate(*this, name, inPlaceExtension, fromInstallation, candidate) &&
        candidate.equals(file, false)) {
      return 1;
    }
  }
  return 0;
}

// With a selection, everything of the folder that the user did not select is left behind, then
// the fixed names. Without one, only the fixed names are; result is then replaced, not appended
// to, which only matters to a caller that passes a non-empty result.
void vxMigrationManager::MakeFullExclusionList(vxStringBase& result, const vxStringBase& selection,
                                               const vxStringBase& folder, const char* extension,
                                               const char* fixedList) {
  if (selection.isEmpty()) {
    result = fixedList;
    return;
  }
  vxStringBase folderPath;
  vxFileManager::MakePath(folderPath, m_sourceDirectory, folder, 0);
  vxStringBase pattern("*.");
  pattern.append(extension);
  vxFileInfoList files;
  vxFileManager::GetFileList(folderPath, pattern.c_str(), files, 0);

  const vxExclusionIndex selected(*this, selection, vxStringBase::NullStr, 0);
  for (const vxFileInfo& file : files) {
    const vxStringBase name = file.GetFilename().Filename();
    if (selected.Contains(name)) continue;
    if (!result.isEmpty()) result.append(',');
    result.append(name);
  }
  if (!result.isEmpty()) result.append(',');
  result.append(fixedList);
}
