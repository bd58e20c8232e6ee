// A shipped plug-in's sample run in a temporary folder: a HostRun with every shipped plug-in and
// the shipped "vxmigrate.ini", copies of the plug-in's two sample installations (samples/) and its
// command file (samples/runs/<plug-in>/migcmd.ini), for tests that run the real host over them.

#ifndef VXMIGRATE_TESTS_RUN_SAMPLE_RUN_H_
#define VXMIGRATE_TESTS_RUN_SAMPLE_RUN_H_

#include <filesystem>
#include <fstream>
#include <string>

#include "run/host_run.h"
#include "support/test_files.h"

namespace vxtest {

inline std::string Source(const std::string& relative) {
  return std::string(VXM_SOURCE_DIR) + "/" + relative;
}

// Every file below folder by relative name, with its content, but for the run's undo journal and
// report, which are no installation files.
inline Tree FilesBelow(const std::string& folder) {
  Tree files;
  for (const std::string& name : ListTree(folder)) {
    if ((name == "vxmigrate.log" || !IsBookkeeping(name)) &&
        !std::filesystem::is_directory(folder + "/" + name)) {
      files[name] = ReadFile(folder + "/" + name);
    }
  }
  return files;
}

// The value of key in section of a sample command file ("D1=halden" -> "halden"); "" when absent.
inline std::string CommandValue(const std::string& commandFile, const std::string& section,
                                const std::string& key) {
  std::ifstream in(commandFile);
  std::string current;
  for (std::string line; std::getline(in, line);) {
    if (!line.empty() && line[0] == '[') current = line.substr(1, line.find(']') - 1);
    if (current == section && line.rfind(key + "=", 0) == 0) return line.substr(key.size() + 1);
  }
  return "";
}

class SampleRun : public HostRun {
 public:
  const std::string plugin, commandFile, source, destination;

  explicit SampleRun(const std::string& name)
      : HostRun(Lines(std::begin(kShippedPlugins), std::end(kShippedPlugins)), false),
        plugin(name),
        commandFile(Source("samples/runs/" + name + "/migcmd.ini")),
        source(CommandValue(commandFile, "main", "D1")),
        destination(CommandValue(commandFile, "main", "D2")) {
    namespace fs = std::filesystem;
    fs::copy_file(Source("host/vxmigrate.ini"), bin + "/vxmigrate.ini");
    fs::copy(Source("samples/" + source), Path(source), fs::copy_options::recursive);
    fs::copy(Source("samples/" + destination), Path(destination), fs::copy_options::recursive);
    fs::copy_file(commandFile, Path("migcmd.ini"));
  }

  using HostRun::Run;
  // The run as a user starts it: from the run folder, with its command file.
  int Run() const { return Run({"-cmd:./migcmd.ini"}); }

  // The command file's run as a whole command line (a preview takes no command file).
  Lines RunOptions() const {
    Lines options;
    for (const char* key : {"D1", "D2", "P1", "P2", "V1", "V2", "FT"}) {
      options.push_back(std::string("-") + key + ":" + CommandValue(commandFile, "main", key));
    }
    // The command file's profile keys become options whether it names them or not.
    for (const char* key : {"Log", "Proxy", "Stream", "Link", "Alert"}) {
      options.push_back(std::string("-PF") + key + ":" + CommandValue(commandFile, "profiles", key));
    }
    return options;
  }

  // The destination's files, its log without time stamps and with the run folder as "<run>".
  Tree Destination() const {
    Tree files = FilesBelow(Path(destination));
    std::string log;
    std::string root = Path("");
    root.pop_back();
    for (std::string entry : LogEntries(Path(destination + "/vxmigrate.log"))) {
      for (size_t at; (at = entry.find(root)) != std::string::npos;) {
        entry.replace(at, root.size(), "<run>");
      }
      log += entry + "\n";
    }
    files["vxmigrate.log"] = log;
    return files;
  }
};

}  // namespace vxtest

#endif  // VXMIGRATE_TESTS_RUN_SAMPLE_RUN_H_
