// The atomic writer: one temporary file per write, created and renamed relative to the target's
// folder (held open), so the rename lands in the folder that was checked. Every system call is
// checked; a failure leaves the target as it was and no temporary file behind.

#include "foundation/files/atomic_file.h"

#include <errno.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "foundation/files/dir_entries.h"
#include "foundation/files/file_manager.h"
#include "foundation/files/run_doors.h"
#include "foundation/files/temp_file.h"
#include "foundation/files/write_all.h"

namespace vxfiles {

// umask can only be read by setting it; the library runs on one thread, so the moment between the
// two calls is harmless.
mode_t NewFileMode() {
  const mode_t mask = umask(0);
  umask(mask);
  return 0666 & ~mask;
}

bool ResolveReplaceTarget(const std::string& path, ReplaceTarget* target) {
  if (path.empty()) return false;
  struct stat st;
  if (lstat(path.c_str(), &st) != 0) {
    if (errno != ENOENT) return false;
    target->path = path;
    target->exists = false;
    target->mode = NewFileMode();
    return true;
  }
  target->path = path;
  // A link is replaced by the file, never written through: a copied link may point into the source
  // installation, which a migration must not change. The file takes the mode of what the link
  // pointed to; a dangling link or a loop is refused.
  if (S_ISLNK(st.st_mode) && stat(path.c_str(), &st) != 0) return false;
  if (!S_ISREG(st.st_mode)) return false;
  target->exists = true;
  target->mode = st.st_mode & 07777;
  target->uid = st.st_uid;
  target->gid = st.st_gid;
  return true;
}

AtomicFileWriter::~AtomicFileWriter() { Abandon(); }

void AtomicFileWriter::Abandon() {
  if (fd_ >= 0) close(fd_);
  fd_ = -1;
  if (!tempName_.empty()) unlinkat(dirFd_, tempName_.c_str(), 0);
  tempName_.clear();
  if (dirFd_ >= 0) close(dirFd_);
  dirFd_ = -1;
}

bool AtomicFileWriter::Fail() {
  const int error = errno;
  Abandon();
  NoteWriteFailure(error, target_.path);
  failed_ = true;
  return false;
}

bool AtomicFileWriter::Begin(const ReplaceTarget& target, bool makeFolder) {
  Abandon();
  target_ = target;
  failed_ = false;
  if (!MayWrite(target.path)) return false;
  std::string folder;
  SplitPath(target.path, folder, name_);
  if (name_.empty()) return false;
  dirFd_ = open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  // Made only when missing: a run writing thousands of files into one folder asks once.
  if (dirFd_ < 0 && errno == ENOENT && makeFolder &&
      vxFileManager::CreateDirectory(vxStringBase(folder.c_str()), nullptr) == 0) {
    dirFd_ = open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  }
  if (dirFd_ < 0) return Fail();
  // 0600 until complete: nobody else reads a file that is still being written.
  fd_ = CreateTempFileAt(dirFd_, name_.c_str(), 0600, tempName_);
  if (fd_ < 0) return Fail();
  return true;
}

bool AtomicFileWriter::Append(std::string_view data) {
  if (failed_ || fd_ < 0) return false;
  return vxWriteAll(fd_, data.data(), data.size()) || Fail();
}

bool AtomicFileWriter::Commit(bool flushToDisk, bool replace) {
  if (fd_ < 0 || failed_) {
    Abandon();
    return false;
  }
  // Keeping the old owner needs privileges the run may lack; the mode is what matters.
  if (target_.exists) (void)!fchown(fd_, target_.uid, target_.gid);
  bool ok = fchmod(fd_, target_.mode) == 0;
  if (ok && flushToDisk) ok = fsync(fd_) == 0;
  ok = (close(fd_) == 0) && ok;
  fd_ = -1;
  if (!ok || CommitTempAt(dirFd_, tempName_.c_str(), name_.c_str(), replace) != 0) {
    // A target that appeared meanwhile is kept, which the caller hears as EEXIST: no failure of
    // the disk.
    if (errno == EEXIST && !replace) {
      Abandon();
      errno = EEXIST;
      return false;
    }
    return Fail();
  }
  tempName_.clear();
  if (flushToDisk && fsync(dirFd_) != 0) return Fail();
  Abandon();  // closes the folder
  return true;
}

bool SyncFileSystemOf(const std::string& folder) {
  const int fd = open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  if (fd < 0) return false;
  const bool synced = syncfs(fd) == 0;
  const int error = errno;
  close(fd);
  errno = error;
  return synced;
}

}  // namespace vxfiles
