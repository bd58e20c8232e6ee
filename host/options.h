// The host's own reading of its command line, before the manager sees it: --help, --version, the
// -q and -v switches, and the refusal of anything that is not a described option or whose value
// cannot be used. Nothing here reads a file or writes anything.

#ifndef VXMIGRATE_HOST_OPTIONS_H_
#define VXMIGRATE_HOST_OPTIONS_H_

#include <string>
#include <vector>

enum class HostAction { kMigrate, kPreview, kReport, kUndo, kListRuns, kHelp, kVersion, kUsageError };
enum class Verbosity { kQuiet, kNormal, kVerbose };

struct HostOptions {
  HostAction action = HostAction::kMigrate;
  Verbosity verbosity = Verbosity::kNormal;
  // For kMigrate: argv without the host's own switches (argv[0] first), for the manager.
  std::vector<char*> managerArguments;
  // For kUsageError: what to print on standard error, ending in a line feed.
  std::string error;
  // The run options ("-D1" ... "-V2") the command line lacks; the command file may give them.
  std::string missingRunOptions;
  // For kPreview: the destination as "-D2" gives it, and its index in managerArguments.
  std::string destination;
  size_t destinationArgument = 0;
  // For kReport, kUndo, kListRuns: the destination folder named after the option.
  bool force = false;  // --undo --force: also when files changed since the run
};

// REQUIRES: argv holds argc texts.
HostOptions ReadHostOptions(int argc, char** argv);

#endif  // VXMIGRATE_HOST_OPTIONS_H_
