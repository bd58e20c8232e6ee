// Copies the user's own report languages ("<language>.rpl") into the new installation's language
// folder. The four languages the new installation ships with are never copied: its own files are
// the current ones. Always returns 0; nothing is done in an in-place migration.

#include "foundation/files/file_info.h"
#include "foundation/files/file_manager.h"
#include "foundation/files/filename.h"
#include "migrate/manager.h"

namespace {

bool IsShippedLanguage(const vxStringBase& language) {
  static const char* const kShipped[] = {"english", "spanish", "german", "french"};
  for (const char* shipped : kShipped) {
    if (language.equals(shipped, false)) return true;
  }
  return false;
}

}  // namespace

int vxMigrationManager::DoCopyLanguageFiles(const char* sourceFolder,
                                            const char* destinationFolder) {
  if (IsInPlaceMigrate()) return 0;
  const vxStringBase sourceRelative(sourceFolder);
  const vxStringBase destinationRelative(destinationFolder);
  vxStringBase folder;
  vxFileManager::MakePath(folder, m_sourceDirectory, sourceRelative, 0);

  vxFileInfoList files;
  vxFileManager::GetFileList(folder, "*.rpl", files, 0);
  for (const vxFileInfo& file : files) {
    vxStringBase name = file.GetFilename().Filename();
    if (IsShippedLanguage(vxFilename(name).BaseName())) continue;
    vxStringBase source;
    vxFileManager::MakePath(source, m_sourceDirectory, sourceRelative, name);
    vxStringBase destination;
    vxFileManager::MakePath(destination, m_destinationDirectory, destinationRelative, name);
    if (vxFileManager::CopyFile(source, destination, 0, 1, 0, 0, 0, nullptr, nullptr) == 0) {
      Log("Language file copied: ", source.c_str());
    }
  }
  return 0;
}
