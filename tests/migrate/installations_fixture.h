// A source and a destination installation in a fresh temporary folder with a real manager over
// them, for the tests of the run checks and of the copying, merging and profile operations: the
// log entries and files those operations wrote, with the two folders written "<src>" and "<dst>"
// so that expectations read as plain texts; and the credential forms old and new profiles hold.

#ifndef VXMIGRATE_TESTS_MIGRATE_INSTALLATIONS_FIXTURE_H_
#define VXMIGRATE_TESTS_MIGRATE_INSTALLATIONS_FIXTURE_H_

#include <gtest/gtest.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
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

// A manager over args, whose executable (plug-ins, "vxmigrate.ini") is args[0].
inline std::unique_ptr<vxMigrationManager> MakeManager(Entries args) {
  std::vector<char*> argv;
  for (std::string& arg : args) argv.push_back(&arg[0]);
  argv.push_back(nullptr);
  return std::make_unique<vxMigrationManager>(static_cast<int>(args.size()), argv.data(),
                                              vxStringBase(args[0].c_str()));
}

class Installations {
 public:
  // A run from pavsuite 5.5 to pavsuite 5.5 with the further options of extra ("-FT:N",
  // "-PFLog:a.wlp", "-V1:6.0" in place of the default); in place (the destination folder is the
  // source folder) when inPlace is set.
  explicit Installations(const Entries& extra = {}, bool inPlace = false) : inPlace_(inPlace) {
    MakeDirs(Src());
    MakeDirs(Dst());
    options_.insert(options_.end(), {"-D1:" + Src(), "-D2:" + Dst()});
    options_.insert(options_.end(), extra.begin(), extra.end());
  }
  Installations(const Installations&) = delete;
  Installations& operator=(const Installations&) = delete;

  // The folder holding both installations (and "bin").
  std::string Root() const { return root_.path(); }
  // Paths inside the two installations ("" for the installation folder itself).
  std::string Src(const std::string& rel = "") const { return Join("src", rel); }
  std::string Dst(const std::string& rel = "") const { return Join(inPlace_ ? "src" : "dst", rel); }
  // Writes each source file named, holding its own name.
  void WriteSources(std::initializer_list<const char*> names) const {
    for (const char* name : names) WriteFile(Src(name), name);
  }

  // The manager, built on first use so that a test can lay out its files first.
  vxMigrationManager& manager() { return manager_ ? *manager_ : Start(options_); }
  // The manager of "-cmd:<folder>" alone, the folder holding "migcmd.ini".
  vxMigrationManager& ManagerFromCommandFile(const std::string& folder) {
    return Start({"-cmd:" + folder});
  }

  std::string Marked(std::string text) const {
    for (const auto& [f, mark] : {std::make_pair(Src(), "<src>"), {Dst(), "<dst>"}}) {
      for (size_t at; (at = text.find(f)) != std::string::npos;) text.replace(at, f.size(), mark);
    }
    return text;
  }
  // The log entries written since the manager's header, time stamps removed.
  Entries RunLog() const {
    Entries entries = LogEntries(Dst("vxmigrate.log"));
    entries.erase(entries.begin(), entries.begin() + static_cast<long>(headerEntries_));
    for (std::string& entry : entries) entry = Marked(entry);
    return entries;
  }
  // What destination files hold; "-> target" for a link.
  Entries ReadDst(std::initializer_list<std::string> names) const {
    Entries out;
    for (const std::string& name : names) {
      char target[4096];
      const ssize_t length = readlink(Dst(name).c_str(), target, sizeof(target));
      out.push_back(length < 0 ? Marked(ReadFile(Dst(name))) : "-> " + std::string(target, length));
    }
    return out;
  }
  // Every entry below the destination folder except the run log.
  Entries DestinationTree() const {
    Entries tree = ListTree(Dst());
    tree.erase(std::remove(tree.begin(), tree.end(), "vxmigrate.log"), tree.end());
    return tree;
  }

 private:
  vxMigrationManager& Start(Entries args) {
    args.insert(args.begin(), Join("bin/vxmigrate", ""));
    manager_ = MakeManager(args);
    EXPECT_TRUE(manager_->IsValid());
    headerEntries_ = LogEntries(Dst("vxmigrate.log")).size();
    return *manager_;
  }
  std::string Join(const std::string& top, const std::string& relative) const {
    return relative.empty() ? root_.Path(top) : root_.Path(top + "/" + relative);
  }

  TempDir root_;
  const bool inPlace_;
  Entries options_ = {"-P1:pavsuite", "-P2:pavsuite", "-V1:5.5", "-V2:5.5"};
  std::unique_ptr<vxMigrationManager> manager_;
  size_t headerEntries_ = 0;
};

// The options of a run from product p1 at version v1 to p2 at v2, then extra; they take the place of
// an Installations' defaults.
inline Entries RunArgs(const std::string& p1, const std::string& p2, const std::string& v1,
                       const std::string& v2, const Entries& extra = {}) {
  Entries args = {"-P1:" + p1, "-P2:" + p2, "-V1:" + v1, "-V2:" + v2};
  args.insert(args.end(), extra.begin(), extra.end());
  return args;
}

// The previous generation's encoding of a clear text, as old profiles store credentials.
inline std::string LegacyEncoded(std::string clear) {
  Obsolete_EncodePasswordOrUserName(&clear[0]);
  return clear.c_str();
}

// The previous generation's 80-digit form of a clear text (36 characters at most): four bytes of no
// meaning, the value and zero filler (40 bytes), each byte but the last XORed with the one after it.
inline std::string PreviousGenerationForm(const std::string& clear, bool lowerCase = false) {
  const std::string bytes = "\x13\x57\x9B\xDF" + clear + std::string(37 - clear.size(), '\0');
  std::string text(80, '\0');
  for (int i = 0; i < 40; ++i) {
    std::snprintf(&text[2 * i], 3, lowerCase ? "%02x" : "%02X",
                  static_cast<unsigned char>(bytes[i] ^ bytes[i + 1]));
  }
  return text;
}

// The clear text behind a value in the protected form; "<not protected>" for any other value.
inline std::string Decrypted(std::string stored) {
  std::vector<unsigned char> clear(1024);
  unsigned long length = clear.size();
  unsigned int notProtected = 1;
  const int read = VXUI_Decrypt(&stored[0], clear.data(), &length, &notProtected);
  if (read != 1 || notProtected != 0) return "<not protected>";
  return std::string(clear.begin(), clear.begin() + static_cast<long>(length));
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
