// Whole-file reading and writing. A file opened with O_TRUNC is written to a temporary file in the
// same folder and renamed over its name by Close, so a crash or a full disk never leaves it half
// written; its old mode is kept.

#ifndef VXMIGRATE_FOUNDATION_FILES_BASIC_FILE_H_
#define VXMIGRATE_FOUNDATION_FILES_BASIC_FILE_H_

#include <string>

#include "foundation/export.h"
#include "foundation/string/string_base.h"

class VXM_EXPORT vxBasicFile {
 public:
  // openFlags and accessMode are open(2) flags, or-ed together (the callers pass 2 = O_RDWR, and
  // 0x240 = O_CREAT | O_TRUNC with 2). permissions is the mode of a newly created file (0: 0666
  // less the umask).
  vxBasicFile(const vxStringBase& name, unsigned int openFlags, unsigned int accessMode,
              unsigned int permissions);
  virtual ~vxBasicFile();  // closes without committing a pending rewrite

  vxBasicFile(const vxBasicFile&) = delete;
  vxBasicFile& operator=(const vxBasicFile&) = delete;

  // 0 on success, non-zero when the file cannot be opened.
  int Open();
  // Reads the whole content into text. 0 on success.
  int ReadAll(vxStringBase& text);
  // Appends text at the current position; written is set to the bytes written. 0 on success.
  [[nodiscard]] int Write(const vxStringBase& text, unsigned long& written);
  // Closes; a pending rewrite is flushed and renamed into place. 0 on success.
  [[nodiscard]] int Close();

 private:
  std::string name_;
  std::string tempName_;
  unsigned int flags_;
  unsigned int permissions_;
  int fd_ = -1;
  bool writeFailed_ = false;
};

#endif  // VXMIGRATE_FOUNDATION_FILES_BASIC_FILE_H_
