// Folder locks through flock(2) on the folder's own descriptor: two spellings of one folder, a link
// to it or a bind mount all lock the same inode.

#include "foundation/files/folder_lock.h"

#include <errno.h>
#include <fcntl.h>
#include <sys/file.h>
#include <unistd.h>

vxFolderLock::~vxFolderLock() {
  if (fd_ >= 0) close(fd_);  // closing the last descriptor releases the lock
}

vxFolderLock::Result vxFolderLock::Acquire(const vxStringBase& folder) {
  if (fd_ >= 0) return kLocked;
  if (folder.isEmpty()) return kNoFolder;
  int fd = open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  if (fd < 0) return kNoFolder;
  while (flock(fd, LOCK_EX | LOCK_NB) != 0) {
    const int error = errno;
    if (error == EINTR) continue;
    close(fd);
    return error == EWOULDBLOCK ? kBusy : kNoFolder;
  }
  fd_ = fd;
  return kLocked;
}
