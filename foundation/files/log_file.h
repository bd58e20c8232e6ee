// The run log. Each entry is one line, "YYYY-MM-DD HH:MM:SS  text\n" in local time, handed to the
// kernel as it is logged, so the log of a run that crashed holds every entry up to the crash.
// Line feeds and carriage returns inside an entry are written as "\n" and "\r", so one entry is
// always one line; only an entry made of nothing but line ends (a deliberate blank) stays as it is.

#ifndef VXMIGRATE_FOUNDATION_FILES_LOG_FILE_H_
#define VXMIGRATE_FOUNDATION_FILES_LOG_FILE_H_

#include <string>

#include "foundation/export.h"
#include "foundation/string/string_base.h"

enum LogLevel { kLogNone = 0, kLogNormal = 1, kLogDetail = 2 };

class VXM_EXPORT vxLogFile {
 public:
  // mode 1 starts a new log (an older one of the same name is replaced); 0 appends to it.
  vxLogFile(const vxStringBase& filename, unsigned int mode);
  virtual ~vxLogFile();

  vxLogFile(const vxLogFile&) = delete;
  vxLogFile& operator=(const vxLogFile&) = delete;

  // Writes one entry. Entries above the current level (m_level) are not written.
  void Log(const char* text, LogLevel level);
  // Writes one entry made of the two texts in order.
  void Log(const char* text, const char* text2, LogLevel level);

  // The entry's text as the log writes it, without the time stamp: the two texts joined (either
  // may be null), line ends escaped.
  static std::string EntryText(const char* text, const char* text2);

  const vxStringBase& GetFilename() const { return filename_; }
  bool IsOpen() const { return fd_ >= 0; }
  // The errno of the failed open, or of the first entry that could not be written; 0 when none.
  int OpenError() const { return openError_; }
  int WriteError() const { return writeError_; }

  // The most detailed level written; callers set it to 1 before each write.
  int m_level = kLogNormal;

 private:
  void WriteEntry(const char* text, const char* text2);

  vxStringBase filename_;
  int fd_ = -1;
  int openError_ = 0;
  int writeError_ = 0;
};

#endif  // VXMIGRATE_FOUNDATION_FILES_LOG_FILE_H_
