// Steps shared by the migrations of the user's selected log, link and alert profiles: the version
// test that decides whether the profile kind keeps a categories file. The list of profiles left
// behind and the home-page split are public (migrate/profile_rules.h).

#ifndef VXMIGRATE_MIGRATE_INTERNAL_PROFILE_MIGRATION_H_
#define VXMIGRATE_MIGRATE_INTERNAL_PROFILE_MIGRATION_H_

#include "foundation/inifile/ini_file.h"
#include "foundation/string/string_base.h"
#include "foundation/string/version.h"
#include "migrate/profile_rules.h"

class vxMigrationManager;


// True when version reaches major.minor, each number compared on its own (so 6.0 does not reach
// 5.5). A missing version reaches nothing.
bool ReachesVersion(const vxVersionDescriptor* version, int major, int minor);

// The version from which an installation of productID keeps a categories file: 5.5, or 6.5 for
// product 6; with firewallCounts, 3.1 for product 8.
void CategoriesVersion(int productID, bool firewallCounts, int& major, int& minor);

// Both installations reach their categories versions.
bool BothKeepCategories(vxMigrationManager& manager, bool firewallCounts);

#endif  // VXMIGRATE_MIGRATE_INTERNAL_PROFILE_MIGRATION_H_
