// Shipped migration plug-in: the log-analysis product ("log") upgraded to a newer version of
// itself. Settings, search engines, data files and advanced options are merged into the new
// installation's files; profiles, events, templates and languages arrive as marked copies.

#include "plugins/log_settings_upgrade.h"

extern "C" int MigrateInitialize(vxMigrateInfo* info) {
  info->sourceProduct = "log";
  info->destinationProduct = "log";
  info->note1 = "Log analysis upgrade";
  return 0;
}

extern "C" int Migrate(vxMigrationManager* manager) {
  vxplugin::MigrateLogSettings(manager);
  vxplugin::MigrateLogProfiles(manager, "log");
  vxplugin::MigrateTemplatesAndLanguages(manager, "log");
  return 0;
}
