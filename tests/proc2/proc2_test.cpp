// The process runner against real children: what Wait reports, what a child that cannot start
// says, priorities, argument splitting, the working folder, and that a child holds none of the
// parent's descriptors. A child that must still run when the test acts reads a pipe the test holds,
// so no test depends on how fast a child starts or ends.

#include "src/proc2/proc2.h"

#include <gtest/gtest.h>

#include <fcntl.h>
#include <signal.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <set>
#include <string>
#include <tuple>

#include "support/process_state.h"
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

// "cat" on two pipes the test holds: it runs until Release, and echoes what it is sent, which tells
// the test that the program itself runs (the exec is done).
class HeldCat : public vxProc2 {
 public:
  HeldCat() {
    int in[2], out[2];
    if (pipe2(in, O_CLOEXEC) != 0 || pipe2(out, O_CLOEXEC) != 0) {
      ADD_FAILURE() << "no pipe";
      return;
    }
    childInput_ = in[0];
    childOutput_ = out[1];
    input_ = in[1];
    output_ = out[0];
    Spawn("/bin/cat", nullptr, nullptr, 0, 6);
  }
  ~HeldCat() override {
    Release();
    if (output_ >= 0) close(output_);
    if (ChildPid() != 0) {
      Kill();
      Finish(*this);
    }
  }
  HeldCat(const HeldCat&) = delete;
  HeldCat& operator=(const HeldCat&) = delete;

  // True once the child has echoed a line back.
  bool AwaitRunning() {
    char echo[3] = {};
    if (write(input_, "x\n", 2) != 2) return false;
    for (size_t got = 0; got < 2;) {
      const ssize_t n = read(output_, echo + got, 2 - got);
      if (n <= 0) return false;
      got += static_cast<size_t>(n);
    }
    return std::string(echo) == "x\n";
  }
  // Closes the child's input: it ends with status 0.
  void Release() {
    if (input_ >= 0) close(input_);
    input_ = -1;
  }

 private:
  int input_ = -1;
  int output_ = -1;
};

// What a descriptor refers to, as /proc names it ("pipe:[1234]", a file's path).
std::string Target(const std::string& link) {
  char target[4096];
  const ssize_t length = readlink(link.c_str(), target, sizeof target);
  return length < 0 ? std::string() : std::string(target, static_cast<size_t>(length));
}

std::set<std::string> TargetsOf(int pid) {
  std::set<std::string> targets;
  const std::string folder = "/proc/" + std::to_string(pid) + "/fd";
  for (const std::string& name : vxtest::ListTree(folder)) targets.insert(Target(folder + "/" + name));
  return targets;
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

// Limits end the wait while the child runs on; the child is still in hand afterwards.
TEST(Wait, ReturnsWhenTheLimitRunsOutAndKeepsTheChild) {
  HeldCat child;
  ASSERT_TRUE(child.AwaitRunning());
  EXPECT_EQ(unsigned(-1), child.Wait(0));
  EXPECT_EQ(unsigned(-1), child.Wait(500));
  EXPECT_NE(0, child.ChildPid());
  child.Release();
  EXPECT_EQ(0u, Finish(child));
}

TEST(Kill, EndsTheChildWithSigkill) {
  HeldCat child;
  child.Kill();
  EXPECT_EQ(unsigned(SIGKILL), Finish(child));
}

TEST(Cancel, InterruptsTheChildAndOptionallyReapsIt) {
  // An ignored SIGINT would be inherited by the child.
  vxtest::ScopedSignalDisposition interruptible(SIGINT, SIG_DFL);
  HeldCat waited, reaped;
  waited.Cancel(0);
  EXPECT_EQ(unsigned(SIGINT), Finish(waited));
  const int pid = reaped.ChildPid();
  reaped.Cancel(1);
  EXPECT_EQ(0, reaped.ChildPid());
  EXPECT_EQ(-1, waitpid(pid, nullptr, WNOHANG));  // reaped: no zombie left
}

// Run in a child process: only root could lower this process's nice value again afterwards.
TEST(Spawn, PriorityGivesTheChildItsNiceValue) {
  EXPECT_TRUE(vxtest::InChildProcess([] {
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
  }));
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

// Descriptors of the parent's without close-on-exec (one above a gap) stay behind; the child is
// looked at once the program itself runs.
TEST(Spawn, ChildInheritsNoDescriptorOfTheParent) {
  vxtest::TempDir dir;
  int ends[2];
  ASSERT_EQ(0, pipe(ends));
  const int file = open(dir.Path("held").c_str(), O_WRONLY | O_CREAT, 0644);
  const int high = fcntl(ends[1], F_DUPFD, 100);
  ASSERT_GE(file, 0);
  ASSERT_GE(high, 100);
  const std::set<std::string> ours = {Target("/proc/self/fd/" + std::to_string(ends[0])),
                                      Target("/proc/self/fd/" + std::to_string(file))};
  {
    HeldCat child;
    ASSERT_TRUE(child.AwaitRunning());
    for (const std::string& target : TargetsOf(child.ChildPid())) {
      EXPECT_EQ(0u, ours.count(target)) << target;
    }
  }
  for (int fd : {ends[0], ends[1], file, high}) close(fd);
}

TEST(GetLastErrorText, CopiesWhatFitsIntoASmallBuffer) {
  char buffer[4];
  EXPECT_EQ(buffer, GetLastErrorText(buffer, sizeof buffer, ENOENT));
  EXPECT_STREQ("No ", buffer);
}

}  // namespace
