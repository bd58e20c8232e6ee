// Profile conversion: each selected Halden log-analysis profile is copied into the OBX profile folder
// as "<name>_vxmigrate.wlp" and rewritten there into the OBX edition's form. The Halden profile is
// only read, a copy present already is never replaced, and a profile that cannot be copied or read
// is reported by name while the others go on.

#include <unistd.h>

#include <algorithm>
#include <cstdint>
#include <string>
#include <string_view>

#include "crypt/value_conversion.h"
#include "edition/edition_util.h"
#include "edition/halden_to_obx.h"
#include "foundation/files/file_info.h"
#include "foundation/files/file_manager.h"
#include "foundation/files/resolved_path.h"
#include "foundation/files/run_doors.h"
#include "foundation/string/tokenizer.h"
#include "migrate/converted_copy.h"
#include "migrate/exclusion_index.h"
#include "migrate/failed_copy.h"
#include "migrate/manager.h"
#include "migrate/profile_rules.h"
#include "migrate/sample_lists.h"

namespace {

const char kProfileFolder[] = "\\vxm_log\\datfiles";
const char kServerSettings[] = "\\vxm_vxx\\vxm_vxx.ini";
const int kMaxNumbered = 99;  // servers, filters and advanced-option profiles per profile

// A profile key whose value "*" stands for every profile of one advanced option; the OBX edition
// wants the profile ids themselves.
struct AllProfilesKey {
  const char* key;
  const char* file;
  const char* prefix;
};

const AllProfilesKey kAllProfilesKeys[] = {
    {"includecontentgroups", "\\vxm_vxx\\datfiles\\contentgroups\\default.ini",
     "contentgroupprofile"},
    {"includequerystring", "\\vxm_vxx\\datfiles\\dynamicpages\\default.ini", "queryprofile"},
    {"includeurlreplacements", "\\vxm_vxx\\datfiles\\urlreplacement\\default.ini",
     "urlreplacementprofile"},
    {"includepathsanalysisprofiles", "\\vxm_vxx\\datfiles\\pathsanalysis\\default.ini",
     "pathsanalysisprofile"},
};
const int kAllProfilesKeyCount = sizeof(kAllProfilesKeys) / sizeof(kAllProfilesKeys[0]);

// The id lists of the destination's advanced options, read once per run: every profile that says
// "*" gets the same list, and the files do not change while profiles are converted.
class AdvancedOptionIds {
 public:
  explicit AdvancedOptionIds(vxMigrationManager* manager) : manager_(manager) {}
  AdvancedOptionIds(const AdvancedOptionIds&) = delete;
  AdvancedOptionIds& operator=(const AdvancedOptionIds&) = delete;

  // The ids of option row, each followed by one blank; false when its file cannot be opened.
  bool Get(int row, vxStringBase& ids) {
    if (!read_[row]) {
      read_[row] = true;
      opened_[row] = Read(kAllProfilesKeys[row], ids_[row]);
    }
    ids = ids_[row];
    return opened_[row];
  }

 private:
  bool Read(const AllProfilesKey& option, vxStringBase& ids) {
    vxMappedINIFile file(manager_->GetFullDestinationFilename(option.file));
    if (file.Open(1) != 0) return false;
    for (int n = 0; n <= kMaxNumbered; ++n) {
      const vxStringBase& id =
          file.GetVal(vxStringBase(NumberedName(option.prefix, n)), "profileid");
      if (id.isEmpty()) break;
      ids.append(id);
      ids.append(' ');
    }
    return true;
  }

  vxMigrationManager* manager_;
  bool read_[kAllProfilesKeyCount] = {};
  bool opened_[kAllProfilesKeyCount] = {};
  vxStringBase ids_[kAllProfilesKeyCount];
};

// True when text starts with a drive letter and ':' ("C:/logs", "d:\\logs").
bool StartsWithDrive(std::string_view text) {
  return text.size() >= 2 && text[1] == ':' &&
         ((text[0] >= 'A' && text[0] <= 'Z') || (text[0] >= 'a' && text[0] <= 'z'));
}

// The OBX edition reads plain paths: the scheme and the URL's first eight characters go.
// "file:///C:/logs/a.log" -> "C:/logs/a.log" (a drive path), but "file:///var/log/a.log" ->
// "/var/log/a.log": there the eighth character is the path's own leading slash, which stays so
// that the path remains absolute.
void StripFileScheme(vxStringBase& path) {
  if (path.length() <= 8 || !path.beginsWith("file:")) return;
  const bool keepSlash =
      path.beginsWith("file:///") && !StartsWithDrive(path.view().substr(8));
  path = path.subString(keepSlash ? 7 : 8, vxStringBase::BadIndex);
}

// Sections written "[[Filter1]]" in the Halden edition are "[Filter1]" in the OBX edition.
void UnwrapFilterSections(vxMappedINIFile& profile) {
  for (const vxStringBase& name : profile.GetSectionNames()) {
    if (name.length() > 3 && name.at(0) == '[' && (name.at(1) == 'F' || name.at(1) == 'f')) {
      profile.RenameSection(name, name.subString(1, name.length() - 2));
    }
  }
}

// A stored credential put into the form the OBX edition reads: protected, or in clear when clear
// is set (any old form is read; a legacy value goes straight to clear text, never through the
// cipher). An empty value stays empty.
void ConvertCredential(vxMigrationManager* manager, vxStringBase& value, bool clear) {
  if (value.isEmpty()) return;
  if (!clear) {
    manager->DoConvertEncryptedValue(value);
  } else if (ConvertToClearText(value) != 0) {
    // As the protecting step says of a value too long for its buffers.
    const std::string length = std::to_string(value.length());
    manager->Log("Error: Value too long to protect - left unchanged, characters: ",
                 length.c_str());
  }
}

// The same for a key of section "Profile", changed in place.
void ConvertProfileCredential(vxMigrationManager* manager, vxMappedINIFile& profile,
                              const char* key, bool clear) {
  vxStringBase value = profile.GetVal("Profile", key);
  if (value.isEmpty()) return;
  ConvertCredential(manager, value, clear);
  profile.SetVal("Profile", key, value);
}

void ConvertSingleServer(vxMigrationManager* manager, vxMappedINIFile& profile) {
  vxStringBase path = profile.GetVal("Profile", "LogFilePath");
  if (path.length() > 8 && path.beginsWith("file:")) {
    StripFileScheme(path);
    profile.SetVal("Profile", "LogFilePath", path);
  }
  ConvertProfileCredential(manager, profile, "LogFileUserName", true);
  ConvertProfileCredential(manager, profile, "LogFilePassword", false);
}

// A cluster's servers move from numbered keys of "Profile" ("ServerName", "ServerName2", ...) into
// sections "server1", "server2", ...; a log path of several files joined by "|" becomes numbered
// "logfilepath" keys, an empty piece keeping its number.
void ConvertCluster(vxMigrationManager* manager, vxMappedINIFile& profile) {
  for (int n = 1; n <= kMaxNumbered; ++n) {
    const std::string suffix = n == 1 ? std::string() : std::to_string(n);
    const vxStringBase nameKey(("ServerName" + suffix).c_str());
    const vxStringBase pathKey(("LogFilePath" + suffix).c_str());
    const vxStringBase userKey(("LogFileUserName" + suffix).c_str());
    const vxStringBase passwordKey(("LogFilePassword" + suffix).c_str());
    const vxStringBase name = profile.GetVal("Profile", nameKey);
    if (name.isEmpty()) break;
    const vxStringBase path = profile.GetVal("Profile", pathKey);
    vxStringBase user = profile.GetVal("Profile", userKey);
    vxStringBase password = profile.GetVal("Profile", passwordKey);
    const bool ftp = path.length() > 6 && path.beginsWith("ftp:");
    if (ftp) {
      ConvertCredential(manager, user, true);
      ConvertCredential(manager, password, false);
    }

    const vxStringBase section(NumberedName("server", n));
    profile.SetVal(section, "servername", name);
    if (ftp) {
      profile.SetVal(section, "logfileusername", user);
      profile.SetVal(section, "logfilepassword", password);
    }
    vxBStringTokenizer pieces(path, "|", true);
    vxStringBase piece;
    for (int k = 1; pieces.GetNext(piece); ++k) {
      if (piece.isEmpty()) continue;
      // Every file of the list loses its scheme, not only the first.
      if (!ftp) StripFileScheme(piece);
      profile.SetVal(section, vxStringBase(NumberedName("logfilepath", k)), piece);
    }
    profile.RemoveKey("Profile", nameKey);
    profile.RemoveKey("Profile", pathKey);
    profile.RemoveKey("Profile", userKey);
    profile.RemoveKey("Profile", passwordKey);
  }
}

void ReportDayTimeFilters(vxMigrationManager* manager, vxMappedINIFile& profile) {
  for (int n = 1; n <= kMaxNumbered; ++n) {
    const INILineList* filter = profile.GetPropertyList(vxStringBase(NumberedName("Filter", n)));
    if (filter == nullptr) break;
    if (!profile.GetVal(filter, "DayTimeEnabled").equals("0", false)) {
      manager->Log("** OBX does not support new day/time filters - MUST manually change: ",
                   profile.GetVal(filter, "Name").c_str());
    }
  }
}

// Early OBX versions (up to 3.1 and its 'a' releases) read the home page user name in clear.
bool ReadsPlainHomePageUser(vxMigrationManager* manager) {
  const vxVersionDescriptor* version = manager->GetDestinationVersionDescriptor();
  if (version == nullptr) return false;
  return version->m_major <= 3 && version->m_minor <= 1 &&
         static_cast<char>(version->m_third) <= 'a';
}

void ConvertHomePageCredentials(vxMigrationManager* manager, vxMappedINIFile& profile) {
  ConvertProfileCredential(manager, profile, "HomePageUsername", ReadsPlainHomePageUser(manager));
  ConvertProfileCredential(manager, profile, "HomePagePassword", false);
}

// Tradequill profiles that read a data warehouse name it as "warehouse:<data source>"; the OBX
// edition keeps the warehouse in a section of its own.
void ConvertWarehouse(vxMigrationManager* manager, vxMappedINIFile& profile) {
  if (manager->GetSourceProductID() != 4) return;
  const vxStringBase path = profile.GetVal("Profile", "LogFilePath");
  if (!path.beginsWith("warehouse:")) return;
  const vxStringBase dataSource = path.subString(path.find(':') + 1, vxStringBase::BadIndex);
  vxStringBase user = profile.GetVal("Profile", "LogFileUsername");
  // The server's "LogFileUserName" and the warehouse's "LogFileUsername" are two keys. Where both
  // stand, the server conversion took its own, and the warehouse user is read into clear here, as
  // the server conversion reads it where the profile holds the warehouse key alone.
  const INILineList* lines = profile.GetPropertyList(vxStringBase("Profile"));
  const bool bothKeys =
      lines != nullptr && std::any_of(lines->begin(), lines->end(), [](const INILine* line) {
        return line != nullptr && line->m_key.equals("LogFileUserName", true);
      });
  if (bothKeys) ConvertCredential(manager, user, true);
  const vxStringBase password = profile.GetVal("Profile", "LogFilePassword");
  profile.SetVal("wdwexport", "warehousedsn", dataSource);
  profile.SetVal("wdwexport", "warehouseusername", user);
  profile.SetVal("wdwexport", "warehousepassword", password);
  profile.SetVal("profile", "iswarehouse", "1");
}

void ExpandAllProfilesKeys(vxMigrationManager* manager, vxMappedINIFile& profile,
                           const vxStringBase& target, AdvancedOptionIds& ids) {
  for (int row = 0; row < kAllProfilesKeyCount; ++row) {
    const vxStringBase key(kAllProfilesKeys[row].key);
    if (!profile.GetVal("Profile", key).equals("*", false)) continue;
    vxStringBase list;
    if (!ids.Get(row, list)) {
      // Without the option's file there is no profile to name; an empty list selects none, which
      // the OBX edition reads, unlike "*".
      vxStringBase text("Error: Advanced option file unavailable - ");
      text.append(key);
      text.append(" emptied: ");
      manager->Log(text.c_str(), target.c_str());
    }
    profile.SetVal("Profile", key, list);
  }
}

void ConvertProfile(vxMigrationManager* manager, vxMappedINIFile& profile,
                    const vxStringBase& target, AdvancedOptionIds& ids) {
  UnwrapFilterSections(profile);
  const vxStringBase& cluster = profile.GetVal("Profile", "IsServerCluster");
  if (cluster.isEmpty() || cluster.equals("0")) {
    ConvertSingleServer(manager, profile);
  } else {
    ConvertCluster(manager, profile);
  }
  ReportDayTimeFilters(manager, profile);
  SplitHomePage(profile);
  ConvertHomePageCredentials(manager, profile);
  ConvertWarehouse(manager, profile);
  const vxStringBase queries = profile.GetVal("Profile", "IncludeQueries");
  if (!queries.isEmpty()) profile.SetVal("Profile", "IncludeQueryStrings", queries);
  ExpandAllProfilesKeys(manager, profile, target, ids);
}

// Converts one Halden profile into its marked name in the OBX profile folder, written once.
void MigrateProfile(vxMigrationManager* manager, const vxFilename& file,
                    const vxStringBase& destinationProfiles, AdvancedOptionIds& ids) {
  vxStringBase name(file.BaseName());
  name.append("_vxmigrate.");
  name.append("wlp");
  vxStringBase target;
  vxFileManager::MakePath(target, destinationProfiles, name, 1);
  if (access(target.c_str(), F_OK) == 0) {
    manager->Log("File exists - no copy made:  ", target.c_str());
    return;
  }
  const vxStringBase& source = file.Pathname();
  const vxConvertedCopy outcome = WriteConvertedCopy(source, target, [&](vxMappedINIFile& profile) {
    ConvertProfile(manager, profile, target, ids);
    return true;
  });
  switch (outcome) {
    case vxConvertedCopy::kConverted:
    case vxConvertedCopy::kDeclined:
      break;
    case vxConvertedCopy::kNotSettings:
      // Carried as it is: the user's own file, which the OBX edition may still read.
      manager->Log("Error: Unable to open file:   ", target.c_str());
      return;
    case vxConvertedCopy::kExists:
      manager->Log("File exists - no copy made:  ", target.c_str());
      return;
    case vxConvertedCopy::kFailed: {
      // The source is named only when it is the side that could not be read.
      const vxFailedCopy blame = vxBlameFailedCopy(source, target);
      manager->Log(blame.path == &target ? blame.text : "Error: Unable to open file:   ",
                   blame.path->c_str());
      return;
    }
  }
  vxStringBase copied("Profile file copied: ");
  copied.append(source);
  copied.append(" to ");
  copied.append(target);
  manager->Log(copied.c_str());
}

}  // namespace

int HaldenToOBXHelper::DoHaldenToOBXProfileFileMigrate() {
  vxStringBase profilesDir;
  {
    vxMappedINIFile settings(manager_->GetFullDestinationFilename(kServerSettings));
    if (settings.Open(1) != 0) return 1;
    profilesDir = settings.GetVal("defaults", "profilesdir");
  }
  if (profilesDir.isEmpty()) return 0;

  vxStringBase destinationProfiles;
  if (!vxRunDoors::JoinBeneath(destinationProfiles, destinationFolder_, profilesDir, 0)) return 1;
  vxStringBase sourceProfiles;
  vxFileManager::MakePath(sourceProfiles, sourceFolder_, kProfileFolder, 0);
  vxFileInfoList profiles;
  vxFileManager::GetFileList(sourceProfiles, "*.wlp", profiles, 1);

  // Also reports each selected name that matches no profile.
  const vxStringBase exclusions =
      MakeProfileExclusions(*manager_, manager_->GetCmdLineParser()->GetValue("PFLog"),
                            kProfileFolder, "wlp", GetSampleFileList("halsuite", "wlp"));
  const vxExclusionIndex excluded(*manager_, exclusions, vxStringBase::NullStr, 0);
  AdvancedOptionIds ids(manager_);

  for (const vxFileInfo& entry : profiles) {
    if (!excluded.Contains(entry.GetFilename().Filename())) {
      MigrateProfile(manager_, entry.GetFilename(), destinationProfiles, ids);
    }
  }
  return 0;
}
