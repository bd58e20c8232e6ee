// A shipped plug-in's sample run in a temporary folder: a bin folder with the host, its library,
// "vxmigrate.ini" and every shipped plug-in, copies of the plug-in's two sample installations
// (samples/) and its command file (samples/runs/<plug-in>/migcmd.ini), for tests that run the
// real host over the samples.

#ifndef VXMIGRATE_TESTS_RUN_SAMPLE_RUN_H_
#define VXMIGRATE_TESTS_RUN_SAMPLE_RUN_H_

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <map>
#include <string>
#include <vector>

#include "support/test_files.h"

namespace vxtest {

using Tree = std::map<std::string, std::string>;

inline const char* const kShippedPlugins[] = {"halden_to_obx", "halsuite_to_halsuite",
                                              "log_to_log", "obx_to_obx"};

inline std::string Source(const std::string& relative) {
  return std::string(VXM_SOURCE_DIR) + "/" + relative;
}

// Every file below folder by relative name, with its content.
// The run's own bookkeeping (its undo journal and report) is no installation file and is left out.
inline Tree FilesBelow(const std::string& folder) {
  Tree files;
  for (const std::string& name : ListTree(folder)) {
    if (name.rfind(".vxmigrate", 0) == 0 || name == "vxmigrate-report.json") continue;
    if (!std::filesystem::is_directory(folder + "/" + name)) {
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

class SampleRun {
  TempDir root_;

 public:
  const std::string plugin, commandFile, source, destination;

  explicit SampleRun(const std::string& name)
      : plugin(name),
        commandFile(Source("samples/runs/" + name + "/migcmd.ini")),
        source(CommandValue(commandFile, "main", "D1")),
        destination(CommandValue(commandFile, "main", "D2")) {
    namespace fs = std::filesystem;
    const std::string host = VXM_HOST_EXE, built = host.substr(0, host.rfind('/'));
    Install(host, "vxmigrate");
    Install(built + "/libvxmigrate.so.0", "libvxmigrate.so.0");
    for (const char* shipped : kShippedPlugins) Install(built + "/" + shipped + ".so", "");
    Install(Source("host/vxmigrate.ini"), "");
    fs::copy(Source("samples/" + source), Path(source), fs::copy_options::recursive);
    fs::copy(Source("samples/" + destination), Path(destination), fs::copy_options::recursive);
    fs::copy_file(commandFile, Path("migcmd.ini"));
  }

  std::string Path(const std::string& relative) const { return root_.Path(relative); }

  // The host's exit status, run from the run folder as a user would, with its command file.
  int Run() const {
    const std::string command = "cd '" + root_.path() + "' && bin/vxmigrate -cmd:./migcmd.ini >" +
                                Path("out.txt") + " 2>&1";
    const int status = system(command.c_str());
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  }

  // The host run from the run folder with options; its exit status (-1 when it did not exit).
  // Standard output and error are kept apart: Out(), Err().
  int Run(const std::vector<std::string>& options) const {
    std::vector<std::string> args = {"bin/vxmigrate"};
    args.insert(args.end(), options.begin(), options.end());
    std::vector<char*> argv;
    for (std::string& arg : args) argv.push_back(arg.data());
    argv.push_back(nullptr);
    const pid_t child = fork();
    if (child == 0) {
      int out = open(Path("out.txt").c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
      int err = open(Path("err.txt").c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
      if (out < 0 || err < 0 || dup2(out, 1) < 0 || dup2(err, 2) < 0 ||
          chdir(root_.path().c_str()) != 0) {
        _exit(126);
      }
      execv(argv[0], argv.data());
      _exit(127);
    }
    int status = 0;
    if (child < 0 || waitpid(child, &status, 0) != child || !WIFEXITED(status)) return -1;
    return WEXITSTATUS(status);
  }
  std::string Out() const { return ReadFile(Path("out.txt")); }
  std::string Err() const { return ReadFile(Path("err.txt")); }

  // The command file's run as a whole command line (a preview takes no command file).
  std::vector<std::string> RunOptions() const {
    std::vector<std::string> options;
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
    for (std::string entry : LogEntries(Path(destination + "/vxmigrate.log"))) {
      for (size_t at; (at = entry.find(root_.path())) != std::string::npos;) {
        entry.replace(at, root_.path().size(), "<run>");
      }
      log += entry + "\n";
    }
    files["vxmigrate.log"] = log;
    return files;
  }

 private:
  void Install(const std::string& from, std::string name) const {
    if (name.empty()) name = from.substr(from.rfind('/') + 1);
    WriteFile(Path("bin/" + name), ReadFile(from));
    chmod(Path("bin/" + name).c_str(), 0755);
  }
};

}  // namespace vxtest

#endif  // VXMIGRATE_TESTS_RUN_SAMPLE_RUN_H_
