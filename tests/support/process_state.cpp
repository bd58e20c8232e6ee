// Saving and restoring process-wide state around a test, and running a test's body in a child.

#include "support/process_state.h"

#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>

namespace vxtest {

ScopedEnvironment::~ScopedEnvironment() {
  for (const auto& [name, previous] : saved_) {
    if (previous.first) {
      setenv(name.c_str(), previous.second.c_str(), 1);
    } else {
      unsetenv(name.c_str());
    }
  }
}

void ScopedEnvironment::Set(const std::string& name, const std::string& value) {
  if (saved_.count(name) == 0) {
    const char* previous = getenv(name.c_str());
    saved_[name] = {previous != nullptr, previous != nullptr ? previous : ""};
  }
  setenv(name.c_str(), value.c_str(), 1);
}

ScopedSignalDisposition::ScopedSignalDisposition(int signal, void (*handler)(int)) : signal_(signal) {
  struct sigaction action = {};
  action.sa_handler = handler;
  sigemptyset(&action.sa_mask);
  sigaction(signal, &action, &saved_);
}

ScopedSignalDisposition::~ScopedSignalDisposition() { sigaction(signal_, &saved_, nullptr); }

ScopedResourceLimit::ScopedResourceLimit(int resource, rlim_t soft) : resource_(resource) {
  if (getrlimit(resource, &saved_) != 0) return;
  struct rlimit lowered = {soft, saved_.rlim_max};
  ok_ = setrlimit(resource, &lowered) == 0;
}

ScopedResourceLimit::~ScopedResourceLimit() {
  if (ok_) setrlimit(resource_, &saved_);
}

bool InChildProcess(const std::function<void()>& body) {
  fflush(stdout);
  fflush(stderr);
  const pid_t pid = fork();
  if (pid < 0) return false;
  if (pid == 0) {
    body();
    fflush(stdout);
    _exit(::testing::Test::HasFailure() ? 1 : 0);
  }
  int status = 0;
  if (waitpid(pid, &status, 0) != pid) return false;
  return WIFEXITED(status) && WEXITSTATUS(status) == 0;
}

}  // namespace vxtest
