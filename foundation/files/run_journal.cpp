// The journal's records: "started", "source", then per path first met "new <path>" (nothing stood
// there) or "kept <path> <n>" (saved/<n> holds what stood there), "dir <path>" per folder made,
// and at the end "after <path> ..." per written entry and "end <result>". Paths are relative to
// the destination. Hard links cost no copy; a file about to be written in place is copied (a
// reflink where the file system has them).

#ifndef _FILE_OFFSET_BITS
#define _FILE_OFFSET_BITS 64
#endif

#include "foundation/files/run_journal.h"

#include <errno.h>
#include <fcntl.h>
#include <linux/fs.h>
#include <stdlib.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <ctime>
#include <vector>

#include "foundation/files/dir_entries.h"
#include "foundation/files/path_text.h"
#include "foundation/files/run_doors.h"
#include "foundation/files/write_all.h"

namespace {

std::string Join(const std::string& folder, const std::string& name) {
  return folder == "/" ? "/" + name : folder + "/" + name;
}

// The next free run number below runs: one more than the highest there.
int NextRunNumber(const std::string& runs) {
  int highest = 0;
  int fd = open(runs.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  if (fd < 0) return 1;
  std::vector<vxfiles::DirEntry> entries;
  std::vector<char> buffer;
  vxfiles::ReadDirEntries(fd, entries, buffer);
  close(fd);
  for (const vxfiles::DirEntry& entry : entries) highest = std::max(highest, atoi(entry.name.c_str()));
  return highest + 1;
}

// A copy of the regular file from as to, with its mode: a reflink when the file system can, the
// kernel's copy otherwise.
bool CopyWhole(const std::string& from, const std::string& to) {
  int in = open(from.c_str(), O_RDONLY | O_NOFOLLOW | O_CLOEXEC);
  if (in < 0) return false;
  struct stat st;
  int out = -1;
  bool ok = fstat(in, &st) == 0 && S_ISREG(st.st_mode);
  if (ok) out = open(to.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0600);
  ok = ok && out >= 0;
  if (ok && ioctl(out, FICLONE, in) != 0) {
    std::vector<char> buffer(256 * 1024);
    for (;;) {
      ssize_t n = read(in, buffer.data(), buffer.size());
      if (n == 0) break;
      if (n < 0 && errno == EINTR) continue;
      if (n < 0 || !vxWriteAll(out, buffer.data(), static_cast<size_t>(n))) {
        ok = false;
        break;
      }
    }
  }
  if (ok) {
    const struct timespec times[2] = {st.st_atim, st.st_mtim};
    ok = fchmod(out, st.st_mode & 07777) == 0 && futimens(out, times) == 0;
  }
  if (out >= 0 && close(out) != 0) ok = false;
  close(in);
  if (!ok) unlink(to.c_str());
  return ok;
}

}  // namespace

std::string vxJournalEscape(std::string_view text) {
  std::string out;
  for (unsigned char c : text) {
    if (c <= ' ' || c == '%' || c == 0x7f) {
      char hex[4];
      snprintf(hex, sizeof hex, "%%%02X", c);
      out += hex;
    } else {
      out.push_back(static_cast<char>(c));
    }
  }
  return out;
}

std::string vxJournalUnescape(std::string_view text) {
  std::string out;
  for (size_t i = 0; i < text.size(); ++i) {
    if (text[i] == '%' && i + 2 < text.size()) {
      out.push_back(static_cast<char>(strtol(std::string(text.substr(i + 1, 2)).c_str(), nullptr, 16)));
      i += 2;
    } else {
      out.push_back(text[i]);
    }
  }
  return out;
}

vxRunJournal::vxRunJournal(const std::string& destination, const std::string& source)
    : destination_(destination) {
  const std::string history = Join(destination, vxfiles::kRunHistoryFolder);
  const std::string runs = Join(history, kRunJournalRuns);
  if (!vxfiles::MayWriteInto(runs)) return;
  mkdir(history.c_str(), 0700);
  mkdir(runs.c_str(), 0700);
  // Another run cannot race us (the destination is locked); the loop only skips leftovers.
  for (int number = NextRunNumber(runs), tries = 0; tries < 100; ++number, ++tries) {
    char id[16];
    snprintf(id, sizeof id, "%06d", number);
    const std::string folder = Join(runs, id);
    if (mkdir(folder.c_str(), 0700) != 0) {
      if (errno == EEXIST) continue;
      return;
    }
    if (mkdir(Join(folder, kRunJournalSaved).c_str(), 0700) != 0) return;
    fd_ = open(Join(folder, kRunJournalFile).c_str(),
               O_WRONLY | O_CREAT | O_EXCL | O_APPEND | O_CLOEXEC, 0600);
    folder_ = folder;
    id_ = id;
    break;
  }
  // Before the run's log exists: a failure here leaves the run without a journal, which the run
  // reports once its log is open.
  if (fd_ >= 0 && !(Write("started " + std::to_string(static_cast<long long>(time(nullptr)))) &&
                    Write("source " + vxJournalEscape(source)))) {
    close(fd_);
    fd_ = -1;
  }
}

vxRunJournal::~vxRunJournal() {
  if (fd_ >= 0) close(fd_);
}

bool vxRunJournal::Write(const std::string& record) {
  const std::string line = record + "\n";
  return fd_ >= 0 && vxWriteAll(fd_, line.data(), line.size());
}

// A journal that lost a record cannot give the old state back: the run's doors hear of it.
bool vxRunJournal::Append(const std::string& record) {
  if (Write(record)) return true;
  if (fd_ >= 0) vxfiles::NoteWriteFailure(errno, Join(folder_, kRunJournalFile));
  return false;
}

bool vxRunJournal::Relative(const std::string& absolute, std::string& relative) {
  std::string real;
  if (!realPaths_.Entry(absolute, real)) return false;
  if (real.compare(0, destination_.size(), destination_) != 0 ||
      real.size() <= destination_.size() + 1 || real[destination_.size()] != '/') {
    return false;
  }
  relative = real.substr(destination_.size() + 1);
  return true;
}

bool vxRunJournal::KeepOld(const std::string& relative, const std::string& path, bool inPlace) {
  auto known = kept_.find(relative);
  struct stat st;
  const bool exists = lstat(path.c_str(), &st) == 0;
  if (known != kept_.end()) {
    Kept& kept = known->second;
    // A file kept as a link and now about to be written in place: the link would change with it.
    if (!inPlace || !kept.linked || !exists || st.st_dev != kept.dev || st.st_ino != kept.ino) {
      return true;
    }
    const std::string saved = Join(Join(folder_, kRunJournalSaved), std::to_string(kept.saved));
    const std::string copy = saved + ".copy";
    if (!CopyWhole(path, copy) || rename(copy.c_str(), saved.c_str()) != 0) return false;
    kept.linked = false;
    return true;
  }
  Kept kept;
  if (exists && S_ISDIR(st.st_mode)) return true;  // folders are never replaced by an entry
  if (exists) {
    kept.saved = nextSaved_++;
    const std::string saved = Join(Join(folder_, kRunJournalSaved), std::to_string(kept.saved));
    kept.linked = !inPlace && link(path.c_str(), saved.c_str()) == 0;
    if (!kept.linked) {
      const bool copied = S_ISREG(st.st_mode) ? CopyWhole(path, saved) : false;
      if (!copied) {
        std::vector<char> target(static_cast<size_t>(st.st_size) + 1);
        ssize_t n = S_ISLNK(st.st_mode) ? readlink(path.c_str(), target.data(), target.size()) : -1;
        if (n < 0 || static_cast<size_t>(n) >= target.size()) return false;
        if (symlink(std::string(target.data(), static_cast<size_t>(n)).c_str(), saved.c_str()) != 0) {
          return false;
        }
      }
    }
    kept.dev = st.st_dev;
    kept.ino = st.st_ino;
    if (!Append("kept " + vxJournalEscape(relative) + " " + std::to_string(kept.saved))) return false;
  } else if (!Append("new " + vxJournalEscape(relative))) {
    return false;
  }
  kept_.emplace(relative, kept);
  order_.push_back(relative);
  return true;
}

bool vxRunJournal::BeforeEntry(std::string_view path, bool inPlace) {
  if (fd_ < 0) return false;
  std::string relative;
  if (!Relative(vxfiles::AbsoluteText(path), relative)) return true;  // the destination folder itself: no entry
  return KeepOld(relative, Join(destination_, relative), inPlace);
}

bool vxRunJournal::BeforeFolder(std::string_view folder) {
  if (fd_ < 0) return false;
  std::string relative;
  if (!Relative(vxfiles::AbsoluteText(folder), relative)) return true;
  // The missing folders, outermost first.
  std::vector<std::string> missing;
  for (std::string walk = relative;;) {
    struct stat st;
    if (lstat(Join(destination_, walk).c_str(), &st) == 0) break;
    missing.push_back(walk);
    size_t slash = walk.rfind('/');
    if (slash == std::string::npos) break;
    walk.resize(slash);
  }
  for (auto it = missing.rbegin(); it != missing.rend(); ++it) {
    if (!folders_.insert(*it).second) continue;
    if (!Append("dir " + vxJournalEscape(*it))) return false;
  }
  return true;
}

bool vxRunJournal::Finish(int result) {
  bool ok = true;
  for (const std::string& relative : order_) {
    struct stat st;
    if (lstat(Join(destination_, relative).c_str(), &st) != 0) {
      ok = Append("after " + vxJournalEscape(relative) + " -") && ok;
      continue;
    }
    ok = Append("after " + vxJournalEscape(relative) + " " + std::to_string(st.st_ino) + " " +
                std::to_string(st.st_size) + " " + std::to_string(st.st_mtim.tv_sec) + " " +
                std::to_string(st.st_mtim.tv_nsec) + " " + std::to_string(st.st_mode)) &&
         ok;
  }
  ok = Append("end " + std::to_string(result)) && ok;
  return fsync(fd_) == 0 && ok;
}
