// Reading one folder's entries through an open descriptor, shared by the listings and the copies.
// Names come back sorted bytewise with the type the file system reported; "." and ".." are left
// out, and so is the runs' history folder. Internal to foundation/files.

#ifndef VXMIGRATE_FOUNDATION_FILES_DIR_ENTRIES_H_
#define VXMIGRATE_FOUNDATION_FILES_DIR_ENTRIES_H_

#include <sys/types.h>

#include <string>
#include <utility>
#include <vector>

namespace vxfiles {

struct DirEntry {
  std::string name;
  unsigned char type;  // DT_DIR, DT_REG, DT_LNK, ... or DT_UNKNOWN when the file system won't say
};

// The folder at the top of a destination where runs keep their journals (see run_journal.h).
// Listings and copies leave every entry of this name out.
constexpr char kRunHistoryFolder[] = ".vxmigrate";

// Reads every entry of the folder open at fd (which stays open and is the caller's) into entries,
// sorted by name. buffer is scratch space the caller may reuse between calls. false when the
// folder cannot be read; entries then holds what was read before the error.
bool ReadDirEntries(int fd, std::vector<DirEntry>& entries, std::vector<char>& buffer);

// The entry's type, asking the file system (without following a link) when the folder did not
// say. DT_UNKNOWN when the entry vanished.
unsigned char ResolveType(int dirFd, const DirEntry& entry);

// Shell-style wildcard match of a single name, case-sensitive; a leading dot needs no special
// match. The patterns "", "*" and "*.*" match every name, with or without a dot.
bool NameMatches(const char* pattern, const char* name);

// True when the pattern holds a wildcard character, i.e. names a set rather than one entry.
bool HasWildcard(const char* pattern);

// Splits a path at its last '/': folder "." for a bare name, "/" for a name in the root.
void SplitPath(const std::string& path, std::string& folder, std::string& name);

// A folder's identity, to recognise the same folder reached twice (bind mounts, copying a tree
// into itself).
typedef std::pair<dev_t, ino_t> FolderId;

}  // namespace vxfiles

#endif  // VXMIGRATE_FOUNDATION_FILES_DIR_ENTRIES_H_
