// Folder reading with getdents64: one system call per buffer full of names and no DIR allocation,
// which matters when a copy walks tens of thousands of folders.

#ifndef _FILE_OFFSET_BITS
#define _FILE_OFFSET_BITS 64  // 64-bit inode numbers and sizes on i386 too
#endif

#include "foundation/files/dir_entries.h"

#include <dirent.h>
#include <fcntl.h>
#include <fnmatch.h>
#include <sys/stat.h>

#include <algorithm>
#include <cerrno>
#include <cstddef>
#include <cstring>
#include <string_view>

namespace vxfiles {

namespace {
const size_t kDirBufferSize = 64 * 1024;
}  // namespace

bool ReadDirEntries(int fd, std::vector<DirEntry>& entries, std::vector<char>& buffer) {
  entries.clear();
  if (buffer.size() < kDirBufferSize) buffer.resize(kDirBufferSize);
  bool ok = true;
  for (;;) {
    ssize_t n = getdents64(fd, buffer.data(), buffer.size());
    if (n == 0) break;
    if (n < 0) {
      if (errno == EINTR) continue;
      ok = false;
      break;
    }
    for (ssize_t offset = 0; offset < n;) {
      const char* record = buffer.data() + offset;
      // The record's fields are read by memcpy: the buffer carries no alignment promise for us.
      unsigned short length;
      unsigned char type;
      memcpy(&length, record + offsetof(struct dirent64, d_reclen), sizeof length);
      memcpy(&type, record + offsetof(struct dirent64, d_type), sizeof type);
      if (length == 0) return false;  // a corrupt record would loop forever
      const char* name = record + offsetof(struct dirent64, d_name);
      size_t room = static_cast<size_t>(length) - offsetof(struct dirent64, d_name);
      size_t nameLength = strnlen(name, room);
      offset += length;
      if (nameLength == 0) continue;
      if (name[0] == '.' && (nameLength == 1 || (nameLength == 2 && name[1] == '.'))) continue;
      // The runs' own history is no installation file: no listing or copy ever meets it.
      if (std::string_view(name, nameLength) == kRunHistoryFolder) continue;
      entries.push_back(DirEntry{std::string(name, nameLength), type});
    }
  }
  std::sort(entries.begin(), entries.end(),
            [](const DirEntry& a, const DirEntry& b) { return a.name < b.name; });
  return ok;
}

unsigned char ResolveType(int dirFd, const DirEntry& entry) {
  if (entry.type != DT_UNKNOWN) return entry.type;
  struct stat st;
  if (fstatat(dirFd, entry.name.c_str(), &st, AT_SYMLINK_NOFOLLOW) != 0) return DT_UNKNOWN;
  return static_cast<unsigned char>(IFTODT(st.st_mode));
}

bool NameMatches(const char* pattern, const char* name) {
  if (pattern == nullptr || pattern[0] == '\0' || strcmp(pattern, "*") == 0 ||
      strcmp(pattern, "*.*") == 0) {
    return true;
  }
  return fnmatch(pattern, name, 0) == 0;
}

bool HasWildcard(const char* pattern) { return strpbrk(pattern, "*?[") != nullptr; }

void SplitPath(const std::string& path, std::string& folder, std::string& name) {
  size_t slash = path.rfind('/');
  if (slash == std::string::npos) {
    folder = ".";
    name = path;
    return;
  }
  folder = slash == 0 ? "/" : path.substr(0, slash);
  name = path.substr(slash + 1);
}

}  // namespace vxfiles
