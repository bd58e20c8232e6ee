// Shipped migration plug-in: a Halden installation ("halsuite") into an OBX reporting server
// ("obx"). The conversion itself is the library's edition converter; after it come the user's
// language files, which the converted templates name under the server's template folder.

#include "edition/halden_to_obx.h"
#include "migrate/manager.h"

extern "C" int MigrateInitialize(vxMigrateInfo* info) {
  info->sourceProduct = "halsuite";
  info->destinationProduct = "obx";
  info->note1 = "Halden to OBX reporting server";
  return 0;
}

extern "C" int Migrate(vxMigrationManager* manager) {
  HaldenToOBXHelper converter(manager);
  converter.DoHaldenToOBXMigrate();
  manager->DoCopyLanguageFiles("\\vxm_log\\template", "\\vxm_vxx\\template");
  return 0;
}
