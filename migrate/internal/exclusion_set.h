// An exclusion list ("a.wlp, b.wlp, ...") read once into a hash set, so that testing many files
// against a long list costs constant time per file instead of a walk over the list. It answers
// exactly what vxMigrationManager::IsExcludeFile answers for the same list, in-place extension and
// comparison form: names stripped of blanks, compared ignoring ASCII case.

#ifndef VXMIGRATE_MIGRATE_INTERNAL_EXCLUSION_SET_H_
#define VXMIGRATE_MIGRATE_INTERNAL_EXCLUSION_SET_H_

#include <string>
#include <unordered_set>

#include "foundation/string/string_base.h"

class vxMigrationManager;

class vxExclusionSet {
 public:
  // fromInstallation 0 holds the names as they stand; non-zero holds each name joined to the
  // source installation folder, for testing full paths.
  vxExclusionSet(vxMigrationManager& manager, const vxStringBase& list,
                 const vxStringBase& inPlaceExtension, int fromInstallation);

  vxExclusionSet(const vxExclusionSet&) = delete;
  vxExclusionSet& operator=(const vxExclusionSet&) = delete;

  bool Contains(const vxStringBase& file) const;
  bool IsEmpty() const { return folded_.empty(); }

 private:
  std::unordered_set<std::string> folded_;
};

#endif  // VXMIGRATE_MIGRATE_INTERNAL_EXCLUSION_SET_H_
