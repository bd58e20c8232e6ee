// The process runner against real children: what Wait reports and when, what a child that cannot
// start says, priorities, argument splitting, the working folder, and that a child holds no
// descriptor but its standard three.

#include <gtest/gtest.h>

#include <fcntl.h>
#include <limits.h>
#include <signal.h>
#include <stdlib.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <cstring>
#include <string>
#include <utility>

#include "src/proc2/proc2.h"
#include "support/test_files.h"

namespace {

const unsigned int kRunning = static_cast<unsigned int>(-1);
// Exit code of a copy of this test program in which Spawn returned 0.
const int kChildCameBack = 77;

// A runner whose child writes its standard output and error into files of its own temporary folder.
class CapturingRunner : public vxProc2 {
 public:
  int Start(const char* program, const char* arguments, const char* folder = nullptr,
            unsigned long priority = 6, unsigned int wait = 0) {
    childOutput_ = OpenForChild(dir_.Path("out"));
    childError_ = OpenForChild(dir_.Path("err"));
    return Spawn(program, arguments, folder, wait, priority);
  }
  // The script goes into a file: the argument text cannot carry blanks.
  int StartScript(const std::string& body) {
    vxtest::WriteFile(dir_.Path("script.sh"), body);
    return Start("/bin/sh", dir_.Path("script.sh").c_str());
  }
  // Waits without limit once the child has ended, so the first poll reaps it and no second passes.
  unsigned int Finish() {
    siginfo_t info;
    if (ChildPid() != 0) waitid(P_PID, ChildPid(), &info, WEXITED | WNOWAIT);
    return Wait(kNoLimit);
  }
  void SetInput(int fd) { childInput_ = fd; }
  std::string Output() const { return vxtest::ReadFile(dir_.Path("out")); }
  std::string Errors() const { return vxtest::ReadFile(dir_.Path("err")); }
  const vxtest::TempDir& dir() const { return dir_; }

 private:
  static int OpenForChild(const std::string& path) {
    return open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0644);
  }
  vxtest::TempDir dir_;
};

double SecondsSince(std::chrono::steady_clock::time_point start) {
  return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
}

struct ExitCase {
  const char* script;
  unsigned int result;
};
class WaitResult : public ::testing::TestWithParam<ExitCase> {};

TEST_P(WaitResult, IsTheExitCodeOrEndingSignalAndLeavesNothingBehind) {
  CapturingRunner runner;
  const int pid = runner.StartScript(GetParam().script);
  ASSERT_GT(pid, 0);
  EXPECT_EQ(GetParam().result, runner.Finish());
  EXPECT_EQ(0, runner.ChildPid());
  EXPECT_EQ(pid, runner.LastStatus());
  errno = 0;
  EXPECT_EQ(-1, waitpid(pid, nullptr, WNOHANG));  // reaped: no zombie left
  EXPECT_EQ(ECHILD, errno);
  // Without a child nothing is waited for or signalled (a kill of pid 0 would hit this program).
  EXPECT_EQ(0u, runner.Wait(vxProc2::kNoLimit));
  runner.Kill();
  runner.Cancel(0);
  EXPECT_EQ(0, runner.LastStatus());
}

INSTANTIATE_TEST_SUITE_P(Children, WaitResult,
                         ::testing::Values(ExitCase{"exit 0", 0}, ExitCase{"exit 3", 3},
                                           ExitCase{"exit 255", 255},
                                           ExitCase{"kill -KILL $$", SIGKILL},
                                           ExitCase{"kill -TERM $$", SIGTERM}));

TEST(Spawn, ChildThatCannotExecSaysWhyAndExitsWithTheErrorNumber) {
  CapturingRunner runner;
  const std::string missing = runner.dir().Path("missing");
  const std::string launchError =
      "Couldn't launch \"" + missing + "\": No such file or directory (2)\n";
  EXPECT_GT(runner.Start(missing.c_str(), nullptr), 0);
  EXPECT_EQ(2u, runner.Finish());
  EXPECT_EQ(launchError, runner.Errors());

  const std::string plain = runner.dir().Path("plain");
  vxtest::WriteFile(plain, "exit 0\n");  // no execute permission, not even for root
  chmod(plain.c_str(), 0644);
  runner.Start(plain.c_str(), nullptr);
  EXPECT_EQ(static_cast<unsigned int>(EACCES), runner.Finish());
  EXPECT_EQ("execl error #13: Permission denied\n", runner.Errors());

  // With the wait flag Spawn reaps the child itself and reports no pid.
  EXPECT_EQ(0, runner.Start(missing.c_str(), nullptr, nullptr, 6, 1));
  EXPECT_EQ(0, runner.ChildPid());
  EXPECT_EQ(launchError, runner.Errors());
}

TEST(Wait, PollsOnceAtLimitZeroAndHonoursLimitsToWholeSeconds) {
  CapturingRunner runner;
  const int pid = runner.Start("/bin/sleep", "10");
  auto start = std::chrono::steady_clock::now();
  EXPECT_EQ(kRunning, runner.Wait(0));
  EXPECT_LT(SecondsSince(start), 0.5);

  // 500 ms reads as one second past the current one, tested once a second: about 2 s.
  start = std::chrono::steady_clock::now();
  EXPECT_EQ(kRunning, runner.Wait(500));
  EXPECT_GT(SecondsSince(start), 1.0);
  EXPECT_LT(SecondsSince(start), 4.0);
  EXPECT_EQ(pid, runner.ChildPid());

  runner.Kill();
  EXPECT_EQ(static_cast<unsigned int>(SIGKILL), runner.Finish());
}

TEST(Cancel, InterruptsTheChildAndOptionallyReapsIt) {
  signal(SIGINT, SIG_DFL);  // an ignored SIGINT would be inherited by the child
  CapturingRunner runner;
  runner.Start("/bin/sleep", "10");
  runner.Cancel(0);
  EXPECT_EQ(0, runner.LastStatus());
  EXPECT_EQ(static_cast<unsigned int>(SIGINT), runner.Finish());

  const int pid = runner.Start("/bin/sleep", "10");
  runner.Cancel(1);
  EXPECT_EQ(0, runner.ChildPid());
  EXPECT_EQ(pid, runner.LastStatus());
}

// Whether this process may lower a nice value (CAP_SYS_NICE in its effective set).
bool MayLowerNice() {
  const std::string status = vxtest::ReadFile("/proc/self/status");
  const size_t at = status.find("CapEff:");
  if (at == std::string::npos) return geteuid() == 0;
  return (strtoull(status.c_str() + at + 7, nullptr, 16) >> 23) & 1;
}

const int kInherited = 100;
class Priority : public ::testing::TestWithParam<std::pair<unsigned long, int>> {};

TEST_P(Priority, GivesTheChildItsNiceValue) {
  const int own = getpriority(PRIO_PROCESS, 0);
  // One step above the usual 0, so that a reset to 0 cannot pass for an unchanged value.
  if (GetParam().second == kInherited) setpriority(PRIO_PROCESS, 0, own + 1);
  const int inherited = getpriority(PRIO_PROCESS, 0);
  int expected = GetParam().second == kInherited ? inherited : GetParam().second;
  if (expected < inherited && !MayLowerNice()) expected = inherited;

  CapturingRunner runner;
  runner.Start("/usr/bin/nice", nullptr, nullptr, GetParam().first);
  EXPECT_EQ(0u, runner.Finish());
  setpriority(PRIO_PROCESS, 0, own);  // needs privilege; harmless when refused
  EXPECT_EQ(std::to_string(expected) + "\n", runner.Output());
}

INSTANTIATE_TEST_SUITE_P(
    Table, Priority,
    ::testing::Values(std::make_pair(1ul, 19), std::make_pair(2ul, 16), std::make_pair(3ul, 12),
                      std::make_pair(4ul, 8), std::make_pair(5ul, 4), std::make_pair(7ul, -5),
                      std::make_pair(8ul, -10), std::make_pair(9ul, -15),
                      std::make_pair(10ul, -20), std::make_pair(6ul, kInherited),
                      std::make_pair(0ul, kInherited), std::make_pair(11ul, kInherited)));

class ArgumentText : public ::testing::TestWithParam<std::pair<const char*, const char*>> {};

TEST_P(ArgumentText, IsSplitAtBlanksIntoAtMostNineteenArguments) {
  CapturingRunner runner;
  runner.Start("/usr/bin/printf", GetParam().first);
  EXPECT_EQ(0u, runner.Finish());
  EXPECT_EQ(GetParam().second, runner.Output());
}

INSTANTIATE_TEST_SUITE_P(
    Pieces, ArgumentText,
    ::testing::Values(
        std::make_pair("[%s] a  b", "[a][b]"),
        std::make_pair("  [%s]   only\ttabs  ", "[only\ttabs]"),
        std::make_pair("%s. 1 2 3 4 5 6 7 8 9 10 11 12 13 14 15 16 17 18",
                       "1.2.3.4.5.6.7.8.9.10.11.12.13.14.15.16.17.18."),
        std::make_pair("%s. 1 2 3 4 5 6 7 8 9 10 11 12 13 14 15 16 17 18 19 20 21 22",
                       "1.2.3.4.5.6.7.8.9.10.11.12.13.14.15.16.17.18.")));

TEST(Spawn, RunsTheChildInTheGivenFolder) {
  CapturingRunner runner;
  vxtest::MakeDirs(runner.dir().Path("work"));
  char real[PATH_MAX];
  ASSERT_NE(nullptr, realpath(runner.dir().Path("work").c_str(), real));
  runner.Start("/bin/pwd", nullptr, runner.dir().Path("work").c_str());
  EXPECT_EQ(0u, runner.Finish());
  EXPECT_EQ(std::string(real) + "\n", runner.Output());
}

// A child that cannot be set up returns 0 from Spawn into this program's code; that copy ends here
// at once, so only its exit code reaches the test.
TEST(Spawn, ChildThatCannotEnterItsFolderComesBackToTheCaller) {
  CapturingRunner runner;
  const pid_t self = getpid();
  const std::string missing = runner.dir().Path("absent");
  const int pid = runner.Start("/bin/true", nullptr, missing.c_str());
  if (getpid() != self) _exit(pid == 0 ? kChildCameBack : 1);
  ASSERT_GT(pid, 0);
  EXPECT_EQ(static_cast<unsigned int>(kChildCameBack), runner.Finish());
  EXPECT_EQ("Unable to change to directory \"" + missing + "\" : No such file or directory (2)",
            runner.Errors());
}

TEST(Spawn, ChildWhoseInputCannotBeSetComesBackToTheCaller) {
  CapturingRunner runner;
  const pid_t self = getpid();
  runner.SetInput(-1);
  const int pid = runner.Start("/bin/true", nullptr);
  if (getpid() != self) _exit(pid == 0 ? kChildCameBack : 1);
  EXPECT_EQ(static_cast<unsigned int>(kChildCameBack), runner.Finish());
}

TEST(Spawn, HandedOverDescriptorsBecomeTheChildsStandardStreams) {
  CapturingRunner runner;
  vxtest::WriteFile(runner.dir().Path("in"), "typed\n");
  const int input = open(runner.dir().Path("in").c_str(), O_RDONLY | O_CLOEXEC);
  runner.SetInput(input);
  runner.StartScript("cat; echo said >&2\n");
  EXPECT_EQ(-1, fcntl(input, F_GETFD));  // the parent let go of it
  EXPECT_EQ(0u, runner.Finish());
  EXPECT_EQ("typed\n", runner.Output());
  EXPECT_EQ("said\n", runner.Errors());
}

TEST(Spawn, ChildInheritsNoOtherDescriptor) {
  // Descriptors held without close-on-exec, one of them above a gap.
  const int low = open("/dev/null", O_RDONLY);
  const int gap = open("/dev/null", O_RDONLY);
  const int high = open("/dev/null", O_RDONLY);
  close(gap);
  CapturingRunner runner;
  runner.Start("/bin/ls", "/proc/self/fd");
  EXPECT_EQ(0u, runner.Finish());
  EXPECT_EQ("0\n1\n2\n3\n", runner.Output());  // 3 is the listing ls itself opens
  close(low);
  close(high);
}

TEST(GetLastErrorText, CopiesWhatFitsAndReadsErrnoWhenAskedTo) {
  char buffer[4];
  EXPECT_EQ(buffer, GetLastErrorText(buffer, sizeof buffer, ENOENT));
  EXPECT_STREQ("No ", buffer);
  errno = EACCES;
  const unsigned long current = GetLastError();
  const char* text = GetLastErrorText(nullptr, 0, 0xFFFFFFFFUL);
  EXPECT_EQ(static_cast<unsigned long>(EACCES), current);
  EXPECT_STREQ(strerror(EACCES), text);
}

}  // namespace
