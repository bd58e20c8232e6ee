// Shipped migration plug-in: the OBX reporting server ("obx") upgraded to a newer version of
// itself. Server settings, search engines, data files and advanced options are merged; profiles
// arrive beside the new ones as "_vxmigrate" copies with their report and database folders; user
// templates and languages follow.

#include "migrate/manager.h"
#include "migrate/sample_lists.h"

namespace {

const char kSettings[] = "\\vxm_vxx\\vxm_vxx.ini";
const char kTemplates[] = "\\vxm_vxx";
const char kLanguages[] = "\\vxm_vxx\\template";

// The kinds that the OBX advanced-option operation handles, for a source already in the layout of
// version 3: there every kind, query profiles included, merges entry by entry.
struct AdvancedOptionFamily {
  const char* file;
  const char* prefix;
};
const AdvancedOptionFamily kAdvancedOptions[] = {
    {"/vxm_vxx/datfiles/contentgroups/default.ini", "contentgroupprofile"},
    {"/vxm_vxx/datfiles/pathsanalysis/default.ini", "pathsanalysisprofile"},
    {"/vxm_vxx/datfiles/urlreplacement/default.ini", "urlreplacementprofile"},
    {"/vxm_vxx/datfiles/tradequill/default.ini", "adcampaignprofile"},
    {"/vxm_vxx/datfiles/tradequill/default.ini", "productprofile"},
    {"/vxm_vxx/datfiles/tradequill/default.ini", "categoryprofile"},
    {"/vxm_vxx/datfiles/dynamicpages/default.ini", "queryprofile"},
};

int SourceMajor(vxMigrationManager* m) {
  const vxVersionDescriptor* version = m->GetSourceVersionDescriptor();
  return version == nullptr ? 0 : version->m_major;
}

// The library's OBX operation converts query profiles from the layout before version 3; reading a
// source that already has the new layout that way would empty their pages. Such a source is
// logged as a pair the conversion does not serve, and merged kind by kind instead.
void MigrateAdvancedOptions(vxMigrationManager* m) {
  if (SourceMajor(m) < 3) {
    m->DoOBXMergeAdvancedOptionsFiles();
    return;
  }
  m->DoBadMigration();
  for (const AdvancedOptionFamily& family : kAdvancedOptions) {
    m->MergeAdvancedOptionsFiles(family.file, family.file, family.prefix);
  }
}

}  // namespace

extern "C" int MigrateInitialize(vxMigrateInfo* info) {
  info->sourceProduct = "obx";
  info->destinationProduct = "obx";
  info->note1 = "OBX reporting server upgrade";
  return 0;
}

extern "C" int Migrate(vxMigrationManager* manager) {
  manager->MergeINIFilesRelative(
      manager->IsInPlaceMigrate() ? "\\vxm_vxx\\vxm_vxx.vxinibak" : kSettings, kSettings);
  manager->DoKeywordINIMerge();
  manager->DoMergeCSVFile("\\adviews.txt", "\\adviews.txt");
  manager->DoMergeCSVFile("\\vxintra.txt", "\\vxintra.txt");
  MigrateAdvancedOptions(manager);
  manager->DoCopyOBXProfiles();
  manager->CopyRenamedUserFiles(kTemplates, "*.wct", "wct", GetSampleFileList("obx", "wct"));
  manager->DoCopyLanguageFiles(kLanguages, kLanguages);
  return 0;
}
