// Command-line validity, product ids, the checks that refuse a run, and the version ranges.

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdlib>
#include <string>
#include <vector>

#include "migrate/driver_fixture.h"

namespace vxtest {
namespace {

TEST(ProductID, MatchesIgnoringCaseButNotBlanks) {
  EXPECT_EQ(1, vxMigrationManager::GetProductID("PAVSUITE"));
  EXPECT_EQ(-1, vxMigrationManager::GetProductID("pavsuite "));
  EXPECT_EQ(-1, vxMigrationManager::GetProductID(""));
  EXPECT_EQ(-1, vxMigrationManager::GetProductID(nullptr));
  EXPECT_EQ(20, vxMigrationManager::GetProductID("obx"));
  EXPECT_EQ(21, vxMigrationManager::GetProductID("Tqrs"));
  EXPECT_EQ(19, vxMigrationManager::GetProductID("vxobx_linux"));
}

struct CommandLineCase {
  const char* name;
  std::vector<std::string> options;
  bool valid;
};

class CommandLineValidity : public ::testing::TestWithParam<CommandLineCase> {};

TEST_P(CommandLineValidity, NeedsSixOptionsAndAKnownDestinationProduct) {
  std::vector<std::string> args = {"vxmigrate"};
  for (const std::string& option : GetParam().options) args.push_back(option);
  std::vector<char*> argv;
  for (std::string& arg : args) argv.push_back(&arg[0]);
  MigrationCmdLineParser parser(static_cast<int>(argv.size()), argv.data());
  EXPECT_EQ(GetParam().valid ? 1 : 0, parser.ParseCommand());
}

INSTANTIATE_TEST_SUITE_P(
    Cases, CommandLineValidity,
    ::testing::Values(
        CommandLineCase{"Complete", {"-D1:a", "-D2:b", "-P1:x", "-P2:pavsuite", "-V1:1", "-V2:2"}, true},
        CommandLineCase{"EmptyValuesPass", {"-D1:", "-D2", "-P1:", "-P2:obx", "-V1:", "-V2:"}, true},
        CommandLineCase{"UnknownDestination", {"-D1:a", "-D2:b", "-P1:x", "-P2:nosuch", "-V1:1", "-V2:2"}, false},
        CommandLineCase{"NoSourceProduct", {"-D1:a", "-D2:b", "-P2:obx", "-V1:1", "-V2:2"}, false},
        CommandLineCase{"NoDestinationFolder", {"-D1:a", "-P1:x", "-P2:obx", "-V1:1", "-V2:2"}, false},
        CommandLineCase{"NamesAreCaseSensitive", {"-d1:a", "-D2:b", "-P1:x", "-P2:obx", "-V1:1", "-V2:2"}, false},
        CommandLineCase{"ExtrasDoNotMatter", {"-D1:C:\\old", "-D2:b", "-P1:x", "-P2:obx", "-V1:1", "-V2:2", "-FT:N", "stray"}, true}),
    [](const ::testing::TestParamInfo<CommandLineCase>& info) { return info.param.name; });

TEST(CommandLine, ValuesKeepTheirOwnSeparators) {
  std::vector<std::string> args = {"vxmigrate", "-D1:C:\\old:x", "-PFLog:a.wlp,b.wlp"};
  std::vector<char*> argv;
  for (std::string& arg : args) argv.push_back(&arg[0]);
  MigrationCmdLineParser parser(static_cast<int>(argv.size()), argv.data());
  parser.ParseCommand();
  EXPECT_EQ("C:\\old:x", parser.GetValue("D1").str());
  EXPECT_EQ("a.wlp,b.wlp", parser.GetValue("PFLog").str());
  EXPECT_FALSE(parser.Exists("PFLink"));
}

// Runs the checks with folders relative to a fresh current folder, as a user might type them.
struct FolderCase {
  const char* source;
  const char* destination;
  bool refused;
};

class ChildFolderCheck : public ::testing::TestWithParam<FolderCase> {};

TEST_P(ChildFolderCheck, RefusesADestinationBelowTheSource) {
  TempDir root;
  char previous[4096];
  ASSERT_NE(nullptr, getcwd(previous, sizeof previous));
  ASSERT_EQ(0, chdir(root.path().c_str()));
  MakeDirs(root.Path(GetParam().source));
  MakeDirs(root.Path(GetParam().destination));
  {
    auto manager = MakeManager({"vxmigrate", std::string("-D1:") + GetParam().source,
                                std::string("-D2:") + GetParam().destination, "-P1:pavsuite",
                                "-P2:pavsuite", "-V1:5.0", "-V2:5.5"});
    EXPECT_EQ(GetParam().refused ? 1 : 0, manager->DoCheckMigrateValidity());
  }
  std::vector<std::string> log = LogEntries(root.Path(std::string(GetParam().destination) + "/vxmigrate.log"));
  bool logged = !log.empty() && log.back().find("cannot be child of source") != std::string::npos;
  EXPECT_EQ(GetParam().refused, logged);
  ASSERT_EQ(0, chdir(previous));
}

INSTANTIATE_TEST_SUITE_P(Cases, ChildFolderCheck,
                         ::testing::Values(FolderCase{"a", "a", false},
                                           FolderCase{"a/", "a/", false},
                                           FolderCase{"a/", "a", false},
                                           FolderCase{"a", "a/new", true},
                                           FolderCase{"a/", "a/new", true},
                                           FolderCase{"a", "ab/new", true},
                                           FolderCase{"a", "xa/b", true},
                                           FolderCase{"a", "xya/b", false},
                                           FolderCase{"a", "b", false}));

struct VersionCase {
  const char* p1;
  const char* p2;
  const char* v1;
  const char* v2;
  int result;
};

class VersionOrderCheck : public ::testing::TestWithParam<VersionCase> {};

TEST_P(VersionOrderCheck, ComparesMajorAndMinorOfOneProductOnly) {
  TempDir root;
  auto manager = MakeRun(root, GetParam().p1, GetParam().p2, GetParam().v1, GetParam().v2);
  EXPECT_EQ(GetParam().result, manager->DoCheckMigrateValidity());
}

INSTANTIATE_TEST_SUITE_P(Cases, VersionOrderCheck,
                         ::testing::Values(VersionCase{"pavsuite", "pavsuite", "5.1", "5.0", 1},
                                           VersionCase{"pavsuite", "pavsuite", "5.1.3", "5.1.0", 0},
                                           VersionCase{"pavsuite", "pavsuite", "6.0", "5.9", 1},
                                           VersionCase{"halsuite", "obx", "6.0", "5.0", 0},
                                           VersionCase{"nosuch", "obx", "1.0", "2.0", 1}));

TEST(VersionRanges, AcceptInclusiveBoundsAndReportAMissingFile) {
  TempDir root;
  auto manager = MakeRun(root, "halsuite", "obx", "5.5", "3.0");
  vxStringBase halsuite("halsuite");
  vxStringBase obx("obx");
  EXPECT_EQ(2, manager->DoCheckVersions(halsuite, obx));
  EXPECT_EQ("Error: Unable to open file:   " + root.Path("bin/vxmigrate.ini"),
            LogEntries(root.Path("dst/vxmigrate.log")).back());

  WriteFile(root.Path("bin/vxmigrate.ini"),
            "[HalSuite]\nLow=5.5\nHigh=6.0\n[obx]\nlow=2.0\nhigh=3.0\n");
  EXPECT_EQ(0, manager->DoCheckVersions(halsuite, obx));
  WriteFile(root.Path("bin/vxmigrate.ini"), "[halsuite]\nLow=5.6\nHigh=6.0\n[obx]\nLow=2.0\nHigh=3.0\n");
  EXPECT_EQ(1, manager->DoCheckVersions(halsuite, obx));
  // A section without "High" admits no real version: its bound reads as 0.0.0.
  WriteFile(root.Path("bin/vxmigrate.ini"), "[halsuite]\nLow=5.0\n[obx]\nLow=2.0\nHigh=3.0\n");
  EXPECT_EQ(1, manager->DoCheckVersions(halsuite, obx));
}

TEST(RunQuestions, InPlaceAndInline) {
  TempDir root;
  MakeDirs(root.Path("same"));
  auto inPlace = MakeManager({"vxmigrate", "-D1:" + root.Path("same"), "-D2:" + root.Path("same"),
                              "-P1:log", "-P2:log", "-V1:6.0", "-V2:6.5"});
  EXPECT_TRUE(inPlace->IsInPlaceMigrate() && inPlace->IsInlineMigrate());
  EXPECT_EQ(root.Path("same/vxm_log/vxm_log.ini"),
            inPlace->GetFullSourceFilename("\\vxm_log\\vxm_log.ini").str());
  auto sideBySide = MakeRun(root, "log", "log", "5.5", "6.0");  // another major number
  EXPECT_FALSE(sideBySide->IsInPlaceMigrate() || sideBySide->IsInlineMigrate());
  // Two spellings of one folder are one installation: nothing may be copied onto itself.
  ASSERT_EQ(0, symlink(root.Path("same").c_str(), root.Path("alias").c_str()));
  for (const std::string& other : {root.Path("same/"), root.Path("alias")}) {
    auto spelt = MakeManager({"vxmigrate", "-D1:" + root.Path("same"), "-D2:" + other, "-P1:log",
                              "-P2:log", "-V1:6.0", "-V2:6.5"});
    EXPECT_TRUE(spelt->IsInPlaceMigrate()) << other;
    EXPECT_EQ(0, spelt->DoCheckMigrateValidity()) << other;
  }
}

TEST(Executable, IsFoundFromTheProgramNameAsAShellWould) {
  TempDir root;
  MakeDirs(root.Path("src"));
  MakeDirs(root.Path("dst"));
  std::vector<std::string> options = {"-D1:" + root.Path("src"), "-D2:" + root.Path("dst"),
                                      "-P1:log", "-P2:log", "-V1:6.0", "-V2:6.0"};
  auto run = [&](const std::string& program) {
    std::vector<std::string> args = {program};
    args.insert(args.end(), options.begin(), options.end());
    return MakeManager(args)->GetExecutable().str();
  };
  char cwd[4096];
  ASSERT_NE(nullptr, getcwd(cwd, sizeof cwd));
  EXPECT_EQ("/opt/vx/bin/vxmigrate", run("/opt/vx/bin/vxmigrate"));
  EXPECT_EQ(std::string(cwd) + "/./bin/tool", run("bin/tool"));
  EXPECT_EQ(std::string(cwd) + "/./tool", run("./tool"));

  WriteFile(root.Path("p1/vxtool"), "not executable");
  WriteFile(root.Path("p2/vxtool"), "#!/bin/sh\n");
  chmod(root.Path("p2/vxtool").c_str(), 0755);
  std::string savedPath = getenv("PATH") ? getenv("PATH") : "";
  setenv("PATH", (root.Path("p0") + ":" + root.Path("p1") + ":" + root.Path("p2")).c_str(), 1);
  EXPECT_EQ(root.Path("p2/vxtool"), run("vxtool"));
  EXPECT_EQ("", run("nosuchtool"));
  setenv("PATH", savedPath.c_str(), 1);
}

}  // namespace
}  // namespace vxtest
