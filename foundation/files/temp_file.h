// Temporary entries beside their final name, and the rename that puts one in place. A writer fills
// the temporary entry completely and only then commits it, so the final name never shows a partial
// file. Internal to foundation/files.

#ifndef VXMIGRATE_FOUNDATION_FILES_TEMP_FILE_H_
#define VXMIGRATE_FOUNDATION_FILES_TEMP_FILE_H_

#include <sys/types.h>

#include <string>

namespace vxfiles {

// Creates a new empty file with a fresh hidden name (".name.vxtmp.XXXXXX") in the folder open at
// dirFd, opened for reading and writing, and returns its descriptor (-1 and errno on failure).
// mode is given to open(2), so the umask applies.
[[nodiscard]] int CreateTempFileAt(int dirFd, const char* name, mode_t mode, std::string& tempName);

// Creates a symbolic link to target with a fresh hidden name in the folder open at dirFd. 0 on
// success, -1 and errno on failure.
[[nodiscard]] int CreateTempLinkAt(int dirFd, const char* name, const char* target, std::string& tempName);

// Renames tempName onto name, both in the folder open at dirFd. replace false never overwrites:
// an entry that exists, or appears meanwhile, makes it fail with errno EEXIST. The temporary entry
// is left for the caller to remove when this fails. 0 on success, -1 and errno on failure.
[[nodiscard]] int CommitTempAt(int dirFd, const char* tempName, const char* name, bool replace);

// True for a name this project gives its temporary entries (".name.vxtmp.XXXXXX").
bool IsTempName(const std::string& name);

// Removes the temporary files and links that an earlier, killed run left in the folder open at
// dirFd: only entries named as ours, never folders. The folder lock keeps a live run's own
// temporary entries out of a sweep. Returns how many were removed.
int RemoveStaleTempsAt(int dirFd);

}  // namespace vxfiles

#endif  // VXMIGRATE_FOUNDATION_FILES_TEMP_FILE_H_
