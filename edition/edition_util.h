// Small helpers shared by the edition converter's steps: numbered names and the destination's
// version.

#ifndef VXMIGRATE_EDITION_EDITION_UTIL_H_
#define VXMIGRATE_EDITION_EDITION_UTIL_H_

#include <cstdint>
#include <string>

#include "migrate/manager.h"

// prefix followed by number in decimal ("Object" 3 -> "Object3").
inline std::string NumberedName(const char* prefix, int64_t number) {
  return std::string(prefix) + std::to_string(number);
}

// The destination version's major number; 0 when the run has no descriptor.
inline int DestinationMajor(vxMigrationManager* manager) {
  const vxVersionDescriptor* version = manager->GetDestinationVersionDescriptor();
  return version == nullptr ? 0 : version->m_major;
}

#endif  // VXMIGRATE_EDITION_EDITION_UTIL_H_
