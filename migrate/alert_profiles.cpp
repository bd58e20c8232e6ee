// Carries alert profiles into the new installation as marked copies whose pager and e-mail
// recipient lists point at the marked copies of their list files, then merges the alert
// categories. Every alert profile but the product's samples is copied, selected or not; the
// selection only decides the categories entries. A marked copy already there is left alone.
// Always returns 0; nothing is done in an in-place migration.

#include <string>

#include "foundation/files/file_info.h"
#include "foundation/files/file_manager.h"
#include "foundation/inifile/ini_file.h"
#include "migrate/converted_copy.h"
#include "migrate/exclusion_index.h"
#include "migrate/internal/marked_name.h"
#include "migrate/internal/profile_migration.h"
#include "migrate/manager.h"

namespace {

const int kMaxListEntries = 100;  // "l0" .. "l99"

// A list file the alert system wrote ("lert..." after the last backslash) is referred to by its
// marked copy's bare name; any other value stays.
bool RedirectListFile(vxStringBase& value) {
  unsigned int backslash = value.rfind('\\');
  vxStringBase name = backslash == vxStringBase::BadIndex
                          ? value
                          : value.subString(backslash + 1, value.length());
  if (name.length() <= 3 || !name.beginsWith("lert", true)) return false;
  unsigned int dot = name.rfind('.');
  vxStringBase base = dot == vxStringBase::BadIndex ? name : name.subString(0, dot - 1);
  vxStringBase extension;
  if (dot != vxStringBase::BadIndex) extension = name.subString(dot + 1, name.length());
  vxStringBase redirected = MarkedBaseName(base);
  redirected.append('.');
  redirected.append(extension);
  if (redirected == value) return false;
  value = redirected;
  return true;
}

// Rewrites "l0", "l1", ... of one recipient list up to the first absent key.
void RedirectRecipientList(vxMappedINIFile& profile, const char* section) {
  for (int n = 0; n < kMaxListEntries; ++n) {
    std::string key = "l" + std::to_string(n);
    vxStringBase value;
    if (profile.GetVal(section, key.c_str(), value) != 0) break;
    if (!value.isEmpty() && RedirectListFile(value)) profile.SetVal(section, key.c_str(), value);
  }
}

bool RedirectRecipientLists(vxMappedINIFile& profile) {
  RedirectRecipientList(profile, "Alert_Pager_List");
  RedirectRecipientList(profile, "Alert_Email_List");
  return true;
}

}  // namespace

int vxMigrationManager::DoCopyAlertProfiles(const char* folder, const char* pattern,
                                            const char* extension, const char* fixedList) {
  if (IsInPlaceMigrate()) return 0;
  const vxStringBase relative(folder);
  const vxStringBase type(extension);
  const vxStringBase exclusions =
      MakeProfileExclusions(*this, m_cmdLineParser->GetValue("PFAlert"), folder, extension, fixedList);

  vxStringBase sourceFolder;
  vxFileManager::MakePath(sourceFolder, m_sourceDirectory, relative, 0);
  vxStringBase destinationFolder;
  vxFileManager::MakePath(destinationFolder, m_destinationDirectory, relative, 0);
  // Only the samples are left behind here; the user's selection counts for the categories alone.
  const vxExclusionIndex samples(*this, vxStringBase(fixedList), vxStringBase::NullStr, 0);

  vxFileInfoList files;
  vxFileManager::GetFileList(sourceFolder, pattern == nullptr ? "" : pattern, files, 0);
  for (const vxFileInfo& file : files) {
    vxStringBase name = file.GetFilename().Filename();
    if (samples.Contains(name)) continue;
    vxStringBase source;
    vxFileManager::MakePath(source, sourceFolder, name, 1);
    vxStringBase target;
    vxFileManager::MakePath(target, destinationFolder, MarkedFileName(name, type), 1);
    if (vxFileManager::Exists(target)) {
      Log("File exists - no copy made:  ", target.c_str());
      continue;
    }
    // Pointed at the marked lists on its way, and written once.
    const vxConvertedCopy outcome = WriteConvertedCopy(source, target, RedirectRecipientLists);
    if (outcome == vxConvertedCopy::kExists) {
      Log("File exists - no copy made:  ", target.c_str());
      continue;
    }
    if (outcome == vxConvertedCopy::kFailed) {
      Log("Error: File could not be copied: ", source.c_str());
      continue;
    }
    Log("File copied:  ", target.c_str());
    if (outcome == vxConvertedCopy::kNotSettings) {
      Log("Error: Profile is not a valid settings file - left as copied: ", target.c_str());
    }
  }

  if (BothKeepCategories(*this, false)) {
    vxStringBase categoriesFolder(relative);
    categoriesFolder.replace("datfiles", "console_datfiles", 0, false);
    MergeCategoriesINIFile(categoriesFolder.c_str(), pattern, extension, exclusions.c_str(), true);
  }
  return 0;
}
