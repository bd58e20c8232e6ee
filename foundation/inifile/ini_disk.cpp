// Whole-file reading and atomic replacement for the INI model. Every system call is checked; a
// failure leaves the old file in place and no temporary file behind.

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
#include "foundation/files/write_all.h"

namespace vxini {
namespace {

// Offsets into the text are 32-bit.
constexpr size_t kMaxFileSize = UINT32_MAX - 1;
constexpr size_t kMaxTempBase = 200;

// umask can only be read by setting it; the library runs on one thread, so the moment between the
// two calls is harmless.
mode_t CurrentUmask() {
  mode_t mask = umask(0);
  umask(mask);
  return mask;
}

std::string FolderOf(const std::string& path) {
  size_t slash = path.rfind('/');
  if (slash == std::string::npos) return ".";
  if (slash == 0) return "/";
  return path.substr(0, slash);
}

bool SyncFolder(const std::string& folder) {
  int fd = open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  if (fd < 0) return false;
  bool ok = fsync(fd) == 0;
  close(fd);
  return ok;
}

}  // namespace

bool ReadWholeFile(const std::string& path, std::string* text) {
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

bool ResolveReplaceTarget(const std::string& path, ReplaceTarget* target) {
  if (path.empty()) return false;
  struct stat st;
  if (lstat(path.c_str(), &st) != 0) {
    if (errno != ENOENT) return false;
    target->path = path;
    target->exists = false;
    target->mode = 0666 & ~CurrentUmask();
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
  if (!tempPath_.empty()) unlink(tempPath_.c_str());
  tempPath_.clear();
}

bool AtomicFileWriter::Begin(const ReplaceTarget& target) {
  Abandon();
  target_ = target;
  failed_ = false;
  if (!vxfiles::MayWrite(target.path)) return false;
  std::string folder = FolderOf(target.path);
  size_t slash = target.path.rfind('/');
  std::string base = slash == std::string::npos ? target.path : target.path.substr(slash + 1);
  // The temporary name adds 14 bytes; a name near the 255-byte limit must still be savable.
  if (base.size() > kMaxTempBase) base.resize(kMaxTempBase);
  std::string pattern = folder + "/." + base + ".vxtmp.XXXXXX";
  std::vector<char> name(pattern.begin(), pattern.end());
  name.push_back('\0');
  fd_ = mkostemp(name.data(), O_CLOEXEC);
  if (fd_ < 0) return false;
  tempPath_ = name.data();
  return true;
}

bool AtomicFileWriter::Append(std::string_view data) {
  if (failed_ || fd_ < 0) return false;
  if (!vxWriteAll(fd_, data.data(), data.size())) failed_ = true;
  return !failed_;
}

bool AtomicFileWriter::Commit(bool flushToDisk) {
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
  if (!ok || rename(tempPath_.c_str(), target_.path.c_str()) != 0) {
    Abandon();
    return false;
  }
  tempPath_.clear();
  if (flushToDisk && !SyncFolder(FolderOf(target_.path))) return false;
  return true;
}

}  // namespace vxini
