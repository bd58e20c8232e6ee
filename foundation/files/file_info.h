// One entry of a folder listing: its path and what lstat (or stat, for followed links) said of it.

#ifndef VXMIGRATE_FOUNDATION_FILES_FILE_INFO_H_
#define VXMIGRATE_FOUNDATION_FILES_FILE_INFO_H_

#include <sys/types.h>

#include <cstdint>
#include <vector>

#include "foundation/export.h"
#include "foundation/files/filename.h"

class VXM_EXPORT vxFileInfo {
 public:
  // Reads the entry's attributes; followLinks chooses stat over lstat. A missing entry gives
  // Exists() false and a mode of 0.
  explicit vxFileInfo(const vxFilename& name, bool followLinks = true);
  vxFileInfo(const vxFileInfo& other);
  vxFileInfo& operator=(const vxFileInfo& other);
  virtual ~vxFileInfo();

  const vxFilename& GetFilename() const { return name_; }
  // Permission and type bits as in POSIX st_mode (owner-execute is 0100).
  unsigned int Mode() const { return mode_; }
  bool Exists() const { return exists_; }
  bool IsDirectory() const;
  bool IsRegular() const;
  bool IsSymlink() const;
  uint64_t Size() const { return size_; }

 private:
  vxFilename name_;
  unsigned int mode_ = 0;
  bool exists_ = false;
  uint64_t size_ = 0;
};

typedef std::vector<vxFileInfo> vxFileInfoList;

#endif  // VXMIGRATE_FOUNDATION_FILES_FILE_INFO_H_
