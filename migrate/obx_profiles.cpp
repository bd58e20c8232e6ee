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

// One of a profile's data folders, copied into the destination before the profile itself: the
// profile's copy marks the profile as done (a re-run skips it), so it must come last.
struct DataFolderCopy {
  vxStringBase from, to;
  int result = 1;
};

DataFolderCopy CopyDataFolder(const vxStringBase& from, const vxStringBase& to) {
  return DataFolderCopy{from, to, vxFileManager::CopyFile(from, to, 1, 1, 0, 0, 0, nullptr, nullptr)};
}

// Logs a data folder's copy after its profile's. A profile without such a folder has nothing to
// carry and counts as copied, as it always has; a copy that failed is logged as the error.
void LogDataFolder(vxMigrationManager& manager, const DataFolderCopy& copy, const char* done) {
  if (vxCopied(manager, copy.result, copy.from, copy.to) || vxIsAbsent(copy.from)) {
    manager.Log(done, copy.to.c_str());
  }
}

// The folders that carry one profile's data: reports, then databases.
struct ProfileData {
  DataFolderCopy reports, databases;
};

ProfileData CopyProfileData(vxMigrationManager& manager, const vxFilename& profile,
                            const vxStringBase& newBase, const vxStringBase& newName) {
  vxStringBase reportsFrom, reportsTo, databaseFrom, databaseTo;
  vxFileManager::MakePath(reportsFrom, manager.GetSourceDirectory(), kReports, profile.Filename());
  vxFileManager::MakePath(reportsTo, manager.GetDestinationDirectory(), kReports, newName);
  vxFileManager::MakePath(databaseFrom, manager.GetSourceDirectory(), kDatabases,
                          profile.BaseName());
  vxFileManager::MakePath(databaseTo, manager.GetDestinationDirectory(), kDatabases, newBase);
  return ProfileData{CopyDataFolder(reportsFrom, reportsTo),
                     CopyDataFolder(databaseFrom, databaseTo)};
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
    // Only a profile that can be carried brings its folders along.
    ProfileData data;
    if (copyData && vxCanRead(from)) data = CopyProfileData(*this, file, newBase, newName);
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
    if (copyData) {
      LogDataFolder(*this, data.reports, "Report folder copied: ");
      LogDataFolder(*this, data.databases, "Database folder copied: ");
    }
  }
  return 0;
}
