// Guards for the process-wide state a test changes (environment variables, signal dispositions,
// resource limits): each puts back what it found when it goes out of scope, also when an assertion
// ends the test early. State the process may not be able to put back (a nice value only root can
// lower again) is changed in a child process instead: InChildProcess.

#ifndef VXMIGRATE_TESTS_SUPPORT_PROCESS_STATE_H_
#define VXMIGRATE_TESTS_SUPPORT_PROCESS_STATE_H_

#include <signal.h>
#include <sys/resource.h>

#include <functional>
#include <map>
#include <string>
#include <utility>

namespace vxtest {

// Sets environment variables while it lives; each is restored (or removed) afterwards.
class ScopedEnvironment {
 public:
  ScopedEnvironment() = default;
  ~ScopedEnvironment();
  ScopedEnvironment(const ScopedEnvironment&) = delete;
  ScopedEnvironment& operator=(const ScopedEnvironment&) = delete;

  void Set(const std::string& name, const std::string& value);

 private:
  std::map<std::string, std::pair<bool, std::string>> saved_;  // name -> (was set, value)
};

// Gives signal the handler (SIG_DFL, SIG_IGN) while it lives.
class ScopedSignalDisposition {
 public:
  ScopedSignalDisposition(int signal, void (*handler)(int));
  ~ScopedSignalDisposition();
  ScopedSignalDisposition(const ScopedSignalDisposition&) = delete;
  ScopedSignalDisposition& operator=(const ScopedSignalDisposition&) = delete;

 private:
  int signal_;
  struct sigaction saved_;
};

// Lowers a resource's soft limit while it lives. ok() is false when the limit could not be set.
class ScopedResourceLimit {
 public:
  ScopedResourceLimit(int resource, rlim_t soft);
  ~ScopedResourceLimit();
  ScopedResourceLimit(const ScopedResourceLimit&) = delete;
  ScopedResourceLimit& operator=(const ScopedResourceLimit&) = delete;

  bool ok() const { return ok_; }

 private:
  int resource_;
  struct rlimit saved_;
  bool ok_ = false;
};

// Runs body in a forked child process, so that whatever it changes in the process stays there.
// True when the child ran body to its end without a test failure; expectations inside body print
// as usual.
bool InChildProcess(const std::function<void()>& body);

}  // namespace vxtest

#endif  // VXMIGRATE_TESTS_SUPPORT_PROCESS_STATE_H_
