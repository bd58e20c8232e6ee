// Carries the user's INI settings into the new installation's files: the new file keeps its own
// values and gains the keys and sections only the old file has. Only the destination is written,
// atomically; a destination that cannot be loaded is left exactly as it is. In an in-place run the
// old contents are read from the ".vxinibak" backup the installer left beside each new ".ini".

#include <unistd.h>

#include "foundation/files/file_manager.h"
#include "foundation/files/filename.h"
#include "foundation/inifile/ini_file.h"
#include "migrate/exclusion_index.h"
#include "migrate/failed_copy.h"
#include "migrate/internal/source_tree.h"
#include "migrate/manager.h"

namespace {

const char kIniMerged[] = "INI file merged: ";
const char kIniCopied[] = "INI file doesn't exist - file being copied: ";
const char kUnableToOpen[] = "Error: Unable to open file:   ";  // three blanks

const char kIniExtension[] = "ini";
const char kBackupExtension[] = "vxinibak";
// Database settings and the migration's own files are never merged.
const char kDatabaseFolder[] = "/vxm_vxx/datfiles/databases";
const char kMigrationFiles[] = "/vxmigrate";

// Tested on the path below the installation folder, so that an installation which itself lies
// below a folder named like these is still merged.
bool IsProtectedPath(const vxStringBase& folder, const vxStringBase& name) {
  vxStringBase relative;
  relative.append('/');
  if (!(folder.length() == 1 && folder.at(0) == vxFileManager::m_slash)) {
    relative.append(folder);
    relative.append('/');
  }
  relative.append(name);
  return relative.find(kDatabaseFolder, 0, true) != vxStringBase::BadIndex ||
         relative.find(kMigrationFiles, 0, true) != vxStringBase::BadIndex;
}

}  // namespace

// 0 merged; 1 when there was nothing to merge from, when the source was copied because the
// destination had no such file, or when either file could not be loaded or the result written.
int vxMigrationManager::MergeINIFiles(const char* sourceFile, const char* destinationFile) {
  const vxFilename source(sourceFile);
  const vxFilename destination(destinationFile);
  if (access(source.Pathname().c_str(), F_OK) != 0) return 1;

  // Anything at the destination, a dangling link included, is merged into, never replaced.
  if (!vxFileManager::Exists(destination.Pathname())) {
    const int copied = vxFileManager::CopyFile(source, destination, 0, 1, 0, 0, 0, nullptr, nullptr);
    Log(kIniCopied, source.Pathname().c_str());
    if (copied != 0) vxLogFailedCopy(*this, source.Pathname(), destination.Pathname());
    return 1;
  }

  vxMappedINIFile oldSettings(source.Pathname());
  vxMappedINIFile newSettings(destination.Pathname());
  if (oldSettings.Open(1) != 0) {
    Log(kUnableToOpen, source.Pathname().c_str());
    return 1;
  }
  if (newSettings.Open(1) != 0) {
    Log(kUnableToOpen, destination.Pathname().c_str());
    return 1;
  }
  newSettings.MergeFrom(oldSettings, RecordMerge(source.Pathname(), destination.Pathname()));
  if (newSettings.Close(1) != 0) {
    Log(kUnableToOpen, destination.Pathname().c_str());
    return 1;
  }
  Log(kIniMerged, source.Pathname().c_str());
  return 0;
}

int vxMigrationManager::MergeINIFilesRelative(const char* sourceRelative,
                                              const char* destinationRelative) {
  vxStringBase source;
  vxStringBase destination;
  vxFileManager::MakePath(source, m_sourceDirectory, vxStringBase(sourceRelative), 1);
  vxFileManager::MakePath(destination, m_destinationDirectory, vxStringBase(destinationRelative), 1);
  return MergeINIFiles(source.c_str(), destination.c_str());
}

int vxMigrationManager::MergeAllINIFiles(const vxStringBase& exclusions) {
  const bool inPlace = IsInPlaceMigrate();
  const vxStringBase extension(inPlace ? kBackupExtension : kIniExtension);
  vxStringBase pattern("*.");
  pattern.append(extension);
  // In place, a list name "x.ini" stands for the backup "x.vxinibak" that is read.
  const vxExclusionIndex excluded(*this, exclusions, extension, 1);

  vxStringBase folderPath;
  vxFileInfoList files;
  vxStringBase source;
  vxStringBase destination;
  for (const vxStringBase& folder : vxListSourceFolders(*this)) {
    if (!vxListSourceFiles(*this, folder, pattern.c_str(), folderPath, files)) continue;
    for (const vxFileInfo& file : files) {
      const vxStringBase sourceName = file.GetFilename().Filename();
      vxFileManager::MakePath(source, m_sourceDirectory, folder, sourceName);
      if (excluded.Contains(source) || IsProtectedPath(folder, sourceName)) continue;
      vxFilename name(file.GetFilename());
      if (inPlace) name.SetExtension(kIniExtension);  // the new file beside its backup
      vxFileManager::MakePath(destination, m_destinationDirectory, folder, name.Filename());
      MergeINIFiles(source.c_str(), destination.c_str());
    }
  }
  return 0;
}
