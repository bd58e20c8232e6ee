// Path texts the run's doors, its journal and its record agree on: an absolute spelling of a path
// and real paths with every link resolved. Nothing here writes; the functions only ask the kernel.

#ifndef VXMIGRATE_FOUNDATION_FILES_PATH_TEXT_H_
#define VXMIGRATE_FOUNDATION_FILES_PATH_TEXT_H_

#include <string>
#include <string_view>
#include <unordered_map>

#include "foundation/export.h"

namespace vxfiles {

// An absolute text for path, with runs of separators collapsed and the closing ones dropped; ".."
// and links are left for the kernel to resolve. Relative paths start at the current folder. Empty
// for an empty path.
VXM_EXPORT std::string AbsoluteText(std::string_view path);

// The kernel's real path of path (every link and ".." resolved); false when it cannot be resolved.
VXM_EXPORT bool RealPath(const std::string& path, std::string& real);

}  // namespace vxfiles

// Real paths with each folder's asked of the kernel once: a run names thousands of files in a few
// folders, and resolving a path costs one call per part of it. A folder that turns into a link
// during the run keeps the real path first seen; callers that must not be fooled by that check
// what they open.
class VXM_EXPORT vxRealPaths {
 public:
  // The real path of an existing folder; false when it cannot be resolved.
  bool Folder(const std::string& folder, std::string& real);

  // The real path of path's folder joined with its last part, so that a link standing at path is
  // named, not followed. Folders on the way that do not exist yet are kept as written below the
  // last one that does. False for an empty path, a missing part "." or "..", or a folder that
  // exists but cannot be resolved.
  bool Entry(std::string_view path, std::string& real);

 private:
  std::unordered_map<std::string, std::string> folders_;  // folder text -> its real path
};

#endif  // VXMIGRATE_FOUNDATION_FILES_PATH_TEXT_H_
