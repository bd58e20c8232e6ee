// The converter's construction, the whole conversion in its fixed order, the merge of the Halden
// log settings into the OBX server settings, and the folder-wide INI merge. A Halden settings file
// that cannot be read is reported and leaves the OBX settings file untouched.

#include "edition/halden_to_obx.h"

#include <string>

#include "foundation/files/file_info.h"
#include "foundation/files/file_manager.h"
#include "foundation/string/tokenizer.h"
#include "migrate/manager.h"

namespace {

const char kLogSettings[] = "\\vxm_log\\vxm_log.ini";
const char kServerSettings[] = "\\vxm_vxx\\vxm_vxx.ini";

// "exe {pdf,1} zip" -> "{exe,0} {pdf,1} {zip,0} ": bare extensions gain the OBX form's flag, items
// already in that form stay. The trailing blank belongs to the OBX form.
vxStringBase ConvertFileTypeList(const vxStringBase& list) {
  vxStringBase result;
  vxBStringTokenizer tokens(list, vxBStringTokenizer::m_spToken, true);
  vxStringBase token;
  while (tokens.GetNext(token)) {
    if (token.isEmpty()) continue;
    if (token.at(0) == '{') {
      result.append(token);
      result.append(' ');
    } else {
      result.append('{');
      result.append(token);
      result.append(",0} ");
    }
  }
  return result;
}

// Sets the OBX list unless the file already holds it. A value is read without its trailing blank,
// which stays in the line after the value: setting the same list again would add a second blank
// on every run.
void SetFileTypeList(vxMappedINIFile& settings, const char* key, const vxStringBase& list) {
  vxStringBase current;
  vxStringBase wanted(list);
  wanted.stripWhite(vxStringBase::kTrailing);
  if (settings.GetVal("defaults", key, current) == 0 && current.equals(wanted, true)) return;
  settings.SetVal("defaults", key, list);
}

}  // namespace

HaldenToOBXHelper::HaldenToOBXHelper(vxMigrationManager* manager)
    : manager_(manager),
      sectionWord_("Section"),
      nameWord_("name"),
      includeWord_("include"),
      typeWord_("type"),
      graphTypeWord_("graphtype"),
      elementsWord_("elements"),
      yesWord_("Y"),
      graphElementsWord_("graphelements"),
      sourceFolder_(manager->GetSourceDirectory()),
      destinationFolder_(manager->GetDestinationDirectory()) {}

HaldenToOBXHelper::~HaldenToOBXHelper() = default;

int HaldenToOBXHelper::DoHaldenToOBXMigrate() {
  // Each step reports its own trouble in the log; none stops the ones after it.
  DoVXMLogINIMigrate();
  DoHaldenToOBXTemplateFileMigrate();
  DoMergeAdvancedOptionsFiles();
  DoHaldenToOBXProfileFileMigrate();
  manager_->DoMergeCSVFile("\\adviews.txt", "\\adviews.txt");
  manager_->DoMergeCSVFile("\\vxintra.txt", "\\vxintra.txt");
  manager_->DoKeywordINIMerge();
  return 0;
}

int HaldenToOBXHelper::DoVXMLogINIMigrate() {
  const vxStringBase sourcePath = manager_->GetFullSourceFilename(kLogSettings);
  const vxStringBase destinationPath = manager_->GetFullDestinationFilename(kServerSettings);
  vxMappedINIFile source(sourcePath);
  vxMappedINIFile destination(destinationPath);

  if (source.Open(1) != 0) {
    // Without the Halden values there is nothing to carry; the few derived keys alone would only
    // overwrite the server's own settings with defaults.
    manager_->Log("Error: Unable to open file:   ", sourcePath.c_str());
    manager_->Log("vxm_log.ini merged with vxm_vxx.ini");
    return 0;
  }
  const bool bothOpen = destination.Open(1) == 0;

  destination.MergeFrom(source, manager_->RecordMerge(sourcePath, destinationPath));

  if (bothOpen) {
    for (const char* key : {"DownloadTypes", "DocumentTypes"}) {
      const vxStringBase& list = source.GetVal("Defaults", key);
      if (!list.isEmpty()) SetFileTypeList(destination, key, ConvertFileTypeList(list));
    }
  }

  // Seconds in the Halden edition, whole days in the OBX edition.
  const long seconds = source.GetVal("Defaults", "TitleCacheLifespan").asLong();
  destination.SetVal("defaults", "TitleCacheLifespan", static_cast<long>(seconds / 86400.0));

  // The old flag says the plug-in checks cookies; the new key says they are validated by type, the
  // opposite sense.
  const vxStringBase& plugin = source.GetVal("cookie", "vantixplugin");
  if (!plugin.isEmpty()) {
    destination.SetVal("cookie", "validatetype", plugin.equals("1") ? "0" : "1");
  }

  if (source.GetVal("Defaults", "UseGlobalSubProfileFilters").equals("0")) {
    destination.SetVal("Defaults", "useglobalcontentgroups", 0L);
    destination.SetVal("Defaults", "useglobalpathsanalysisprofiles", 0L);
    destination.SetVal("Defaults", "useglobalquerystrings", 0L);
  }

  if (destination.Close(1) != 0) {
    // An existing server settings file that could not be read is never replaced.
    manager_->Log(bothOpen ? "Error: Unable to write file:   " : "Error: Unable to open file:   ",
                  destinationPath.c_str());
  }
  manager_->Log("vxm_log.ini merged with vxm_vxx.ini");
  return 0;
}

int HaldenToOBXHelper::DoMergeINIFilesInFolder(const vxStringBase& sourceFolder,
                                               const vxStringBase& destinationFolder) {
  vxFileInfoList files;
  vxFileManager::GetFileList(sourceFolder, "*.ini", files, 1);
  for (const vxFileInfo& file : files) {
    vxStringBase destinationPath;
    vxFileManager::MakePath(destinationPath, destinationFolder, vxStringBase::NullStr,
                            file.GetFilename().Filename());
    manager_->MergeINIFiles(file.GetFilename().Pathname().c_str(), destinationPath.c_str());
  }
  return 0;
}
