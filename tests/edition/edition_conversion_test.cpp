// A whole Halden installation converted into an OBX installation: the steps in their order, the
// source never changed, and the same source giving the same tree every time.

#include <unistd.h>

#include <cstdio>
#include <map>
#include <string>
#include <vector>

#include "edition/halden_to_obx.h"
#include "foundation/inifile/ini_file.h"
#include "tests/edition/edition_fixture.h"

namespace {

using vxtest::EditionRun;
using vxtest::Snapshot;

std::string Replace(std::string text, const std::string& from, const std::string& to) {
  for (size_t at = text.find(from); at != std::string::npos; at = text.find(from, at + to.size())) {
    text.replace(at, from.size(), to);
  }
  return text;
}

// The run's log with its folders written as <src> and <dst>, so that two runs compare.
std::vector<std::string> PortableLog(EditionRun& run) {
  std::vector<std::string> log = run.NewLog();
  for (std::string& entry : log) {
    entry = Replace(Replace(entry, run.src(), "<src>"), run.dst(), "<dst>");
  }
  return log;
}

// Also when a profile, or the OBX standard template, is a symbolic link: the converted copies are
// files of their own and nothing is written through a link.
TEST(EditionConversion, NeverChangesTheHaldenInstallation) {
  EditionRun run;
  vxtest::WriteFile(run.src() + "/shared/mirror.conf", "[Profile]\nLogFilePath=file:///var/log/m\n");
  ASSERT_EQ(symlink((run.src() + "/shared/mirror.conf").c_str(),
                    (run.src() + "/vxm_log/datfiles/mirror.wlp").c_str()), 0);
  const std::string standard = run.dst() + "/standard/CompleteSummary.wct";
  vxtest::WriteFile(standard, vxtest::StandardTemplate());
  std::remove((run.dst() + "/vxm_vxx/CompleteSummary.wct").c_str());
  ASSERT_EQ(symlink(standard.c_str(), (run.dst() + "/vxm_vxx/CompleteSummary.wct").c_str()), 0);
  const std::map<std::string, std::string> before = Snapshot(run.src());

  HaldenToOBXHelper(run.manager()).DoHaldenToOBXMigrate();
  EXPECT_EQ(Snapshot(run.src()), before);
  EXPECT_EQ(vxtest::ReadFile(standard), vxtest::StandardTemplate());
  vxMappedINIFile mirror((run.dst() + "/vxm_vxx/datfiles/profiles/mirror_vxmigrate.wlp").c_str());
  ASSERT_EQ(mirror.Open(1), 0);
  EXPECT_EQ(mirror.GetVal("Profile", "LogFilePath").str(), "/var/log/m");
}

TEST(EditionConversion, RunsTheStepsInOrder) {
  EditionRun run;
  EXPECT_EQ(HaldenToOBXHelper(run.manager()).DoHaldenToOBXMigrate(), 0);
  const std::vector<std::string> log = PortableLog(run);
  ASSERT_GE(log.size(), 4u);
  EXPECT_EQ(log.front(), "vxm_log.ini merged with vxm_vxx.ini");
  EXPECT_EQ(log.back(), "keywords.ini merged");
  // The profiles see the advanced options merged before them: the Halden "Checkout" content group
  // joined the OBX one.
  const std::string shop =
      vxtest::ReadFile(run.dst() + "/vxm_vxx/datfiles/profiles/shop_vxmigrate.wlp");
  EXPECT_NE(shop.find("\nincludecontentgroups=4 9 \n"), std::string::npos) << shop;
  EXPECT_EQ(vxtest::ReadFile(run.dst() + "/vxintra.txt"),
            "10.0.0.0,Office\n192.168.0.0,Warehouse");
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

}  // namespace
