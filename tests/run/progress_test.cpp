// The progress line through a pseudo-terminal: on a terminal the host rewrites one line on
// standard error with '\r' and blanks it before anything else is printed; with -q, or when standard error is
// a file, no progress text appears at all.

#include <gtest/gtest.h>
#include <pty.h>
#include <sys/wait.h>
#include <termios.h>
#include <unistd.h>

#include <regex>
#include <string>

#include "run/host_run.h"

namespace vxtest {
namespace {

// Runs the host on a pseudo-terminal of 80 columns (standard output and error both); what the
// terminal received, byte for byte, and the exit status in *status.
std::string RunOnTerminal(const HostRun& run, const Lines& options, int* status) {
  Lines args = run.Args(options);
  std::vector<char*> argv;
  for (std::string& arg : args) argv.push_back(arg.data());
  argv.push_back(nullptr);
  struct termios raw;
  cfmakeraw(&raw);  // no "\n" -> "\r\n": every '\r' seen is the host's own
  struct winsize size = {24, 80, 0, 0};
  int master = -1;
  const pid_t child = forkpty(&master, nullptr, &raw, &size);
  if (child == 0) {
    execv(argv[0], argv.data());
    _exit(127);
  }
  std::string seen;
  char buffer[4096];
  // Reading ends with EIO once the child has exited and closed the terminal.
  for (ssize_t n; child > 0 && (n = read(master, buffer, sizeof buffer)) != 0;) {
    if (n < 0 && errno == EINTR) continue;
    if (n < 0) break;
    seen.append(buffer, static_cast<size_t>(n));
  }
  if (master >= 0) close(master);
  *status = ExitStatus(child);
  return seen;
}

const std::regex kProgress(R"(\r\[[0-9]+ of [0-9]+ files\] [^\r\n]*\x1b\[K)");

TEST(Progress, RewritesOneLineOnATerminalAndBlanksItBeforeTheSummary) {
  HostRun run({"halden_to_obx"});
  run.UseSamples();
  int status = -1;
  const std::string seen = RunOnTerminal(run, run.SampleOptions(), &status);
  ASSERT_EQ(0, status) << seen;
  EXPECT_TRUE(std::regex_search(seen, kProgress)) << seen;
  // The last progress text is blanked before the summary, and none follows it.
  const size_t summary = seen.find("Plug-in:");
  ASSERT_NE(std::string::npos, summary) << seen;
  size_t lastDrawn = 0;
  for (std::sregex_iterator it(seen.begin(), seen.begin() + summary, kProgress), end; it != end; ++it) {
    lastDrawn = it->position() + it->length();
  }
  EXPECT_NE(std::string::npos, seen.substr(lastDrawn, summary - lastDrawn).find("\r\x1b[K")) << seen;
  EXPECT_EQ(std::string::npos, seen.find(" files] ", summary)) << seen;
  // Never wider than the terminal: a wrapped line could not be rewritten.
  for (std::sregex_iterator it(seen.begin(), seen.end(), kProgress), end; it != end; ++it) {
    EXPECT_LE(it->str().size(), 1 + 79 + 3u) << it->str();
  }
}

// Standard error in a file gets no progress either: HostReport's summary test expects it exact.
TEST(Progress, NothingWithQuiet) {
  HostRun run({"halden_to_obx"});
  run.UseSamples();
  int status = -1;
  Lines quiet = run.SampleOptions();
  quiet.push_back("-q");
  const std::string seen = RunOnTerminal(run, quiet, &status);
  EXPECT_EQ(0, status) << seen;
  EXPECT_EQ(std::string::npos, seen.find(" files] ")) << seen;
  EXPECT_EQ(std::string::npos, seen.find('\r')) << seen;
}

}  // namespace
}  // namespace vxtest
