// Rules that more than one migration of profiles applies (the library's log profile copy, the
// edition's profile conversion, plug-ins that convert profiles of their own): which profiles are
// left behind, and rewrites of a profile file's own keys.

#ifndef VXMIGRATE_MIGRATE_PROFILE_RULES_H_
#define VXMIGRATE_MIGRATE_PROFILE_RULES_H_

#include "foundation/export.h"
#include "foundation/inifile/ini_file.h"
#include "foundation/string/string_base.h"

class vxMigrationManager;

// The exclusion list of bare names for the profiles "*.<extension>" of the source's folder: every
// profile the selection does not name, then fixedList (fixedList alone for an empty selection).
// Each selected name that matches no such profile is logged as "Error: Selected profile not
// found: ": the user asked for it.
VXM_EXPORT vxStringBase MakeProfileExclusions(vxMigrationManager& manager,
                                              const vxStringBase& selection, const char* folder,
                                              const char* extension, const char* fixedList);

// Splits "HomePageName" of section "Profile" into "HomePageBaseDir" (before its last "/") and
// "HomePageDefaults" (after it): "a/b/index.htm" gives "a/b" and "index.htm"; without a "/" the
// whole value is the folder and the page is empty. "HomePageName" stays; an empty one changes nothing.
VXM_EXPORT void SplitHomePage(vxMappedINIFile& profile);

#endif  // VXMIGRATE_MIGRATE_PROFILE_RULES_H_
