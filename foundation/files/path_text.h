// Path texts the run's doors, its journal and its record agree on: an absolute spelling of a path
// and real paths with every link resolved. Nothing here writes; the functions only ask the kernel.

#ifndef VXMIGRATE_FOUNDATION_FILES_PATH_TEXT_H_
#define VXMIGRATE_FOUNDATION_FILES_PATH_TEXT_H_

#include <string>
#include <string_view>

namespace vxfiles {

// An absolute text for path, with runs of separators collapsed and the closing ones dropped; ".."
// and links are left for the kernel to resolve. Relative paths start at the current folder. Empty
// for an empty path.
std::string AbsoluteText(std::string_view path);

// The kernel's real path of path (every link and ".." resolved); false when it cannot be resolved.
bool RealPath(const std::string& path, std::string& real);

// The real path of path's folder joined with its last part, so that a link standing at path is
// named, not followed. Folders on the way that do not exist yet are kept as written below the last
// one that does. False for an empty path, a missing part "." or "..", or a folder that exists but
// cannot be resolved.
bool RealEntryPath(std::string_view path, std::string& real);

}  // namespace vxfiles

#endif  // VXMIGRATE_FOUNDATION_FILES_PATH_TEXT_H_
