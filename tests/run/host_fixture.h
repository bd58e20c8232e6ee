// Runs the real vxmigrate host as a child process from a temporary bin folder that holds a copy of
// the host, its library, a "vxmigrate.ini" and the test plug-ins the test asks for.

#ifndef VXMIGRATE_TESTS_RUN_HOST_FIXTURE_H_
#define VXMIGRATE_TESTS_RUN_HOST_FIXTURE_H_

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <string>
#include <vector>

#include "support/test_files.h"

namespace vxtest {

struct HostResult {
  int exitCode = -1;
  std::string out;
  std::string err;
};

const char kDefaultRanges[] =
    "[pavsuite]\nLow=4.0\nHigh=6.5\n\n[halsuite]\nLow=4.0\nHigh=6.5\n\n[log]\nLow=5.0\nHigh=7.0\n\n"
    "[obx]\nLow=1.0\nHigh=4.5\n\n[tradeq]\nLow=1.0\nHigh=9.0\n";

class HostRun {
 public:
  // plugins: base names of test plug-ins ("p10_pavsuite") to place beside the host.
  explicit HostRun(const std::vector<std::string>& plugins, const char* ranges = kDefaultRanges)
      : bin_(root_.Path("bin")), src_(root_.Path("src")), dst_(root_.Path("dst")) {
    MakeDirs(bin_);
    MakeDirs(src_);
    MakeDirs(dst_);
    std::string hostDir = std::string(VXM_HOST_EXE).substr(0, std::string(VXM_HOST_EXE).rfind('/'));
    CopyExecutable(VXM_HOST_EXE, bin_ + "/vxmigrate");
    CopyExecutable(hostDir + "/libvxmigrate.so.0", bin_ + "/libvxmigrate.so.0");
    for (const std::string& name : plugins) {
      CopyExecutable(std::string(VXM_TEST_PLUGIN_DIR) + "/" + name + ".so", bin_ + "/" + name + ".so");
    }
    if (ranges != nullptr) WriteFile(bin_ + "/vxmigrate.ini", ranges);
  }

  const std::string& bin() const { return bin_; }
  const std::string& src() const { return src_; }
  const std::string& dst() const { return dst_; }
  std::string Path(const std::string& relative) const { return root_.Path(relative); }
  std::string Log() const { return dst_ + "/vxmigrate.log"; }

  // Runs the host with argv[0] = its full path and the given options.
  HostResult Run(const std::vector<std::string>& options) const {
    std::vector<std::string> args = {bin_ + "/vxmigrate"};
    args.insert(args.end(), options.begin(), options.end());
    std::string outPath = root_.Path("stdout.txt");
    std::string errPath = root_.Path("stderr.txt");
    pid_t child = fork();
    if (child == 0) {
      int out = open(outPath.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
      int err = open(errPath.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
      dup2(out, 1);
      dup2(err, 2);
      std::vector<char*> argv;
      for (std::string& arg : args) argv.push_back(&arg[0]);
      argv.push_back(nullptr);
      execv(argv[0], argv.data());
      _exit(127);
    }
    HostResult result;
    int status = 0;
    waitpid(child, &status, 0);
    result.exitCode = WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
    result.out = ReadFile(outPath);
    result.err = ReadFile(errPath);
    return result;
  }

  // The six run options for products p1 -> p2 and versions v1 -> v2 over src() and dst().
  std::vector<std::string> RunOptions(const std::string& p1, const std::string& p2,
                                      const std::string& v1, const std::string& v2) const {
    return {"-D1:" + src_, "-D2:" + dst_, "-P1:" + p1, "-P2:" + p2, "-V1:" + v1, "-V2:" + v2};
  }

 private:
  static void CopyExecutable(const std::string& from, const std::string& to) {
    WriteFile(to, ReadFile(from));
    chmod(to.c_str(), 0755);
  }

  TempDir root_;
  std::string bin_;
  std::string src_;
  std::string dst_;
};

}  // namespace vxtest

#endif  // VXMIGRATE_TESTS_RUN_HOST_FIXTURE_H_
