// A migration plug-in for the tests: it declares one pair of products and, when run, appends what
// it was handed to "plugin_calls.txt" in the destination folder.

#ifndef VXMIGRATE_TESTS_PLUGINS_RECORDING_PLUGIN_H_
#define VXMIGRATE_TESTS_PLUGINS_RECORDING_PLUGIN_H_

#include <cstdio>
#include <string>

#include "migrate/manager.h"

inline void RecordCall(vxMigrationManager* manager, const char* pluginName) {
  std::string path = manager->GetDestinationDirectory().str() + "/plugin_calls.txt";
  FILE* out = fopen(path.c_str(), "a");
  if (out == nullptr) return;
  fprintf(out, "%s %s %s %s %s %d %d FT=%s\n", pluginName, manager->GetSourceDirectory().c_str(),
          manager->GetDestinationDirectory().c_str(), manager->GetSourceVersion().c_str(),
          manager->GetDestinationVersion().c_str(), manager->GetSourceProductID(),
          manager->GetDestinationProductID(),
          manager->GetCmdLineParser()->GetValue("FT").c_str());
  fclose(out);
  manager->Log("Test plug-in ran: ", pluginName);
}

#define VXM_TEST_PLUGIN_INITIALIZE(source, destination)     \
  extern "C" int MigrateInitialize(vxMigrateInfo* info) {    \
    info->sourceProduct = source;                            \
    info->destinationProduct = destination;                  \
    info->note1 = "test plug-in";                            \
    return 0;                                                \
  }

#define VXM_TEST_PLUGIN_MIGRATE(name)                        \
  extern "C" int Migrate(vxMigrationManager* manager) {      \
    RecordCall(manager, name);                               \
    return 0;                                                \
  }

#endif  // VXMIGRATE_TESTS_PLUGINS_RECORDING_PLUGIN_H_
