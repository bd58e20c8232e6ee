// Steps shared by the migrations of the user's selected log, link and alert profiles (and by the
// edition's profile conversion): the list of profiles left behind (unselected ones and the
// product's samples), with a log line for every selected name that is not in the folder, the
// version test that decides whether the profile kind keeps a categories file, and the home-page
// split.

#ifndef VXMIGRATE_MIGRATE_INTERNAL_PROFILE_MIGRATION_H_
#define VXMIGRATE_MIGRATE_INTERNAL_PROFILE_MIGRATION_H_

#include "foundation/inifile/ini_file.h"
#include "foundation/string/string_base.h"
#include "foundation/string/version.h"

class vxMigrationManager;

// The exclusion list of bare names for the profiles "*.<extension>" of the source's folder: every
// profile the selection does not name, then fixedList (fixedList alone for an empty selection).
// Each selected name that matches no such profile is logged as "Error: Selected profile not found: ": the user asked for it.
vxStringBase MakeProfileExclusions(vxMigrationManager& manager, const vxStringBase& selection,
                                   const char* folder, const char* extension,
                                   const char* fixedList);

// True when version reaches major.minor, each number compared on its own (so 6.0 does not reach
// 5.5). A missing version reaches nothing.
bool ReachesVersion(const vxVersionDescriptor* version, int major, int minor);

// The version from which an installation of productID keeps a categories file: 5.5, or 6.5 for
// product 6; with firewallCounts, 3.1 for product 8.
void CategoriesVersion(int productID, bool firewallCounts, int& major, int& minor);

// Both installations reach their categories versions.
bool BothKeepCategories(vxMigrationManager& manager, bool firewallCounts);

// Splits "HomePageName" of section "Profile" into "HomePageBaseDir" (before its last "/") and
// "HomePageDefaults" (after it): "a/b/index.htm" gives "a/b" and "index.htm"; without a "/" the
// whole value is the folder and the page is empty. "HomePageName" stays; an empty one changes nothing.
void SplitHomePage(vxMappedINIFile& profile);

#endif  // VXMIGRATE_MIGRATE_INTERNAL_PROFILE_MIGRATION_H_
