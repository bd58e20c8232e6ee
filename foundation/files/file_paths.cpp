// Path joins, folders and deletes. MakePath accepts the '\\' separators that settings-file names
// are written with and always produces '/' paths with exactly one separator at each join.

#ifndef _FILE_OFFSET_BITS
#define _FILE_OFFSET_BITS 64
#endif

#include "foundation/files/file_manager.h"

#include <errno.h>
#include <stdlib.h>
#include <sys/stat.h>
#include <unistd.h>

#include <string>
#include <string_view>
#include <vector>

#include "foundation/files/run_doors.h"

const char vxFileManager::m_slash = '/';

namespace {

bool IsSeparator(char c) { return c == '/' || c == '\\'; }

// The folder text as given, less its closing separators; a folder of separators only is the root.
std::string FolderPart(std::string_view folder) {
  size_t end = folder.size();
  while (end > 0 && IsSeparator(folder[end - 1])) --end;
  if (end == 0 && !folder.empty()) return "/";
  return std::string(folder.substr(0, end));
}

// Appends a name part with one separator in front of it. Inside the part '\\' becomes '/' and runs
// of separators collapse; leading and closing separators are dropped, so a part of separators only
// (the top folder written as "/") adds nothing. A name therefore always stays below the folder.
void AppendPart(std::string& out, std::string_view part) {
  std::string clean;
  clean.reserve(part.size());
  for (char c : part) {
    if (IsSeparator(c)) {
      if (!clean.empty() && clean.back() != '/') clean.push_back('/');
    } else {
      clean.push_back(c);
    }
  }
  if (!clean.empty() && clean.back() == '/') clean.pop_back();
  if (clean.empty()) return;
  if (!out.empty() && out.back() != '/') out.push_back('/');
  out.append(clean);
}

void EndAsFolder(std::string& out) {
  if (!out.empty() && out.back() != '/') out.push_back('/');
}

}  // namespace

void vxFileManager::MakePath(vxStringBase& result, const vxStringBase& folder,
                             const vxStringBase& name, unsigned int isFile) {
  std::string out = FolderPart(folder.view());
  AppendPart(out, name.view());
  if (isFile == 0) EndAsFolder(out);
  result = vxStringBase(std::string_view(out));
}

void vxFileManager::MakePath(vxStringBase& result, const vxStringBase& folder,
                             const vxStringBase& subFolder, const vxStringBase& name) {
  std::string out = FolderPart(folder.view());
  AppendPart(out, subFolder.view());
  size_t before = out.size();
  AppendPart(out, name.view());
  // Without a name the result names a folder, and says so.
  if (out.size() == before) EndAsFolder(out);
  result = vxStringBase(std::string_view(out));
}

int vxFileManager::DeleteFile(const vxStringBase& path, unsigned int missingIsSuccess) {
  if (path.isEmpty() || !vxfiles::MayWrite(path.view())) return 1;
  if (unlink(path.c_str()) == 0) return 0;
  if (errno == ENOENT && missingIsSuccess != 0) return 0;
  vxfiles::NoteWriteFailure(errno, path.view());
  return 1;
}

int vxFileManager::CreateDirectory(const vxStringBase& path, const void* /*attributes*/) {
  std::string folder = FolderPart(path.view());
  if (folder.empty() || !vxfiles::MayWriteInto(path.view())) return 1;
  if (mkdir(folder.c_str(), 0777) == 0 || errno == EEXIST) {
    return vxFilename::IsDirectory(folder.c_str()) ? 0 : 1;
  }
  if (errno == ENOENT) {
    // Parents first; one that exists already (or appears meanwhile) is no failure.
    for (size_t slash = folder.find('/', 1); slash != std::string::npos;
         slash = folder.find('/', slash + 1)) {
      const std::string parent = folder.substr(0, slash);
      if (mkdir(parent.c_str(), 0777) != 0 && errno != EEXIST) {
        vxfiles::NoteWriteFailure(errno, parent);
      }
    }
    if (mkdir(folder.c_str(), 0777) == 0 || errno == EEXIST) {
      return vxFilename::IsDirectory(folder.c_str()) ? 0 : 1;
    }
  }
  vxfiles::NoteWriteFailure(errno, folder);
  return 1;
}

void vxFileManager::GetCurrentDirectory(vxStringBase& result) {
  char* cwd = getcwd(nullptr, 0);
  result = cwd != nullptr ? vxStringBase(cwd) : vxStringBase();
  free(cwd);
}

void vxFileManager::GetModuleDirectory(vxStringBase& result) {
  vxStringBase path;
  GetModulePath(path);
  result = path.isEmpty() ? vxStringBase() : vxFilename(path).Directory();
}

void vxFileManager::GetModulePath(vxStringBase& result) {
  std::vector<char> buffer(4096);
  for (;;) {
    ssize_t n = readlink("/proc/self/exe", buffer.data(), buffer.size());
    if (n < 0) {
      result.makeNull();
      return;
    }
    if (static_cast<size_t>(n) < buffer.size()) {
      result = vxStringBase(buffer.data(), static_cast<size_t>(n));
      return;
    }
    if (buffer.size() >= (1u << 20)) {  // no path is that long; stop rather than grow forever
      result.makeNull();
      return;
    }
    buffer.resize(buffer.size() * 2);
  }
}

bool vxFileManager::Exists(const vxStringBase& path) {
  struct stat st;
  return !path.isEmpty() && lstat(path.c_str(), &st) == 0;
}
