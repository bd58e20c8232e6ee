// Forks, gives the test's folders away and drops root before running the body.

#include "support/unprivileged.h"

#include <gtest/gtest.h>
#include <grp.h>
#include <unistd.h>

#include <cstdlib>

#include "support/process_state.h"

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
  return InChildProcess([&] {
    if (root && (setgroups(0, nullptr) != 0 || setgid(kNobody) != 0 || setuid(kNobody) != 0)) {
      ADD_FAILURE() << "cannot become user " << kNobody;
      return;
    }
    body();
  });
}

}  // namespace vxtest
