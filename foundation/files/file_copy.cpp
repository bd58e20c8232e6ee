// Copies of one file, of a folder's whole tree, and of a "folder/pattern" set. Each file is written
// to a hidden temporary name beside its destination and renamed into place once complete, so a
// destination name never shows a partial file; an existing destination is replaced only when the
// caller asks. Symbolic links in the source are copied as links and never followed. Every folder
// written into and every file or folder read by name passes the run's doors first.

#ifndef _FILE_OFFSET_BITS
#define _FILE_OFFSET_BITS 64
#endif

#include "foundation/files/file_manager.h"

#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <string>
#include <vector>

#include "foundation/files/dir_entries.h"
#include "foundation/files/run_doors.h"
#include "foundation/files/temp_file.h"
#include "foundation/files/unique_fd.h"
#include "foundation/files/write_all.h"

namespace {

using vxfiles::FolderId;
using vxfiles::UniqueFd;

// Deeper trees are refused: no installation comes near it, and each level holds two descriptors.
const int kMaxTreeDepth = 256;
const size_t kKernelChunk = 1u << 30;
const size_t kCopyBufferSize = 256 * 1024;
// O_NONBLOCK: a pipe met where a file was expected must not hang the run (fstat then rejects it).
const int kOpenSource = O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC;
const int kOpenFolder = O_RDONLY | O_DIRECTORY | O_CLOEXEC;

enum class Outcome {
  kCopied,
  kLeftInPlace,  // the destination exists and the caller's flags keep it
  kSkipped,      // not data: a pipe, socket or device
  kFailed,
};

// State shared by every file of one CopyFile call, so a tree of thousands of files allocates its
// buffers once and learns once that the kernel copy does not work between its file systems.
struct CopyJob {
  bool replace = false;
  bool newerOnly = false;
  bool kernelCopy = true;
  bool failed = false;
  bool hasDestRoot = false;
  FolderId destRoot;
  std::string destPath;  // the destination folder being filled, for the doors
  std::vector<char> copyBuffer;
  std::vector<char> dirBuffer;
  std::vector<FolderId> openFolders;  // source folders on the current descent
};

// A source entry ready to be written out: an open regular file, or a link's target text.
struct Source {
  UniqueFd fd;
  bool isLink = false;
  struct stat st;
  std::string linkTarget;
};

bool Newer(const struct timespec& a, const struct timespec& b) {
  return a.tv_sec > b.tv_sec || (a.tv_sec == b.tv_sec && a.tv_nsec > b.tv_nsec);
}

bool ReadLinkAt(int dirFd, const char* name, size_t sizeHint, std::string& target) {
  std::vector<char> buffer(sizeHint > 0 ? sizeHint + 1 : 256);
  for (;;) {
    ssize_t n = readlinkat(dirFd, name, buffer.data(), buffer.size());
    if (n < 0) return false;
    if (static_cast<size_t>(n) < buffer.size()) {
      target.assign(buffer.data(), static_cast<size_t>(n));
      return true;
    }
    if (buffer.size() >= 65536) return false;
    buffer.resize(buffer.size() * 2);
  }
}

// Opens the entry name of the folder dirFd (AT_FDCWD with a path for a single file) for copying.
// kCopied means src is ready.
Outcome OpenSource(int dirFd, const char* name, Source& src) {
  src.fd.Reset(openat(dirFd, name, kOpenSource));
  if (src.fd.valid()) {
    if (fstat(src.fd.get(), &src.st) != 0) return Outcome::kFailed;
    if (S_ISREG(src.st.st_mode)) return Outcome::kCopied;
    return S_ISDIR(src.st.st_mode) ? Outcome::kFailed : Outcome::kSkipped;
  }
  if (errno != ELOOP) return Outcome::kFailed;
  // O_NOFOLLOW refused it: a symbolic link, copied as the link itself.
  if (fstatat(dirFd, name, &src.st, AT_SYMLINK_NOFOLLOW) != 0 || !S_ISLNK(src.st.st_mode)) {
    return Outcome::kFailed;
  }
  src.isLink = true;
  return ReadLinkAt(dirFd, name, static_cast<size_t>(src.st.st_size), src.linkTarget)
             ? Outcome::kCopied
             : Outcome::kFailed;
}

// Whether an existing destination stands in the way; kCopied means go ahead. A fresh folder has
// nothing in it, and a plain replacing copy lets the rename decide (it never puts a file over a
// folder), so neither costs a lookup.
Outcome CheckDestination(const CopyJob& job, int dstDirFd, const char* name, const Source& src,
                         bool destFresh) {
  if (destFresh || (job.replace && !job.newerOnly)) return Outcome::kCopied;
  struct stat dst;
  if (fstatat(dstDirFd, name, &dst, AT_SYMLINK_NOFOLLOW) != 0) return Outcome::kCopied;
  if (S_ISDIR(dst.st_mode)) return Outcome::kFailed;
  if (!job.replace) return Outcome::kLeftInPlace;
  return Newer(src.st.st_mtim, dst.st_mtim) ? Outcome::kCopied : Outcome::kLeftInPlace;
}

// Whether setting a mode or times worked, or failed only because the destination's file system
// cannot hold them (a copy onto such a disk keeps its content all the same).
bool KeptOrUnsupported(int result) {
  return result == 0 || errno == EPERM || errno == ENOTSUP || errno == EOPNOTSUPP;
}

// A folder the copy created takes its source's mode and times once it is filled (filling it would
// change its times again). False when the disk failed to take them.
bool StampFolder(int fd, const struct stat& source) {
  const struct timespec times[2] = {source.st_atim, source.st_mtim};
  return KeptOrUnsupported(fchmod(fd, source.st_mode & 07777)) &&
         KeptOrUnsupported(futimens(fd, times));
}

// Records a failed write of the copy (errno) on path: the copy fails, and the run's doors hear it.
void NoteFailure(CopyJob& job, const std::string& path) {
  job.failed = true;
  vxfiles::NoteWriteFailure(errno, path);
}

// Copies the content of in to out, both at their current offsets. The kernel copy serves the
// bytes fstat promised; read(2) finishes whatever it could not, up to the real end of the file.
bool CopyBytes(CopyJob& job, int in, int out, off_t size) {
  off_t done = 0;
  while (job.kernelCopy && done < size) {
    ssize_t n = copy_file_range(in, nullptr, out, nullptr, kKernelChunk, 0);
    if (n > 0) {
      done += n;
    } else if (n == 0) {
      break;
    } else if (errno == EXDEV || errno == ENOSYS || errno == EINVAL || errno == EOPNOTSUPP) {
      job.kernelCopy = false;  // these file systems won't; don't ask again for every file
    } else if (errno != EINTR) {
      return false;
    }
  }
  if (size > 0 && done >= size) return true;
  if (job.copyBuffer.empty()) job.copyBuffer.resize(kCopyBufferSize);
  for (;;) {
    ssize_t n = read(in, job.copyBuffer.data(), job.copyBuffer.size());
    if (n == 0) return true;
    if (n < 0) {
      if (errno == EINTR) continue;
      return false;
    }
    if (!vxWriteAll(out, job.copyBuffer.data(), static_cast<size_t>(n))) return false;
  }
}

// Writes the temporary entry for src; mode and times are kept where the file system can hold
// them (only a disk that fails to take them fails the copy).
bool WriteTemp(CopyJob& job, const Source& src, int dstDirFd, const char* name,
               std::string& temp) {
  const struct timespec times[2] = {src.st.st_atim, src.st.st_mtim};
  if (src.isLink) {
    if (vxfiles::CreateTempLinkAt(dstDirFd, name, src.linkTarget.c_str(), temp) != 0) {
      return false;
    }
    return KeptOrUnsupported(utimensat(dstDirFd, temp.c_str(), times, AT_SYMLINK_NOFOLLOW));
  }
  // 0600 until complete: nobody else reads a file that is still being written.
  UniqueFd out(vxfiles::CreateTempFileAt(dstDirFd, name, 0600, temp));
  if (!out.valid()) return false;
  const bool ok = CopyBytes(job, src.fd.get(), out.get(), src.st.st_size) &&
                  KeptOrUnsupported(fchmod(out.get(), src.st.st_mode & 07777)) &&
                  KeptOrUnsupported(futimens(out.get(), times));
  return out.Close() && ok;
}

Outcome WriteDestination(CopyJob& job, const Source& src, int dstDirFd, const char* name,
                         bool destFresh) {
  Outcome gate = CheckDestination(job, dstDirFd, name, src, destFresh);
  if (gate != Outcome::kCopied) return gate;
  if (!vxfiles::MayWriteAt(dstDirFd, name)) return Outcome::kFailed;
  std::string temp;
  bool written = WriteTemp(job, src, dstDirFd, name, temp);
  if (written && vxfiles::CommitTempAt(dstDirFd, temp.c_str(), name, job.replace) == 0) {
    return Outcome::kCopied;
  }
  int error = errno;
  if (!temp.empty()) unlinkat(dstDirFd, temp.c_str(), 0);
  // Created by someone else since the check: theirs stays.
  if (written && error == EEXIST && !job.replace) return Outcome::kLeftInPlace;
  vxfiles::NoteWriteFailure(error, job.destPath.empty() ? name : job.destPath + "/" + name);
  return Outcome::kFailed;
}

Outcome CopyEntry(CopyJob& job, int srcDirFd, const char* name, int dstDirFd, bool destFresh) {
  Source src;
  Outcome opened = OpenSource(srcDirFd, name, src);
  if (opened != Outcome::kCopied) return opened;
  return WriteDestination(job, src, dstDirFd, name, destFresh);
}

void Record(CopyJob& job, Outcome outcome) {
  if (outcome == Outcome::kFailed) job.failed = true;
}

void CopyFolderContents(CopyJob& job, int srcFd, int dstFd, bool destFresh, int depth);

// Copies the sub-folder name of srcParent into the same name under dstParent.
void CopySubFolder(CopyJob& job, int srcParent, const char* name, int dstParent, int depth) {
  if (depth > kMaxTreeDepth) {
    job.failed = true;
    return;
  }
  UniqueFd srcFd(openat(srcParent, name, kOpenFolder | O_NOFOLLOW));
  struct stat st;
  if (!srcFd.valid() || fstat(srcFd.get(), &st) != 0) {
    job.failed = true;
    return;
  }
  FolderId id(st.st_dev, st.st_ino);
  // Our own destination inside the source, or a bind mount bringing a folder back below itself:
  // copying it again would never end.
  bool loop = (job.hasDestRoot && id == job.destRoot) ||
              std::find(job.openFolders.begin(), job.openFolders.end(), id) !=
                  job.openFolders.end();
  if (loop) return;
  const size_t parentPathSize = job.destPath.size();
  job.destPath.append("/").append(name);
  // Made private while it fills (a read-only source folder must not lock us out of its copy);
  // its own mode and times follow once it is complete.
  bool fresh = vxfiles::MayWriteAt(dstParent, name) && mkdirat(dstParent, name, 0700) == 0;
  if (!fresh && errno != EEXIST) vxfiles::NoteWriteFailure(errno, job.destPath);
  UniqueFd dstFd((fresh || errno == EEXIST) ? openat(dstParent, name, kOpenFolder | O_NOFOLLOW)
                                            : -1);
  // An existing destination folder that is a link is written through only when it leads to a
  // folder inside the destination installation.
  if (!dstFd.valid() && errno == ELOOP && vxfiles::MayWriteInto(job.destPath)) {
    dstFd.Reset(openat(dstParent, name, kOpenFolder));
  }
  if (!dstFd.valid()) {
    job.destPath.resize(parentPathSize);
    job.failed = true;
    return;
  }
  if (!fresh) vxfiles::RemoveStaleTempsAt(dstFd.get());  // what a killed run left here
  job.openFolders.push_back(id);
  CopyFolderContents(job, srcFd.get(), dstFd.get(), fresh, depth);
  job.openFolders.pop_back();
  if (fresh && !StampFolder(dstFd.get(), st)) NoteFailure(job, job.destPath);
  job.destPath.resize(parentPathSize);
}

void CopyFolderContents(CopyJob& job, int srcFd, int dstFd, bool destFresh, int depth) {
  std::vector<vxfiles::DirEntry> entries;
  if (!vxfiles::ReadDirEntries(srcFd, entries, job.dirBuffer)) job.failed = true;
  for (const vxfiles::DirEntry& entry : entries) {
    switch (vxfiles::ResolveType(srcFd, entry)) {
      case DT_DIR:
        CopySubFolder(job, srcFd, entry.name.c_str(), dstFd, depth + 1);
        break;
      case DT_REG:
      case DT_LNK:
        Record(job, CopyEntry(job, srcFd, entry.name.c_str(), dstFd, destFresh));
        break;
      default:
        break;  // gone meanwhile, or not data
    }
  }
}

// The path without its closing separators; the root stays "/".
std::string TrimFolder(const std::string& path) {
  size_t end = path.size();
  while (end > 1 && path[end - 1] == '/') --end;
  return path.substr(0, end);
}

// Opens the destination folder, creating it and its parents when missing. fresh tells whether
// this call made the folder itself.
UniqueFd OpenDestinationFolder(const std::string& path, bool& fresh) {
  fresh = false;
  if (!vxfiles::MayWriteInto(path)) return UniqueFd();
  std::string folder = TrimFolder(path);
  // Opened first: a run copying thousands of files into one folder makes it once, never asks
  // mkdir again.
  UniqueFd fd(open(folder.c_str(), kOpenFolder));
  if (fd.valid() || errno != ENOENT) return fd;
  fresh = mkdir(folder.c_str(), 0777) == 0;
  if (!fresh && errno == ENOENT) {
    fresh = vxFileManager::CreateDirectory(vxStringBase(std::string_view(folder)), nullptr) == 0;
  } else if (!fresh && errno != EEXIST) {
    vxfiles::NoteWriteFailure(errno, folder);
  }
  return UniqueFd(open(folder.c_str(), kOpenFolder));
}

FolderId IdOf(int fd) {
  struct stat st;
  if (fstat(fd, &st) != 0) return FolderId(0, 0);
  return FolderId(st.st_dev, st.st_ino);
}

// A single file: to is the destination file's path.
int CopySingleFile(CopyJob& job, const std::string& from, const std::string& to) {
  std::string parent, name;
  vxfiles::SplitPath(to, parent, name);
  if (name.empty()) return 1;
  // The source is opened first, so a missing or unreadable one leaves no trace at the destination.
  Source src;
  if (OpenSource(AT_FDCWD, from.c_str(), src) != Outcome::kCopied) return 1;
  bool fresh;
  UniqueFd dstFd = OpenDestinationFolder(parent, fresh);
  if (!dstFd.valid()) return 1;
  Outcome outcome = WriteDestination(job, src, dstFd.get(), name.c_str(), false);
  // Callers report "copied" on 0: a destination that was kept was not copied.
  return outcome == Outcome::kCopied ? 0 : 1;
}

// The entries of folder whose names match pattern, not descending, into the folder to.
int CopyMatchingFiles(CopyJob& job, const std::string& folder, const std::string& pattern,
                      const std::string& to) {
  if (!vxfiles::MayRead(folder)) return 1;
  UniqueFd srcFd(open(folder.c_str(), kOpenFolder));
  if (!srcFd.valid()) return 1;
  std::vector<vxfiles::DirEntry> entries;
  if (!vxfiles::ReadDirEntries(srcFd.get(), entries, job.dirBuffer)) job.failed = true;
  UniqueFd dstFd;
  for (const vxfiles::DirEntry& entry : entries) {
    if (!vxfiles::NameMatches(pattern.c_str(), entry.name.c_str())) continue;
    unsigned char type = vxfiles::ResolveType(srcFd.get(), entry);
    if (type != DT_REG && type != DT_LNK) continue;
    if (!dstFd.valid()) {  // made only when there is something to put in it
      bool fresh;
      dstFd = OpenDestinationFolder(to, fresh);
      if (!dstFd.valid()) return 1;
      // The files are already where they should go.
      if (IdOf(dstFd.get()) == IdOf(srcFd.get())) break;
    }
    Record(job, CopyEntry(job, srcFd.get(), entry.name.c_str(), dstFd.get(), false));
  }
  return job.failed ? 1 : 0;
}

// tree 1: a folder's whole tree, a "folder/pattern" set, or a single file, into the folder to.
int CopyIntoFolder(CopyJob& job, const std::string& from, const std::string& to) {
  if (!vxfiles::MayRead(from)) return 1;
  UniqueFd srcFd(open(from.c_str(), kOpenFolder));
  if (!srcFd.valid()) {
    int error = errno;
    std::string folder, last;
    vxfiles::SplitPath(from, folder, last);
    if (error == ENOENT && vxfiles::HasWildcard(last.c_str())) {
      return CopyMatchingFiles(job, folder, last, to);
    }
    if (error != ENOTDIR || last.empty()) return 1;
    Source src;  // a file named as the source: it goes into the folder under its own name
    Outcome opened = OpenSource(AT_FDCWD, from.c_str(), src);
    if (opened != Outcome::kCopied) return opened == Outcome::kSkipped ? 0 : 1;
    bool fresh;
    UniqueFd dstFd = OpenDestinationFolder(to, fresh);
    if (!dstFd.valid()) return 1;
    Outcome outcome = WriteDestination(job, src, dstFd.get(), last.c_str(), fresh);
    return outcome == Outcome::kFailed ? 1 : 0;
  }
  struct stat st;
  bool fresh;
  UniqueFd dstFd = fstat(srcFd.get(), &st) == 0 ? OpenDestinationFolder(to, fresh) : UniqueFd();
  if (!dstFd.valid()) return 1;
  FolderId srcId(st.st_dev, st.st_ino);
  job.destRoot = IdOf(dstFd.get());
  job.hasDestRoot = true;
  job.destPath = TrimFolder(to);
  if (job.destRoot != srcId) {
    job.openFolders.push_back(srcId);
    CopyFolderContents(job, srcFd.get(), dstFd.get(), fresh, 0);
    if (fresh && !StampFolder(dstFd.get(), st)) NoteFailure(job, job.destPath);
  }
  return job.failed ? 1 : 0;
}

}  // namespace

int vxFileManager::CopyFile(const vxStringBase& from, const vxStringBase& to, unsigned int tree,
                            unsigned int replace, unsigned int newerOnly,
                            unsigned int /*reserved1*/, unsigned int /*reserved2*/,
                            const char* /*text1*/, const char* /*text2*/) {
  if (from.isEmpty() || to.isEmpty()) return 1;
  CopyJob job;
  job.replace = replace != 0;
  job.newerOnly = newerOnly != 0;
  if (tree != 0) return CopyIntoFolder(job, from.str(), to.str());
  if (!vxfiles::MayRead(from.view()) || !vxfiles::MayWrite(to.view())) return 1;
  return CopySingleFile(job, from.str(), to.str());
}

int vxFileManager::CopyFile(const vxFilename& from, const vxFilename& to, unsigned int tree,
                            unsigned int replace, unsigned int newerOnly, unsigned int reserved1,
                            unsigned int reserved2, const char* text1, const char* text2) {
  return CopyFile(from.Pathname(), to.Pathname(), tree, replace, newerOnly, reserved1, reserved2,
                  text1, text2);
}
