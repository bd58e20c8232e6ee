// Whole-file reading for the INI model. Every system call is checked.

#include "foundation/inifile/ini_disk.h"

#include <errno.h>
#include <fcntl.h>
#include <stdlib.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <climits>
#include <cstdint>
#include <vector>

#include "foundation/files/run_doors.h"

namespace vxini {
namespace {

// Offsets into the text are 32-bit.
constexpr size_t kMaxFileSize = UINT32_MAX - 1;

}  // namespace

bool ReadWholeFile(const std::string& path, std::string* text, mode_t* mode) {
  text->clear();
  if (!vxfiles::MayRead(path)) return false;
  // Non-blocking, so that a pipe given as a settings file cannot stall the run before the check.
  int fd = open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NOCTTY | O_NONBLOCK);
  if (fd < 0) return false;
  struct stat st;
  if (fstat(fd, &st) != 0 || !S_ISREG(st.st_mode) || static_cast<uintmax_t>(st.st_size) > kMaxFileSize) {
    close(fd);
    return false;
  }
  if (mode != nullptr) *mode = st.st_mode & 07777;
  // One byte more than the size, so that a file that grew since fstat is noticed and read whole.
  text->resize(static_cast<size_t>(st.st_size) + 1);
  size_t filled = 0;
  bool ok = true;
  for (;;) {
    if (filled == text->size()) {
      if (text->size() > kMaxFileSize) {
        ok = false;
        break;
      }
      text->resize(std::min(kMaxFileSize + 1, text->size() * 2));
    }
    ssize_t n = read(fd, &(*text)[filled], text->size() - filled);
    if (n < 0) {
      if (errno == EINTR) continue;
      ok = false;
      break;
    }
    if (n == 0) break;
    filled += static_cast<size_t>(n);
  }
  close(fd);
  if (!ok) {
    text->clear();
    return false;
  }
  text->resize(filled);
  return true;
}

}  // namespace vxini
