// The run log. Every entry is assembled in memory and handed to the kernel with one write, so
// entries never interleave and a crash loses nothing that was logged before it.

#include "foundation/files/log_file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <ctime>
#include <string>

#include "foundation/files/run_doors.h"
#include "foundation/files/write_all.h"

namespace {

std::string TimeStamp() {
  time_t now = time(nullptr);
  struct tm local;
  char text[32] = "0000-00-00 00:00:00";
  if (localtime_r(&now, &local) != nullptr) strftime(text, sizeof text, "%Y-%m-%d %H:%M:%S", &local);
  return text;
}

}  // namespace

vxLogFile::vxLogFile(const vxStringBase& filename, unsigned int mode) : filename_(filename) {
  int flags = O_WRONLY | O_CREAT | O_CLOEXEC | (mode == 1 ? O_TRUNC : O_APPEND);
  errno = 0;
  if (!vxfiles::MayWriteInPlace(filename_.view())) {  // no log where the run may not write
    openError_ = errno != 0 ? errno : EPERM;  // the doors' reason when they give one
    return;
  }
  // A link where the log belongs is removed, never followed: it could point into the source
  // installation, which the run must not change.
  struct stat st;
  if (lstat(filename_.c_str(), &st) == 0 && S_ISLNK(st.st_mode)) unlink(filename_.c_str());
  fd_ = open(filename_.c_str(), flags | O_NOFOLLOW, 0644);
  if (fd_ < 0) openError_ = errno;
}

vxLogFile::~vxLogFile() {
  if (fd_ >= 0) close(fd_);
}

void vxLogFile::Log(const char* text, LogLevel level) {
  if (level > m_level) return;
  WriteEntry(text, nullptr);
}

void vxLogFile::Log(const char* text, const char* text2, LogLevel level) {
  if (level > m_level) return;
  WriteEntry(text, text2);
}

std::string vxLogFile::EntryText(const char* text, const char* text2) {
  std::string joined;
  if (text != nullptr) joined += text;
  if (text2 != nullptr) joined += text2;
  if (joined.find_first_not_of("\r\n") == std::string::npos) return joined;
  std::string escaped;
  escaped.reserve(joined.size());
  for (char c : joined) {
    if (c == '\n') {
      escaped += "\\n";
    } else if (c == '\r') {
      escaped += "\\r";
    } else {
      escaped += c;
    }
  }
  return escaped;
}

void vxLogFile::WriteEntry(const char* text, const char* text2) {
  if (fd_ < 0) return;
  std::string entry = TimeStamp();
  entry += "  ";
  entry += EntryText(text, text2);
  entry += '\n';
  // A full disk loses the entry, never the run; the first failure is kept for the host to report.
  if (!vxWriteAll(fd_, entry.data(), entry.size()) && writeError_ == 0) writeError_ = errno;
}
