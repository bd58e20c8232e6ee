// Temporary folders and whole-file helpers for the tests.

#include "support/test_files.h"

#include <dirent.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <functional>
#include <sstream>

namespace vxtest {
namespace {

void RemoveTree(const std::string& path) {
  struct stat st;
  if (lstat(path.c_str(), &st) != 0) return;
  if (S_ISDIR(st.st_mode)) {
    chmod(path.c_str(), 0700);  // tests may have made it unreadable
    if (DIR* dir = opendir(path.c_str())) {
      while (dirent* entry = readdir(dir)) {
        if (strcmp(entry->d_name, ".") == 0 || strcmp(entry->d_name, "..") == 0) continue;
        RemoveTree(path + "/" + entry->d_name);
      }
      closedir(dir);
    }
    rmdir(path.c_str());
  } else {
    unlink(path.c_str());
  }
}

}  // namespace

TempDir::TempDir() {
  const char* base = getenv("TMPDIR");
  std::string pattern = std::string(base && *base ? base : "/tmp") + "/vxmtest.XXXXXX";
  std::vector<char> buffer(pattern.begin(), pattern.end());
  buffer.push_back('\0');
  if (mkdtemp(buffer.data()) == nullptr) {
    perror("mkdtemp");
    abort();
  }
  path_ = buffer.data();
}

TempDir::~TempDir() { RemoveTree(path_); }

std::string TempDir::Path(const std::string& relative) const { return path_ + "/" + relative; }

void MakeDirs(const std::string& path) {
  for (size_t i = 1; i <= path.size(); ++i) {
    if (i == path.size() || path[i] == '/') mkdir(path.substr(0, i).c_str(), 0755);
  }
}

void WriteFile(const std::string& path, const std::string& content) {
  size_t slash = path.rfind('/');
  if (slash != std::string::npos) MakeDirs(path.substr(0, slash));
  std::ofstream out(path, std::ios::binary | std::ios::trunc);
  out << content;
  if (!out) {
    fprintf(stderr, "cannot write %s\n", path.c_str());
    abort();
  }
}

std::string ReadFile(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  if (!in) return "<missing>";
  std::ostringstream text;
  text << in.rdbuf();
  return text.str();
}

bool FileExists(const std::string& path) {
  struct stat st;
  return lstat(path.c_str(), &st) == 0;
}

std::vector<std::string> ListTree(const std::string& folder) {
  std::vector<std::string> names;
  std::function<void(const std::string&)> walk = [&](const std::string& relative) {
    std::string full = relative.empty() ? folder : folder + "/" + relative;
    DIR* dir = opendir(full.c_str());
    if (dir == nullptr) return;
    while (dirent* entry = readdir(dir)) {
      if (strcmp(entry->d_name, ".") == 0 || strcmp(entry->d_name, "..") == 0) continue;
      std::string name = relative.empty() ? entry->d_name : relative + "/" + entry->d_name;
      names.push_back(name);
      struct stat st;
      if (lstat((folder + "/" + name).c_str(), &st) == 0 && S_ISDIR(st.st_mode)) walk(name);
    }
    closedir(dir);
  };
  walk("");
  std::sort(names.begin(), names.end());
  return names;
}

std::map<std::string, std::string> TreeState(const std::string& folder) {
  std::map<std::string, std::string> state;
  for (const std::string& name : ListTree(folder)) {
    const std::string path = folder + "/" + name;
    struct stat st;
    if (lstat(path.c_str(), &st) != 0) continue;
    char mode[16];
    snprintf(mode, sizeof mode, "%04o ", st.st_mode & 07777);
    if (S_ISLNK(st.st_mode)) {
      char target[4096];
      const ssize_t length = readlink(path.c_str(), target, sizeof target);
      state[name] = "-> " + std::string(target, length > 0 ? static_cast<size_t>(length) : 0);
    } else {
      state[name] = mode + (S_ISDIR(st.st_mode) ? std::string("folder") : ReadFile(path));
    }
  }
  return state;
}

std::vector<std::string> LogEntries(const std::string& logPath) {
  std::vector<std::string> entries;
  std::ifstream in(logPath, std::ios::binary);
  std::string line;
  const size_t kStampLength = strlen("YYYY-MM-DD HH:MM:SS  ");
  while (std::getline(in, line)) {
    entries.push_back(line.size() >= kStampLength ? line.substr(kStampLength) : line);
  }
  return entries;
}

}  // namespace vxtest
