// An example migration plug-in: the mirror suite ("mirsuite") upgraded to a newer version of
// itself. It declares its pair of products in MigrateInitialize; the host calls Migrate when a run
// names that pair and both versions lie in the "[mirsuite]" range of vxmigrate.ini. Migrate then
// calls the library's operations in the order the product's files need.

#include "migrate/manager.h"
#include "migrate/sample_lists.h"

namespace {

const char kProduct[] = "mirsuite";
// Folders are written relative to the installation, with a leading separator.
const char kLogSettings[] = "\\vxm_log\\vxm_log.ini";
const char kProfiles[] = "\\vxm_log\\datfiles";

}  // namespace

// Both entry points have C linkage: the host looks them up by these names.
extern "C" int MigrateInitialize(vxMigrateInfo* info) {
  info->sourceProduct = kProduct;
  info->destinationProduct = kProduct;
  info->note1 = "Example: mirror suite upgrade";
  return 0;
}

extern "C" int Migrate(vxMigrationManager* manager) {
  manager->Log("Example plug-in migrating the mirror suite from ",
               manager->GetSourceVersion().c_str());
  // Settings first: the main-settings merge converts cookie keys of the merged log settings. In an
  // in-place run the installer has kept the old file as ".vxinibak".
  manager->MergeINIFilesRelative(
      manager->IsInPlaceMigrate() ? "\\vxm_log\\vxm_log.vxinibak" : kLogSettings, kLogSettings);
  manager->DoVantixINIMerge();
  manager->DoKeywordINIMerge();
  // The profiles the user selected ("PFLog"), less the samples the new version ships itself.
  manager->DoCopyLogProfiles(kProfiles, "*.wlp", "wlp", GetSampleFileList(kProduct, "wlp"));
  manager->DoCopyLanguageFiles("\\vxm_log\\template", "\\vxm_log\\template");
  return 0;
}
