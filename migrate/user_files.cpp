// Copies user files of one folder into the destination as marked copies ("report_vxmigrate.wlp"),
// and scheduled events with them, each event pointed at the marked copy of the file it works on or
// dropped when that file did not come along. A marked copy already in the destination is never
// replaced. Results are always 0; nothing is done in an in-place migration.

#include "foundation/files/file_info.h"
#include "foundation/files/file_manager.h"
#include "foundation/inifile/ini_file.h"
#include "migrate/converted_copy.h"
#include "migrate/exclusion_index.h"
#include "migrate/failed_copy.h"
#include "migrate/internal/marked_name.h"
#include "migrate/manager.h"

namespace {

const char kEventSection[] = "Main";
const char kSetNameKey[] = "SetName";
const char kSetExtensionKey[] = "SetExtension";

// What becomes of one scheduled event.
enum class EventOutcome { kKept, kDropped };

// Points the event's "SetName" at the marked copy of its set when the name falls under prefix;
// drops the event when that marked copy is not in the destination folder. Changes the event in
// memory only.
EventOutcome RedirectEvent(vxMappedINIFile& event, const vxStringBase& prefix,
                           const vxStringBase& destinationFolder) {
  vxStringBase setName = event.GetVal(kEventSection, kSetNameKey);
  if (setName.isEmpty() || !setName.beginsWith(prefix.view(), true)) {
    return EventOutcome::kKept;  // nothing changed: the copy stays byte for byte
  }
  vxStringBase markedName = MarkedBaseName(setName);
  vxStringBase setFile(markedName);
  setFile.append('.');
  setFile.append(event.GetVal(kEventSection, kSetExtensionKey));
  vxStringBase setPath;
  vxFileManager::MakePath(setPath, destinationFolder, setFile, 1);
  if (!vxFileManager::Exists(setPath)) return EventOutcome::kDropped;
  event.SetVal(kEventSection, kSetNameKey, markedName);
  return EventOutcome::kKept;
}

}  // namespace

int vxMigrationManager::CopyRenamedUserFiles(const char* folder, const char* pattern,
                                             const char* extension, const char* exclusions) {
  CopyMarkedFiles(folder, pattern, extension, exclusions, nullptr, nullptr);
  return 0;
}

void vxMigrationManager::CopyMarkedFiles(
    const char* folder, const char* pattern, const char* extension, const char* exclusions,
    const MarkedCopyConversion* convert, std::vector<vxStringBase>* made) {
  if (IsInPlaceMigrate()) return;
  const vxStringBase relative(folder);
  vxStringBase sourceFolder;
  vxFileManager::MakePath(sourceFolder, m_sourceDirectory, relative, 0);

  const vxExclusionIndex excluded(*this, vxStringBase(exclusions), vxStringBase::NullStr, 0);
  vxFileInfoList files;
  vxFileManager::GetFileList(sourceFolder, pattern == nullptr ? "" : pattern, files, 0);
  for (const vxFileInfo& file : files) {
    vxStringBase name = file.GetFilename().Filename();
    if (excluded.Contains(name)) continue;
    vxStringBase destination;
    vxFileManager::MakePath(destination, m_destinationDirectory, relative,
                            MarkedFileName(name, vxStringBase(extension)));
    vxStringBase source;
    vxFileManager::MakePath(source, m_sourceDirectory, relative, name);
    if (vxFileManager::Exists(destination)) {
      Log("File exists - no copy made: ", destination.c_str());
      continue;
    }
    if (convert == nullptr) {
      const int copied =
          vxFileManager::CopyFile(source, destination, 0, 1, 0, 0, 0, nullptr, nullptr);
      if (copied != 0) {
        vxLogFailedCopy(*this, source, destination);
        continue;
      }
      Log("File copied:  ", destination.c_str());
      if (made != nullptr) made->push_back(destination);
      continue;
    }
    std::string declined;
    const vxConvertedCopy outcome = WriteConvertedCopy(
        source, destination, [&](vxMappedINIFile& content) { return (*convert)(content, declined); });
    switch (outcome) {
      case vxConvertedCopy::kExists:
        Log("File exists - no copy made: ", destination.c_str());
        break;
      case vxConvertedCopy::kFailed:
        vxLogFailedCopy(*this, source, destination);
        break;
      case vxConvertedCopy::kNotSettings:
        Log("File copied:  ", destination.c_str());
        Log("Error: Profile is not a valid settings file - left as copied: ", destination.c_str());
        if (made != nullptr) made->push_back(destination);
        break;
      case vxConvertedCopy::kConverted:
      case vxConvertedCopy::kDeclined:
        Log("File copied:  ", destination.c_str());
        if (!declined.empty()) Log(declined.c_str(), destination.c_str());
        if (made != nullptr) made->push_back(destination);
        break;
    }
  }
}

int vxMigrationManager::CopyScheduledEventFiles(const char* folder, const char* pattern,
                                                const char* extension, const char* namePattern) {
  if (IsInPlaceMigrate()) return 0;
  vxStringBase prefix(namePattern);
  prefix.cut(1);  // the trailing wildcard
  const vxStringBase relative(folder);
  vxStringBase sourceFolder;
  vxFileManager::MakePath(sourceFolder, m_sourceDirectory, relative, 0);
  vxStringBase destinationFolder;
  vxFileManager::MakePath(destinationFolder, m_destinationDirectory, relative, 0);

  vxFileInfoList files;
  vxFileManager::GetFileList(sourceFolder, pattern == nullptr ? "" : pattern, files, 0);
  for (const vxFileInfo& file : files) {
    vxStringBase name = file.GetFilename().Filename();
    vxStringBase source;
    vxFileManager::MakePath(source, m_sourceDirectory, relative, name);
    vxStringBase copy;
    vxFileManager::MakePath(copy, m_destinationDirectory, relative,
                            MarkedFileName(name, vxStringBase(extension)));
    if (vxFileManager::Exists(copy)) {
      // An earlier run's event, possibly edited since: it stays as it is.
      Log("File exists - no copy made:  ", copy.c_str());
      continue;
    }
    // Decided and pointed at its set in memory, then written once: a dropped event is never
    // written, and a kill never leaves one pointing at the old set.
    vxMappedINIFile event(source);
    if (event.Open(0) != 0) {
      if (vxFileManager::CopyFile(source, copy, 0, 0, 0, 0, 0, nullptr, nullptr) != 0) {
        Log("Error: Schedule Event could not be copied: ", source.c_str());
      } else {
        Log("Error: Schedule Event could not be rewritten - left as copied: ", copy.c_str());
      }
      continue;
    }
    if (RedirectEvent(event, prefix, destinationFolder) == EventOutcome::kDropped) continue;
    const int written = event.CreateAs(copy);
    if (written == 2) {
      Log("File exists - no copy made:  ", copy.c_str());
    } else if (written != 0) {
      Log("Error: Schedule Event could not be copied: ", source.c_str());
    } else {
      Log("Schedule Event copied:  ", copy.c_str());
    }
  }
  return 0;
}
