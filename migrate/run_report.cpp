// Counting log entries by kind: the progress texts of the operations are fixed, so their starts
// say what an entry reports.

#include "migrate/run_report.h"

#include <cstring>

namespace {

struct EntryKind {
  const char* start;
  long vxRunCounts::*counter;
};

// Progress texts, matched at the entry's start. Errors and manual actions are told by their marks.
const EntryKind kKinds[] = {
    {"File copied: ", &vxRunCounts::filesCopied},
    {"Schedule Event copied: ", &vxRunCounts::filesCopied},
    {"Language file copied: ", &vxRunCounts::filesCopied},
    {"Folder copied: ", &vxRunCounts::filesCopied},
    {"Report folder copied: ", &vxRunCounts::filesCopied},
    {"Database folder copied: ", &vxRunCounts::filesCopied},
    {"TXT file doesn't exist - file being copied: ", &vxRunCounts::filesCopied},
    {"INI file doesn't exist - file being copied: ", &vxRunCounts::filesCopied},
    {"INI file merged: ", &vxRunCounts::iniFilesMerged},
    {"keywords.ini merged", &vxRunCounts::iniFilesMerged},
    {"vxm_log.ini merged with vxm_vxx.ini", &vxRunCounts::iniFilesMerged},
    {"categories.ini merged: ", &vxRunCounts::iniFilesMerged},
    {"Data File Merged: ", &vxRunCounts::iniFilesMerged},
    {"Advanced option file migrated: ", &vxRunCounts::iniFilesMerged},
    {"MSS to WCT conversion: ", &vxRunCounts::templatesConverted},
    {"Profile copied: ", &vxRunCounts::profilesConverted},
    {"Profile file copied: ", &vxRunCounts::profilesConverted},
    {"File exists - no copy made: ", &vxRunCounts::filesKept},
    {"Folder exists - no copy made: ", &vxRunCounts::filesKept},
};

const char kErrorMark[] = "Error: ";
const char kNoticeMark[] = "** ";
// The run's last line points to the log; it is no notice for the user to act on.
const char kPointerLine[] = "** See VXMigrate Log File for details:";

bool StartsWith(const std::string& text, const char* start) {
  return text.compare(0, strlen(start), start) == 0;
}

}  // namespace

void vxRunCounts::Count(const std::string& entry) {
  if (StartsWith(entry, kErrorMark)) {
    ++errors;
  } else if (StartsWith(entry, kNoticeMark)) {
    if (!StartsWith(entry, kPointerLine)) ++manualActions;
  } else {
    for (const EntryKind& kind : kKinds) {
      if (StartsWith(entry, kind.start)) {
        ++(this->*kind.counter);
        return;
      }
    }
  }
}
