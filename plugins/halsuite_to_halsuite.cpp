// Shipped migration plug-in: the Halden suite ("halsuite") upgraded to a newer version of itself.
// Everything the log-analysis upgrade carries, plus the suite's other profile kinds, each in its
// own folder so that each folder's categories file is merged against its own selection.

#include "plugins/log_settings_upgrade.h"

namespace {

const char kProduct[] = "halsuite";

// Proxy and streaming profiles travel like log-analysis profiles (data folders, credentials).
struct ProfileKind {
  const char* folder;
  const char* pattern;
  const char* extension;
};
const ProfileKind kLogLikeProfiles[] = {
    {"\\vxm_log\\datfiles\\proxy", "*.prx", "prx"},
    {"\\vxm_log\\datfiles\\stream", "*.slp", "slp"},
};
const char kLinkProfiles[] = "\\vxm_log\\datfiles\\links";
const char kAlertProfiles[] = "\\vxm_log\\datfiles\\alerts";
const char kAutoReports[] = "\\vxm_log\\datfiles\\autoreports";

}  // namespace

extern "C" int MigrateInitialize(vxMigrateInfo* info) {
  info->sourceProduct = kProduct;
  info->destinationProduct = kProduct;
  info->note1 = "Halden suite upgrade";
  return 0;
}

extern "C" int Migrate(vxMigrationManager* manager) {
  vxplugin::MigrateLogSettings(manager);
  vxplugin::MigrateLogProfiles(manager, kProduct);
  for (const ProfileKind& kind : kLogLikeProfiles) {
    manager->DoCopyLogProfiles(kind.folder, kind.pattern, kind.extension,
                               GetSampleFileList(kProduct, kind.extension));
  }
  manager->DoCopyLinkProfiles(kLinkProfiles, "*.llp", "llp", GetSampleFileList(kProduct, "llp"));
  // Alert profiles name their recipient lists by the lists' marked copies: the lists come first.
  manager->CopyRenamedUserFiles(kAlertProfiles, "lert*.lst", "lst", nullptr);
  manager->DoCopyAlertProfiles(kAlertProfiles, "*.alp", "alp", GetSampleFileList(kProduct, "alp"));
  manager->CopyRenamedUserFiles(kAutoReports, "*.arp", "arp", GetSampleFileList(kProduct, "arp"));
  vxplugin::MigrateTemplatesAndLanguages(manager, kProduct);
  return 0;
}
