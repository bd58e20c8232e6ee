// Absolute and real path texts, from getcwd and realpath.

#include "foundation/files/path_text.h"

#include <errno.h>
#include <stdlib.h>
#include <unistd.h>

namespace vxfiles {

std::string AbsoluteText(std::string_view path) {
  std::string text;
  if (path.empty()) return text;
  if (path[0] != '/') {
    char* cwd = getcwd(nullptr, 0);
    if (cwd != nullptr) text = cwd;
    free(cwd);
  }
  text.push_back('/');
  for (char c : path) {
    if (c == '/' && text.back() == '/') continue;
    text.push_back(c);
  }
  while (text.size() > 1 && text.back() == '/') text.pop_back();
  return text;
}

bool RealPath(const std::string& path, std::string& real) {
  char* resolved = realpath(path.c_str(), nullptr);
  if (resolved == nullptr) return false;
  real = resolved;
  free(resolved);
  return true;
}

}  // namespace vxfiles

bool vxRealPaths::Folder(const std::string& folder, std::string& real) {
  auto known = folders_.find(folder);
  if (known != folders_.end()) {
    real = known->second;
    return true;
  }
  if (!vxfiles::RealPath(folder, real)) return false;
  folders_.emplace(folder, real);
  return true;
}

bool vxRealPaths::Entry(std::string_view path, std::string& real) {
  std::string folder = vxfiles::AbsoluteText(path), rest;
  for (;;) {
    const size_t slash = folder.rfind('/');
    if (slash == std::string::npos) return false;
    const std::string last = folder.substr(slash + 1);
    if (last.empty() || last == "." || last == "..") return false;
    rest = rest.empty() ? last : last + "/" + rest;
    folder = slash == 0 ? "/" : folder.substr(0, slash);
    std::string resolved;
    if (Folder(folder, resolved)) {
      real = resolved == "/" ? "/" + rest : resolved + "/" + rest;
      return true;
    }
    if (errno != ENOENT || folder == "/") return false;
  }
}
