// A source and a destination installation in a fresh temporary folder with a real manager over
// them, for the tests of the copying, merging and profile operations; the log entries those
// operations wrote; and the credential encodings old and new profiles hold.

#ifndef VXMIGRATE_TESTS_MIGRATE_INSTALLATIONS_FIXTURE_H_
#define VXMIGRATE_TESTS_MIGRATE_INSTALLATIONS_FIXTURE_H_

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <initializer_list>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "crypt/protected_value.h"
#include "migrate/manager.h"
#include "support/test_files.h"

namespace vxtest {

using Entries = std::vector<std::string>;

struct RunOptions {
  std::vector<std::string> extra;  // further options: "-FT:N", "-PFLog:a.wlp"
  bool inPlace = false;            // the destination folder is the source folder
  std::string sourceProduct = "pavsuite";
  std::string sourceVersion = "5.5";
  std::string destinationProduct = "pavsuite";
  std::string destinationVersion = "5.5";
};

class Installations {
 public:
  explicit Installations(RunOptions options = RunOptions()) : options_(std::move(options)) {
    MakeDirs(Src());
    MakeDirs(Dst());
  }
  Installations(const Installations&) = delete;
  Installations& operator=(const Installations&) = delete;

  // Paths inside the two installations ("" for the installation folder itself).
  std::string Src(const std::string& relative = "") const { return Join("src", relative); }
  std::string Dst(const std::string& relative = "") const {
    return options_.inPlace ? Src(relative) : Join("dst", relative);
  }
  std::string Root(const std::string& relative) const { return root_.Path(relative); }

  // Writes each source file named, holding its own name.
  void WriteSources(std::initializer_list<const char*> names) const {
    for (const char* name : names) WriteFile(Src(name), name);
  }

  // The manager, built on first use so that a test can lay out its files first.
  vxMigrationManager& manager() {
    if (!manager_) {
      Entries args = {"-D1:" + Src(), "-D2:" + Dst(), "-P1:" + options_.sourceProduct,
                      "-P2:" + options_.destinationProduct, "-V1:" + options_.sourceVersion,
                      "-V2:" + options_.destinationVersion};
      args.insert(args.end(), options_.extra.begin(), options_.extra.end());
      Start(args);
    }
    return *manager_;
  }
  // The manager of "-cmd:<folder>" alone, the folder holding "migcmd.ini".
  vxMigrationManager& ManagerFromCommandFile(const std::string& folder) {
    Start({"-cmd:" + folder});
    return *manager_;
  }

  // The log entries written since the manager's header, time stamps removed.
  Entries RunLog() const {
    Entries entries = LogEntries(Dst("vxmigrate.log"));
    entries.erase(entries.begin(),
                  entries.begin() + static_cast<long>(std::min(headerEntries_, entries.size())));
    return entries;
  }
  // Every entry below the destination folder except the run log.
  Entries DestinationTree() const {
    Entries tree;
    for (const std::string& name : ListTree(Dst())) {
      if (name != "vxmigrate.log") tree.push_back(name);
    }
    return tree;
  }

 private:
  void Start(Entries args) {
    args.insert(args.begin(), root_.Path("bin/vxmigrate"));
    std::vector<char*> argv;
    for (std::string& arg : args) argv.push_back(&arg[0]);
    argv.push_back(nullptr);
    manager_ = std::make_unique<vxMigrationManager>(static_cast<int>(args.size()), argv.data());
    EXPECT_TRUE(manager_->IsValid());
    headerEntries_ = LogEntries(Dst("vxmigrate.log")).size();
  }
  std::string Join(const std::string& top, const std::string& relative) const {
    return relative.empty() ? root_.Path(top) : root_.Path(top + "/" + relative);
  }

  TempDir root_;
  RunOptions options_;
  std::unique_ptr<vxMigrationManager> manager_;
  size_t headerEntries_ = 0;
};

inline bool RunningAsRoot() { return geteuid() == 0; }

inline std::string LinkTarget(const std::string& path) {
  char buffer[4096];
  const ssize_t length = readlink(path.c_str(), buffer, sizeof(buffer));
  return length < 0 ? "<not a link>" : std::string(buffer, static_cast<size_t>(length));
}

inline unsigned int ModeOf(const std::string& path) {
  struct stat st = {};
  return lstat(path.c_str(), &st) == 0 ? (st.st_mode & 07777) : 0;
}

// The previous generation's encoding of a clear text, as old profiles store credentials.
inline std::string LegacyEncoded(const std::string& clear) {
  std::vector<char> text(clear.begin(), clear.end());
  text.push_back('\0');
  Obsolete_EncodePasswordOrUserName(text.data());
  return std::string(text.data());
}

// The clear text behind a stored value; "<undecryptable>" when it does not decrypt.
inline std::string Decrypted(const std::string& stored) {
  std::vector<char> input(stored.begin(), stored.end());
  input.push_back('\0');
  std::vector<unsigned char> output(1024);
  unsigned long length = output.size();
  if (VXUI_Decrypt(input.data(), output.data(), &length, nullptr) != 1) return "<undecryptable>";
  return std::string(output.begin(), output.begin() + static_cast<long>(length));
}

// The protected form of a clear text.
inline std::string Protected(const std::string& clear) {
  std::vector<unsigned char> data(clear.begin(), clear.end());
  std::vector<char> output(5 + 32 * (clear.size() / 16 + 2));
  if (VXUI_Encrypt(data.data(), data.size(), output.data()) != 1) return "<unprotectable>";
  return std::string(output.data());
}

}  // namespace vxtest

#endif  // VXMIGRATE_TESTS_MIGRATE_INSTALLATIONS_FIXTURE_H_
