// Naming the side of a failed copy. Only asked after a failure, so a copy that succeeds pays
// nothing for it.

#include "migrate/failed_copy.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>

#include "foundation/inifile/ini_file.h"
#include "migrate/internal/source_tree.h"
#include "migrate/manager.h"

const char vxMsgUnableToOpenFile[] = "Error: Unable to open file:   ";
const char vxMsgUnableToWriteFile[] = "Error: Unable to write file:   ";

bool vxCanRead(const vxStringBase& path) {
  // open, not access: the answer must hold for the effective user, root included.
  int fd = open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK);
  if (fd < 0) return false;
  close(fd);
  return true;
}

bool vxIsAbsent(const vxStringBase& path) {
  struct stat st;
  if (lstat(path.c_str(), &st) == 0) return false;
  return errno == ENOENT || errno == ENOTDIR;
}

vxFailedCopy vxBlameFailedCopy(const vxStringBase& source, const vxStringBase& destination) {
  if (vxCanRead(source)) return vxFailedCopy{vxMsgUnableToWriteFile, &destination};
  return vxFailedCopy{vxMsgUnableToCopyFile, &source};
}

void vxLogFailedCopy(vxMigrationManager& manager, const vxStringBase& source,
                     const vxStringBase& destination) {
  const vxFailedCopy blame = vxBlameFailedCopy(source, destination);
  manager.Log(blame.text, blame.path->c_str());
}

bool vxCopied(vxMigrationManager& manager, int copyResult, const vxStringBase& source,
              const vxStringBase& destination) {
  if (copyResult == 0) return true;
  if (!vxIsAbsent(source)) vxLogFailedCopy(manager, source, destination);
  return false;
}

bool vxWroteBack(vxMigrationManager& manager, vxMappedINIFile& file) {
  const vxStringBase path(file.GetFilename());
  if (file.Close(1) == 0) return true;
  manager.Log(vxMsgUnableToWriteFile, path.c_str());
  return false;
}
