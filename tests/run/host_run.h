// A temporary installation pair and a copy of the vxmigrate host with chosen plug-ins beside it,
// for tests that run the real host process and look at its exit status, output and log.

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
#include <filesystem>
#include <string>
#include <vector>

#include "support/test_files.h"

namespace vxtest {

using Lines = std::vector<std::string>;

// A temporary bin folder holding a copy of the host, its library, "vxmigrate.ini" (unless told
// otherwise) and the named plug-ins (test plug-ins, or "halden_to_obx", the shipped one), beside
// empty "src" and "dst" folders.
class HostRun {
  TempDir root_;

 public:
  const std::string bin = root_.Path("bin"), src = root_.Path("src"), dst = root_.Path("dst");
  const std::string log = dst + "/vxmigrate.log";

  explicit HostRun(const Lines& plugins, bool ranges = true) {
    for (const std::string& folder : {src, dst}) MakeDirs(folder);
    const std::string host = VXM_HOST_EXE;
    const std::string hostFolder = host.substr(0, host.rfind('/'));
    Copy(host, "vxmigrate");
    Copy(hostFolder + "/libvxmigrate.so.0", "libvxmigrate.so.0");
    for (const std::string& name : plugins) {
      Copy(name == "halden_to_obx" ? hostFolder + "/" + name + ".so"
                                   : VXM_TEST_PLUGIN_DIR "/" + name + ".so",
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
    namespace fs = std::filesystem;
    lchown(root_.path().c_str(), uid, uid);
    for (const auto& entry : fs::recursive_directory_iterator(root_.path())) {
      lchown(entry.path().c_str(), uid, uid);
    }
  }

  // Runs the host with argv[0] = its full path and the given options, as user uid when given
  // (the child drops to it before exec); its exit status, -1 when it did not exit. fullDisk: no
  // file may grow (every write fails as on a full disk).
  int Run(const Lines& options, int uid = -1, bool fullDisk = false) const {
    std::vector<std::string> args = {bin + "/vxmigrate"};
    args.insert(args.end(), options.begin(), options.end());
    std::vector<char*> argv;
    for (std::string& arg : args) argv.push_back(arg.data());
    argv.push_back(nullptr);
    int out = open(Path("out.txt").c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0644);
    int err = open(Path("err.txt").c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0644);
    // Under the file-size limit the output files could not grow either: the output goes through
    // pipes (a few hundred bytes, well within a pipe's buffer) and is saved after the run.
    int pipes[2][2] = {{-1, -1}, {-1, -1}};
    if (fullDisk && (pipe2(pipes[0], O_CLOEXEC) != 0 || pipe2(pipes[1], O_CLOEXEC) != 0)) return -1;
    pid_t child = fork();
    if (child == 0) {
      dup2(fullDisk ? pipes[0][1] : out, 1);
      dup2(fullDisk ? pipes[1][1] : err, 2);
      if (uid >= 0 && (setgroups(0, nullptr) != 0 || setgid(uid) != 0 || setuid(uid) != 0)) {
        _exit(126);
      }
      if (fullDisk) {
        signal(SIGXFSZ, SIG_IGN);  // kept across exec: writes then fail with EFBIG
        struct rlimit none = {0, 0};
        setrlimit(RLIMIT_FSIZE, &none);
      }
      execv(argv[0], argv.data());
      _exit(127);
    }
    int status = 0;
    const bool waited = child > 0 && waitpid(child, &status, 0) == child;
    for (int i = 0; i < 2 && fullDisk; ++i) {
      close(pipes[i][1]);
      char buffer[4096];
      for (ssize_t n; (n = read(pipes[i][0], buffer, sizeof buffer)) > 0;) {
        if (write(i == 0 ? out : err, buffer, n) != n) break;
      }
      close(pipes[i][0]);
    }
    close(out);
    close(err);
    if (!waited) return -1;
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
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
  void Copy(const std::string& from, const std::string& name) const {
    WriteFile(bin + "/" + name, ReadFile(from));
    chmod((bin + "/" + name).c_str(), 0755);
  }
};

}  // namespace vxtest

#endif  // VXMIGRATE_TESTS_RUN_HOST_RUN_H_
