// Copies the analysis profiles of one OBX reporting-server installation into another, each under a
// new name ending in "_vxmigrate" so that it never meets the destination's own profiles, with its
// report and database folders when the run carries profile data. A copy present already is never
// redone, and the edition's sample profiles stay behind.

#include <unistd.h>

#include "foundation/files/file_info.h"
#include "foundation/files/file_manager.h"
#include "foundation/files/run_doors.h"
#include "foundation/inifile/ini_file.h"
#include "migrate/converted_copy.h"
#include "migrate/exclusion_index.h"
#include "migrate/failed_copy.h"
#include "migrate/manager.h"
#include "migrate/sample_lists.h"

namespace {

const char kProfiles[] = "\\vxm_vxx\\datfiles\\profiles";
const char kReports[] = "\\vxm_vxx\\datfiles\\reports";
const char kDatabases[] = "\\vxm_vxx\\datfiles\\databases";
const char kServerSettings[] = "/vxm_vxx/vxm_vxx.ini";

// The source's profile folder must lie inside its installation: a short name, or one starting
// "./" or with a backslash third (".x\profiles"). Anything else is taken for an absolute folder
// whose profiles belong to no installation being migrated.
bool IsInstallationProfileFolder(const vxStringBase& folder) {
  if (folder.length() <= 2) return true;
  return folder.at(0) == '.' && (folder.at(1) == '/' || folder.at(2) == '\\');
}

// Copies the folder from into the folder to. A profile without such a folder has nothing to carry
// and counts as copied, as it always has; a copy that failed is logged as the error.
bool CopiedOrAbsent(vxMigrationManager& manager, const vxStringBase& from,
                    const vxStringBase& to) {
  const int copied = vxFileManager::CopyFile(from, to, 1, 1, 0, 0, 0, nullptr, nullptr);
  return vxCopied(manager, copied, from, to) || vxIsAbsent(from);
}

// The folders that carry one profile's data, copied beside its copy.
void CopyProfileData(vxMigrationManager& manager, const vxFilename& profile,
                             const vxStringBase& newBase, const vxStringBase& newName) {
  vxStringBase reportsFrom, reportsTo;
  vxFileManager::MakePath(reportsFrom, manager.GetSourceDirectory(), kReports, profile.Filename());
  vxFileManager::MakePath(reportsTo, manager.GetDestinationDirectory(), kReports, newName);
  if (CopiedOrAbsent(manager, reportsFrom, reportsTo)) {
    manager.Log("Report folder copied: ", reportsTo.c_str());
  }

  vxStringBase databaseFrom, databaseTo;
  vxFileManager::MakePath(databaseFrom, manager.GetSourceDirectory(), kDatabases,
                          profile.BaseName());
  vxFileManager::MakePath(databaseTo, manager.GetDestinationDirectory(), kDatabases, newBase);
  if (CopiedOrAbsent(manager, databaseFrom, databaseTo)) {
    manager.Log("Database folder copied: ", databaseTo.c_str());
  }
}

// A profile without its report folders creates its reports on demand unless it says otherwise;
// one whose folders travel with it keeps its setting, as the folders carry the reports.
bool DefaultToReportsOnDemand(vxMappedINIFile& profile, bool withData) {
  if (!withData && profile.GetVal("profile", "ondemandreports").isEmpty()) {
    profile.SetVal("profile", "ondemandreports", "0");
  }
  return true;
}

}  // namespace

int vxMigrationManager::DoCopyOBXProfiles() {
  if (IsInPlaceMigrate()) return 0;

  vxMappedINIFile destinationSettings(GetFullDestinationFilename(kServerSettings));
  if (destinationSettings.Open(1) != 0) return 1;
  vxStringBase destinationProfiles;
  vxFileManager::MakePath(destinationProfiles, m_destinationDirectory, kProfiles, 0);
  vxMappedINIFile sourceSettings(GetFullSourceFilename(kServerSettings));
  if (sourceSettings.Open(1) != 0) return 1;

  const vxStringBase profilesDir = sourceSettings.GetVal("defaults", "profilesdir");
  if (!IsInstallationProfileFolder(profilesDir)) return 0;
  vxStringBase sourceProfiles;
  if (!vxRunDoors::JoinBeneath(sourceProfiles, m_sourceDirectory,
                               profilesDir.isEmpty() ? vxStringBase(kProfiles) : profilesDir, 0)) {
    return 1;
  }

  vxFileInfoList profiles;
  vxFileManager::GetFileList(sourceProfiles, "*.wlp", profiles, 0);
  // The list is the same for every profile of the folder: built once.
  vxStringBase exclusions;
  MakeFullExclusionList(exclusions, m_cmdLineParser->GetValue("PFLog"), kProfiles, "wlp",
                        GetSampleFileList("obx", "wlp"));
  const vxExclusionIndex excluded(*this, exclusions, vxStringBase::NullStr, 0);
  const bool copyData = CopiesProfileDataFolders();

  for (const vxFileInfo& entry : profiles) {
    const vxFilename& file = entry.GetFilename();
    const vxStringBase name = file.Filename();
    if (excluded.Contains(name)) continue;

    vxStringBase newBase(file.BaseName());
    newBase.append("_vxmigrate");
    vxStringBase newName(newBase);
    const vxStringBase extension = file.Extension();
    if (!extension.isEmpty()) {
      newName.append('.');
      newName.append(extension);
    }
    vxStringBase target;
    vxFileManager::MakePath(target, destinationProfiles, vxStringBase::NullStr, newName);
    if (access(target.c_str(), F_OK) == 0) continue;

    vxStringBase from;
    vxFileManager::MakePath(from, sourceProfiles, vxStringBase::NullStr, name);
    // Converted on its way and written once: a kill never leaves a copy without its default.
    const vxConvertedCopy outcome = WriteConvertedCopy(from, target, [copyData](vxMappedINIFile& p) {
      return DefaultToReportsOnDemand(p, copyData);
    });
    if (outcome == vxConvertedCopy::kExists) continue;
    if (outcome == vxConvertedCopy::kFailed) {
      vxLogFailedCopy(*this, from, target);
      continue;
    }
    Log("Profile copied: ", target.c_str());
    if (copyData) CopyProfileData(*this, file, newBase, newName);
  }
  return 0;
}
