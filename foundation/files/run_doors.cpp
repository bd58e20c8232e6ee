// The run's doors: real paths resolved once, folders compared by device and inode, and a memo of
// which installation each real folder lies in, so that thousands of writes into a few folders cost
// one path resolution each and no walk to the root.

#include "foundation/files/run_doors.h"

#include <errno.h>
#include <fcntl.h>
#include <stdlib.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstring>
#include <string_view>
#include <vector>

#include "foundation/files/file_manager.h"
#include "foundation/files/path_text.h"
#include "foundation/files/temp_file.h"

namespace {

using vxfiles::AbsoluteText;
using vxfiles::RealPath;

vxRunDoors* g_current = nullptr;

// The folder that holds path ("/a/b" -> "/a", "/a" -> "/"); path is absolute.
std::string ParentOf(const std::string& path) {
  size_t slash = path.rfind('/');
  return slash == 0 || slash == std::string::npos ? "/" : path.substr(0, slash);
}

std::string LastPart(const std::string& path) {
  size_t slash = path.rfind('/');
  return slash == std::string::npos ? path : path.substr(slash + 1);
}

// The real path of an absolute folder, where folders at its end that do not exist yet count as
// made inside the last one that does. False when a part exists but cannot be resolved (a link that
// leads nowhere, a loop, a file on the way) or a missing part is "." or "..".
bool ResolveFolder(std::string folder, std::string& real) {
  for (;;) {
    if (RealPath(folder, real)) return true;
    struct stat st;
    if (errno != ENOENT || lstat(folder.c_str(), &st) == 0 || errno != ENOENT) return false;
    const std::string last = LastPart(folder);
    if (last == "." || last == "..") return false;
    folder = ParentOf(folder);
  }
}

bool StartsWithFolder(const std::string& path, const std::string& folder) {
  if (folder.empty() || path.compare(0, folder.size(), folder) != 0) return false;
  return path.size() == folder.size() || path[folder.size()] == '/' || folder == "/";
}

}  // namespace

vxRunDoors::vxRunDoors(const vxStringBase& source, const vxStringBase& destination,
                       Reporter reporter)
    : reporter_(std::move(reporter)),
      sourceText_(AbsoluteText(source.view())),
      destinationText_(AbsoluteText(destination.view())) {
  struct stat st;
  if (!sourceText_.empty() && RealPath(sourceText_, sourceReal_) &&
      stat(sourceReal_.c_str(), &st) == 0 && S_ISDIR(st.st_mode)) {
    source_ = {st.st_dev, st.st_ino, true};
  }
  if (!destinationText_.empty() && RealPath(destinationText_, destinationReal_) &&
      stat(destinationReal_.c_str(), &st) == 0 && S_ISDIR(st.st_mode)) {
    destination_ = {st.st_dev, st.st_ino, true};
  }
  inPlace_ = source_.known && destination_.known && source_.dev == destination_.dev &&
             source_.ino == destination_.ino;
  if (source_.known && destination_.known && !inPlace_) {
    for (std::string walk = destinationReal_; walk != "/";) {
      walk = ParentOf(walk);
      if (stat(walk.c_str(), &st) == 0 && st.st_dev == source_.dev && st.st_ino == source_.ino) {
        destinationInsideSource_ = true;
        break;
      }
    }
  }
  previous_ = g_current;
  g_current = this;
}

// Doors usually close in the reverse order of opening; any other order still unlinks these.
vxRunDoors::~vxRunDoors() {
  vxRunDoors** link = &g_current;
  while (*link != nullptr && *link != this) link = &(*link)->previous_;
  if (*link == this) *link = previous_;
}

vxRunDoors* vxRunDoors::Current() { return g_current; }

void vxRunDoors::Refuse(const char* text, std::string_view path) const {
  if (reporter_) reporter_(text, std::string(path).c_str());
}

// Walks up from a real folder until an installation folder is met. The destination is looked for
// first, so an in-place run (one folder) counts as writing its destination.
vxRunDoors::Within vxRunDoors::Locate(const std::string& realFolder) {
  auto known = located_.find(realFolder);
  if (known != located_.end()) return known->second;
  Within within = Within::kNeither;
  struct stat st;
  if (stat(realFolder.c_str(), &st) == 0) {
    if (destination_.known && st.st_dev == destination_.dev && st.st_ino == destination_.ino) {
      within = Within::kDestination;
    } else if (source_.known && st.st_dev == source_.dev && st.st_ino == source_.ino) {
      within = Within::kSource;
    } else if (realFolder != "/") {
      within = Locate(ParentOf(realFolder));
    }
  }
  located_.emplace(realFolder, within);
  return within;
}

bool vxRunDoors::AdmitWriteBelow(const std::string& folder, std::string_view path) {
  if (!destination_.known) {
    Refuse("Error: No destination installation to write in: ", path);
    return false;
  }
  if (destinationInsideSource_) {
    Refuse("Error: Refused to write inside the source installation: ", path);
    return false;
  }
  std::string real;
  if (!realPaths_.Folder(folder, real) && !ResolveFolder(folder, real)) {
    Refuse("Error: Refused to write where the path cannot be followed: ", path);
    return false;
  }
  switch (Locate(real)) {
    case Within::kDestination:
      SweepOnce(real);
      return true;
    case Within::kSource:
      Refuse("Error: Refused to write inside the source installation: ", path);
      return false;
    case Within::kNeither:
      break;
  }
  Refuse("Error: Refused to write outside the destination installation: ", path);
  return false;
}

// The first write into a folder of the destination clears the temporary files a killed run left
// there; the destination lock keeps any live run's own out of the way.
void vxRunDoors::SweepOnce(const std::string& realFolder) {
  if (!swept_.insert(realFolder).second) return;
  const int fd = open(realFolder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  if (fd < 0) return;
  vxfiles::RemoveStaleTempsAt(fd);
  close(fd);
}

void vxRunDoors::NoteWriteFailure(int error, std::string_view path) {
  if (stoppedBy_ != 0 || (error != ENOSPC && error != EDQUOT && error != EIO)) return;
  stoppedBy_ = error;
  const std::string text =
      std::string("Error: Writing stopped (") + strerror(error) + ") after a failed write to: ";
  Refuse(text.c_str(), path);
}

bool vxRunDoors::AdmitWrite(std::string_view path) {
  if (stoppedBy_ != 0) {
    errno = stoppedBy_;
    return false;
  }
  const std::string text = AbsoluteText(path);
  const std::string last = LastPart(text);
  if (text.empty() || text == "/" || last == "." || last == "..") {
    Refuse("Error: Refused to write an entry without a name: ", path);
    return false;
  }
  return AdmitWriteBelow(ParentOf(text), path);
}

bool vxRunDoors::AdmitWriteInto(std::string_view folder) {
  if (stoppedBy_ != 0) {
    errno = stoppedBy_;
    return false;
  }
  const std::string text = AbsoluteText(folder);
  if (text.empty()) {
    Refuse("Error: Refused to write an entry without a name: ", folder);
    return false;
  }
  return AdmitWriteBelow(text, folder);
}

bool vxRunDoors::IsInstallationText(const std::string& path) const {
  for (const std::string* folder :
       {&sourceText_, &destinationText_, &sourceReal_, &destinationReal_}) {
    if (StartsWithFolder(path, *folder)) return true;
  }
  return false;
}

bool vxRunDoors::AdmitRead(std::string_view path) {
  const std::string text = AbsoluteText(path);
  if (!IsInstallationText(text)) return true;
  struct stat entry;
  if (lstat(text.c_str(), &entry) != 0) return true;  // left to the reader to report as missing
  std::string real;
  if (!S_ISLNK(entry.st_mode) && !S_ISDIR(entry.st_mode) && text != "/") {
    // A file that is no link lies in its folder: that folder decides.
    if (!realPaths_.Folder(ParentOf(text), real) || Locate(real) != Within::kNeither) return true;
    Refuse("Error: Refused to read a file that leads outside the installations: ", path);
    return false;
  }
  if (!RealPath(text, real)) return true;
  struct stat st;
  if (stat(real.c_str(), &st) != 0) return true;
  const bool isRoot = (source_.known && st.st_dev == source_.dev && st.st_ino == source_.ino) ||
                      (destination_.known && st.st_dev == destination_.dev &&
                       st.st_ino == destination_.ino);
  if (isRoot || Locate(S_ISDIR(st.st_mode) ? real : ParentOf(real)) != Within::kNeither) {
    return true;
  }
  Refuse("Error: Refused to read a file that leads outside the installations: ", path);
  return false;
}

bool vxRunDoors::JoinBeneath(vxStringBase& result, const vxStringBase& folder,
                             const vxStringBase& name, unsigned int isFile) {
  std::vector<std::string_view> parts;
  std::string_view rest = name.view();
  while (!rest.empty()) {
    size_t end = rest.find_first_of("/\\");
    std::string_view part = rest.substr(0, end);
    rest = end == std::string_view::npos ? std::string_view() : rest.substr(end + 1);
    if (part.empty() || part == ".") continue;
    if (part != "..") {
      parts.push_back(part);
    } else if (!parts.empty()) {
      parts.pop_back();
    } else {
      if (g_current != nullptr) {
        g_current->Refuse("Error: Refused a folder name that climbs out of its installation: ",
                          name.view());
      }
      result.makeNull();
      return false;
    }
  }
  std::string joined;
  for (std::string_view part : parts) {
    if (!joined.empty()) joined.push_back('/');
    joined.append(part);
  }
  vxFileManager::MakePath(result, folder, vxStringBase(std::string_view(joined)), isFile);
  return true;
}

namespace vxfiles {

namespace {

bool Observed(vxRunDoors* doors, std::string_view path, vxWriteObserver::Change change) {
  vxWriteObserver* observer = doors->Observer();
  return observer == nullptr || observer->BeforeWrite(path, change);
}

}  // namespace

bool MayWrite(std::string_view path) {
  vxRunDoors* doors = vxRunDoors::Current();
  return doors == nullptr ||
         (doors->AdmitWrite(path) && Observed(doors, path, vxWriteObserver::Change::kEntry));
}

bool MayWriteInPlace(std::string_view path) {
  vxRunDoors* doors = vxRunDoors::Current();
  return doors == nullptr ||
         (doors->AdmitWrite(path) && Observed(doors, path, vxWriteObserver::Change::kInPlace));
}

bool MayWriteInto(std::string_view folder) {
  vxRunDoors* doors = vxRunDoors::Current();
  return doors == nullptr || (doors->AdmitWriteInto(folder) &&
                              Observed(doors, folder, vxWriteObserver::Change::kInto));
}

bool MayWriteAt(int dirFd, const char* name) {
  vxRunDoors* doors = vxRunDoors::Current();
  if (doors != nullptr && doors->StoppedBy() != 0) {
    errno = doors->StoppedBy();
    return false;
  }
  vxWriteObserver* observer = doors == nullptr ? nullptr : doors->Observer();
  return observer == nullptr || observer->BeforeWriteAt(dirFd, name);
}

void NoteWriteFailure(int error, std::string_view path) {
  vxRunDoors* doors = vxRunDoors::Current();
  if (doors != nullptr) doors->NoteWriteFailure(error, path);
  errno = error;
}

bool MayRead(std::string_view path) {
  vxRunDoors* doors = vxRunDoors::Current();
  if (doors == nullptr) return true;
  if (!doors->AdmitRead(path)) return false;
  if (doors->Observer() != nullptr) doors->Observer()->AfterReadAdmitted(path);
  return true;
}

}  // namespace vxfiles
