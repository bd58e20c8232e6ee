// A source and a destination installation in a fresh temporary folder with a real manager over
// them, for the tests of the profile and user-file operations.

#ifndef VXMIGRATE_TESTS_MIGRATE_PROFILES_FIXTURE_H_
#define VXMIGRATE_TESTS_MIGRATE_PROFILES_FIXTURE_H_

#include <memory>
#include <string>
#include <vector>

#include "crypt/protected_value.h"
#include "migrate/manager.h"
#include "support/test_files.h"

namespace vxtest {

struct RunOptions {
  std::string sourceProduct = "pavsuite";
  std::string destinationProduct = "pavsuite";
  std::string sourceVersion = "5.5";
  std::string destinationVersion = "5.5";
  std::vector<std::string> extra;  // further options: "-FT:N", "-PFLog:a.wlp"
  bool inPlace = false;            // the destination folder is the source folder
};

class Installations {
 public:
  explicit Installations(const RunOptions& options = RunOptions()) : options_(options) {
    MakeDirs(root_.Path("src"));
    MakeDirs(root_.Path("dst"));
    MakeDirs(root_.Path("bin"));
  }

  Installations(const Installations&) = delete;
  Installations& operator=(const Installations&) = delete;

  // Paths inside the two installations ("" for the installation folder itself).
  std::string Src(const std::string& relative = "") const { return Join("src", relative); }
  std::string Dst(const std::string& relative = "") const {
    return options_.inPlace ? Src(relative) : Join("dst", relative);
  }
  std::string Root(const std::string& relative) const { return root_.Path(relative); }

  // The manager, built on first use so that a test can lay out its files first.
  vxMigrationManager& manager() {
    if (!manager_) {
      std::vector<std::string> args = {root_.Path("bin/vxmigrate"), "-D1:" + Src(), "-D2:" + Dst(),
                                       "-P1:" + options_.sourceProduct,
                                       "-P2:" + options_.destinationProduct,
                                       "-V1:" + options_.sourceVersion,
                                       "-V2:" + options_.destinationVersion};
      args.insert(args.end(), options_.extra.begin(), options_.extra.end());
      manager_ = MakeManager(args);
      headerEntries_ = LogEntries(LogPath()).size();
    }
    return *manager_;
  }

  // Builds the manager from a command file alone: "-cmd:<folder>" naming the folder that holds
  // "migcmd.ini".
  vxMigrationManager& ManagerFromCommandFile(const std::string& commandFolder) {
    manager_ = MakeManager({root_.Path("bin/vxmigrate"), "-cmd:" + commandFolder});
    headerEntries_ = LogEntries(LogPath()).size();
    return *manager_;
  }

  // The log entries written since the manager's header, time stamps removed.
  std::vector<std::string> RunLog() const {
    std::vector<std::string> entries = LogEntries(LogPath());
    if (entries.size() <= headerEntries_) return {};
    return std::vector<std::string>(entries.begin() + static_cast<long>(headerEntries_),
                                    entries.end());
  }

  // Every entry below the destination folder except the run log.
  std::vector<std::string> DestinationTree() const {
    std::vector<std::string> tree;
    for (const std::string& name : ListTree(Dst())) {
      if (name != "vxmigrate.log") tree.push_back(name);
    }
    return tree;
  }

  static std::unique_ptr<vxMigrationManager> MakeManager(std::vector<std::string> args) {
    std::vector<char*> argv;
    for (std::string& arg : args) argv.push_back(&arg[0]);
    argv.push_back(nullptr);
    return std::make_unique<vxMigrationManager>(static_cast<int>(args.size()), argv.data());
  }

 private:
  std::string Join(const std::string& top, const std::string& relative) const {
    return relative.empty() ? root_.Path(top) : root_.Path(top + "/" + relative);
  }
  std::string LogPath() const { return Dst("vxmigrate.log"); }

  TempDir root_;
  RunOptions options_;
  std::unique_ptr<vxMigrationManager> manager_;
  size_t headerEntries_ = 0;
};

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

#endif  // VXMIGRATE_TESTS_MIGRATE_PROFILES_FIXTURE_H_
