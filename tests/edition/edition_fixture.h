// A Halden installation and an OBX installation as a customer has them (tests/edition/data), and a
// manager over the two, for the edition converter's tests. Data files write credentials as
// "{legacy:text}" and "{protected:text}", expanded to the forms the products store.

#ifndef VXMIGRATE_TESTS_EDITION_EDITION_FIXTURE_H_
#define VXMIGRATE_TESTS_EDITION_EDITION_FIXTURE_H_

#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "crypt/protected_value.h"
#include "edition/halden_to_obx.h"
#include "migrate/driver_fixture.h"
#include "migrate/manager.h"
#include "migrate/sample_lists.h"
#include "support/test_files.h"

namespace vxtest {

inline std::string Legacy(std::string text) {
  Obsolete_EncodePasswordOrUserName(&text[0]);
  return text.c_str();
}

inline std::string Protected(const std::string& plain) {
  std::vector<char> out(5 + 32 * (plain.size() / 16 + 2));
  VXUI_Encrypt(reinterpret_cast<unsigned char*>(const_cast<char*>(plain.data())), plain.size(),
               out.data());
  return out.data();
}

inline std::string ExpandCredentials(std::string text) {
  for (size_t at; (at = text.find("{legacy:")) != std::string::npos ||
                  (at = text.find("{protected:")) != std::string::npos;) {
    const size_t end = text.find('}', at);
    const size_t colon = text.find(':', at);
    const std::string plain = text.substr(colon + 1, end - colon - 1);
    text.replace(at, end + 1 - at, text[at + 1] == 'l' ? Legacy(plain) : Protected(plain));
  }
  return text;
}

inline std::string DataPath(const std::string& name) {
  return std::string(VXM_SOURCE_DIR) + "/tests/edition/data/" + name;
}

// A file of data/expected as the conversion must write it.
inline std::string Expected(const std::string& name) {
  return ExpandCredentials(ReadFile(DataPath("expected/" + name)));
}

inline void CopyDataTree(const std::string& tree, const std::string& to) {
  for (const std::string& name : ListTree(DataPath(tree))) {
    const std::string from = DataPath(tree + "/" + name);
    if (!std::filesystem::is_directory(from)) {
      WriteFile(to + "/" + name, ExpandCredentials(ReadFile(from)));
    }
  }
}

// A run from the Halden data tree (plus a sample profile, an unreadable template and an unreadable
// profile) into the OBX data tree; with write false both folders start empty.
class EditionRun {
 public:
  explicit EditionRun(const std::string& version = "3.0", std::vector<std::string> extra = {},
                      const std::string& product = "halsuite", bool write = true) {
    MakeDirs(root_.Path("dst"));
    MakeDirs(root_.Path("src"));
    if (write) {
      MakeDirs(root_.Path("dst/vxm_vxx/datfiles/profiles"));
      CopyDataTree("halden", src());
      CopyDataTree("obx", dst());
      const std::string dat = src() + "/vxm_log/datfiles/";
      const std::string samples = GetSampleFileList("halsuite", "wlp");
      WriteFile(dat + samples.substr(0, samples.find(',')), "[Profile]\nName=Sample\n");
      WriteFile(dat + "Broken.mss", std::string("[SaveAs]\nSaveReportAs=x.htm\n\0\1", 30));
      WriteFile(dat + "corrupt.wlp", std::string("[Profile]\n\0\0", 12));
    }
    std::vector<std::string> args = {root_.Path("bin/vxmigrate"), "-D1:" + src(), "-D2:" + dst(),
                                      "-P1:" + product, "-P2:obx", "-V1:5.5", "-V2:" + version};
    args.insert(args.end(), extra.begin(), extra.end());
    manager_ = MakeManager(args);
    NewLog();
  }

  std::string src() const { return root_.Path("src"); }
  std::string dst() const { return root_.Path("dst"); }
  vxMigrationManager* manager() { return manager_.get(); }

  // Log entries written since the last call (the first call takes the manager's header).
  std::vector<std::string> NewLog() {
    std::vector<std::string> all = LogEntries(dst() + "/vxmigrate.log");
    std::vector<std::string> fresh(all.begin() + std::min(mark_, all.size()), all.end());
    mark_ = all.size();
    return fresh;
  }

 private:
  TempDir root_;
  std::unique_ptr<vxMigrationManager> manager_;
  size_t mark_ = 0;
};

// Every file below folder with its content, by relative name (folders left out).
inline std::map<std::string, std::string> Snapshot(const std::string& folder) {
  std::map<std::string, std::string> files;
  for (const std::string& name : ListTree(folder)) {
    if (!std::filesystem::is_directory(folder + "/" + name)) {
      files[name] = ReadFile(folder + "/" + name);
    }
  }
  return files;
}

}  // namespace vxtest

#endif  // VXMIGRATE_TESTS_EDITION_EDITION_FIXTURE_H_
