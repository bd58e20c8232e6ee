// Carries the user's selection of log-analysis, proxy and streaming profiles (and of link
// profiles) into the new installation as marked copies: data folders follow, home-page settings are
// split into folder and page, stored credentials are turned into the protected form, and the
// profile kind's categories are merged. A profile that cannot be read as settings, or holds a
// credential that cannot be protected, is logged and left exactly as copied. Results are always 0.

#include <cstring>
#include <filesystem>
#include <string>
#include <unordered_set>
#include <vector>

#include "crypt/protected_value.h"
#include "foundation/files/file_info.h"
#include "foundation/files/file_manager.h"
#include "foundation/files/run_doors.h"
#include "foundation/inifile/ini_file.h"
#include "migrate/exclusion_index.h"
#include "migrate/failed_copy.h"
#include "migrate/internal/marked_name.h"
#include "migrate/internal/profile_migration.h"
#include "migrate/manager.h"

namespace {

const char kProfileSection[] = "Profile";
const int kFirewallProduct = 8;

// The command-file selection that holds the user's choice of profiles of one extension.
const char* SelectionOption(const vxStringBase& extension) {
  if (extension.equals("wlp", true)) return "PFLog";
  if (extension.equals("prx", true)) return "PFProxy";
  if (extension.equals("slp", true)) return "PFStream";
  return nullptr;
}

bool IsProtected(const vxStringBase& value) {
  std::vector<char> text(value.c_str(), value.c_str() + value.length() + 1);
  return VXUI_IsOurTwoFish(text.data()) == 1;
}

// A data folder this step made and could not fill because the disk failed (every later write of
// the run is refused then): taken away again, so that the next run, finding none, copies it
// whole rather than leaving it half filled as one that "exists". Only what the step just made.
void TakeBackHalfCopiedFolder(const vxStringBase& folder) {
  vxRunDoors* doors = vxRunDoors::Current();
  if (doors == nullptr || doors->StoppedBy() == 0) return;
  std::error_code ignored;
  std::filesystem::remove_all(folder.str(), ignored);
}

// Copies the data folders ("<profile>.dat") of the profiles that were not left behind, under their
// marked names; one that is already there is left alone.
void CopyDataFolders(vxMigrationManager& manager, const vxStringBase& folder,
                     const vxStringBase& extension, const vxStringBase& exclusions) {
  vxStringBase sourceFolder;
  vxFileManager::MakePath(sourceFolder, manager.GetSourceDirectory(), folder, 0);
  vxStringBase destinationFolder;
  vxFileManager::MakePath(destinationFolder, manager.GetDestinationDirectory(), folder, 0);
  const vxExclusionIndex excluded(manager, exclusions, extension, 0);

  std::vector<vxStringBase> dataFolders;
  vxFileManager::GetFolderList(sourceFolder, "", dataFolders, 0, 0);
  for (const vxStringBase& dataFolder : dataFolders) {
    unsigned int dat = dataFolder.find(".dat", 0, true);
    if (dat == vxStringBase::BadIndex) continue;
    vxStringBase stem(dataFolder);
    stem.del(dat, dat + 3);
    vxStringBase profile(stem);
    profile.append('.');
    profile.append(extension);
    if (excluded.Contains(profile)) continue;

    vxStringBase markedFolder = MarkedBaseName(stem);
    markedFolder.append(".dat");
    vxStringBase destination;
    vxFileManager::MakePath(destination, destinationFolder, markedFolder, 0);
    if (vxFileManager::Exists(destination)) {
      manager.Log("Folder exists - no copy made: ", destination.c_str());
      continue;
    }
    vxStringBase source;
    vxFileManager::MakePath(source, sourceFolder, dataFolder, 0);
    // Made even when the source folder is empty: the profile looks for it.
    const int copied = vxFileManager::CreateDirectory(destination, nullptr) != 0
                           ? 1
                           : vxFileManager::CopyFile(source, destination, 1, 1, 0, 0, 0, nullptr,
                                                     nullptr);
    if (vxCopied(manager, copied, source, destination)) {
      manager.Log("Folder copied:  ", destination.c_str());
    } else {
      TakeBackHalfCopiedFolder(destination);
    }
  }
}

// Protects the stored credentials. Returns the first key whose value could not be protected, or
// null when all of them are protected now.
const char* ProtectCredentials(vxMigrationManager& manager, vxMappedINIFile& profile) {
  static const char* const kCredentialKeys[] = {"LogFileUsername", "LogFilePassword",
                                                "HomePageUsername", "HomePagePassword"};
  for (const char* key : kCredentialKeys) {
    vxStringBase value = profile.GetVal(kProfileSection, key);
    if (value.isEmpty()) continue;
    vxStringBase converted(value);
    manager.DoConvertEncryptedValue(converted);
    if (!IsProtected(converted)) return key;
    if (converted != value) profile.SetVal(kProfileSection, key, converted);
  }
  return nullptr;
}

// The conversion of a log profile: home page split, credentials protected. False, with the reason
// in declined, when a credential cannot be protected: the profile is then kept as it was.
bool ConvertLogProfile(vxMigrationManager& manager, vxMappedINIFile& profile,
                       std::string& declined) {
  SplitHomePage(profile);
  if (const char* key = ProtectCredentials(manager, profile)) {
    declined = "Error: Value of ";
    declined.append(key).append(" cannot be protected - profile left as copied: ");
    return false;
  }
  return true;
}

// Rewrites one destination profile's settings; anything it cannot do leaves the file as it is.
void RewriteProfileSettings(vxMigrationManager& manager, const vxStringBase& path, bool flush) {
  vxMappedINIFile profile(path);
  if (profile.Open(1) != 0) {
    manager.Log("Error: Profile is not a valid settings file - left as copied: ", path.c_str());
    return;
  }
  std::string declined;
  if (!ConvertLogProfile(manager, profile, declined)) {
    manager.Log(declined.c_str(), path.c_str());
    return;
  }
  int written = flush ? profile.CloseFW(1) : profile.Close(1);
  if (written != 0) {
    manager.Log("Error: Profile could not be written - left as copied: ", path.c_str());
  }
}

// Every profile of the destination folder that matches pattern, the new installation's own
// included (the caller's pattern decides which ones), but the copies this run converted already.
void RewriteProfiles(vxMigrationManager& manager, const vxStringBase& folder, const char* pattern,
                     const std::vector<vxStringBase>& converted) {
  std::unordered_set<std::string> skip;
  for (const vxStringBase& path : converted) skip.insert(path.str());
  vxStringBase destinationFolder;
  vxFileManager::MakePath(destinationFolder, manager.GetDestinationDirectory(), folder, 0);
  const bool flush = manager.GetDestinationProductID() == kFirewallProduct;
  vxFileInfoList files;
  vxFileManager::GetFileList(destinationFolder, pattern, files, 0);
  for (const vxFileInfo& file : files) {
    vxStringBase path;
    vxFileManager::MakePath(path, destinationFolder, file.GetFilename().Filename(), 1);
    if (skip.count(path.str()) != 0) continue;
    RewriteProfileSettings(manager, path, flush);
  }
}

}  // namespace

int vxMigrationManager::DoCopyLogProfiles(const char* folder, const char* pattern,
                                          const char* extension, const char* fixedList) {
  if (IsInPlaceMigrate()) return 0;
  const vxStringBase relative(folder);
  const vxStringBase type(extension);
  const char* option = SelectionOption(type);
  vxStringBase selection;
  if (option != nullptr) selection = m_cmdLineParser->GetValue(option);
  const vxStringBase exclusions = MakeProfileExclusions(*this, selection, folder, extension, fixedList);

  // Each marked copy is converted on its way, written once; the destination's other profiles
  // that match are rewritten where they stand.
  const MarkedCopyConversion convert = [this](vxMappedINIFile& profile, std::string& declined) {
    return ConvertLogProfile(*this, profile, declined);
  };
  std::vector<vxStringBase> converted;
  CopyMarkedFiles(folder, pattern, extension, exclusions.c_str(), &convert, &converted);
  if (CopiesProfileDataFolders()) CopyDataFolders(*this, relative, type, exclusions);
  RewriteProfiles(*this, relative, pattern == nullptr ? "" : pattern, converted);
  if (BothKeepCategories(*this, true)) {
    MergeCategoriesINIFile(folder, pattern, extension, exclusions.c_str(), false);
  }
  return 0;
}

int vxMigrationManager::DoCopyLinkProfiles(const char* folder, const char* pattern,
                                           const char* extension, const char* fixedList) {
  // In place nothing is copied, so merging the categories would only enter marked copies that
  // were never made.
  if (IsInPlaceMigrate()) return 0;
  const vxStringBase selection = m_cmdLineParser->GetValue("PFLink");
  const vxStringBase exclusions = MakeProfileExclusions(*this, selection, folder, extension, fixedList);
  CopyRenamedUserFiles(folder, pattern, extension, exclusions.c_str());
  if (BothKeepCategories(*this, false)) {
    MergeCategoriesINIFile(folder, pattern, extension, exclusions.c_str(), false);
  }
  return 0;
}
