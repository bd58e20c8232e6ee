// What a run has done, as the manager learns it: counts kept as each log entry is written, the
// outcome of the plug-in search, and the listener through which a host sees every entry as it is
// logged. Nothing here reads the log file back; the counts follow the entries' fixed texts.

#ifndef VXMIGRATE_MIGRATE_RUN_REPORT_H_
#define VXMIGRATE_MIGRATE_RUN_REPORT_H_

#include <string>
#include <vector>

// Entries counted by kind. A copy is counted when it is announced, so a copy announced and then
// reported failed counts once in each.
struct vxRunCounts {
  long filesCopied = 0;
  long iniFilesMerged = 0;
  long templatesConverted = 0;
  long profilesConverted = 0;
  long filesKept = 0;  // already in the destination: left as they were
  long errors = 0;
  long manualActions = 0;

  // Counts one entry by its text (as vxLogFile::EntryText gives it).
  void Count(const std::string& entry);
};

// Why the plug-in search ended as it did.
struct vxPluginSearch {
  std::string ran;                        // the plug-in whose Migrate was called; empty when none
  bool rangesUnreadable = false;          // "vxmigrate.ini" could not be opened
  std::string rangesFile;                 // its path
  std::vector<std::string> outOfRange;    // plug-ins for the pair whose versions did not fit
  std::string ranges;                     // the ranges they were checked against, as read
  std::string withoutMigrate;             // a plug-in that passed but has no "Migrate"
  std::vector<std::string> notLoaded;     // the loader's messages, each naming its file
};

// Told of every log entry as it is written, and of failures the log does not show.
class vxRunListener {
 public:
  virtual ~vxRunListener() = default;
  // entry: the text as written, without its time stamp.
  virtual void OnLogEntry(const std::string& entry) = 0;
};

#endif  // VXMIGRATE_MIGRATE_RUN_REPORT_H_
