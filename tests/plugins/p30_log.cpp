// A log to log plug-in listed after p15: never used.
#include "plugins/recording_plugin.h"
VXM_TEST_PLUGIN_INITIALIZE("log", "log")
VXM_TEST_PLUGIN_MIGRATE("p30")
