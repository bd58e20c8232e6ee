// An exclusive lock on a folder, held by this process until it is released or the process ends
// (the kernel drops it, so a crashed run never leaves a stale lock). It is taken on the folder
// itself, so locking writes nothing.

#ifndef VXMIGRATE_FOUNDATION_FILES_FOLDER_LOCK_H_
#define VXMIGRATE_FOUNDATION_FILES_FOLDER_LOCK_H_

#include "foundation/export.h"
#include "foundation/string/string_base.h"

class VXM_EXPORT vxFolderLock {
 public:
  enum Result { kLocked, kBusy, kNoFolder };

  vxFolderLock() = default;
  ~vxFolderLock();

  vxFolderLock(const vxFolderLock&) = delete;
  vxFolderLock& operator=(const vxFolderLock&) = delete;

  // Takes the lock without waiting: kBusy when another process holds it, kNoFolder when folder
  // cannot be opened (nothing is locked then).
  Result Acquire(const vxStringBase& folder);

 private:
  int fd_ = -1;
};

#endif  // VXMIGRATE_FOUNDATION_FILES_FOLDER_LOCK_H_
