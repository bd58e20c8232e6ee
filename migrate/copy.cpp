// Copies files and folders from the source installation into the destination. The whole-tree
// copies never replace an existing destination file; CopyFilesOfType replaces one when its option
// is set, CopyFiles and CopyFilesInRelativeFolder always (or, with their option, only an older
// one). In an in-place run (source folder equal to destination folder) every operation does
// nothing and returns 0. A file that cannot be copied costs one "Error: " line; the rest go on.

#include <sys/stat.h>
#include <unistd.h>

#include <string>

#include "foundation/files/file_manager.h"
#include "foundation/files/filename.h"
#include "foundation/string/tokenizer.h"
#include "migrate/exclusion_index.h"
#include "migrate/failed_copy.h"
#include "migrate/internal/source_tree.h"
#include "migrate/manager.h"

const char vxMsgUnableToCopyFile[] = "Error: Unable to copy file:  ";

namespace {

const char kFileCopied[] = "File copied: ";               // CopyFiles: one blank
const char kFileCopiedTree[] = "File copied:  ";          // CopyAllFilesOfType: two blanks
const char kFileExists[] = "File exists - no copy made:  ";
const char kFilesCopiedFromFolder[] = "Files copied from folder:  ";
const char kUnableToReadFolder[] = "Error: Unable to read folder:  ";

// A pattern copy reports only success or failure for the whole set. After a failure, name each
// matching file that did not arrive, so the customer learns which ones stayed behind.
void ReportFilesNotCopied(vxMigrationManager& manager, const vxStringBase& sourceFolder,
                          const vxStringBase& extension, const vxStringBase& destinationFolder) {
  vxStringBase pattern("*.");
  pattern.append(extension);
  vxFileInfoList files;
  vxFileManager::GetFileList(sourceFolder, pattern.c_str(), files, 0);
  vxStringBase destination;
  for (const vxFileInfo& file : files) {
    if (!file.IsRegular() && !file.IsSymlink()) continue;  // pipes and devices are not copied
    vxFileManager::MakePath(destination, destinationFolder, file.GetFilename().Filename(), 1);
    if (!vxFileManager::Exists(destination)) {
      vxLogFailedCopy(manager, file.GetFilename().Pathname(), destination);
    }
  }
}

// A newer-only copy keeps a destination that is not older than the source; that is no failure.
bool KeptAsNewer(const vxStringBase& source, const vxStringBase& destination) {
  struct stat from;
  struct stat to;
  if (lstat(source.c_str(), &from) != 0 || lstat(destination.c_str(), &to) != 0) return false;
  return from.st_mtim.tv_sec < to.st_mtim.tv_sec ||
         (from.st_mtim.tv_sec == to.st_mtim.tv_sec && from.st_mtim.tv_nsec <= to.st_mtim.tv_nsec);
}

}  // namespace

bool vxNextListItem(vxBStringTokenizer& tokens, vxStringBase& item) {
  while (tokens.GetNext(item)) {
    item.stripWhite(vxStringBase::kBoth);
    if (!item.isEmpty()) return true;
  }
  return false;
}

std::vector<vxStringBase> vxListSourceFolders(vxMigrationManager& manager) {
  std::vector<vxStringBase> folders;
  vxFileManager::GetFolderList(manager.GetSourceDirectory(), "", folders, 1, 0);
  folders.emplace_back(std::string(1, vxFileManager::m_slash));
  return folders;
}

bool vxListSourceFiles(vxMigrationManager& manager, const vxStringBase& folder, const char* pattern,
                       vxStringBase& folderPath, vxFileInfoList& files) {
  files.clear();
  vxFileManager::MakePath(folderPath, manager.GetSourceDirectory(), folder, 0);
  if (folderPath.isEmpty()) return false;
  if (access(folderPath.c_str(), R_OK | X_OK) != 0) {
    manager.Log(kUnableToReadFolder, folderPath.c_str());
    return false;
  }
  vxFileManager::GetFileList(folderPath, pattern, files, 0);
  return true;
}

int vxMigrationManager::CopyFilesOfType(const char* extension, unsigned int copyOption) {
  if (IsInPlaceMigrate()) return 0;
  vxStringBase source(m_sourceDirectory);
  source.append("/*.");
  source.append(extension);
  const int result = vxFileManager::CopyFile(vxFilename(source), vxFilename(m_destinationDirectory),
                                             1, copyOption, 0, 0, 0, nullptr, nullptr);
  if (result != 0) ReportFilesNotCopied(*this, m_sourceDirectory, extension, m_destinationDirectory);
  return result;
}

// copyOption is accepted for symmetry with CopyFilesOfType and ignored: these files always go
// through CopyAllFilesOfType, which never replaces a destination file.
int vxMigrationManager::CopyFilesOfTypes(const vxStringBase& extensions, unsigned int copyOption) {
  if (IsInPlaceMigrate()) return 0;
  vxBStringTokenizer tokens(extensions, ",", true);
  vxStringBase extension;
  while (vxNextListItem(tokens, extension)) CopyAllFilesOfType(extension, vxStringBase::NullStr);
  return 0;
}

// Each name may carry a subfolder ("reports/a.mss"). A name the source does not have is skipped
// silently: plug-ins list files that only some installations hold.
int vxMigrationManager::CopyFiles(const vxStringBase& fileNames, unsigned int copyOption) {
  if (IsInPlaceMigrate()) return 0;
  vxBStringTokenizer tokens(fileNames, vxBStringTokenizer::m_csvToken, true);
  vxStringBase name;
  vxStringBase source;
  vxStringBase destination;
  while (vxNextListItem(tokens, name)) {
    vxFileManager::MakePath(source, m_sourceDirectory, vxStringBase::NullStr, name);
    vxFileManager::MakePath(destination, m_destinationDirectory, vxStringBase::NullStr, name);
    if (vxFileManager::CopyFile(source, destination, 0, 1, copyOption, 0, 0, nullptr, nullptr) == 0) {
      Log(kFileCopied, source.c_str());
    } else if (!vxIsAbsent(source) &&
               !(copyOption != 0 && KeptAsNewer(source, destination))) {
      vxLogFailedCopy(*this, source, destination);
    }
  }
  return 0;
}

// The recursive copy the toolkit rests on: it never replaces a destination file, and says so.
int vxMigrationManager::CopyAllFilesOfType(const vxStringBase& extension,
                                           const vxStringBase& exclusions) {
  if (IsInPlaceMigrate()) return 0;
  vxStringBase pattern("*.");
  pattern.append(extension);
  const vxExclusionIndex excluded(*this, exclusions, vxStringBase::NullStr, 1);

  vxStringBase folderPath;
  vxFileInfoList files;
  vxStringBase source;
  vxStringBase destination;
  for (const vxStringBase& folder : vxListSourceFolders(*this)) {
    if (!vxListSourceFiles(*this, folder, pattern.c_str(), folderPath, files)) continue;
    for (const vxFileInfo& file : files) {
      const vxStringBase name = file.GetFilename().Filename();
      vxFileManager::MakePath(source, m_sourceDirectory, folder, name);
      vxFileManager::MakePath(destination, m_destinationDirectory, folder, name);
      if (excluded.Contains(source)) continue;
      // The copy never replaces anything at the destination, a dangling link included, so it is
      // asked first and the destination looked at only when it refused: one lookup less per file.
      if (vxFileManager::CopyFile(source, destination, 0, 0, 0, 0, 0, nullptr, nullptr) == 0) {
        Log(kFileCopiedTree, source.c_str());
      } else if (vxFileManager::Exists(destination)) {
        Log(kFileExists, source.c_str());
      } else {
        vxLogFailedCopy(*this, source, destination);
      }
    }
  }
  return 0;
}

// The folder line is logged whatever the copy's result: the customer sees every folder tried.
int vxMigrationManager::CopyFilesInRelativeFolder(const vxStringBase& relativeFolder,
                                                  const char* extension, unsigned int copyOption) {
  if (IsInPlaceMigrate()) return 0;
  vxStringBase source;
  vxFileManager::MakePath(source, m_sourceDirectory, relativeFolder, 0);
  if (access(source.c_str(), F_OK) != 0) return 1;
  const vxStringBase folder(source);
  source.append("*.");
  source.append(extension);
  vxStringBase destination;
  vxFileManager::MakePath(destination, m_destinationDirectory, relativeFolder, 0);
  const int result =
      vxFileManager::CopyFile(source, destination, 1, 1, copyOption, 0, 0, nullptr, nullptr);
  Log(kFilesCopiedFromFolder, source.c_str());
  if (result != 0) ReportFilesNotCopied(*this, folder, extension, destination);
  return result;
}
