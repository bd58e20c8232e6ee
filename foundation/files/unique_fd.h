// A file descriptor with one owner, closed when the owner goes away, so that no early return can
// leak one. Move-only. Closing a descriptor that was written through is the caller's business
// (Close reports the error); the destructor closes quietly.

#ifndef VXMIGRATE_FOUNDATION_FILES_UNIQUE_FD_H_
#define VXMIGRATE_FOUNDATION_FILES_UNIQUE_FD_H_

#include <unistd.h>

#include <utility>

namespace vxfiles {

class UniqueFd {
 public:
  UniqueFd() = default;
  explicit UniqueFd(int fd) : fd_(fd) {}
  ~UniqueFd() { Reset(); }

  UniqueFd(UniqueFd&& other) noexcept : fd_(other.Release()) {}
  UniqueFd& operator=(UniqueFd&& other) noexcept {
    if (this != &other) Reset(other.Release());
    return *this;
  }
  UniqueFd(const UniqueFd&) = delete;
  UniqueFd& operator=(const UniqueFd&) = delete;

  int get() const { return fd_; }
  bool valid() const { return fd_ >= 0; }

  // Closes what it holds (if anything) and takes fd.
  void Reset(int fd = -1) {
    if (fd_ >= 0) ::close(fd_);
    fd_ = fd;
  }
  // Gives the descriptor up without closing it.
  int Release() { return std::exchange(fd_, -1); }
  // Closes now; false when close(2) reported an error (for a written file, a lost write). Holds
  // nothing afterwards either way.
  [[nodiscard]] bool Close() { return fd_ < 0 || ::close(Release()) == 0; }

 private:
  int fd_ = -1;
};

}  // namespace vxfiles

#endif  // VXMIGRATE_FOUNDATION_FILES_UNIQUE_FD_H_
