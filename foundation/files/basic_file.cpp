// Whole-file reading and writing. A truncating open writes to a hidden temporary file beside the
// real one, renamed over it by Close; until then, and after any failure, the old content stays.

#ifndef _FILE_OFFSET_BITS
#define _FILE_OFFSET_BITS 64
#endif

#include "foundation/files/basic_file.h"

#include <fcntl.h>
#include <stdio.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <string>

#include "foundation/files/dir_entries.h"
#include "foundation/files/run_doors.h"
#include "foundation/files/temp_file.h"
#include "foundation/files/whole_file.h"
#include "foundation/files/write_all.h"

namespace {

// Opens the temporary file that a truncating open writes to. A symbolic link at name is replaced
// by the new file, never written through: after a copy it may point into the source installation.
// Returns the descriptor or -1.
int OpenRewrite(const std::string& name, int flags, mode_t permissions, std::string& tempName) {
  struct stat st;
  bool exists = stat(name.c_str(), &st) == 0;
  if (exists) {
    if ((flags & O_CREAT) && (flags & O_EXCL)) return -1;
    if (S_ISDIR(st.st_mode)) return -1;
    // The rename must not become a way around a file's write protection.
    if (access(name.c_str(), W_OK) != 0) return -1;
  } else if (!(flags & O_CREAT)) {
    return -1;
  }
  std::string folder, base;
  vxfiles::SplitPath(name, folder, base);
  int dirFd = open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  if (dirFd < 0) return -1;
  std::string temp;
  int fd = vxfiles::CreateTempFileAt(dirFd, base.c_str(), exists ? 0600 : permissions, temp);
  close(dirFd);
  if (fd < 0) {
    vxfiles::NoteWriteFailure(errno, name);
    return -1;
  }
  tempName = folder + "/" + temp;
  if (exists) {
    // Owner first: a change of owner clears the set-id bits that the mode then restores.
    if (fchown(fd, st.st_uid, st.st_gid) != 0) {
      // Only root may give a file away; anyone else keeps the file as their own.
    }
    if (fchmod(fd, st.st_mode & 07777) != 0) {
      vxfiles::NoteWriteFailure(errno, name);
      close(fd);
      unlink(tempName.c_str());
      tempName.clear();
      return -1;
    }
  }
  return fd;
}

}  // namespace

vxBasicFile::vxBasicFile(const vxStringBase& name, unsigned int openFlags, unsigned int accessMode,
                         unsigned int permissions)
    : name_(name.str()), flags_(openFlags | accessMode), permissions_(permissions) {}

vxBasicFile::~vxBasicFile() {
  if (fd_ >= 0) close(fd_);
  if (!tempName_.empty()) unlink(tempName_.c_str());
}

int vxBasicFile::Open() {
  if (fd_ >= 0) return 0;
  if (name_.empty()) return 1;
  writeFailed_ = false;
  int flags = static_cast<int>(flags_) | O_CLOEXEC;
  int access = flags & O_ACCMODE;
  mode_t permissions = permissions_ != 0 ? static_cast<mode_t>(permissions_) : 0666;
  if ((flags & O_TRUNC) && access != O_RDONLY) {
    if (!vxfiles::MayWrite(name_)) return 1;
    fd_ = OpenRewrite(name_, flags, permissions, tempName_);
    return fd_ >= 0 ? 0 : 1;
  }
  if (!vxfiles::MayRead(name_) || (access != O_RDONLY && !vxfiles::MayWriteInPlace(name_))) return 1;
  // Non-blocking until it is known to be a regular file: opening a pipe for reading would wait
  // for a writer, and reading a pipe or a device might never end.
  fd_ = open(name_.c_str(), flags | O_NONBLOCK, permissions);
  if (fd_ < 0 && access == O_RDWR && !(flags & O_CREAT) && (errno == EACCES || errno == EROFS)) {
    // A file we may read but not write (a read-only source installation) can still be read;
    // a Write then fails.
    fd_ = open(name_.c_str(), (flags & ~O_ACCMODE) | O_RDONLY | O_NONBLOCK);
  }
  if (fd_ < 0) return 1;
  struct stat st;
  if (fstat(fd_, &st) != 0 || !S_ISREG(st.st_mode)) {
    close(fd_);
    fd_ = -1;
    return 1;
  }
  fcntl(fd_, F_SETFL, fcntl(fd_, F_GETFL) & ~O_NONBLOCK);
  return 0;
}

int vxBasicFile::ReadAll(vxStringBase& text) {
  if (fd_ < 0) return 1;
  lseek(fd_, 0, SEEK_SET);  // the whole content, whatever was read before
  struct stat st;
  const bool sized = fstat(fd_, &st) == 0 && S_ISREG(st.st_mode);
  std::string content;
  if (!vxfiles::ReadRest(fd_, sized ? static_cast<size_t>(st.st_size) : 0, vxfiles::kMaxWholeFile,
                         &content)) {
    return 1;
  }
  text = vxStringBase(std::string_view(content));
  return 0;
}

int vxBasicFile::Write(const vxStringBase& text, unsigned long& written) {
  written = 0;
  if (fd_ < 0) return 1;
  if (!vxWriteAll(fd_, text.c_str(), text.length())) {
    writeFailed_ = true;  // a rewrite that missed bytes must not replace the old file
    vxfiles::NoteWriteFailure(errno, name_);
    return 1;
  }
  written = text.length();
  return 0;
}

int vxBasicFile::Close() {
  if (fd_ < 0) return 0;
  const bool closed = close(fd_) == 0;
  if (!closed) vxfiles::NoteWriteFailure(errno, name_);
  const bool ok = closed && !writeFailed_;
  fd_ = -1;
  if (tempName_.empty()) return ok ? 0 : 1;
  if (ok && rename(tempName_.c_str(), name_.c_str()) == 0) {
    tempName_.clear();
    return 0;
  }
  if (ok) vxfiles::NoteWriteFailure(errno, name_);
  unlink(tempName_.c_str());
  tempName_.clear();
  return 1;
}
