// Shipped migration plug-in: a Halden installation ("halsuite") into an OBX reporting server
// ("obx"). The conversion itself is the library's edition converter; this file only declares the
// pair of products and runs it.

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
  return 0;
}
