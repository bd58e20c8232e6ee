// The file-system side of the INI model: reading a whole regular file in one go, and replacing a
// file atomically (a temporary file in the same folder, renamed over the old one), so that a crash
// or a full disk leaves either the old file or the new one, never a mix.

#ifndef VXMIGRATE_FOUNDATION_INIFILE_INI_DISK_H_
#define VXMIGRATE_FOUNDATION_INIFILE_INI_DISK_H_

#include <sys/types.h>

#include <string>
#include <string_view>

namespace vxini {

// Reads the regular file at path into text. False when it is missing, unreadable, not a regular
// file (a folder, a device, a pipe), or too large for the model's 32-bit offsets.
bool ReadWholeFile(const std::string& path, std::string* text);

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

// Writes a new version of a file beside it and renames it into place on Commit. Destroyed
// without a successful Commit, it removes the temporary file and the old file stays as it was.
class AtomicFileWriter {
 public:
  AtomicFileWriter() = default;
  ~AtomicFileWriter();
  AtomicFileWriter(const AtomicFileWriter&) = delete;
  AtomicFileWriter& operator=(const AtomicFileWriter&) = delete;

  // Creates the temporary file in the target's folder. False on failure.
  bool Begin(const ReplaceTarget& target);
  // Writes data to the temporary file (callers buffer); false once any write has failed.
  bool Append(std::string_view data);
  // Gives the file the target's mode (and owner, where allowed), with
  // flushToDisk syncs it, renames it over the target, and with flushToDisk syncs the folder too.
  bool Commit(bool flushToDisk);

 private:
  void Abandon();

  ReplaceTarget target_;
  std::string tempPath_;
  int fd_ = -1;
  bool failed_ = false;
};

}  // namespace vxini

#endif  // VXMIGRATE_FOUNDATION_INIFILE_INI_DISK_H_
