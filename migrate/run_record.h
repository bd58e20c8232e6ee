// What one run did to its destination, file by file, as the run's doors see it: which entries it
// created, replaced, merged, converted or left as they were, from which source file, which keys
// each INI merge added and where both sides disagreed, and the run's notices and errors. It is
// the observer the manager gives the doors; it also feeds the undo journal, when the run keeps
// one. At the end it writes "vxmigrate-report.json" beside the log (schema in docs/REPORT.md).
// Paths in the report are relative to the installations, so a preview's report and the real
// run's compare equal. Protected values never appear in clear.

#ifndef VXMIGRATE_MIGRATE_RUN_RECORD_H_
#define VXMIGRATE_MIGRATE_RUN_RECORD_H_

#include <sys/types.h>

#include <map>
#include <memory>
#include <set>
#include <string>
#include <vector>

#include "foundation/files/run_doors.h"
#include "foundation/files/run_journal.h"
#include "foundation/inifile/ini_file.h"

constexpr char kRunReportName[] = "vxmigrate-report.json";
constexpr int kRunReportSchema = 1;

class vxRunRecord : public vxWriteObserver {
 public:
  // source, destination: the run's folders as given. shownDestination: how the report names the
  // destination in notices and errors (a preview runs in a scratch copy but names the real one).
  vxRunRecord(const std::string& source, const std::string& destination,
              const std::string& shownDestination, bool keepJournal);
  ~vxRunRecord() override;

  vxRunRecord(const vxRunRecord&) = delete;
  vxRunRecord& operator=(const vxRunRecord&) = delete;

  // Null when the run keeps no journal or it could not be started.
  vxRunJournal* Journal() { return journal_.get(); }

  bool BeforeWrite(std::string_view path, Change change) override;
  bool BeforeWriteAt(int dirFd, const char* name) override;
  void AfterReadAdmitted(std::string_view path) override;

  // A log entry as written (errors, notices, and the steps that say which file they converted).
  void NoteEntry(const std::string& entry);
  // An observer for one INI merge of source into destination; owned by the record.
  vxIniMergeObserver* Merge(const std::string& source, const std::string& destination);

  // Destination files met so far (written, or found in place by a copy), log and report left out.
  long FilesWritten() const;

  // The report as JSON text; plugin is the plug-in that ran (empty when none).
  std::string ReportText(const std::string& plugin);

 private:
  struct FileRecord {
    bool existed = false;
    dev_t dev = 0;
    ino_t ino = 0;
    off_t size = 0;
    long long mtime = 0;
    std::string source;
    bool merged = false;
    bool converted = false;
  };
  class MergeRecord;

  FileRecord& Touch(const std::string& relative);
  bool DestinationRelative(std::string_view path, std::string& relative) const;
  std::string RealEntry(std::string_view path) const;  // "" when it cannot be found
  std::string Shown(const std::string& text) const;
  std::string Action(const std::string& relative, const FileRecord& file) const;

  std::string sourceReal_, destinationReal_, destinationText_, shownDestination_;
  mutable vxRealPaths realPaths_;  // a cache: asking for a real path changes nothing
  std::unique_ptr<vxRunJournal> journal_;
  std::map<std::string, FileRecord> files_;  // by path relative to the destination
  std::vector<std::unique_ptr<MergeRecord>> merges_;
  std::vector<std::string> notices_, errors_;
  std::string lastSourceRead_;
  std::set<std::string> mergedNamed_;  // files that merges writing them by themselves named
};

// The text a report shows for a value: "<protected>" for a stored password or user name (a value
// in the protected, previous-generation or legacy form, or any value of a key naming a password),
// the value itself otherwise (the empty value too).
std::string vxReportValue(std::string_view key, std::string_view value);

#endif  // VXMIGRATE_MIGRATE_RUN_RECORD_H_
