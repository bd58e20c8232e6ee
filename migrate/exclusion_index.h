// An exclusion list read once into a hash set, for operations that test many files against one
// list. Contains() answers exactly what vxMigrationManager::IsExcludeFile answers for the same
// list, extension and fromInstallation, in constant average time instead of a walk of the list.
// The index copies what it needs: the list and the manager may change afterwards.

#ifndef VXMIGRATE_MIGRATE_EXCLUSION_INDEX_H_
#define VXMIGRATE_MIGRATE_EXCLUSION_INDEX_H_

#include <string>
#include <unordered_set>

#include "foundation/export.h"
#include "foundation/string/string_base.h"

class vxMigrationManager;

class VXM_EXPORT vxExclusionIndex {
 public:
  vxExclusionIndex(vxMigrationManager& manager, const vxStringBase& list,
                   const vxStringBase& inPlaceExtension, int fromInstallation);

  vxExclusionIndex(const vxExclusionIndex&) = delete;
  vxExclusionIndex& operator=(const vxExclusionIndex&) = delete;

  // True when file (a bare name or a full path, as the list was built for) is named by the list.
  bool Contains(const vxStringBase& file) const;
  bool IsEmpty() const { return names_.empty(); }

 private:
  std::unordered_set<std::string> names_;  // candidates with ASCII case folded
};

#endif  // VXMIGRATE_MIGRATE_EXCLUSION_INDEX_H_
