// The process runner against real children: what Wait reports and when, what a child that cannot
// start says, priorities, argument splitting, the working folder, and that a child holds no
// descriptor but its standard three.

#include "src/proc2/proc2.h"

#include <gtest/gtest.h>

#include <fcntl.h>
#include <signal.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <string>
#include <tuple>

#include "support/test_files.h"

namespace {

// Hands the child files for its standard output and error.
struct CapturingRunner : vxProc2 {
  CapturingRunner(const std::string& output, const std::string& error) {
    childOutput_ = open(output.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0644);
    childError_ = open(error.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0644);
  }
};

// Waits without limit once the child has ended, so the first poll reaps it and no second passes.
unsigned int Finish(vxProc2& runner) {
  siginfo_t info;
  if (runner.ChildPid() != 0) waitid(P_PID, runner.ChildPid(), &info, WEXITED | WNOWAIT);
  return runner.Wait(vxProc2::kNoLimit);
}

// Exit code or signal number, standard output and standard error of a child run to its end.
using Ran = std::tuple<unsigned int, std::string, std::string>;

Ran RunToEnd(const char* program, const char* arguments, const char* folder = nullptr,
             unsigned long priority = 6) {
  vxtest::TempDir dir;
  CapturingRunner runner(dir.Path("out"), dir.Path("err"));
  const int pid = runner.Spawn(program, arguments, folder, 0, priority);
  const unsigned int result = Finish(runner);
  EXPECT_EQ(0, runner.ChildPid());
  EXPECT_EQ(-1, waitpid(pid, nullptr, WNOHANG));  // reaped: no zombie left
  return {result, vxtest::ReadFile(dir.Path("out")), vxtest::ReadFile(dir.Path("err"))};
}

double SecondsSince(std::chrono::steady_clock::time_point start) {
  return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
}

TEST(Wait, GivesTheExitCodeOrEndingSignal) {
  vxtest::TempDir dir;
  const std::pair<const char*, int> children[] = {
      {"exit 0", 0}, {"exit 3", 3}, {"exit 255", 255}, {"kill -TERM $$", SIGTERM}};
  for (auto [script, result] : children) {
    vxtest::WriteFile(dir.Path("script.sh"), script);
    EXPECT_EQ(Ran(result, "", ""), RunToEnd("/bin/sh", dir.Path("script.sh").c_str())) << script;
  }
}

// A kill of pid 0 would hit this program's whole process group.
TEST(Wait, WithoutAChildNothingIsWaitedForOrSignalled) {
  vxProc2 runner;
  EXPECT_EQ(0u, runner.Wait(vxProc2::kNoLimit));
  runner.Kill();
  runner.Cancel(0);
  EXPECT_EQ(0, runner.LastStatus());
}

TEST(Spawn, MissingProgramSaysWhyAndExitsWithStatus2) {
  EXPECT_EQ(Ran(2, "", "Couldn't launch \"/nonexistent/program\": No such file or directory (2)\n"),
            RunToEnd("/nonexistent/program", nullptr));
}

TEST(Wait, PollsOnceAtLimitZeroAndHonoursLimitsToWholeSeconds) {
  vxProc2 runner;
  runner.Spawn("/bin/sleep", "10", nullptr, 0, 6);
  auto start = std::chrono::steady_clock::now();
  EXPECT_EQ(unsigned(-1), runner.Wait(0));
  EXPECT_LT(SecondsSince(start), 0.5);
  // 500 ms reads as one second past the current one, tested once a second: about 2 s.
  start = std::chrono::steady_clock::now();
  EXPECT_EQ(unsigned(-1), runner.Wait(500));
  EXPECT_GT(SecondsSince(start), 1.0);
  EXPECT_LT(SecondsSince(start), 4.0);
  runner.Kill();  // the child is still in hand after a limit ran out
  EXPECT_EQ(unsigned(SIGKILL), Finish(runner));
}

TEST(Cancel, InterruptsTheChildAndOptionallyReapsIt) {
  signal(SIGINT, SIG_DFL);  // an ignored SIGINT would be inherited by the child
  vxProc2 runner;
  runner.Spawn("/bin/sleep", "10", nullptr, 0, 6);
  runner.Cancel(0);
  EXPECT_EQ(unsigned(SIGINT), Finish(runner));
  runner.Spawn("/bin/sleep", "10", nullptr, 0, 6);
  runner.Cancel(1);
  EXPECT_EQ(0, runner.ChildPid());
}

TEST(Spawn, PriorityGivesTheChildItsNiceValue) {
  const int own = getpriority(PRIO_PROCESS, 0);
  // One step above the usual 0, so that a reset to 0 cannot pass for an unchanged value; taking
  // the step back tells whether this process may lower a nice value at all.
  setpriority(PRIO_PROCESS, 0, own + 1);
  const bool mayLower = setpriority(PRIO_PROCESS, 0, own) == 0;
  setpriority(PRIO_PROCESS, 0, own + 1);
  const int inherited = getpriority(PRIO_PROCESS, 0);
  const std::pair<unsigned long, int> table[] = {{1, 19},  {3, 12},   {6, inherited},
                                                 {8, -10}, {10, -20}, {11, inherited}};
  for (auto [priority, nice] : table) {
    const int expected = nice < inherited && !mayLower ? inherited : nice;
    EXPECT_EQ(Ran(0, std::to_string(expected) + "\n", ""),
              RunToEnd("/usr/bin/nice", nullptr, nullptr, priority));
  }
  setpriority(PRIO_PROCESS, 0, own);  // needs privilege; harmless when refused
}

TEST(Spawn, SplitsArgumentsAtBlanksIntoAtMostNineteen) {
  EXPECT_EQ(Ran(0, "[a\tb][c]", ""), RunToEnd("/usr/bin/printf", "  [%s]   a\tb  c "));
  EXPECT_EQ(
      Ran(0, "1.2.3.4.5.6.7.8.9.10.11.12.13.14.15.16.17.18.", ""),
      RunToEnd("/usr/bin/printf", "%s. 1 2 3 4 5 6 7 8 9 10 11 12 13 14 15 16 17 18 19 20 21 22"));
}

TEST(Spawn, RunsTheChildInTheGivenFolder) {
  EXPECT_EQ(Ran(0, "/proc\n", ""), RunToEnd("/bin/pwd", nullptr, "/proc"));
}

TEST(Spawn, ChildInheritsNoOtherDescriptor) {
  // Descriptors held without close-on-exec, one of them above a gap.
  const int low = open("/dev/null", O_RDONLY), high = dup2(low, 100);
  // 3 is the listing ls itself opens.
  EXPECT_EQ(Ran(0, "0\n1\n2\n3\n", ""), RunToEnd("/bin/ls", "/proc/self/fd"));
  close(low);
  close(high);
}

TEST(GetLastErrorText, CopiesWhatFitsIntoASmallBuffer) {
  char buffer[4];
  EXPECT_EQ(buffer, GetLastErrorText(buffer, sizeof buffer, ENOENT));
  EXPECT_STREQ("No ", buffer);
}

}  // namespace
