// A child process that stays alive until the object is destroyed, for tests that need the pid of a
// running process (a server's pid file).

#ifndef VXMIGRATE_TESTS_SUPPORT_LIVE_PROCESS_H_
#define VXMIGRATE_TESTS_SUPPORT_LIVE_PROCESS_H_

#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

namespace vxtest {

class LiveProcess {
 public:
  LiveProcess() : pid_(fork()) {
    if (pid_ == 0) {
      pause();
      _exit(0);
    }
  }
  ~LiveProcess() {
    kill(pid_, SIGKILL);
    waitpid(pid_, nullptr, 0);
  }
  LiveProcess(const LiveProcess&) = delete;
  LiveProcess& operator=(const LiveProcess&) = delete;

  pid_t pid() const { return pid_; }

 private:
  pid_t pid_;
};

}  // namespace vxtest

#endif  // VXMIGRATE_TESTS_SUPPORT_LIVE_PROCESS_H_
