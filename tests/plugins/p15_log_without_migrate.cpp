// Declares log to log but has no "Migrate": it still ends the search.
#include "plugins/recording_plugin.h"
VXM_TEST_PLUGIN_INITIALIZE("log", "log")
