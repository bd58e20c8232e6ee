// The vxmigrate host: reads its own options, builds the migration manager from the rest, runs the
// migration and tells the user what happened. The exit status says how the run ended (see
// exit_status.h); nothing is written before the command line has been found usable.

#include <cstdio>
#include <cstring>
#include <string>

#include "host/exit_status.h"
#include "host/options.h"
#include "host/terminal_report.h"
#include "host/usage.h"
#include "migrate/manager.h"

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
    case HostAction::kMigrate:
      break;
  }

  vxMigrationManager manager(static_cast<int>(options.managerArguments.size()),
                             options.managerArguments.data());
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
  manager.SetRunListener(&report);
  int result = manager.DoMigration();
  if (log->WriteError() != 0) {
    report.HostError("the log " + log->GetFilename().str() + " lost entries: " +
                     strerror(log->WriteError()));
  }
  report.PrintSummary(manager, result, log->WriteError());
  return RunExitStatus(manager, result, log->WriteError());
}
