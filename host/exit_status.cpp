// A finished run's exit status, from the manager's record of the run.

#include "host/exit_status.h"

HostExitStatus RunExitStatus(const vxMigrationManager& manager, int result, int logWriteError) {
  if (result != 0) return kExitRefused;
  if (manager.GetPluginSearch().ran.empty()) return kExitNoPlugin;
  if (manager.GetRunCounts().errors > 0 || logWriteError != 0) return kExitStepErrors;
  return kExitDone;
}
