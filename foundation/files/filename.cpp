// A path and its parts. The parts are computed on demand from the one stored text, so a name
// never disagrees with its path.

#ifndef _FILE_OFFSET_BITS
#define _FILE_OFFSET_BITS 64
#endif

#include "foundation/files/filename.h"

#include <sys/stat.h>

#include <cstdlib>
#include <cstring>
#include <string>

namespace {

// Position just after the last '/' or '\\' (0 when there is none).
size_t NameStart(const std::string& path) {
  size_t slash = path.find_last_of("/\\");
  return slash == std::string::npos ? 0 : slash + 1;
}

// Position of the extension's dot within the path, or npos. A dot that opens the name is not an
// extension (".profile" has none).
size_t ExtensionDot(const std::string& path) {
  size_t start = NameStart(path);
  size_t dot = path.rfind('.');
  if (dot == std::string::npos || dot <= start) return std::string::npos;
  return dot;
}

}  // namespace

vxFilename::vxFilename() {}
vxFilename::vxFilename(const char* path) : path_(path) {}
vxFilename::vxFilename(const vxStringBase& path) : path_(path) {}
vxFilename::vxFilename(const vxFilename& other) : path_(other.path_) {}
vxFilename& vxFilename::operator=(const vxFilename& other) {
  path_ = other.path_;
  return *this;
}
vxFilename::~vxFilename() {}

vxStringBase vxFilename::Filename() const {
  const std::string& path = path_.str();
  return vxStringBase(std::string_view(path).substr(NameStart(path)));
}

vxStringBase vxFilename::Directory() const {
  const std::string& path = path_.str();
  return vxStringBase(std::string_view(path).substr(0, NameStart(path)));
}

vxStringBase vxFilename::BaseName() const {
  const std::string& path = path_.str();
  size_t start = NameStart(path);
  size_t dot = ExtensionDot(path);
  size_t end = dot == std::string::npos ? path.size() : dot;
  return vxStringBase(std::string_view(path).substr(start, end - start));
}

vxStringBase vxFilename::Extension() const {
  const std::string& path = path_.str();
  size_t dot = ExtensionDot(path);
  if (dot == std::string::npos) return vxStringBase();
  return vxStringBase(std::string_view(path).substr(dot + 1));
}

void vxFilename::SetExtension(const char* ext) {
  std::string path = path_.str();
  size_t dot = ExtensionDot(path);
  if (dot != std::string::npos) path.erase(dot);
  if (ext != nullptr && ext[0] != '\0') {
    path.push_back('.');
    path.append(ext);
  }
  path_ = vxStringBase(std::string_view(path));
}

int vxFilename::IsDirectory(const char* path) {
  struct stat st;
  if (path == nullptr || path[0] == '\0' || stat(path, &st) != 0) return 0;
  return S_ISDIR(st.st_mode) ? 1 : 0;
}

int vxFilename::Dup(char** target, const char* source, int length) {
  if (target == nullptr) return 1;
  *target = nullptr;
  if (source == nullptr) return 1;
  // A length past the text's end stops at its NUL: the caller's count is never trusted for reading.
  size_t size = length < 0 ? strlen(source) : strnlen(source, static_cast<size_t>(length));
  char* copy = static_cast<char*>(malloc(size + 1));
  if (copy == nullptr) return 1;
  memcpy(copy, source, size);
  copy[size] = '\0';
  *target = copy;
  return 0;
}
