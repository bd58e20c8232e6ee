// A real manager over fresh source and destination installations for the toolkit's tests (copies,
// exclusion lists, INI merges), and the log entries the operations wrote after the header.

#ifndef VXMIGRATE_TESTS_MIGRATE_TOOLKIT_FIXTURE_H_
#define VXMIGRATE_TESTS_MIGRATE_TOOLKIT_FIXTURE_H_

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <memory>
#include <string>
#include <vector>

#include "migrate/manager.h"
#include "support/test_files.h"

namespace vxtest {

class ToolkitTest : public ::testing::Test {
 protected:
  void SetUp() override {
    src_ = root_.Path("src");
    dst_ = root_.Path("dst");
    MakeDirs(src_);
    MakeDirs(dst_);
  }

  // A side-by-side run from src to dst, or an in-place run inside src.
  void StartRun(bool inPlace = false) {
    const std::string destination = inPlace ? src_ : dst_;
    std::vector<std::string> args = {root_.Path("bin/vxmigrate"), "-D1:" + src_, "-D2:" + destination,
                                     "-P1:pavsuite", "-P2:pavsuite", "-V1:5.0", "-V2:5.5"};
    std::vector<char*> argv;
    for (std::string& arg : args) argv.push_back(&arg[0]);
    argv.push_back(nullptr);
    manager_ = std::make_unique<vxMigrationManager>(static_cast<int>(args.size()), argv.data());
    ASSERT_TRUE(manager_->IsValid());
    logPath_ = destination + "/vxmigrate.log";
    headerEntries_ = LogEntries(logPath_).size();
  }

  // What the operations logged since StartRun, time stamps removed.
  std::vector<std::string> NewLogEntries() const {
    std::vector<std::string> entries = LogEntries(logPath_);
    entries.erase(entries.begin(), entries.begin() + static_cast<long>(headerEntries_));
    return entries;
  }

  // Entries a test expects, each a fixed text followed by a path below the source.
  std::string Entry(const std::string& text, const std::string& relative) const {
    return text + src_ + "/" + relative;
  }

  std::string S(const std::string& relative) const { return src_ + "/" + relative; }
  std::string D(const std::string& relative) const { return dst_ + "/" + relative; }

  static bool RunningAsRoot() { return geteuid() == 0; }
  static std::string LinkTarget(const std::string& path) {
    char buffer[4096];
    const ssize_t length = readlink(path.c_str(), buffer, sizeof(buffer));
    return length < 0 ? "<not a link>" : std::string(buffer, static_cast<size_t>(length));
  }
  static unsigned int ModeOf(const std::string& path) {
    struct stat st;
    return lstat(path.c_str(), &st) == 0 ? (st.st_mode & 07777) : 0;
  }

  TempDir root_;
  std::string src_;
  std::string dst_;
  std::string logPath_;
  size_t headerEntries_ = 0;
  std::unique_ptr<vxMigrationManager> manager_;
};

}  // namespace vxtest

#endif  // VXMIGRATE_TESTS_MIGRATE_TOOLKIT_FIXTURE_H_
