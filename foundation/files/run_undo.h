// The runs a destination remembers, and taking the last one back. Undo follows the run's journal
// backwards: every entry the run replaced gets its kept old version back (the same bytes and
// mode), every entry and folder it created goes. The undone run's log and report are kept aside in
// its journal folder, never deleted. The caller holds the destination's lock.

#ifndef VXMIGRATE_FOUNDATION_FILES_RUN_UNDO_H_
#define VXMIGRATE_FOUNDATION_FILES_RUN_UNDO_H_

#include <string>
#include <vector>

#include "foundation/export.h"

struct vxRunEntry {
  std::string id;
  std::string folder;
  long long started = 0;  // seconds since the epoch
  std::string source;
  bool finished = false;  // false: the run ended without closing its journal (killed)
  int result = 0;         // when finished
  bool undone = false;
};

// Every run recorded below destination, oldest first.
VXM_EXPORT std::vector<vxRunEntry> vxListRuns(const std::string& destination);

struct vxUndoOutcome {
  enum Status { kUndone, kNothingToUndo, kChangedSince, kFailed };
  Status status = kFailed;
  std::string id;                    // the run taken back (or refused)
  std::vector<std::string> changed;  // files the run wrote that changed afterwards
  std::vector<std::string> failed;   // entries that could not be put back
  std::string keptAside;             // the folder holding the undone run's log and report
};

// Takes back the last run of destination that is not undone yet. Refuses (kChangedSince) when a
// file the run wrote changed since the run ended, unless force. A run killed before its end is
// undone without that test: its files' final state was never recorded.
VXM_EXPORT vxUndoOutcome vxUndoLastRun(const std::string& destination, bool force);

#endif  // VXMIGRATE_FOUNDATION_FILES_RUN_UNDO_H_
