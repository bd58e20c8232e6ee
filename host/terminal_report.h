// What the user sees of a run on the terminal: errors and notices that need manual action on
// standard error as they are logged (the log's text unchanged), every entry on standard output
// with -v, and one summary on standard output at the end. With -q only errors are printed.

#ifndef VXMIGRATE_HOST_TERMINAL_REPORT_H_
#define VXMIGRATE_HOST_TERMINAL_REPORT_H_

#include <cstdio>
#include <string>

#include "host/options.h"
#include "migrate/manager.h"

class TerminalReport : public vxRunListener {
 public:
  // Streams are not owned.
  TerminalReport(Verbosity verbosity, FILE* out, FILE* err);

  TerminalReport(const TerminalReport&) = delete;
  TerminalReport& operator=(const TerminalReport&) = delete;

  void OnLogEntry(const std::string& entry) override;
  void OnUnloggedFailure(const std::string& text) override;

  // An error of the host's own (for example a log that could not be written), on standard error.
  void HostError(const std::string& text);

  // The summary of a run that DoMigration returned from with result. Nothing with -q.
  void PrintSummary(vxMigrationManager& manager, int result, int logWriteError);

 private:
  void PrintWhyNoPluginRan(vxMigrationManager& manager, int result);

  Verbosity verbosity_;
  FILE* out_;
  FILE* err_;
};

#endif  // VXMIGRATE_HOST_TERMINAL_REPORT_H_
