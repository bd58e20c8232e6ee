// The terminal's view of a run, built from what the manager counted and recorded; the log file is
// never read back.

#include "host/terminal_report.h"

#include <cstring>

namespace {

bool StartsWith(const std::string& text, const char* start) {
  return text.compare(0, strlen(start), start) == 0;
}

bool IsError(const std::string& entry) { return StartsWith(entry, "Error: "); }

// "** " marks a notice the user must act on, except the run's last line, which points to the log.
bool IsNotice(const std::string& entry) {
  return StartsWith(entry, "** ") && !StartsWith(entry, "** See VXMigrate Log File for details:");
}

}  // namespace

TerminalReport::TerminalReport(Verbosity verbosity, FILE* out, FILE* err)
    : verbosity_(verbosity), out_(out), err_(err), progress_(err) {}

void TerminalReport::ShowProgress(vxMigrationManager& manager) {
  if (verbosity_ == Verbosity::kQuiet) return;
  manager_ = &manager;
  progress_.Enable(manager.GetSourceDirectory().str());
}

void TerminalReport::OnLogEntry(const std::string& entry) {
  if (IsError(entry) || (IsNotice(entry) && verbosity_ != Verbosity::kQuiet)) {
    progress_.Clear();
    fprintf(err_, "%s\n", entry.c_str());
    fflush(err_);
  } else if (verbosity_ == Verbosity::kVerbose) {
    progress_.Clear();  // standard output may be the same terminal
    // The header's blank entry stays blank.
    fprintf(out_, "%s\n", entry.find_first_not_of("\r\n") == std::string::npos ? "" : entry.c_str());
    fflush(out_);
  }
  if (manager_ != nullptr) progress_.Update(entry, manager_->GetFilesWritten());
}

void TerminalReport::HostError(const std::string& text) {
  progress_.Clear();
  fprintf(err_, "vxmigrate: %s\n", text.c_str());
  fflush(err_);
}

void TerminalReport::PrintSummary(vxMigrationManager& manager, int result, int logWriteError) {
  progress_.Clear();
  if (verbosity_ == Verbosity::kQuiet) return;
  const vxPluginSearch& search = manager.GetPluginSearch();
  const vxRunCounts& counts = manager.GetRunCounts();
  if (search.ran.empty()) {
    PrintWhyNoPluginRan(manager, result);
  } else {
    fprintf(out_, "Plug-in:              %s\n", search.ran.c_str());
  }
  const long errors = counts.errors + (logWriteError != 0 ? 1 : 0);
  fprintf(out_,
          "Files copied:         %ld\n"
          "INI files merged:     %ld\n"
          "Templates converted:  %ld\n"
          "Profiles converted:   %ld\n"
          "Files kept (existed): %ld\n"
          "Errors:               %ld\n"
          "Manual actions:       %ld\n",
          counts.filesCopied, counts.iniFilesMerged, counts.templatesConverted,
          counts.profilesConverted, counts.filesKept, errors, counts.manualActions);
  const vxLogFile* log = manager.GetLog();
  fprintf(out_, "Log:                  %s", log->GetFilename().c_str());
  if (logWriteError != 0) fprintf(out_, " (incomplete: %s)", strerror(logWriteError));
  fputc('\n', out_);
  fflush(out_);
}

void TerminalReport::PrintWhyNoPluginRan(vxMigrationManager& manager, int result) {
  const vxPluginSearch& search = manager.GetPluginSearch();
  fputs("Plug-in:              none ran\n", out_);
  if (result != 0) {
    fputs("  the run was refused by its checks (the error above says why)\n", out_);
    return;
  }
  if (search.rangesUnreadable) {
    fprintf(out_, "  the version ranges file could not be read: %s\n", search.rangesFile.c_str());
  } else if (!search.withoutMigrate.empty()) {
    fprintf(out_, "  %s serves the products and versions but has no Migrate entry point\n",
            search.withoutMigrate.c_str());
  } else if (!search.outOfRange.empty()) {
    fprintf(out_, "  versions %s and %s are outside the ranges of %s: %s (from %s)\n",
            manager.GetSourceVersion().c_str(), manager.GetDestinationVersion().c_str(),
            search.outOfRange.front().c_str(), search.ranges.c_str(), search.rangesFile.c_str());
  } else {
    fprintf(out_, "  no plug-in serves %s to %s\n", manager.GetSourceProduct().c_str(),
            manager.GetDestinationProduct().c_str());
  }
  for (const std::string& why : search.notLoaded) {
    fprintf(out_, "  could not be loaded: %s\n", why.c_str());
  }
}
