// Reading a run's journal back and undoing it. Entries are put back in the reverse order of the
// journal, folders the run made go last (deepest first, once emptied), and temporary files a
// killed run left beside its entries are removed.

#ifndef _FILE_OFFSET_BITS
#define _FILE_OFFSET_BITS 64
#endif

#include "foundation/files/run_undo.h"

#include <fcntl.h>
#include <stdlib.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <ctime>
#include <fstream>
#include <map>
#include <set>
#include <sstream>

#include "foundation/files/dir_entries.h"
#include "foundation/files/run_journal.h"
#include "foundation/files/whole_file.h"

namespace {

const char kLogName[] = "vxmigrate.log";
const char kReportName[] = "vxmigrate-report.json";

std::string Join(const std::string& folder, const std::string& name) {
  return folder + "/" + name;
}

std::string RunsFolder(const std::string& destination) {
  return Join(Join(destination, vxfiles::kRunHistoryFolder), kRunJournalRuns);
}

struct JournalEntry {
  std::string path;  // relative to the destination
  int saved = -1;    // saved/<n>, -1 when the run created the entry
};

struct Journal {
  std::vector<JournalEntry> entries;
  std::vector<std::string> folders;
  std::map<std::string, std::string> after;  // path -> recorded state text
};

std::vector<std::string> Fields(const std::string& line) {
  std::vector<std::string> fields;
  std::istringstream in(line);
  for (std::string field; in >> field;) fields.push_back(field);
  return fields;
}

// Reads the journal; run (when given) gets its header and end.
Journal ReadJournal(const std::string& folder, vxRunEntry* run) {
  Journal journal;
  std::string text;
  vxfiles::ReadWholeFile(Join(folder, kRunJournalFile), &text);  // a missing journal lists nothing
  std::istringstream in(text);
  for (std::string line; std::getline(in, line);) {
    std::vector<std::string> f = Fields(line);
    if (f.size() < 2) continue;
    if (f[0] == "started" && run != nullptr) {
      run->started = atoll(f[1].c_str());
    } else if (f[0] == "source" && run != nullptr) {
      run->source = vxJournalUnescape(f[1]);
    } else if (f[0] == "end" && run != nullptr) {
      run->finished = true;
      run->result = atoi(f[1].c_str());
    } else if (f[0] == "new") {
      journal.entries.push_back({vxJournalUnescape(f[1]), -1});
    } else if (f[0] == "kept" && f.size() >= 3) {
      journal.entries.push_back({vxJournalUnescape(f[1]), atoi(f[2].c_str())});
    } else if (f[0] == "dir") {
      journal.folders.push_back(vxJournalUnescape(f[1]));
    } else if (f[0] == "after") {
      journal.after[vxJournalUnescape(f[1])] = line.substr(line.find(' ', 6) + 1);
    }
  }
  return journal;
}

// The state text Finish records for an entry now ("-" when absent).
std::string StateNow(const std::string& path) {
  struct stat st;
  if (lstat(path.c_str(), &st) != 0) return "-";
  return std::to_string(st.st_ino) + " " + std::to_string(st.st_size) + " " +
         std::to_string(st.st_mtim.tv_sec) + " " + std::to_string(st.st_mtim.tv_nsec) + " " +
         std::to_string(st.st_mode);
}

// Makes the missing folders on the way to path's folder (a user may have removed one).
void MakeParents(const std::string& path) {
  for (size_t slash = path.find('/', 1); slash != std::string::npos;
       slash = path.find('/', slash + 1)) {
    mkdir(path.substr(0, slash).c_str(), 0777);
  }
}

bool SameEntry(const std::string& a, const std::string& b) {
  struct stat sa, sb;
  return lstat(a.c_str(), &sa) == 0 && lstat(b.c_str(), &sb) == 0 && sa.st_dev == sb.st_dev &&
         sa.st_ino == sb.st_ino;
}

// Temporary files (".name.vxtmp.XXXXXX") a killed run left in folder since it started.
void RemoveLeftTemporaries(const std::string& folder, long long started) {
  int fd = open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  if (fd < 0) return;
  std::vector<vxfiles::DirEntry> entries;
  std::vector<char> buffer;
  vxfiles::ReadDirEntries(fd, entries, buffer);
  for (const vxfiles::DirEntry& entry : entries) {
    if (entry.name[0] != '.' || entry.name.find(".vxtmp.") == std::string::npos) continue;
    struct stat st;
    if (fstatat(fd, entry.name.c_str(), &st, AT_SYMLINK_NOFOLLOW) == 0 &&
        st.st_ctim.tv_sec >= started && !S_ISDIR(st.st_mode)) {
      unlinkat(fd, entry.name.c_str(), 0);
    }
  }
  close(fd);
}

}  // namespace

std::vector<vxRunEntry> vxListRuns(const std::string& destination) {
  std::vector<vxRunEntry> runs;
  const std::string folder = RunsFolder(destination);
  int fd = open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  if (fd < 0) return runs;
  std::vector<vxfiles::DirEntry> entries;
  std::vector<char> buffer;
  vxfiles::ReadDirEntries(fd, entries, buffer);
  close(fd);
  for (const vxfiles::DirEntry& entry : entries) {
    vxRunEntry run;
    run.id = entry.name;
    run.folder = Join(folder, entry.name);
    if (access(Join(run.folder, kRunJournalFile).c_str(), F_OK) != 0) continue;
    ReadJournal(run.folder, &run);
    run.undone = access(Join(run.folder, kRunJournalUndone).c_str(), F_OK) == 0;
    runs.push_back(run);
  }
  return runs;
}

vxUndoOutcome vxUndoLastRun(const std::string& destination, bool force) {
  vxUndoOutcome outcome;
  std::vector<vxRunEntry> runs = vxListRuns(destination);
  while (!runs.empty() && runs.back().undone) runs.pop_back();
  if (runs.empty()) {
    outcome.status = vxUndoOutcome::kNothingToUndo;
    return outcome;
  }
  const vxRunEntry run = runs.back();
  outcome.id = run.id;
  outcome.keptAside = run.folder;
  Journal journal = ReadJournal(run.folder, nullptr);

  for (const auto& [path, state] : journal.after) {
    if (StateNow(Join(destination, path)) != state) outcome.changed.push_back(path);
  }
  if (!outcome.changed.empty() && !force) {
    outcome.status = vxUndoOutcome::kChangedSince;
    return outcome;
  }

  // The undone run's own log and report stay readable beside its journal.
  for (const char* name : {kLogName, kReportName}) {
    for (const JournalEntry& entry : journal.entries) {
      if (entry.path == name) rename(Join(destination, name).c_str(), Join(run.folder, name).c_str());
    }
  }
  std::set<std::string> touchedFolders = {destination};
  for (auto it = journal.entries.rbegin(); it != journal.entries.rend(); ++it) {
    const std::string path = Join(destination, it->path);
    touchedFolders.insert(path.substr(0, path.rfind('/')));
    if (it->saved < 0) {
      if (unlink(path.c_str()) != 0 && errno != ENOENT) outcome.failed.push_back(it->path);
      continue;
    }
    const std::string saved = Join(Join(run.folder, kRunJournalSaved), std::to_string(it->saved));
    if (SameEntry(saved, path)) {  // never replaced: rename would leave both names
      unlink(saved.c_str());
      continue;
    }
    MakeParents(path);
    if (rename(saved.c_str(), path.c_str()) != 0) outcome.failed.push_back(it->path);
  }
  for (const std::string& folder : touchedFolders) RemoveLeftTemporaries(folder, run.started);
  std::vector<std::string> folders = journal.folders;
  // Deeper folders first: a longer path never holds a shorter one.
  std::sort(folders.begin(), folders.end(),
            [](const std::string& a, const std::string& b) { return a.size() > b.size(); });
  for (const std::string& folder : folders) {
    const std::string path = Join(destination, folder);
    RemoveLeftTemporaries(path, run.started);
    if (rmdir(path.c_str()) != 0 && errno != ENOENT) outcome.failed.push_back(folder + "/");
  }
  std::ofstream(Join(run.folder, kRunJournalUndone))
      << static_cast<long long>(time(nullptr)) << "\n";
  outcome.status = outcome.failed.empty() ? vxUndoOutcome::kUndone : vxUndoOutcome::kFailed;
  return outcome;
}
