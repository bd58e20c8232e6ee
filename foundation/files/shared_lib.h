// A loaded plug-in library. Loading never throws; a failed load leaves a null handle and the
// loader's message in LoadError().

#ifndef VXMIGRATE_FOUNDATION_FILES_SHARED_LIB_H_
#define VXMIGRATE_FOUNDATION_FILES_SHARED_LIB_H_

#include "foundation/export.h"
#include "foundation/string/string_base.h"

class VXM_EXPORT vxSharedLib {
 public:
  explicit vxSharedLib(const char* path);
  virtual ~vxSharedLib();  // unloads

  vxSharedLib(const vxSharedLib&) = delete;
  vxSharedLib& operator=(const vxSharedLib&) = delete;

  bool IsLoaded() const { return handle_ != nullptr; }
  void* Handle() const { return handle_; }
  // The symbol's address, or null (also when the library did not load).
  void* ProcAddr(const char* symbol) const;
  // Why the load failed; empty after a good load.
  const vxStringBase& LoadError() const { return error_; }

 private:
  void* handle_ = nullptr;
  vxStringBase error_;
};

#endif  // VXMIGRATE_FOUNDATION_FILES_SHARED_LIB_H_
