// Checks each argument against the described options. Only values the run cannot use are
// refused here; whether the run is complete is the manager's question (it may consult the
// command file).

#include "host/options.h"

#include <strings.h>

#include <algorithm>
#include <cstring>

#include "host/usage.h"
#include "migrate/manager.h"

namespace {

const char* const kRunOptions[] = {"D1", "D2", "P1", "P2", "V1", "V2"};
const char* const kFreeOptions[] = {"cmd", "PFLog", "PFProxy", "PFStream", "PFLink", "PFAlert"};

bool IsDigit(char c) { return c >= '0' && c <= '9'; }

// One to three numbers joined by dots: what the version reader takes in full.
bool IsDottedNumber(const std::string& text) {
  int numbers = 0;
  size_t at = 0;
  while (true) {
    size_t start = at;
    while (at < text.size() && IsDigit(text[at])) ++at;
    if (at == start) return false;
    ++numbers;
    if (at == text.size()) return numbers <= 3;
    if (text[at] != '.') return false;
    ++at;
  }
}

bool EqualsIgnoringCase(const std::string& a, const char* b) {
  return strcasecmp(a.c_str(), b) == 0;
}

std::string ProductList() {
  std::string list;
  for (int id = 1; vxMigrationManager::GetProductText(id) != nullptr; ++id) {
    if (!list.empty()) list += ", ";
    list += vxMigrationManager::GetProductText(id);
  }
  return list;
}

// Why the value of a described option cannot be used; empty when it can, or when the name is not
// a described option (then *known is false).
std::string CheckValue(const std::string& argument, const std::string& name,
                       const std::string& value, bool* known) {
  *known = true;
  const std::string quoted = "vxmigrate: '" + argument + "': ";
  if (name == "D1" || name == "D2") {
    if (value.empty()) return quoted + "needs a folder, as -" + name + ":<folder>\n";
    return "";
  }
  if (name == "P1" || name == "P2") {
    if (vxMigrationManager::GetProductID(value.c_str()) > 0) return "";
    return quoted + "unknown product id '" + value + "'\naccepted product ids: " + ProductList() +
           "\n";
  }
  if (name == "V1" || name == "V2") {
    if (IsDottedNumber(value)) return "";
    return quoted + "'" + value + "' is not a version\naccepted versions: dotted numbers, as 5.5 or 6.0.1\n";
  }
  if (name == "FT") {
    for (const char* accepted : {"", "Y", "Yes", "N", "No"}) {
      if (EqualsIgnoringCase(value, accepted)) return "";
    }
    return quoted + "unknown value '" + value + "'\naccepted values: Y, Yes, N, No\n";
  }
  for (const char* free : kFreeOptions) {
    if (name == free) return "";
  }
  *known = false;
  return "";
}

}  // namespace

HostOptions ReadHostOptions(int argc, char** argv) {
  HostOptions options;
  // --help and --version win over everything else, so that they never start a run.
  for (int i = 1; i < argc; ++i) {
    if (strcmp(argv[i], "--help") == 0 || strcmp(argv[i], "-h") == 0) {
      options.action = HostAction::kHelp;
      return options;
    }
  }
  for (int i = 1; i < argc; ++i) {
    if (strcmp(argv[i], "--version") == 0) {
      options.action = HostAction::kVersion;
      return options;
    }
  }

  // The commands about a destination's past runs take the destination and nothing else.
  for (int i = 1; i < argc; ++i) {
    const std::string argument = argv[i];
    HostAction action = argument == "--report"      ? HostAction::kReport
                        : argument == "--undo"      ? HostAction::kUndo
                        : argument == "--list-runs" ? HostAction::kListRuns
                                                    : HostAction::kMigrate;
    if (action == HostAction::kMigrate) continue;
    std::vector<std::string> rest;
    for (int j = 1; j < argc; ++j) {
      if (j != i) rest.push_back(argv[j]);
    }
    if (action == HostAction::kUndo && !rest.empty() &&
        std::find(rest.begin(), rest.end(), "--force") != rest.end()) {
      options.force = true;
      rest.erase(std::find(rest.begin(), rest.end(), "--force"));
    }
    if (i + 1 >= argc || rest.size() != 1 || rest[0] != argv[i + 1] || rest[0].empty()) {
      options.error = "vxmigrate: " + argument + " takes one destination folder" +
                      (action == HostAction::kUndo ? " (and --force)" : "") + "\n" + kHostHint;
      options.action = HostAction::kUsageError;
      return options;
    }
    options.destination = rest[0];
    options.action = action;
    return options;
  }

  options.managerArguments.push_back(argc > 0 ? argv[0] : nullptr);
  std::string given = " ";
  for (int i = 1; i < argc; ++i) {
    const std::string argument = argv[i];
    if (argument == "-q" || argument == "-v") {
      options.verbosity = argument == "-q" ? Verbosity::kQuiet : Verbosity::kVerbose;
      continue;
    }
    if (argument == "-n" || argument == "--dry-run") {
      options.action = HostAction::kPreview;
      continue;
    }
    bool known = false;
    if (argument.size() > 1 && argument[0] == '-') {
      // As the manager splits them: the name runs to the first ':'.
      const size_t split = argument.find(':');
      const std::string name = argument.substr(1, split == std::string::npos ? split : split - 1);
      const std::string value = split == std::string::npos ? "" : argument.substr(split + 1);
      options.error = CheckValue(argument, name, value, &known);
      given += name + " ";
      if (name == "D2") {
        options.destination = value;
        options.destinationArgument = options.managerArguments.size();
      }
    }
    if (!known) options.error = "vxmigrate: unknown option '" + argument + "'\n";
    if (!options.error.empty()) {
      options.error += kHostHint;
      options.action = HostAction::kUsageError;
      return options;
    }
    options.managerArguments.push_back(argv[i]);
  }
  for (const char* name : kRunOptions) {
    if (given.find(std::string(" ") + name + " ") != std::string::npos) continue;
    if (!options.missingRunOptions.empty()) options.missingRunOptions += ", ";
    options.missingRunOptions += std::string("-") + name;
  }
  // An incomplete line would have the command file fill it in, and the file's destination would
  // replace the scratch copy's: the preview would write into a real installation.
  if (options.action == HostAction::kPreview && !options.missingRunOptions.empty()) {
    options.error = "vxmigrate: a preview (-n) needs the whole run on the command line; missing " +
                    options.missingRunOptions + "\n" + kHostHint;
    options.action = HostAction::kUsageError;
  }
  return options;
}
