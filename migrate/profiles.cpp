// Copies profiles of given types from the whole source tree into the same folders of the
// destination, never replacing a profile that is there already, each with its data folder
// ("<name>.dat" beside it) unless option "FT" says otherwise. Results are always 0; nothing is done
// in an in-place migration.

#include <string>
#include <vector>

#include "foundation/files/file_info.h"
#include "foundation/files/file_manager.h"
#include "foundation/files/filename.h"
#include "foundation/string/tokenizer.h"
#include "migrate/exclusion_index.h"
#include "migrate/failed_copy.h"
#include "migrate/internal/source_tree.h"
#include "migrate/manager.h"

namespace {

// Copies the files directly in the profile's data folder, if it has one; its subfolders stay.
void CopyProfileDataFolder(vxMigrationManager& manager, const vxStringBase& sourceFolder,
                           const vxStringBase& destinationFolder, const vxStringBase& profileName) {
  vxStringBase dataName = vxFilename(profileName).BaseName();
  dataName.append(".dat");
  vxStringBase sourceData;
  vxFileManager::MakePath(sourceData, sourceFolder, dataName, 0);
  if (vxFilename::IsDirectory(sourceData.c_str()) == 0) return;
  vxStringBase destinationData;
  vxFileManager::MakePath(destinationData, destinationFolder, dataName, 0);
  vxStringBase sourcePattern(sourceData);
  sourcePattern.append("*.*");
  // The profile itself was new to the destination, so its data folder's files go in as they are.
  // The folder is made even when it gets no file: the profile looks for it.
  const int copied = vxFileManager::CreateDirectory(destinationData, nullptr) != 0
                         ? 1
                         : vxFileManager::CopyFile(sourcePattern, destinationData, 1, 1, 0, 0, 0,
                                                   nullptr, nullptr);
  if (copied != 0) {
    vxLogFailedCopy(manager, sourceData, destinationData);
    return;
  }
  manager.Log("Folder copied:  ", sourcePattern.c_str());
}

}  // namespace

int vxMigrationManager::CopyProfilesOfTypes(const vxStringBase& extensions, unsigned int option) {
  if (IsInPlaceMigrate()) return 0;
  vxBStringTokenizer tokens(extensions, ",", true);
  vxStringBase extension;
  while (vxNextListItem(tokens, extension)) {
    CopyAllProfilesOfType(extension, vxStringBase::NullStr);
  }
  return 0;
}

int vxMigrationManager::CopyAllProfilesOfType(const vxStringBase& extension,
                                              const vxStringBase& exclusions) {
  if (IsInPlaceMigrate()) return 0;
  std::string pattern = "*.";
  pattern.append(extension.str());

  const vxExclusionIndex excluded(*this, exclusions, vxStringBase::NullStr, 1);
  const bool copyDataFolders = CopiesProfileDataFolders();
  vxStringBase sourceFolder;
  vxFileInfoList files;
  for (const vxStringBase& folder : vxListSourceFolders(*this)) {
    if (!vxListSourceFiles(*this, folder, pattern.c_str(), sourceFolder, files)) continue;
    vxStringBase destinationFolder;
    vxFileManager::MakePath(destinationFolder, m_destinationDirectory, folder, 0);
    for (const vxFileInfo& file : files) {
      vxStringBase name = file.GetFilename().Filename();
      vxStringBase source;
      vxFileManager::MakePath(source, m_sourceDirectory, folder, name);
      vxStringBase destination;
      vxFileManager::MakePath(destination, m_destinationDirectory, folder, name);
      if (excluded.Contains(source)) continue;
      if (vxFileManager::Exists(destination)) {
        // The installed profile stays, and so does its data folder.
        Log("File exists - no copy made:  ", source.c_str());
        continue;
      }
      if (vxFileManager::CopyFile(source, destination, 0, 1, 0, 0, 0, nullptr, nullptr) == 0) {
        Log("File copied:  ", source.c_str());
      }
      if (copyDataFolders) CopyProfileDataFolder(*this, sourceFolder, destinationFolder, name);
    }
  }
  return 0;
}
