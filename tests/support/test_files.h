// Helpers for tests that work on real files: a fresh temporary folder removed afterwards, and whole
// file reading and writing.

#ifndef VXMIGRATE_TESTS_SUPPORT_TEST_FILES_H_
#define VXMIGRATE_TESTS_SUPPORT_TEST_FILES_H_

#include <map>
#include <string>
#include <vector>

namespace vxtest {

// A new empty folder under $TMPDIR (or /tmp); removed with everything in it on destruction.
class TempDir {
 public:
  TempDir();
  ~TempDir();
  TempDir(const TempDir&) = delete;
  TempDir& operator=(const TempDir&) = delete;

  const std::string& path() const { return path_; }
  // path() + "/" + relative
  std::string Path(const std::string& relative) const;

 private:
  std::string path_;
};

// Writes content to path, creating missing parent folders. Aborts the test run on failure.
void WriteFile(const std::string& path, const std::string& content);
// The whole content of path; "<missing>" when it cannot be read.
std::string ReadFile(const std::string& path);
bool FileExists(const std::string& path);
void MakeDirs(const std::string& path);
// Names (not paths) of every entry below folder, relative to it, sorted: "a", "a/b.ini", ...
std::vector<std::string> ListTree(const std::string& folder);
// Every entry below folder with what it holds, to compare a whole tree before and after: a file's
// mode and bytes, a folder's mode, a link's target.
std::map<std::string, std::string> TreeState(const std::string& folder);
// The lines of a log file with their time stamps removed ("YYYY-MM-DD HH:MM:SS  " prefix).
std::vector<std::string> LogEntries(const std::string& logPath);

}  // namespace vxtest

#endif  // VXMIGRATE_TESTS_SUPPORT_TEST_FILES_H_
