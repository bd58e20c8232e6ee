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
const char kDynamicPages[] = "/vxm_vxx/datfiles/dynamicpages/default.ini";

int SourceMajor(vxMigrationManager* m) {
  const vxVersionDescriptor* version = m->GetSourceVersionDescriptor();
  return version == nullptr ? 0 : version->m_major;
}

// The library's OBX operation converts query profiles from the layout before version 3; reading a
// source that already has the new layout that way would empty their pages. For such a source the
// plug-in says the pair is served only in part and first merges the query profiles whole: the
// conversion then finds each one present by its id and converts none.
void MigrateAdvancedOptions(vxMigrationManager* m) {
  if (SourceMajor(m) >= 3) {
    m->DoBadMigration();
    m->MergeAdvancedOptionsFiles(kDynamicPages, kDynamicPages, "queryprofile");
  }
  m->DoOBXMergeAdvancedOptionsFiles();
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
