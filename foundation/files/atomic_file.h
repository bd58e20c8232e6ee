// Writing a whole file atomically: the new content goes to a temporary file in the target's folder
// (".name.vxtmp.XXXXXX"), which is renamed into place only once complete, so a crash, a kill or a
// full disk leaves either the old file (or none) or the whole new one, never a mix. The rename
// either replaces the target or never does (a file that appears meanwhile is kept). Every write
// passes the run's write door first.

#ifndef VXMIGRATE_FOUNDATION_FILES_ATOMIC_FILE_H_
#define VXMIGRATE_FOUNDATION_FILES_ATOMIC_FILE_H_

#include <sys/types.h>

#include <string>
#include <string_view>

namespace vxfiles {

// Where a replacement goes and how it looks: a symbolic link is itself replaced by the new file,
// never written through; the new file takes the mode of what the link pointed to.
struct ReplaceTarget {
  std::string path;
  bool exists = false;
  mode_t mode = 0;  // permission bits for the new file: the old file's, else 0666 less the umask
  uid_t uid = 0;
  gid_t gid = 0;
};

// False when path cannot be replaced: it names something other than a regular file, a dangling
// link, or cannot be examined.
bool ResolveReplaceTarget(const std::string& path, ReplaceTarget* target);

// The permission bits a new file gets: 0666 less the process's umask.
mode_t NewFileMode();

// Makes everything written so far to the file system holding folder durable: one syncfs at the
// end of a run instead of an fsync per file and folder. False (errno set) when the folder cannot
// be opened or the kernel reports a lost write.
bool SyncFileSystemOf(const std::string& folder);

// Writes a new version of a file beside it and renames it into place on Commit. Destroyed
// without a successful Commit, it removes the temporary file and the target stays as it was.
class AtomicFileWriter {
 public:
  AtomicFileWriter() = default;
  ~AtomicFileWriter();
  AtomicFileWriter(const AtomicFileWriter&) = delete;
  AtomicFileWriter& operator=(const AtomicFileWriter&) = delete;

  // Creates the temporary file in the target's folder; with makeFolder, a missing folder (and its
  // missing parents) is made first. False on failure (the door refused, the folder is missing or
  // not writable).
  [[nodiscard]] bool Begin(const ReplaceTarget& target, bool makeFolder = false);
  // Writes data to the temporary file (callers buffer); false once any write has failed.
  [[nodiscard]] bool Append(std::string_view data);
  // Gives the file the target's mode (and owner, where allowed), with flushToDisk syncs it, and
  // renames it onto the target: replacing what is there with replace, else failing with errno
  // EEXIST when the target exists. With flushToDisk the folder is synced too.
  [[nodiscard]] bool Commit(bool flushToDisk, bool replace = true);

 private:
  void Abandon();
  // Abandons the write after a failed call (errno), which the run's doors are told of; false.
  bool Fail();

  ReplaceTarget target_;
  std::string name_;      // the target's name within its folder
  std::string tempName_;  // the temporary file's name within the same folder
  int dirFd_ = -1;
  int fd_ = -1;
  bool failed_ = false;
};

}  // namespace vxfiles

#endif  // VXMIGRATE_FOUNDATION_FILES_ATOMIC_FILE_H_
