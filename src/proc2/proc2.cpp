// The process runner. The parent prepares everything the child needs (the argument vector, the nice
// value, the descriptor limit) before fork, so that between fork and execv the child makes only
// system calls and formats its few messages into a stack buffer: no allocation, no stdio lock.
// The child keeps no descriptor but 0, 1 and 2 across execv.

#include "src/proc2/proc2.h"

#include <fcntl.h>
#include <signal.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <climits>
#include <cstdarg>
#include <cstdio>
#include <cstring>
#include <ctime>

#include "src/proc2/close_descriptors.h"

namespace {

// The program takes entry 0 of the vector; 19 arguments follow at most, and a null always ends it.
const size_t kMaxArguments = 19;
const size_t kVectorEntries = kMaxArguments + 2;

const unsigned int kStillRunning = static_cast<unsigned int>(-1);
const int kKeepNice = INT_MIN;

// Where the source of the runner's diagnostics is said to be.
const char kSourceName[] = "./src/proc2";
const int kSetuidLine = 649;

int NiceForPriority(unsigned long priority) {
  static const int kNice[11] = {kKeepNice, 19, 16, 12, 8, 4, kKeepNice, -5, -10, -15, -20};
  return priority <= 10 ? kNice[priority] : kKeepNice;
}

// "All bits set" on both word sizes: callers on 64-bit may pass either form.
bool AllBitsSet(unsigned long value) { return value == 0xFFFFFFFFUL || value == ULONG_MAX; }

// Formats a diagnostic into a stack buffer and writes it to descriptor 2 directly, which is safe
// in a forked child and keeps the text whole.
void WriteDiagnostic(const char* format, ...) {
  char text[8192];
  va_list args;
  va_start(args, format);
  const int length = vsnprintf(text, sizeof text, format, args);
  va_end(args);
  if (length <= 0) return;
  size_t left = static_cast<size_t>(length) < sizeof text ? static_cast<size_t>(length)
                                                          : sizeof text - 1;
  const char* at = text;
  while (left > 0) {
    const ssize_t written = write(2, at, left);
    if (written < 0 && errno == EINTR) continue;
    if (written <= 0) return;
    at += written;
    left -= static_cast<size_t>(written);
  }
}

// Puts a handed-over descriptor in a standard slot; the source is closed once it is copied.
bool MoveDescriptor(int from, int to) {
  if (dup2(from, to) != to) return false;
  close(from);
  return true;
}

// Pieces of text between single blanks; runs of blanks give no empty pieces.
std::vector<std::string> SplitAtBlanks(const std::string& text) {
  std::vector<std::string> pieces;
  std::vector<char> copy(text.begin(), text.end());
  copy.push_back('\0');
  char* state = nullptr;
  for (char* piece = strtok_r(copy.data(), " ", &state); piece != nullptr;
       piece = strtok_r(nullptr, " ", &state)) {
    pieces.emplace_back(piece);
  }
  return pieces;
}

}  // namespace

vxProc2::vxProc2() { strcpy(errorText_, "No Error."); }

vxProc2::~vxProc2() = default;

int vxProc2::Spawn(const char* program, const char* arguments, const char* folder,
                   unsigned int wait, unsigned long priority) {
  char* argv[kVectorEntries] = {};
  try {
    if (program != nullptr) program_ = program;
    if (arguments != nullptr) {
      argumentText_ = arguments;
      arguments_ = SplitAtBlanks(argumentText_);
    }
  } catch (...) {
    return 0;  // out of memory: nothing was started
  }
  argv[0] = &program_[0];
  for (size_t i = 0; i < arguments_.size() && i < kMaxArguments; ++i) argv[i + 1] = &arguments_[i][0];
  const int nice = NiceForPriority(priority);
  const long openMax = vxproc2::DescriptorLimit();

  spawnerPid_ = getpid();
  const pid_t pid = fork();
  if (pid < 0) {
    const int error = errno;
    WriteDiagnostic("Fork() error %d: %s.\n", error, strerror(error));
    return 0;
  }
  if (pid == 0) {
    RunChild(argv, folder, nice, openMax);
    return 0;  // the child could not be set up; it carries on in the caller's code
  }
  childPid_ = pid;
  CloseHandedOverDescriptors();
  if (wait != 0 && Wait(kNoLimit) == kStillRunning) Cancel(0);
  return childPid_;
}

void vxProc2::CloseHandedOverDescriptors() {
  for (int32_t* fd : {&childInput_, &childOutput_, &childError_}) {
    if (*fd != 0) close(*fd);
    *fd = 0;
  }
}

void vxProc2::RunChild(char* const argv[], const char* folder, int nice, long openMax) {
  if (nice != kKeepNice) {
    // Only root may lower the nice value: borrow uid 0 for this one call when the saved uid
    // allows it, and give it back at once. Failures leave the inherited value.
    const uid_t previous = geteuid();
    int ignored = seteuid(0);
    setpriority(PRIO_PROCESS, 0, nice);
    ignored = seteuid(previous);
    (void)ignored;
  }

  // The tests differ on purpose: 1 as output and 2 as error mean "unchanged".
  if (childInput_ != 0 && !MoveDescriptor(childInput_, 0)) return;
  if (childOutput_ > 1 && !MoveDescriptor(childOutput_, 1)) return;
  if (childError_ != 0 && childError_ != 2 && !MoveDescriptor(childError_, 2)) return;

  // /dev/null lands on the lowest free descriptor: below 3 it stands in for a closed standard
  // stream; from 3 up it and the run of open descriptors beneath it are closed.
  const int devNull = open("/dev/null", O_RDWR);
  for (int fd = devNull; fd >= 3; --fd) close(fd);
  // Descriptors above a gap would survive that run; nothing beyond 0, 1 and 2 may reach the
  // program.
  vxproc2::CloseDescriptorsFrom3(openMax);

  if (folder != nullptr && chdir(folder) != 0) {
    const int error = errno;
    WriteDiagnostic("Unable to change to directory \"%s\" : %s (%d)", folder, strerror(error),
                    error);
    return;
  }
  if (dropPrivileges_ == 1 && seteuid(getuid()) != 0) {
    WriteDiagnostic("%s %d - setuid(%d): %s", kSourceName, kSetuidLine,
                    static_cast<int>(getuid()), strerror(errno));
  }

  execv(argv[0], argv);
  const int error = errno;
  GetLastErrorText(errorText_, 598, static_cast<unsigned long>(error));
  if (error == ENOENT) {
    WriteDiagnostic("Couldn't launch \"%s\": %s (%d)\n", argv[0], strerror(error), error);
  } else {
    WriteDiagnostic("execl error #%d: %s\n", error, strerror(error));
  }
  _exit(error);
}

unsigned int vxProc2::Wait(unsigned long limit) {
  if (childPid_ == 0) return 0;
  unsigned int result = kStillRunning;
  const bool unlimited = AllBitsSet(limit);
  const unsigned long seconds = limit / 1000 != 0 ? limit / 1000 : 1;
  const long long deadline = static_cast<long long>(time(nullptr)) + static_cast<long long>(seconds);

  while (childPid_ != 0) {
    // A copy of this object in a forked process must not reap its sibling.
    if (getpid() == spawnerPid_) {
      int status = 0;
      pid_t reaped;
      do {
        reaped = waitpid(childPid_, &status, WNOHANG);
      } while (reaped == -1 && errno == EINTR);
      lastStatus_ = reaped;
      if (reaped == -1) {
        const int error = errno;
        childPid_ = 0;
        result = error == ECHILD ? 0 : static_cast<unsigned int>(error);
      } else if (reaped == childPid_) {
        childPid_ = 0;
        if (WIFEXITED(status)) return static_cast<unsigned int>(WEXITSTATUS(status));
        if (WIFSIGNALED(status)) return static_cast<unsigned int>(WTERMSIG(status));
        if (WIFSTOPPED(status)) return static_cast<unsigned int>(WSTOPSIG(status));
        return result;
      }
    }
    if (childPid_ == 0 || limit == 0) return result;
    if (!unlimited && static_cast<long long>(time(nullptr)) > deadline) return result;
    const struct timespec oneSecond = {1, 0};
    nanosleep(&oneSecond, nullptr);
  }
  return result;
}

void vxProc2::Cancel(unsigned int wait) {
  lastStatus_ = 0;
  if (childPid_ != 0 && kill(childPid_, SIGINT) != 0) lastStatus_ = errno;
  if (wait != 0) Wait(kNoLimit);
}

void vxProc2::Kill() {
  lastStatus_ = 0;
  if (childPid_ != 0 && kill(childPid_, SIGKILL) != 0) lastStatus_ = errno;
}

const char* vxProc2::GetLastError() { return errorText_; }

unsigned long GetLastError() { return static_cast<unsigned long>(errno); }

const char* GetLastErrorText(char* buffer, unsigned long size, unsigned long error) {
  const int number = AllBitsSet(error) ? errno : static_cast<int>(error);
  const char* text = strerror(number);
  if (text == nullptr) text = "undefined.";
  // A buffer without room gets nothing; the caller still receives a terminated text.
  if (buffer == nullptr || size == 0) return text;
  strncpy(buffer, text, size);
  buffer[size - 1] = '\0';
  return buffer;
}
