// Starts a program as a child process, waits for it with or without a time limit, interrupts or
// kills it. Diagnostics go to standard error. One object serves one child from one thread; only the
// process that spawned the child reaps it.

#ifndef VXMIGRATE_SRC_PROC2_PROC2_H_
#define VXMIGRATE_SRC_PROC2_PROC2_H_

#include <cstdint>
#include <string>
#include <vector>

class vxProc2 {
 public:
  // Wait's limit meaning "no limit".
  static const unsigned long kNoLimit = 0xFFFFFFFFUL;

  vxProc2();
  virtual ~vxProc2();  // neither signals nor reaps a running child

  vxProc2(const vxProc2&) = delete;
  vxProc2& operator=(const vxProc2&) = delete;

  // Starts program with the blank-separated arguments (may be null) in folder (may be null: the
  // current one). wait non-zero waits without limit. priority 1..10 maps to a nice value, 6 keeps
  // the inherited one. Returns the child's pid, 0 after a completed wait, 0 when fork failed.
  virtual int Spawn(const char* program, const char* arguments, const char* folder,
                    unsigned int wait, unsigned long priority);
  // Waits up to limit milliseconds (kNoLimit: without limit; 0: polls once), testing once a second.
  // Returns the exit code, the number of the signal that ended the child, an error number, 0 when
  // there is no child, or -1 (as unsigned) while the child still runs.
  virtual unsigned int Wait(unsigned long limit);
  // Sends SIGINT to the child; with wait non-zero then waits without limit.
  virtual void Cancel(unsigned int wait);
  // Sends SIGKILL to the child without waiting.
  virtual void Kill();
  // The text of the last error ("No Error." until one happens).
  virtual const char* GetLastError();

  int ChildPid() const { return childPid_; }
  int LastStatus() const { return lastStatus_; }

 protected:
  int32_t lastStatus_ = 0;
  int32_t childPid_ = 0;
  int32_t spawnerPid_ = 0;
  int32_t dropPrivileges_ = 0;   // 1: the child sets its effective uid to its real uid
  int32_t childInput_ = 0;       // descriptors the child takes as 0, 1 and 2; 0 means unchanged
  int32_t childOutput_ = 0;
  int32_t childError_ = 0;

 private:
  // Sets the child up and execs the program; returns only when a descriptor or the folder could
  // not be set up (the caller's Spawn then returns 0 in the child). Allocates nothing: everything
  // it needs is prepared before the fork.
  void RunChild(char* const argv[], const char* folder, int nice, long openMax);
  void CloseHandedOverDescriptors();

  std::string program_;
  std::string argumentText_;
  char errorText_[600];
  std::vector<std::string> arguments_;
};

// The calling thread's current errno.
unsigned long GetLastError();
// strerror of error (all bits set: the current errno), or "undefined."; copied into buffer (at most
// size bytes, always terminated) when one is given.
const char* GetLastErrorText(char* buffer, unsigned long size, unsigned long error);

#endif  // VXMIGRATE_SRC_PROC2_PROC2_H_
