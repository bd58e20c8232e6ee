// The host's exit statuses, as --help, the README and the manual page list them, and the rule
// that gives a finished run its status.

#ifndef VXMIGRATE_HOST_EXIT_STATUS_H_
#define VXMIGRATE_HOST_EXIT_STATUS_H_

#include "migrate/manager.h"

enum HostExitStatus {
  kExitDone = 0,          // a plug-in ran and no step reported an error
  kExitRefused = 1,       // refused by the run checks
  kExitUsage = 2,         // unknown option or unusable value; nothing written
  kExitNoPlugin = 3,      // no plug-in served the products and versions
  kExitStepErrors = 4,    // the plug-in ran and some steps reported errors
  kExitDestinationBusy = 5,  // another run holds the destination
};

// result: what DoMigration returned. logWriteError: errno of the first log entry that could not
// be written, 0 when none; a log that lost entries counts as an error.
HostExitStatus RunExitStatus(const vxMigrationManager& manager, int result, int logWriteError);

#endif  // VXMIGRATE_HOST_EXIT_STATUS_H_
