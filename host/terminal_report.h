// What the user sees of a run on the terminal: errors and notices that need manual action on
// standard error as they are logged (the log's text unchanged), every entry on standard output
// with -v, and one summary on standard output at the end. With -q only errors are printed. On a
// terminal (and without -q) a progress line on standard error follows the run.

#ifndef VXMIGRATE_HOST_TERMINAL_REPORT_H_
#define VXMIGRATE_HOST_TERMINAL_REPORT_H_

#include <cstdio>
#include <string>

#include "host/options.h"
#include "host/progress_line.h"
#include "migrate/manager.h"

class TerminalReport : public vxRunListener {
 public:
  // Streams are not owned.
  TerminalReport(Verbosity verbosity, FILE* out, FILE* err);

  TerminalReport(const TerminalReport&) = delete;
  TerminalReport& operator=(const TerminalReport&) = delete;

  // Shows the progress line for manager's run when standard error is a terminal, unless -q.
  void ShowProgress(vxMigrationManager& manager);

  void OnLogEntry(const std::string& entry) override;

  // An error of the host's own (for example a log that could not be written), on standard error.
  void HostError(const std::string& text);

  // The summary of a run that DoMigration returned from with result. Nothing with -q.
  void PrintSummary(vxMigrationManager& manager, int result, int logWriteError);

 private:
  void PrintWhyNoPluginRan(vxMigrationManager& manager, int result);

  Verbosity verbosity_;
  FILE* out_;
  FILE* err_;
  ProgressLine progress_;
  const vxMigrationManager* manager_ = nullptr;  // the run the progress line follows
};

#endif  // VXMIGRATE_HOST_TERMINAL_REPORT_H_
