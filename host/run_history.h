// The host's commands about a destination's runs: print the last report, list the runs, undo the
// last one; and the scratch copy a preview runs in. Each returns the host's exit status.

#ifndef VXMIGRATE_HOST_RUN_HISTORY_H_
#define VXMIGRATE_HOST_RUN_HISTORY_H_

#include <string>

class vxFolderLock;

// Takes the destination's lock: 0 when held, otherwise the exit status, having said why.
int LockDestination(vxFolderLock& lock, const std::string& destination);

int ShowLastReport(const std::string& destination);
int ListRuns(const std::string& destination);
int UndoLastRun(const std::string& destination, bool force);

// A copy of destination beside it on the same file system (the kernel's copy, which shares
// blocks where the file system can), without the runs' history. Empty, with a message on
// standard error, when it cannot be made.
std::string MakeScratchCopy(const std::string& destination);
void RemoveScratchCopy(const std::string& scratch);

#endif  // VXMIGRATE_HOST_RUN_HISTORY_H_
