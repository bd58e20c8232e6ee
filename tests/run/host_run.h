// A temporary installation pair and a copy of the vxmigrate host with chosen plug-ins beside it,
// for tests that run the real host process and look at its exit status, output and log; the same
// over a shipped plug-in's samples and command file (SampleRun); and the child-process plumbing
// those tests share.

#ifndef VXMIGRATE_TESTS_RUN_HOST_RUN_H_
#define VXMIGRATE_TESTS_RUN_HOST_RUN_H_

#include <fcntl.h>
#include <grp.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <functional>
#include <map>
#include <string>
#include <vector>

#include "support/test_files.h"

extern char** environ;

namespace vxtest {

using Lines = std::vector<std::string>;
using Tree = std::map<std::string, std::string>;

inline const char* const kShippedPlugins[] = {"halden_to_obx", "halsuite_to_halsuite",
                                              "log_to_log", "obx_to_obx"};

inline bool Has(const std::string& text, const std::string& part) {
  return text.find(part) != std::string::npos;
}

// text with every mark ("$DST") replaced by its value.
inline std::string Expand(std::string text, const std::map<std::string, std::string>& marks) {
  for (const auto& [mark, value] : marks) {
    for (size_t at; (at = text.find(mark)) != std::string::npos;) text.replace(at, mark.size(), value);
  }
  return text;
}

// The run's own bookkeeping: its log, its report and its undo journal, which every run changes.
inline bool IsBookkeeping(const std::string& name) {
  return name == "vxmigrate.log" || name == "vxmigrate-report.json" ||
         name.rfind(".vxmigrate", 0) == 0;
}

inline Tree WithoutBookkeeping(Tree tree) {
  for (auto entry = tree.begin(); entry != tree.end();) {
    entry = IsBookkeeping(entry->first) ? tree.erase(entry) : std::next(entry);
  }
  return tree;
}

// A file at path opened for writing, emptied; closed on exec.
inline int CreateFile(const std::string& path) {
  return open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0644);
}

// Starts program with argument list args (args[0]: the name it sees) in folder cwd, standard
// output and error on descriptors out and err, its environment without PATH unless keepPath;
// inChild, when given, runs in the child right before the exec. The child's pid.
inline pid_t StartProcess(const std::string& program, Lines args, const std::string& cwd,
                          int out, int err, bool keepPath = true,
                          const std::function<bool()>& inChild = nullptr) {
  const pid_t child = fork();
  if (child != 0) return child;
  if (dup2(out, 1) < 0 || dup2(err, 2) < 0 || chdir(cwd.c_str()) != 0 || (inChild && !inChild())) {
    _exit(126);
  }
  std::vector<char*> argv, env;
  for (std::string& arg : args) argv.push_back(arg.data());
  argv.push_back(nullptr);
  for (char** e = environ; *e != nullptr; ++e) {
    if (keepPath || strncmp(*e, "PATH=", 5) != 0) env.push_back(*e);
  }
  env.push_back(nullptr);
  execve(program.c_str(), argv.data(), env.data());
  _exit(127);
}

// The child's exit status; -1 when it did not exit.
inline int ExitStatus(pid_t child) {
  int status = 0;
  if (child <= 0 || waitpid(child, &status, 0) != child || !WIFEXITED(status)) return -1;
  return WEXITSTATUS(status);
}

// A temporary bin folder holding a copy of the host, its library, "vxmigrate.ini" (unless told
// otherwise) and the named plug-ins (test plug-ins, or shipped ones), beside empty "src" and "dst"
// folders. The host runs from the temporary folder.
class HostRun {
  TempDir root_;

 public:
  const std::string bin = root_.Path("bin"), src = root_.Path("src"), dst = root_.Path("dst");
  const std::string log = dst + "/vxmigrate.log";

  explicit HostRun(const Lines& plugins, bool ranges = true) {
    for (const std::string& folder : {src, dst}) MakeDirs(folder);
    const std::string host = VXM_HOST_EXE, built = host.substr(0, host.rfind('/'));
    Install(host, "vxmigrate");
    Install(built + "/libvxmigrate.so.0", "libvxmigrate.so.0");
    for (const std::string& name : plugins) {
      const bool shipped = std::count(std::begin(kShippedPlugins), std::end(kShippedPlugins), name);
      Install((shipped ? built : std::string(VXM_TEST_PLUGIN_DIR)) + "/" + name + ".so",
              name + ".so");
    }
    if (ranges) {
      WriteFile(bin + "/vxmigrate.ini",
                "[pavsuite]\nLow=4.0\nHigh=6.5\n\n[halsuite]\nLow=4.0\nHigh=6.5\n\n[log]\nLow=5.0\n"
                "High=7.0\n\n[obx]\nLow=1.0\nHigh=4.5\n\n[tradeq]\nLow=1.0\nHigh=9.0\n");
    }
  }

  std::string Path(const std::string& relative) const { return root_.Path(relative); }
  std::string Pointer() const { return "** See VXMigrate Log File for details:  " + log; }
  std::string Script() const { return dst + "/synchinstall.sh"; }

  // Fills src and dst with the shipped sample installations (Halden and OBX).
  void UseSamples() const {
    namespace fs = std::filesystem;
    fs::copy(VXM_SOURCE_DIR "/samples/halden", src, fs::copy_options::recursive);
    fs::copy(VXM_SOURCE_DIR "/samples/obx", dst, fs::copy_options::recursive);
  }

  // Hands the whole test folder to uid (and the group of the same number), for runs as that user.
  void GiveTo(uid_t uid) const {
    lchown(root_.path().c_str(), uid, uid);
    for (const auto& entry : std::filesystem::recursive_directory_iterator(root_.path())) {
      lchown(entry.path().c_str(), uid, uid);
    }
  }

  // The host's command line: its full path, then options.
  Lines Args(const Lines& options) const {
    Lines args = {bin + "/vxmigrate"};
    args.insert(args.end(), options.begin(), options.end());
    return args;
  }

  // Runs the host with the given options, as user uid when given (the child drops to it before
  // exec); its exit status, -1 when it did not exit. fullDisk: no file may grow (every write fails
  // as on a full disk).
  int Run(const Lines& options, int uid = -1, bool fullDisk = false) const {
    const int files[2] = {CreateFile(Path("out.txt")), CreateFile(Path("err.txt"))};
    // Under the file-size limit the output files could not grow either: the output then goes
    // through pipes (a few hundred bytes, well within a pipe's buffer) and is saved after the run.
    int pipes[2][2] = {{-1, files[0]}, {-1, files[1]}};
    if (fullDisk && (pipe2(pipes[0], O_CLOEXEC) != 0 || pipe2(pipes[1], O_CLOEXEC) != 0)) return -1;
    const pid_t child = StartProcess(bin + "/vxmigrate", Args(options), root_.path(), pipes[0][1],
                                     pipes[1][1], true, [&] {
      if (uid >= 0 && (setgroups(0, nullptr) != 0 || setgid(uid) != 0 || setuid(uid) != 0)) {
        return false;
      }
      if (!fullDisk) return true;
      signal(SIGXFSZ, SIG_IGN);  // kept across exec: writes then fail with EFBIG
      const struct rlimit none = {0, 0};
      return setrlimit(RLIMIT_FSIZE, &none) == 0;
    });
    for (int i = 0; i < 2 && fullDisk; ++i) close(pipes[i][1]);
    const int status = ExitStatus(child);
    for (int i = 0; i < 2 && fullDisk; ++i) {
      char buffer[4096];
      for (ssize_t n; (n = read(pipes[i][0], buffer, sizeof buffer)) > 0;) {
        if (write(files[i], buffer, n) != n) break;
      }
      close(pipes[i][0]);
    }
    for (int file : files) close(file);
    return status;
  }
  std::string Out() const { return ReadFile(Path("out.txt")); }
  std::string Err() const { return ReadFile(Path("err.txt")); }

  // The six run options over src and dst for products and versions {P1, P2, V1, V2}.
  Lines Options(const Lines& p) const {
    return {"-D1:" + src, "-D2:" + dst, "-P1:" + p[0], "-P2:" + p[1], "-V1:" + p[2], "-V2:" + p[3]};
  }
  // The shipped plug-in's run over the samples: halsuite 5.5 into obx 3.0.
  Lines SampleOptions() const { return Options({"halsuite", "obx", "5.5", "3.0"}); }

  // The log's entries after the header (the header's last entry, "\r\n\r\n", spans three lines).
  Lines Body() const {
    Lines entries = LogEntries(log);
    return Lines(entries.begin() + std::min<size_t>(11, entries.size()), entries.end());
  }

 private:
  void Install(const std::string& from, const std::string& name) const {
    WriteFile(bin + "/" + name, ReadFile(from));
    chmod((bin + "/" + name).c_str(), 0755);
  }
};

// A shipped plug-in's sample run: a HostRun with every shipped plug-in and the shipped
// "vxmigrate.ini", copies of the plug-in's two sample installations (samples/) and its command
// file (samples/runs/<plug-in>/migcmd.ini).
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

#endif  // VXMIGRATE_TESTS_RUN_HOST_RUN_H_
