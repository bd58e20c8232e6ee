// Reports, the list of runs and undo, each under the destination's lock so that none of them
// meets a run in progress; and the preview's scratch copy.

#include "host/run_history.h"

#include <stdlib.h>
#include <sys/stat.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <ctime>
#include <filesystem>

#include "foundation/files/file_manager.h"
#include "foundation/files/folder_lock.h"
#include "foundation/files/run_undo.h"
#include "foundation/files/whole_file.h"
#include "host/exit_status.h"
#include "host/report_view.h"
#include "migrate/run_record.h"

namespace {

std::string RealPath(const std::string& path) {
  char* real = realpath(path.c_str(), nullptr);
  std::string text = real != nullptr ? real : path;
  free(real);
  return text;
}

}  // namespace

int LockDestination(vxFolderLock& lock, const std::string& destination) {
  switch (lock.Acquire(vxStringBase(destination.c_str()))) {
    case vxFolderLock::kLocked:
      return 0;
    case vxFolderLock::kBusy:
      fprintf(stderr, "vxmigrate: another run is migrating into %s; try again when it has finished\n",
              destination.c_str());
      return kExitDestinationBusy;
    case vxFolderLock::kNoFolder:
      break;
  }
  fprintf(stderr, "vxmigrate: cannot open the destination folder %s: %s\n", destination.c_str(),
          strerror(errno));
  return kExitRefused;
}

int ShowLastReport(const std::string& destination) {
  const std::string path = destination + "/" + kRunReportName;
  std::string text;
  if (!vxfiles::ReadWholeFile(path, &text)) {
    fprintf(stderr, "vxmigrate: no report of a run in %s (%s)\n", destination.c_str(), strerror(errno));
    return kExitRefused;
  }
  if (!PrintReport(text, ReportParts::kWhole, stdout)) {
    fprintf(stderr, "vxmigrate: %s is not a report this version can read\n", path.c_str());
    return kExitRefused;
  }
  return kExitDone;
}

int ListRuns(const std::string& destination) {
  vxFolderLock lock;
  if (int refused = LockDestination(lock, destination)) return refused;
  for (const vxRunEntry& run : vxListRuns(RealPath(destination))) {
    char when[32] = "?";
    time_t started = static_cast<time_t>(run.started);
    struct tm local;
    if (localtime_r(&started, &local) != nullptr) strftime(when, sizeof when, "%Y-%m-%d %H:%M:%S", &local);
    std::string result = run.finished ? "status " + std::to_string(run.result) : "unfinished";
    if (run.undone) result += ", undone";
    printf("%s  %s  %-20s  from %s\n", run.id.c_str(), when, result.c_str(), run.source.c_str());
  }
  return kExitDone;
}

int UndoLastRun(const std::string& destination, bool force) {
  vxFolderLock lock;
  if (int refused = LockDestination(lock, destination)) return refused;
  const vxUndoOutcome outcome = vxUndoLastRun(RealPath(destination), force);
  switch (outcome.status) {
    case vxUndoOutcome::kNothingToUndo:
      fprintf(stderr, "vxmigrate: no run to undo in %s\n", destination.c_str());
      return kExitRefused;
    case vxUndoOutcome::kChangedSince:
      fprintf(stderr, "vxmigrate: run %s not undone: these files changed since it wrote them "
                      "(--force undoes it anyway, losing those changes):\n", outcome.id.c_str());
      for (const std::string& file : outcome.changed) fprintf(stderr, "  %s\n", file.c_str());
      return kExitRefused;
    case vxUndoOutcome::kFailed:
      fprintf(stderr, "vxmigrate: run %s undone except for:\n", outcome.id.c_str());
      for (const std::string& file : outcome.failed) fprintf(stderr, "  %s\n", file.c_str());
      return kExitStepErrors;
    case vxUndoOutcome::kUndone:
      break;
  }
  printf("Run %s undone. Its log and report are kept in %s\n", outcome.id.c_str(),
         outcome.keptAside.c_str());
  return kExitDone;
}

std::string MakeScratchCopy(const std::string& destination) {
  std::string folder = destination;
  while (folder.size() > 1 && folder.back() == '/') folder.pop_back();
  const size_t slash = folder.rfind('/');
  const std::string parent = slash == std::string::npos ? "." : slash == 0 ? "/" : folder.substr(0, slash);
  const std::string name = slash == std::string::npos ? folder : folder.substr(slash + 1);
  std::string pattern = parent + "/." + name + ".vxpreview.XXXXXX";
  struct stat st;
  if (stat(folder.c_str(), &st) != 0 || !S_ISDIR(st.st_mode) || mkdtemp(pattern.data()) == nullptr) {
    fprintf(stderr, "vxmigrate: cannot make a scratch copy of %s beside it: %s\n",
            destination.c_str(), strerror(errno));
    return "";
  }
  if (vxFileManager::CopyFile(vxStringBase(folder.c_str()), vxStringBase(pattern.c_str()), 1, 1, 0, 0,
                              0, nullptr, nullptr) != 0) {
    fprintf(stderr, "vxmigrate: cannot copy %s for a preview\n", destination.c_str());
    RemoveScratchCopy(pattern);
    return "";
  }
  chmod(pattern.c_str(), st.st_mode & 07777);
  return pattern;
}

void RemoveScratchCopy(const std::string& scratch) {
  std::error_code ignored;
  std::filesystem::remove_all(scratch, ignored);
}
