// Migrates halsuite to obx (declared in upper case: products match ignoring case).
#include "plugins/recording_plugin.h"
VXM_TEST_PLUGIN_INITIALIZE("HALSUITE", "obx")
VXM_TEST_PLUGIN_MIGRATE("p05")
