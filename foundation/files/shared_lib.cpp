// Plug-in loading through the dynamic loader. Symbols are resolved at load time (RTLD_NOW), so a
// plug-in with missing dependencies fails to load here instead of crashing in the middle of a run.

#include "foundation/files/shared_lib.h"

#include <dlfcn.h>

#include <cstring>
#include <string>

vxSharedLib::vxSharedLib(const char* path) {
  if (path == nullptr || *path == '\0') {
    error_ = "no library named";
    return;
  }
  // A bare name is a file in the current folder, as in a listing of it; the loader would
  // otherwise search its system folders and load some other library of that name.
  std::string file = strchr(path, '/') != nullptr ? path : std::string("./") + path;
  dlerror();
  handle_ = dlopen(file.c_str(), RTLD_NOW | RTLD_LOCAL);
  if (handle_ == nullptr) {
    const char* why = dlerror();
    error_ = why != nullptr ? why : "unknown loader error";
  }
}

vxSharedLib::~vxSharedLib() {
  if (handle_ != nullptr) dlclose(handle_);
}

void* vxSharedLib::ProcAddr(const char* symbol) const {
  if (handle_ == nullptr || symbol == nullptr) return nullptr;
  return dlsym(handle_, symbol);
}
