// One listing entry: a path and the attributes read once when the entry was made. The attributes
// are a snapshot; they are not refreshed.

#ifndef _FILE_OFFSET_BITS
#define _FILE_OFFSET_BITS 64
#endif

#include "foundation/files/file_info.h"

#include <sys/stat.h>

vxFileInfo::vxFileInfo(const vxFilename& name, bool followLinks) : name_(name) {
  const char* path = name_.Pathname().c_str();
  struct stat st;
  if (path[0] == '\0') return;
  int rc = followLinks ? stat(path, &st) : lstat(path, &st);
  if (rc != 0) return;
  exists_ = true;
  mode_ = static_cast<unsigned int>(st.st_mode);
  size_ = static_cast<uint64_t>(st.st_size);
}

vxFileInfo::vxFileInfo(const vxFileInfo& other)
    : name_(other.name_), mode_(other.mode_), exists_(other.exists_), size_(other.size_) {}

vxFileInfo& vxFileInfo::operator=(const vxFileInfo& other) {
  name_ = other.name_;
  mode_ = other.mode_;
  exists_ = other.exists_;
  size_ = other.size_;
  return *this;
}

vxFileInfo::~vxFileInfo() {}

bool vxFileInfo::IsDirectory() const { return exists_ && S_ISDIR(mode_); }
bool vxFileInfo::IsRegular() const { return exists_ && S_ISREG(mode_); }
bool vxFileInfo::IsSymlink() const { return exists_ && S_ISLNK(mode_); }
