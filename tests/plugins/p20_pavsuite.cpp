// The second plug-in for pavsuite to pavsuite: never reached while p10 fits.
#include "plugins/recording_plugin.h"
VXM_TEST_PLUGIN_INITIALIZE("pavsuite", "pavsuite")
VXM_TEST_PLUGIN_MIGRATE("p20")
