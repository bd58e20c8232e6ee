// Folder listings. Both are sorted bytewise and never follow a symbolic link into a folder, so a
// link loop or a link out of the installation can neither hang a listing nor widen it.

#ifndef _FILE_OFFSET_BITS
#define _FILE_OFFSET_BITS 64
#endif

#include "foundation/files/file_manager.h"

#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <string>
#include <vector>

#include "foundation/files/dir_entries.h"

namespace {

// Deeper trees than this are not walked: no real installation comes near it, and it bounds the
// stack and the descriptors a hostile tree could make us use.
const int kMaxFolderDepth = 256;

// Opens the folder to list; an empty text is the current folder.
int OpenFolder(const vxStringBase& folder) {
  const char* path = folder.isEmpty() ? "." : folder.c_str();
  return open(path, O_RDONLY | O_DIRECTORY | O_CLOEXEC);
}

// folder + '/' + name, both taken literally: the folder was opened as written, and a listed name
// is what the file system gave.
std::string JoinListed(const vxStringBase& folder, const std::string& name) {
  std::string path = folder.str();
  if (!path.empty() && path.back() != '/') path.push_back('/');
  path.append(name);
  return path;
}

struct FolderWalk {
  const char* pattern;
  bool recursive;
  bool listLinkedFolders;
  std::vector<vxStringBase>* list;
  std::vector<char> buffer;
  std::vector<vxfiles::FolderId> open;  // folders on the current descent, to refuse a loop
  int added = 0;
};

bool IsLinkToFolder(int dirFd, const std::string& name) {
  struct stat st;
  return fstatat(dirFd, name.c_str(), &st, 0) == 0 && S_ISDIR(st.st_mode);
}

void WalkFolders(FolderWalk& walk, int dirFd, const std::string& prefix, int depth) {
  struct stat self;
  if (fstat(dirFd, &self) != 0) return;
  vxfiles::FolderId id(self.st_dev, self.st_ino);
  // A bind mount can bring a folder back below itself without any symbolic link.
  if (std::find(walk.open.begin(), walk.open.end(), id) != walk.open.end()) return;
  std::vector<vxfiles::DirEntry> entries;
  vxfiles::ReadDirEntries(dirFd, entries, walk.buffer);
  walk.open.push_back(id);
  for (const vxfiles::DirEntry& entry : entries) {
    unsigned char type = vxfiles::ResolveType(dirFd, entry);
    bool matches = vxfiles::NameMatches(walk.pattern, entry.name.c_str());
    if (type == DT_LNK) {
      if (walk.listLinkedFolders && matches && IsLinkToFolder(dirFd, entry.name)) {
        walk.list->push_back(vxStringBase(std::string_view(prefix + entry.name)));
        ++walk.added;
      }
      continue;
    }
    if (type != DT_DIR) continue;
    if (matches) {
      walk.list->push_back(vxStringBase(std::string_view(prefix + entry.name)));
      ++walk.added;
    }
    if (!walk.recursive || depth >= kMaxFolderDepth) continue;
    int child = openat(dirFd, entry.name.c_str(),
                       O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC);
    if (child < 0) continue;  // unreadable or replaced meanwhile: listed, not descended
    WalkFolders(walk, child, prefix + entry.name + "/", depth + 1);
    close(child);
  }
  walk.open.pop_back();
}

}  // namespace

int vxFileManager::GetFileList(const vxStringBase& folder, const char* pattern,
                               vxFileInfoList& list, unsigned int followLinks) {
  int dirFd = OpenFolder(folder);
  if (dirFd < 0) return 0;
  std::vector<vxfiles::DirEntry> entries;
  std::vector<char> buffer;
  vxfiles::ReadDirEntries(dirFd, entries, buffer);
  close(dirFd);
  int added = 0;
  for (const vxfiles::DirEntry& entry : entries) {
    if (entry.type == DT_DIR) continue;
    if (!vxfiles::NameMatches(pattern, entry.name.c_str())) continue;
    vxFileInfo info(vxFilename(vxStringBase(std::string_view(JoinListed(folder, entry.name)))),
                    followLinks != 0);
    // Special files (pipes, sockets, devices) are not data; a pipe would even block a copy.
    bool wanted = info.IsRegular() || (followLinks == 0 && info.IsSymlink());
    if (!wanted) continue;
    list.push_back(info);
    ++added;
  }
  return added;
}

int vxFileManager::GetFolderList(const vxStringBase& folder, const char* pattern,
                                 std::vector<vxStringBase>& list, unsigned int recursive,
                                 unsigned int listLinkedFolders) {
  int dirFd = OpenFolder(folder);
  if (dirFd < 0) return 0;
  FolderWalk walk;
  walk.pattern = pattern;
  walk.recursive = recursive != 0;
  walk.listLinkedFolders = listLinkedFolders != 0;
  walk.list = &list;
  WalkFolders(walk, dirFd, std::string(), 0);
  close(dirFd);
  return walk.added;
}
