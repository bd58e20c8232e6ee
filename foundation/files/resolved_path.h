// Where a copy should be read from so that the copy is a file of its own. The file layer copies a
// symbolic link as a link; a settings file copied that way and then rewritten would be rewritten
// through the link, in the installation it points into. A link is followed only where the run's
// read door lets it: to an entry inside the two installations.

#ifndef VXMIGRATE_FOUNDATION_FILES_RESOLVED_PATH_H_
#define VXMIGRATE_FOUNDATION_FILES_RESOLVED_PATH_H_

#include <sys/stat.h>

#include <climits>
#include <cstdlib>

#include "foundation/files/run_doors.h"
#include "foundation/string/string_base.h"

// The file a symbolic link at path leads to; path itself when it is no link or the link leads
// nowhere (the copy then fails or copies the dangling link, and nothing is written through it).
// Empty, so that the copy fails, when the link leads out of the installations (the door logs it).
inline vxStringBase ResolvedCopySource(const vxStringBase& path) {
  struct stat st;
  if (lstat(path.c_str(), &st) != 0 || !S_ISLNK(st.st_mode)) return path;
  if (!vxfiles::MayRead(path.view())) return vxStringBase();
  char* resolved = realpath(path.c_str(), nullptr);
  if (resolved == nullptr) return path;
  vxStringBase result(resolved);
  free(resolved);
  return result;
}

#endif  // VXMIGRATE_FOUNDATION_FILES_RESOLVED_PATH_H_
