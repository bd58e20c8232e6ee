// Whole-file reading. Every system call is checked; an allocation that fails is a failed read,
// never an exception.

#include "foundation/files/whole_file.h"

#include <errno.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <new>
#include <stdexcept>

#include "foundation/files/run_doors.h"

namespace vxfiles {
namespace {

const size_t kFirstChunk = 64 * 1024;

bool ReadInto(int fd, size_t sizeHint, size_t limit, std::string* text) {
  text->resize(std::min(limit, std::max(sizeHint, kFirstChunk - 1)) + 1);
  size_t filled = 0;
  for (;;) {
    if (filled == text->size()) {
      if (text->size() > limit) return false;
      text->resize(text->size() <= limit / 2 ? text->size() * 2 : limit + 1);
    }
    const ssize_t n = read(fd, &(*text)[filled], text->size() - filled);
    if (n == 0) break;
    if (n < 0) {
      if (errno == EINTR) continue;
      return false;
    }
    filled += static_cast<size_t>(n);
  }
  text->resize(filled);
  return true;
}

}  // namespace

bool ReadRest(int fd, size_t sizeHint, size_t limit, std::string* text) {
  bool read = false;
  try {
    read = ReadInto(fd, sizeHint, limit, text);
  } catch (const std::bad_alloc&) {
    read = false;
  } catch (const std::length_error&) {
    read = false;
  }
  if (!read) text->clear();
  return read;
}

bool ReadWholeFile(const std::string& path, std::string* text, mode_t* mode, size_t limit) {
  text->clear();
  if (!MayRead(path)) return false;
  // Non-blocking, so that a pipe given as a settings file cannot stall the run before the check.
  const int fd = open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NOCTTY | O_NONBLOCK);
  if (fd < 0) return false;
  struct stat st;
  bool read = false;
  if (fstat(fd, &st) == 0 && S_ISREG(st.st_mode) && static_cast<uintmax_t>(st.st_size) <= limit) {
    if (mode != nullptr) *mode = st.st_mode & 07777;
    read = ReadRest(fd, static_cast<size_t>(st.st_size), limit, text);
  }
  close(fd);
  return read;
}

}  // namespace vxfiles
