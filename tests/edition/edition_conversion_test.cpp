// A whole Halden installation converted into an OBX installation, compared with
// tests/edition/data/expected: every file the conversion writes, byte for byte, and the log. The
// Halden installation is never changed, the same source gives the same tree every time, and a
// second run over the same destination converts nothing.

#include <unistd.h>

#include <cstdio>
#include <iterator>
#include <map>
#include <string>
#include <vector>

#include "edition/halden_to_obx.h"
#include "tests/edition/edition_fixture.h"

namespace {

using vxtest::EditionRun;
using vxtest::ReadFile;
using vxtest::Snapshot;

// The files a conversion writes below a destination: the "_vxmigrate" ones and the settings.
std::map<std::string, std::string> Converted(const std::string& dst) {
  std::map<std::string, std::string> files = Snapshot(dst);
  for (auto file = files.begin(); file != files.end();) {
    const bool ours = file->first.find("_vxmigrate") != std::string::npos ||
                      file->first == "vxm_vxx/vxm_vxx.ini";
    file = ours ? std::next(file) : files.erase(file);
  }
  return files;
}

// The run's log entries, one a line, with its folders written as <src> and <dst>.
std::string PortableLog(EditionRun& run) {
  std::string text;
  for (const std::string& entry : run.NewLog()) text += entry + "\n";
  for (const auto& [folder, mark] : {std::make_pair(run.src(), "<src>"),
                                     std::make_pair(run.dst(), "<dst>")}) {
    for (size_t at; (at = text.find(folder)) != std::string::npos;) {
      text.replace(at, folder.size(), mark);
    }
  }
  return text;
}

TEST(EditionConversion, WholeInstallation) {
  EditionRun run;
  // A profile and the OBX standard template that are symbolic links: the converted copies are
  // files of their own, and nothing is written through a link.
  vxtest::WriteFile(run.src() + "/shared/mirror.conf", "[Profile]\nLogFilePath=file:///var/m\n");
  ASSERT_EQ(symlink((run.src() + "/shared/mirror.conf").c_str(),
                    (run.src() + "/vxm_log/datfiles/mirror.wlp").c_str()), 0);
  const std::string standard = run.dst() + "/vxm_vxx/CompleteSummary.wct";
  ASSERT_EQ(rename(standard.c_str(), (run.src() + "/shared/standard.wct").c_str()), 0);
  ASSERT_EQ(symlink((run.src() + "/shared/standard.wct").c_str(), standard.c_str()), 0);
  const std::map<std::string, std::string> source = Snapshot(run.src());

  EXPECT_EQ(HaldenToOBXHelper(run.manager()).DoHaldenToOBXMigrate(), 0);
  EXPECT_EQ(Snapshot(run.src()), source);
  std::map<std::string, std::string> expected = Snapshot(vxtest::DataPath("expected"));
  for (auto& [name, text] : expected) text = vxtest::ExpandCredentials(text);
  const std::string log = expected["vxmigrate.log"];
  expected.erase("vxmigrate.log");
  // An unreadable profile is left as the user's copy.
  expected["vxm_vxx/datfiles/profiles/corrupt_vxmigrate.wlp"] =
      ReadFile(run.src() + "/vxm_log/datfiles/corrupt.wlp");
  EXPECT_EQ(Converted(run.dst()), expected);
  EXPECT_EQ(PortableLog(run), log);

  // A second run finds every target present and leaves it as it is.
  HaldenToOBXHelper(run.manager()).DoHaldenToOBXMigrate();
  std::map<std::string, std::string> again = Converted(run.dst());
  again.erase("vxm_vxx/vxm_vxx.ini");
  expected.erase("vxm_vxx/vxm_vxx.ini");
  EXPECT_EQ(again, expected);
  const std::string secondLog = PortableLog(run);
  EXPECT_EQ(secondLog.find("conversion: <src>"), std::string::npos) << secondLog;
  EXPECT_NE(secondLog.find("File exists - no copy made:  <dst>/vxm_vxx/datfiles/profiles/"
                           "shop_vxmigrate.wlp\n"), std::string::npos) << secondLog;
}

TEST(EditionConversion, SameSourceGivesTheSameTree) {
  EditionRun first;
  EditionRun second;
  HaldenToOBXHelper(first.manager()).DoHaldenToOBXMigrate();
  HaldenToOBXHelper(second.manager()).DoHaldenToOBXMigrate();
  std::map<std::string, std::string> one = Snapshot(first.dst());
  std::map<std::string, std::string> two = Snapshot(second.dst());
  one.erase("vxmigrate.log");
  two.erase("vxmigrate.log");
  EXPECT_EQ(one, two);
  EXPECT_EQ(PortableLog(first), PortableLog(second));
}

TEST(EditionConversion, OnlySelectedProfilesTravel) {
  EditionRun run("3.0", {"-PFLog:shop.wlp"});
  HaldenToOBXHelper(run.manager()).DoHaldenToOBXProfileFileMigrate();
  EXPECT_EQ(vxtest::ListTree(run.dst() + "/vxm_vxx/datfiles/profiles"),
            std::vector<std::string>{"shop_vxmigrate.wlp"});
}

}  // namespace
