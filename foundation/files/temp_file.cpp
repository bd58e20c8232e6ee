// Temporary names and the final rename. The name is unique enough to be created with O_EXCL on
// the first try; a clash just draws another one.

#ifndef _FILE_OFFSET_BITS
#define _FILE_OFFSET_BITS 64
#endif

#include "foundation/files/temp_file.h"

#include <dirent.h>
#include <fcntl.h>
#include <stdio.h>
#include <sys/stat.h>
#include <time.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <cstdint>
#include <cstring>
#include <vector>

#include "foundation/files/dir_entries.h"

namespace vxfiles {

namespace {

const int kMaxAttempts = 100;
// Keeps ".name.vxtmp.XXXXXX" within the 255 bytes a name may have.
const size_t kMaxNamePrefix = 200;

uint64_t Mix(uint64_t x) {  // splitmix64 finaliser
  x += 0x9e3779b97f4a7c15ULL;
  x = (x ^ (x >> 30)) * 0xbf58476d1ce4e5b9ULL;
  x = (x ^ (x >> 27)) * 0x94d049bb133111ebULL;
  return x ^ (x >> 31);
}

std::string NextTempName(const char* name) {
  // Seeded once: uniqueness comes from O_EXCL, the bits only make a clash (say, after a fork)
  // unlikely, so a system call per name would buy nothing.
  static const uint64_t seed = [] {
    struct timespec now;
    clock_gettime(CLOCK_REALTIME, &now);
    return (static_cast<uint64_t>(getpid()) << 40) ^ static_cast<uint64_t>(now.tv_nsec) ^
           (static_cast<uint64_t>(now.tv_sec) << 20);
  }();
  static std::atomic<uint64_t> counter{0};
  uint64_t bits = Mix(seed + counter.fetch_add(1));
  static const char kAlphabet[] =
      "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789";
  std::string result(".");
  result.append(name, strnlen(name, kMaxNamePrefix));
  result.append(".vxtmp.");
  for (int i = 0; i < 6; ++i) {
    result.push_back(kAlphabet[bits % 62]);
    bits /= 62;
  }
  return result;
}

}  // namespace

int CreateTempFileAt(int dirFd, const char* name, mode_t mode, std::string& tempName) {
  for (int attempt = 0; attempt < kMaxAttempts; ++attempt) {
    tempName = NextTempName(name);
    int fd = openat(dirFd, tempName.c_str(), O_RDWR | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC,
                    mode);
    if (fd >= 0) return fd;
    if (errno != EEXIST) break;
  }
  tempName.clear();  // nothing of ours to remove
  return -1;
}

int CreateTempLinkAt(int dirFd, const char* name, const char* target, std::string& tempName) {
  for (int attempt = 0; attempt < kMaxAttempts; ++attempt) {
    tempName = NextTempName(name);
    if (symlinkat(target, dirFd, tempName.c_str()) == 0) return 0;
    if (errno != EEXIST) break;
  }
  tempName.clear();
  return -1;
}

int CommitTempAt(int dirFd, const char* tempName, const char* name, bool replace) {
  if (replace) return renameat(dirFd, tempName, dirFd, name);
  if (renameat2(dirFd, tempName, dirFd, name, RENAME_NOREPLACE) == 0) return 0;
  if (errno != EINVAL && errno != ENOSYS && errno != EOPNOTSUPP) return -1;
  // The file system cannot rename without replacing: a hard link fails on an existing name just
  // as atomically.
  if (linkat(dirFd, tempName, dirFd, name, 0) == 0) {
    unlinkat(dirFd, tempName, 0);
    return 0;
  }
  if (errno != EPERM && errno != EOPNOTSUPP && errno != EMLINK) return -1;
  // No hard links either (FAT-like file systems): test, then rename. Only a creation racing
  // between the two calls could be replaced here.
  struct stat st;
  if (fstatat(dirFd, name, &st, AT_SYMLINK_NOFOLLOW) == 0) {
    errno = EEXIST;
    return -1;
  }
  return renameat(dirFd, tempName, dirFd, name);
}

bool IsTempName(const std::string& name) {
  static const char kMark[] = ".vxtmp.";
  const size_t mark = sizeof kMark - 1;
  if (name.size() < 1 + mark + 6 || name[0] != '.') return false;
  if (name.compare(name.size() - 6 - mark, mark, kMark) != 0) return false;
  for (size_t i = name.size() - 6; i < name.size(); ++i) {
    const char c = name[i];
    if (!((c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9'))) return false;
  }
  return true;
}

int RemoveStaleTempsAt(int dirFd) {
  // A descriptor of its own: reading a folder moves the reader's position.
  const int listFd = openat(dirFd, ".", O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  if (listFd < 0) return 0;
  std::vector<DirEntry> entries;
  std::vector<char> buffer;
  ReadDirEntries(listFd, entries, buffer);
  close(listFd);
  int removed = 0;
  for (const DirEntry& entry : entries) {
    if (!IsTempName(entry.name)) continue;
    const unsigned char type = ResolveType(dirFd, entry);
    if ((type == DT_REG || type == DT_LNK) && unlinkat(dirFd, entry.name.c_str(), 0) == 0) {
      ++removed;
    }
  }
  return removed;
}

}  // namespace vxfiles
