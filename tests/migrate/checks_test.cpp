// Command-line validity, product ids, the checks that refuse a run, the version ranges, and the
// run sequence around the install script and the log.

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <memory>
#include <string>
#include <tuple>
#include <utility>
#include <vector>

#include "migrate/installations_fixture.h"

namespace vxtest {
namespace {

TEST(ProductID, MatchesIgnoringCaseButNotBlanks) {
  for (const auto& [name, id] : std::vector<std::pair<const char*, int>>{
           {"PAVSUITE", 1}, {"pavsuite ", -1}, {"", -1}, {nullptr, -1}, {"obx", 20}, {"Tqrs", 21},
           {"vxobx_linux", 19}}) {
    EXPECT_EQ(id, vxMigrationManager::GetProductID(name)) << (name ? name : "(null)");
  }
}

// A parser over "vxmigrate" and the options, after ParseCommand.
std::unique_ptr<MigrationCmdLineParser> Parse(std::vector<std::string> args) {
  args.insert(args.begin(), "vxmigrate");
  std::vector<char*> argv;
  for (std::string& arg : args) argv.push_back(&arg[0]);
  auto parser = std::make_unique<MigrationCmdLineParser>(static_cast<int>(argv.size()), argv.data());
  parser->ParseCommand();
  return parser;
}

TEST(CommandLine, NeedsSixOptionsAndAKnownDestinationProductAndKeepsValueSeparators) {
  for (const auto& [options, expected] : std::vector<std::pair<std::vector<std::string>, int>>{
           {{"-D1:a", "-D2:b", "-P1:x", "-P2:pavsuite", "-V1:1", "-V2:2"}, 1},
           {{"-D1:", "-D2", "-P1:", "-P2:obx", "-V1:", "-V2:"}, 1},  // empty values pass
           {{"-D1:a", "-D2:b", "-P1:x", "-P2:nosuch", "-V1:1", "-V2:2"}, 0},
           {{"-D1:a", "-D2:b", "-P2:obx", "-V1:1", "-V2:2"}, 0},
           {{"-D1:a", "-P1:x", "-P2:obx", "-V1:1", "-V2:2"}, 0},
           {{"-d1:a", "-D2:b", "-P1:x", "-P2:obx", "-V1:1", "-V2:2"}, 0},  // names are case sensitive
           {{"-D1:C:\\old", "-D2:b", "-P1:x", "-P2:obx", "-V1:1", "-V2:2", "-FT:N", "stray"}, 1}}) {
    EXPECT_EQ(expected, Parse(options)->IsValid()) << ::testing::PrintToString(options);
  }
  auto parser = Parse({"-D1:C:\\old:x", "-PFLog:a.wlp,b.wlp"});
  EXPECT_EQ("C:\\old:x", parser->GetValue("D1").str());
  EXPECT_EQ("a.wlp,b.wlp", parser->GetValue("PFLog").str());
  EXPECT_FALSE(parser->Exists("PFLink"));
}

// Folders relative to a fresh current folder, as a user might type them. A destination that
// really lies inside the source gets no log there: the source is never written.
TEST(Checks, RefuseADestinationBelowTheSourceButNotTheSameFolder) {
  const std::filesystem::path previous = std::filesystem::current_path();
  enum Outcome { kRuns, kRefused, kRefusedWithoutLog };
  using Case = std::tuple<std::string, std::string, Outcome>;  // source, destination, outcome
  for (const auto& [source, destination, outcome] : std::vector<Case>{
           {"a", "a", kRuns}, {"a/", "a/", kRuns}, {"a/", "a", kRuns}, {"a", "xya/b", kRuns},
           {"a", "b", kRuns}, {"a", "ab/new", kRefused}, {"a", "xa/b", kRefused},
           {"a", "a/new", kRefusedWithoutLog}, {"a/", "a/new", kRefusedWithoutLog},
           {"a", "b/../a/new", kRefusedWithoutLog}, {"a", "link/new", kRefusedWithoutLog}}) {
    TempDir root;
    std::filesystem::current_path(root.path());
    MakeDirs(root.Path(source));
    MakeDirs(root.Path("b"));
    ASSERT_EQ(0, symlink(root.Path("a").c_str(), root.Path("link").c_str()));
    MakeDirs(root.Path(destination));
    EXPECT_EQ(outcome != kRuns,
              MakeManager({"vxmigrate", "-D1:" + source, "-D2:" + destination, "-P1:pavsuite",
                           "-P2:pavsuite", "-V1:5.0", "-V2:5.5"})->DoCheckMigrateValidity())
        << source << " -> " << destination;
    std::vector<std::string> log = LogEntries(root.Path(destination + "/vxmigrate.log"));
    if (outcome == kRefusedWithoutLog) {
      EXPECT_TRUE(log.empty()) << destination;
    } else {
      ASSERT_FALSE(log.empty()) << destination;
      EXPECT_EQ(outcome == kRefused, log.back().find("cannot be child of source") != std::string::npos)
          << log.back();
    }
    std::filesystem::current_path(previous);
  }
}

TEST(Checks, CompareMajorAndMinorOfOneProductOnly) {
  for (const std::vector<std::string>& c : std::vector<std::vector<std::string>>{
           {"pavsuite", "pavsuite", "5.1.3", "5.1.0", "0"}, {"pavsuite", "pavsuite", "6.0", "5.9", "1"},
           {"halsuite", "obx", "6.0", "5.0", "0"}}) {
    Installations run(RunArgs(c[0], c[1], c[2], c[3]));
    EXPECT_EQ(std::stoi(c[4]), run.manager().DoCheckMigrateValidity())
        << ::testing::PrintToString(c);
  }
}

TEST(VersionRanges, AcceptInclusiveBoundsAndReportAMissingFile) {
  Installations run(RunArgs("halsuite", "obx", "5.5", "3.0"));
  vxStringBase halsuite("halsuite"), obx("obx");
  EXPECT_EQ(2, run.manager().DoCheckVersions(halsuite, obx));
  const std::string ranges = run.Root() + "/bin/vxmigrate.ini";
  EXPECT_EQ("Error: Unable to open file:   " + ranges, run.RunLog().back());
  for (const auto& [text, result] : std::vector<std::pair<std::string, int>>{
           {"[HalSuite]\nLow=5.5\nHigh=6.0\n[obx]\nlow=2.0\nhigh=3.0\n", 0},
           {"[halsuite]\nLow=5.6\nHigh=6.0\n[obx]\nLow=2.0\nHigh=3.0\n", 1},
           // A section without "High" admits no real version: its bound reads as 0.0.0.
           {"[halsuite]\nLow=5.0\n[obx]\nLow=2.0\nHigh=3.0\n", 1}}) {
    WriteFile(ranges, text);
    EXPECT_EQ(result, run.manager().DoCheckVersions(halsuite, obx)) << text;
  }
}

// Two spellings of one folder are one installation: nothing may be copied onto itself.
TEST(RunQuestions, InPlaceAndInline) {
  TempDir root;
  MakeDirs(root.Path("same"));
  ASSERT_EQ(0, symlink(root.Path("same").c_str(), root.Path("alias").c_str()));
  for (const std::string& other : {root.Path("same"), root.Path("same/"), root.Path("alias")}) {
    auto inPlace = MakeManager({"vxmigrate", "-D1:" + root.Path("same"), "-D2:" + other,
                                "-P1:log", "-P2:log", "-V1:6.0", "-V2:6.5"});
    EXPECT_TRUE(inPlace->IsInPlaceMigrate() && inPlace->IsInlineMigrate()) << other;
    EXPECT_EQ(0, inPlace->DoCheckMigrateValidity()) << other;
    EXPECT_EQ(root.Path("same/vxm_log/vxm_log.ini"),
              inPlace->GetFullSourceFilename("\\vxm_log\\vxm_log.ini").str());
  }
  Installations sideBySide(RunArgs("log", "log", "5.5", "6.0"));  // another major number
  EXPECT_FALSE(sideBySide.manager().IsInPlaceMigrate() || sideBySide.manager().IsInlineMigrate());
}

// The log replaces a link in its place instead of writing through it; the install script runs in
// the destination and the current folder comes back afterwards.
TEST(RunSequence, TheLogReplacesALinkAndTheFolderComesBackAfterTheScript) {
  Installations run(RunArgs("log", "log", "6.0", "6.5"));
  WriteFile(run.Src("keep.txt"), "customer data\n");
  ASSERT_EQ(0, symlink(run.Src("keep.txt").c_str(), run.Dst("vxmigrate.log").c_str()));
  vxMigrationManager& manager = run.manager();
  EXPECT_EQ("customer data\n", ReadFile(run.Src("keep.txt")));
  struct stat st;
  ASSERT_EQ(0, lstat(run.Dst("vxmigrate.log").c_str(), &st));
  EXPECT_TRUE(S_ISREG(st.st_mode));
  EXPECT_EQ(11u, LogEntries(run.Dst("vxmigrate.log")).size());  // the header
  WriteFile(run.Dst("synchinstall.sh"), "#!/bin/sh\npwd > ran_in.txt\n");
  chmod(run.Dst("synchinstall.sh").c_str(), 0755);
  const std::filesystem::path before = std::filesystem::current_path();
  EXPECT_EQ(0, manager.DoMigration());
  EXPECT_EQ(before, std::filesystem::current_path());
  EXPECT_EQ(run.Dst() + "\n", ReadFile(run.Dst("ran_in.txt")));
}

}  // namespace
}  // namespace vxtest
