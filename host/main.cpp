// The vxmigrate host: reads its own options, builds the migration manager from the rest, runs the
// migration and tells the user what happened. The exit status says how the run ended (see
// exit_status.h); nothing is written before the command line has been found usable. A preview
// (-n) runs the same migration in a scratch copy of the destination and removes it afterwards.

#include <cstdio>
#include <cstring>
#include <string>

#include "foundation/files/folder_lock.h"
#include "foundation/files/whole_file.h"
#include "host/exit_status.h"
#include "host/options.h"
#include "host/report_view.h"
#include "host/run_history.h"
#include "host/terminal_report.h"
#include "host/usage.h"
#include "migrate/manager.h"
#include "migrate/run_record.h"

namespace {

// Runs the migration the options describe; its exit status. The report, when settings ask for
// one, is left beside the log.
int Migrate(HostOptions& options, const vxRunSettings& settings, bool preview) {
  vxMigrationManager manager(static_cast<int>(options.managerArguments.size()),
                             options.managerArguments.data(), settings);
  if (!manager.IsValid()) {
    // Every option on the command line was usable, so what is wrong is what is missing.
    fprintf(stderr, "vxmigrate: incomplete run: missing %s, and no usable migcmd.ini gives it\n",
            options.missingRunOptions.c_str());
    fputs(kHostHint, stderr);
    return kExitUsage;
  }
  TerminalReport report(options.verbosity, stdout, stderr);
  if (manager.IsDestinationBusy()) {
    report.HostError("another run is migrating into " + manager.GetDestinationDirectory().str() +
                     "; nothing was written. Try again when it has finished.");
    return kExitDestinationBusy;
  }
  const vxLogFile* log = manager.GetLog();
  if (!log->IsOpen()) {
    // Typically a destination folder that does not exist, or a file, or one inside the source: a
    // run without its log would hide everything it did. The checks (which only read) still tell
    // the user why, on standard error.
    manager.SetRunListener(&report);
    manager.DoCheckMigrateValidity();
    report.HostError("cannot write the log " + log->GetFilename().str() + ": " +
                     strerror(log->OpenError()));
    return kExitRefused;
  }
  report.ShowProgress(manager);
  manager.SetRunListener(&report);
  int result = manager.DoMigration();
  if (log->WriteError() != 0) {
    report.HostError("the log " + log->GetFilename().str() + " lost entries: " +
                     strerror(log->WriteError()));
  }
  if (!preview) report.PrintSummary(manager, result, log->WriteError());
  HostExitStatus status = RunExitStatus(manager, result, log->WriteError());
  // The report or the journal lost: the run's record is incomplete, which is a failed step too.
  if (manager.FinishRun(status) != 0 && status == kExitDone) status = kExitStepErrors;
  return status;
}

// The whole migration into a scratch copy; the destination itself is only read. Its report's
// summary and conflicts are printed (with -v the whole report, as --report shows it).
int Preview(HostOptions& options) {
  vxFolderLock lock;
  if (int refused = LockDestination(lock, options.destination)) return refused;
  const std::string scratch = MakeScratchCopy(options.destination);
  if (scratch.empty()) return kExitRefused;
  std::string scratchOption = "-D2:" + scratch;
  options.managerArguments[options.destinationArgument] = scratchOption.data();
  vxRunSettings settings;
  settings.writeReport = true;
  settings.shownDestination = options.destination;
  const int status = Migrate(options, settings, true);
  std::string text;
  vxfiles::ReadWholeFile(scratch + "/" + kRunReportName, &text);
  RemoveScratchCopy(scratch);
  if (options.verbosity != Verbosity::kQuiet && !text.empty()) {
    printf("Preview of the migration into %s (nothing there was changed):\n",
           options.destination.c_str());
    PrintReport(text, options.verbosity == Verbosity::kVerbose ? ReportParts::kWhole
                                                                : ReportParts::kSummaryAndConflicts,
                stdout);
  }
  return status;
}

}  // namespace

int main(int argc, char** argv) {
  HostOptions options = ReadHostOptions(argc, argv);
  switch (options.action) {
    case HostAction::kHelp:
      fputs(kHostUsage, stdout);
      return kExitDone;
    case HostAction::kVersion:
      fputs(kHostVersion, stdout);
      return kExitDone;
    case HostAction::kUsageError:
      fputs(options.error.c_str(), stderr);
      return kExitUsage;
    case HostAction::kReport:
      return ShowLastReport(options.destination);
    case HostAction::kListRuns:
      return ListRuns(options.destination);
    case HostAction::kUndo:
      return UndoLastRun(options.destination, options.force);
    case HostAction::kPreview:
      return Preview(options);
    case HostAction::kMigrate:
      break;
  }
  vxRunSettings settings;
  settings.keepJournal = true;
  settings.writeReport = true;
  return Migrate(options, settings, false);
}
