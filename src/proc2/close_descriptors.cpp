// Closing every descriptor above the standard three in a child before exec. /proc/self/fd is read
// with getdents64 into a stack buffer because opendir would allocate.

#include "src/proc2/close_descriptors.h"

#include <fcntl.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <climits>
#include <cstddef>
#include <cstdint>
#include <cstring>

namespace vxproc2 {
namespace {

// The kernel's record for one directory entry as getdents64 returns it.
struct DirectoryEntry64 {
  uint64_t inode;
  int64_t offset;
  unsigned short length;
  unsigned char type;
  char name[1];
};

// The descriptor a /proc/self/fd entry names; -1 for "." and "..".
int DescriptorNamed(const char* name) {
  if (*name == '\0') return -1;
  long value = 0;
  for (; *name != '\0'; ++name) {
    if (*name < '0' || *name > '9' || value > INT_MAX / 10) return -1;
    value = value * 10 + (*name - '0');
  }
  return value > INT_MAX ? -1 : static_cast<int>(value);
}

// Closes the descriptors listed in /proc/self/fd; false when the listing cannot be read.
bool CloseListedDescriptors() {
  const int folder = open("/proc/self/fd", O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  if (folder < 0) return false;
  alignas(8) char buffer[4096];
  for (;;) {
    const long filled = syscall(SYS_getdents64, folder, buffer, sizeof buffer);
    if (filled < 0) {
      close(folder);
      return false;
    }
    if (filled == 0) break;
    // The listing is indexed by descriptor number, so closing while reading skips nothing.
    for (long at = 0; at < filled;) {
      const char* record = buffer + at;
      unsigned short length = 0;
      memcpy(&length, record + offsetof(DirectoryEntry64, length), sizeof length);
      if (length == 0) break;
      const int fd = DescriptorNamed(record + offsetof(DirectoryEntry64, name));
      if (fd >= 3 && fd != folder) close(fd);
      at += length;
    }
  }
  close(folder);
  return true;
}

}  // namespace

long DescriptorLimit() {
  const long limit = sysconf(_SC_OPEN_MAX);
  return limit > 0 ? limit : 1024;
}

void CloseDescriptorsFrom3(long limit) {
#ifdef SYS_close_range
  if (syscall(SYS_close_range, 3u, ~0u, 0u) == 0) return;
#endif
  if (CloseListedDescriptors()) return;
  for (long fd = 3; fd < limit; ++fd) close(static_cast<int>(fd));
}

}  // namespace vxproc2
