// The first of two plug-ins for pavsuite to pavsuite: it is the one that runs.
#include "plugins/recording_plugin.h"
VXM_TEST_PLUGIN_INITIALIZE("pavsuite", "pavsuite")
VXM_TEST_PLUGIN_MIGRATE("p10")
