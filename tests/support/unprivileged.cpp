// Forks, gives the test's folders away and drops root before running the body.

#include "support/unprivileged.h"

#include <gtest/gtest.h>
#include <grp.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdlib>

namespace vxtest {
namespace {

const uid_t kNobody = 65534;

bool GiveAway(const std::string& folder) {
  const std::string command = "chown -R -h 65534:65534 '" + folder + "'";
  return system(command.c_str()) == 0;
}

}  // namespace

bool AsUnprivilegedUser(const std::vector<std::string>& folders, const std::function<void()>& body) {
  const bool root = geteuid() == 0;
  if (root) {
    for (const std::string& folder : folders) {
      if (!GiveAway(folder)) return false;
    }
  }
  fflush(stdout);
  const pid_t pid = fork();
  if (pid < 0) return false;
  if (pid == 0) {
    if (root && (setgroups(0, nullptr) != 0 || setgid(kNobody) != 0 || setuid(kNobody) != 0)) {
      _exit(2);
    }
    body();
    fflush(stdout);
    _exit(::testing::Test::HasFailure() ? 1 : 0);
  }
  int status = 0;
  if (waitpid(pid, &status, 0) != pid) return false;
  return WIFEXITED(status) && WEXITSTATUS(status) == 0;
}

}  // namespace vxtest
