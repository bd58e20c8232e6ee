// The progress line: throttled by the monotonic clock, cut to the terminal's width at a character
// boundary so that it never wraps (a wrapped line could not be rewritten with '\r').

#include "host/progress_line.h"

#include <sys/ioctl.h>
#include <time.h>
#include <unistd.h>

#include <filesystem>

#include "foundation/files/dir_entries.h"

namespace {

const long long kRefreshMs = 100;

long long NowMs() {
  struct timespec now;
  clock_gettime(CLOCK_MONOTONIC, &now);
  return static_cast<long long>(now.tv_sec) * 1000 + now.tv_nsec / 1000000;
}

// The entries below folder that are not folders, leaving out the runs' history.
long CountInstallationFiles(const std::string& folder) {
  namespace fs = std::filesystem;
  long files = 0;
  std::error_code error;
  fs::recursive_directory_iterator it(folder, fs::directory_options::skip_permission_denied, error);
  for (; !error && it != fs::recursive_directory_iterator(); it.increment(error)) {
    if (it.depth() == 0 && it->path().filename() == vxfiles::kRunHistoryFolder) {
      it.disable_recursion_pending();
      continue;
    }
    std::error_code unknown;
    if (!it->is_directory(unknown)) ++files;
  }
  return files;
}

}  // namespace

void ProgressLine::Enable(const std::string& source) {
  const int fd = fileno(err_);
  if (fd < 0 || isatty(fd) != 1) return;
  struct winsize size;
  if (ioctl(fd, TIOCGWINSZ, &size) == 0 && size.ws_col > 10) width_ = size.ws_col;
  enabled_ = true;
  found_ = CountInstallationFiles(source);
}

void ProgressLine::Update(const std::string& step, long done) {
  if (!enabled_) return;
  const long long now = NowMs();
  if (lastDrawn_ != 0 && now - lastDrawn_ < kRefreshMs) return;
  lastDrawn_ = now;
  std::string line = "[" + std::to_string(done) + " of " +
                     std::to_string(done > found_ ? done : found_) + " files] ";
  for (char c : step) line.push_back(static_cast<unsigned char>(c) < 0x20 || c == 0x7f ? ' ' : c);
  const size_t room = static_cast<size_t>(width_ - 1);
  if (line.size() > room) {
    size_t cut = room;
    while (cut > 0 && (static_cast<unsigned char>(line[cut]) & 0xC0) == 0x80) --cut;
    line.resize(cut);
  }
  // "\033[K" blanks what a longer earlier line left to the right.
  fprintf(err_, "\r%s\033[K", line.c_str());
  fflush(err_);
  drawn_ = true;
}

void ProgressLine::Clear() {
  if (!drawn_) return;
  fputs("\r\033[K", err_);
  fflush(err_);
  drawn_ = false;
}
