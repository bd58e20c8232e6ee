// The undo journal of one run, in <destination>/.vxmigrate/runs/<run-id>/. Before a change reaches
// the destination it keeps what stood there (a hard link to the old file when the change replaces
// it by a rename, a copy when the file will be written where it stands) and lists every entry and
// folder the run creates. Each record is appended with one write(2) before the change is made, so
// a run killed at any point leaves a journal that undo can follow. Not thread-safe.

#ifndef VXMIGRATE_FOUNDATION_FILES_RUN_JOURNAL_H_
#define VXMIGRATE_FOUNDATION_FILES_RUN_JOURNAL_H_

#include <sys/types.h>

#include <string>
#include <string_view>
#include <unordered_map>
#include <unordered_set>
#include <vector>

#include "foundation/files/path_text.h"

// Names inside a destination's history folder (dir_entries.h names the folder itself).
constexpr char kRunJournalRuns[] = "runs";
constexpr char kRunJournalFile[] = "journal";
constexpr char kRunJournalSaved[] = "saved";
constexpr char kRunJournalUndone[] = "undone";

class vxRunJournal {
 public:
  // Starts a new run's journal below destination (a folder's real path); source is recorded for
  // the list of runs. IsOpen() is false when the journal could not be made.
  vxRunJournal(const std::string& destination, const std::string& source);
  ~vxRunJournal();

  vxRunJournal(const vxRunJournal&) = delete;
  vxRunJournal& operator=(const vxRunJournal&) = delete;

  bool IsOpen() const { return fd_ >= 0; }
  // The run's folder ("<destination>/.vxmigrate/runs/000001") and id ("000001").
  const std::string& Folder() const { return folder_; }
  const std::string& Id() const { return id_; }

  // Keeps what stands at path before an entry there is created, replaced or removed (inPlace:
  // written where it stands). Only the first change of a path in the run is kept. False when the
  // old state could not be kept: the change must then not be made.
  [[nodiscard]] bool BeforeEntry(std::string_view path, bool inPlace);
  // Lists the folders on the way to folder that do not exist yet: the run is about to make them.
  [[nodiscard]] bool BeforeFolder(std::string_view folder);

  // Closes the journal: the state of every entry the run wrote, so that undo can tell a file
  // changed afterwards, and the run's result. False when any of it could not be written (undo then
  // treats the run as one that was stopped).
  [[nodiscard]] bool Finish(int result);

 private:
  struct Kept {
    int saved = -1;  // number of the kept copy or link in saved/, -1 when nothing stood there
    bool linked = false;
    dev_t dev = 0;
    ino_t ino = 0;
  };

  bool Relative(const std::string& absolute, std::string& relative);
  [[nodiscard]] bool KeepOld(const std::string& relative, const std::string& path, bool inPlace);
  // One record line; Append also tells the run's doors when it fails.
  [[nodiscard]] bool Write(const std::string& record);
  [[nodiscard]] bool Append(const std::string& record);

  std::string destination_;
  vxRealPaths realPaths_;
  std::string folder_;
  std::string id_;
  int fd_ = -1;
  int nextSaved_ = 0;
  std::unordered_map<std::string, Kept> kept_;
  std::vector<std::string> order_;  // relative paths in the order first met
  std::unordered_set<std::string> folders_;
};

// Journal texts: a path is written with '%' and the bytes up to a blank (and 0x7f) as %XX, so a
// record is one line of blank-separated fields whatever the names hold.
std::string vxJournalEscape(std::string_view text);
std::string vxJournalUnescape(std::string_view text);

#endif  // VXMIGRATE_FOUNDATION_FILES_RUN_JOURNAL_H_
