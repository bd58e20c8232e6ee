// Writing a whole buffer to a descriptor: write(2) may take less than it was given or be
// interrupted, and every caller that rewrites a file must not lose the rest.

#ifndef VXMIGRATE_FOUNDATION_FILES_WRITE_ALL_H_
#define VXMIGRATE_FOUNDATION_FILES_WRITE_ALL_H_

#include <unistd.h>

#include <cerrno>
#include <cstddef>

// True when all size bytes were written; false on the first error other than EINTR.
[[nodiscard]] inline bool vxWriteAll(int fd, const char* data, size_t size) {
  while (size > 0) {
    ssize_t n = write(fd, data, size);
    if (n < 0) {
      if (errno == EINTR) continue;
      return false;
    }
    data += n;
    size -= static_cast<size_t>(n);
  }
  return true;
}

#endif  // VXMIGRATE_FOUNDATION_FILES_WRITE_ALL_H_
