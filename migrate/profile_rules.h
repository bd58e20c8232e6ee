// Rewrites of a profile file's own keys that more than one migration applies: the library's log
// profile copy and the edition's profile conversion, and plug-ins that convert profiles of their own.

#ifndef VXMIGRATE_MIGRATE_PROFILE_RULES_H_
#define VXMIGRATE_MIGRATE_PROFILE_RULES_H_

#include "foundation/export.h"
#include "foundation/inifile/ini_file.h"

// Splits "HomePageName" of section "Profile" into "HomePageBaseDir" (before its last "/") and
// "HomePageDefaults" (after it): "a/b/index.htm" gives "a/b" and "index.htm"; without a "/" the
// whole value is the folder and the page is empty. "HomePageName" stays; an empty one changes nothing.
VXM_EXPORT void SplitHomePage(vxMappedINIFile& profile);

#endif  // VXMIGRATE_MIGRATE_PROFILE_RULES_H_
