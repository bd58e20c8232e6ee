// An exclusion list of bare file names turned into a hash set, so that testing every file of a
// large folder against a list that names most of them costs one lookup per file. It answers
// exactly as IsExcludeFile(file, list, inPlaceExtension, 0) does: names split at ",", blanks
// around them ignored, ASCII case ignored, and in an in-place run a name containing ".ini" standing
// for the name with its last four characters replaced by "." and the in-place extension.

#ifndef VXMIGRATE_MIGRATE_INTERNAL_EXCLUSION_NAME_SET_H_
#define VXMIGRATE_MIGRATE_INTERNAL_EXCLUSION_NAME_SET_H_

#include <string>
#include <unordered_set>

#include "foundation/string/string_base.h"

class vxExclusionNameSet {
 public:
  vxExclusionNameSet(const vxStringBase& list, bool inPlace, const vxStringBase& inPlaceExtension) {
    unsigned int position = 0;
    while (position < list.length()) {
      vxStringBase name;
      position = list.subString(',', name, position, list.length() - 1);
      name.stripWhite(vxStringBase::kBoth);
      if (inPlace && name.find(".ini", 0, true) != vxStringBase::BadIndex) {
        name.cut(4);
        name.append('.');
        name.append(inPlaceExtension);
      }
      names_.insert(vxFoldCase(name.view()));
    }
  }
  vxExclusionNameSet(const vxExclusionNameSet&) = delete;
  vxExclusionNameSet& operator=(const vxExclusionNameSet&) = delete;

  bool Contains(const vxStringBase& file) const {
    return names_.count(vxFoldCase(file.view())) != 0;
  }

 private:
  std::unordered_set<std::string> names_;
};

#endif  // VXMIGRATE_MIGRATE_INTERNAL_EXCLUSION_NAME_SET_H_
