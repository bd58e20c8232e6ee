// How the INI model answers lookups, refuses what it cannot read, protects files it did not load,
// writes atomically, and merges one file into another with the destination's values winning.

#include <dirent.h>
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <functional>
#include <string>
#include <vector>

#include "foundation/inifile/ini_file.h"
#include "support/test_files.h"

namespace {

using vxtest::ReadFile;
using vxtest::WriteFile;

// The sorted names in a folder. readdir64, because on i386 plain readdir fails on file systems
// with 64-bit directory offsets.
std::vector<std::string> Names(const std::string& folder) {
  std::vector<std::string> names;
  if (DIR* dir = opendir(folder.c_str())) {
    while (struct dirent64* entry = readdir64(dir)) {
      std::string name = entry->d_name;
      if (name != "." && name != "..") names.push_back(name);
    }
    closedir(dir);
  }
  std::sort(names.begin(), names.end());
  return names;
}

mode_t FileMode(const std::string& path) {
  struct stat st;
  return stat(path.c_str(), &st) == 0 ? (st.st_mode & 07777) : 0;
}

// The content of a regular file, or its kind for anything else (reading a pipe would block).
std::string Snapshot(const std::string& path) {
  struct stat st;
  if (lstat(path.c_str(), &st) != 0) return "<missing>";
  if (!S_ISREG(st.st_mode)) return "<kind " + std::to_string(st.st_mode & S_IFMT) + ">";
  chmod(path.c_str(), 0644);
  std::string text = ReadFile(path);
  chmod(path.c_str(), st.st_mode & 07777);
  return text;
}

mode_t DefaultMode() {
  mode_t mask = umask(0);
  umask(mask);
  return 0666 & ~mask;
}

TEST(IniFile, LookupsIgnoreCaseAndCreateNothing) {
  vxtest::TempDir dir;
  const std::string text = "[Main]\nKey = v \n[[Filter1]]\nName=f\n";
  WriteFile(dir.Path("a.ini"), text);
  vxMappedINIFile ini(dir.Path("a.ini").c_str());
  ASSERT_EQ(0, ini.Open(1));
  EXPECT_EQ("v", ini.GetVal("MAIN", "key").str());
  EXPECT_EQ("f", ini.GetVal("[filter1]", "NAME").str());
  EXPECT_EQ("f", ini.GetVal(ini.GetPropertyList("[Filter1]"), "name").str());
  EXPECT_TRUE(ini.GetVal("absent", "Key").isEmpty());
  EXPECT_TRUE(ini.GetVal("Main", "absent").isEmpty());
  EXPECT_EQ(nullptr, ini.GetPropertyList("absent"));
  EXPECT_EQ((std::vector<vxStringBase>{"Main", "[Filter1]"}), ini.GetSectionNames());
  ASSERT_EQ(0, ini.Close(1));
  EXPECT_EQ(text, ReadFile(dir.Path("a.ini")));
}

TEST(IniFile, NumberedWalkStopsAtFirstMissingKeyAndClearsTheOutput) {
  vxtest::TempDir dir;
  WriteFile(dir.Path("a.ini"), "[List]\nl0=a\nl1=\nl2=c\nl4=e\n");
  vxMappedINIFile ini(dir.Path("a.ini").c_str());
  ASSERT_EQ(0, ini.Open(0));
  std::vector<std::string> seen;
  vxStringBase value;
  for (long n = 0; n < 100; ++n) {
    vxStringBase key("l");
    if (ini.GetVal("list", key.append(n), value) != 0) break;
    seen.push_back(value.str());
  }
  EXPECT_EQ((std::vector<std::string>{"a", "", "c"}), seen);
  EXPECT_TRUE(value.isEmpty());
}

struct OpenFailure {
  const char* name;
  std::function<void(const std::string& path)> make;
  bool needsNonRoot;
};

class IniOpenFailure : public testing::TestWithParam<OpenFailure> {};

// A file that cannot be read gives a non-zero Open and an empty object; Close(1) then creates a
// missing file but never replaces whatever stands at the path.
TEST_P(IniOpenFailure, LeavesObjectEmptyAndNeverReplacesWhatExists) {
  if (GetParam().needsNonRoot && geteuid() == 0) GTEST_SKIP() << "root reads any file";
  vxtest::TempDir dir;
  std::string path = dir.Path("s.ini");
  GetParam().make(path);
  std::string before = Snapshot(path);
  bool existed = vxtest::FileExists(path);
  vxMappedINIFile ini(path.c_str());
  EXPECT_NE(0, ini.Open(1));
  EXPECT_FALSE(ini.IsLoaded());
  EXPECT_TRUE(ini.GetSectionNames().empty());
  ini.SetVal("s", "k", "v");
  if (existed) {
    EXPECT_EQ(1, ini.Close(1));
    EXPECT_EQ(before, Snapshot(path));
    EXPECT_EQ(std::vector<std::string>{"s.ini"}, Names(dir.path()));
  } else {
    EXPECT_EQ(0, ini.Close(1));
    EXPECT_EQ("[s]\nk=v\n", ReadFile(path));
    EXPECT_EQ(DefaultMode(), FileMode(path));
  }
}

INSTANTIATE_TEST_SUITE_P(
    Kinds, IniOpenFailure,
    testing::Values(
        OpenFailure{"Missing", [](const std::string&) {}, false},
        OpenFailure{"Folder", [](const std::string& p) { vxtest::MakeDirs(p); }, false},
        OpenFailure{"Binary", [](const std::string& p) { WriteFile(p, std::string("[a]\nk=\0\n", 8)); }, false},
        OpenFailure{"Pipe", [](const std::string& p) { ASSERT_EQ(0, mkfifo(p.c_str(), 0644)); }, false},
        OpenFailure{"Unreadable",
                    [](const std::string& p) {
                      WriteFile(p, "[a]\nk=v\n");
                      chmod(p.c_str(), 0);
                    },
                    true}),
    [](const testing::TestParamInfo<OpenFailure>& info) { return info.param.name; });

TEST(IniFile, CloseWithoutSavingLeavesTheFileAndEndsTheSession) {
  vxtest::TempDir dir;
  WriteFile(dir.Path("a.ini"), "[a]\nk=1\n");
  vxMappedINIFile ini(dir.Path("a.ini").c_str());
  ASSERT_EQ(0, ini.Open(1));
  ini.SetVal("a", "k", "2");
  ini.SetVal("b", "n", "3");
  EXPECT_EQ(0, ini.Close(0));
  // Nothing is loaded any more: a second Close(1) must not empty the file.
  EXPECT_EQ(1, ini.Close(1));
  EXPECT_EQ("[a]\nk=1\n", ReadFile(dir.Path("a.ini")));
}

TEST(IniFile, WritingReplacesALinkAndNeverWritesThroughIt) {
  // A settings file copied as a link may point into the source installation: the link is replaced
  // by the new file and what it pointed to stays as it was.
  vxtest::TempDir dir;
  WriteFile(dir.Path("source.ini"), "[a]\nk=1\n");
  chmod(dir.Path("source.ini").c_str(), 0640);
  ASSERT_EQ(0, symlink("source.ini", dir.Path("link.ini").c_str()));
  vxMappedINIFile ini(dir.Path("link.ini").c_str());
  ASSERT_EQ(0, ini.Open(1));
  ini.SetVal("a", "k", "2");
  ASSERT_EQ(0, ini.CloseFW(1));
  EXPECT_EQ("[a]\nk=1\n", ReadFile(dir.Path("source.ini")));
  EXPECT_EQ("[a]\nk=2\n", ReadFile(dir.Path("link.ini")));
  EXPECT_EQ(0640u, FileMode(dir.Path("link.ini")));
  struct stat st;
  ASSERT_EQ(0, lstat(dir.Path("link.ini").c_str(), &st));
  EXPECT_TRUE(S_ISREG(st.st_mode));
  EXPECT_EQ((std::vector<std::string>{"link.ini", "source.ini"}), Names(dir.path()));
}

// A disk that fills up mid-write, played by a file-size limit (which binds root too).
TEST(IniFile, FailedWriteKeepsTheOldFile) {
  vxtest::TempDir dir;
  WriteFile(dir.Path("a.ini"), "[a]\nk=1\n");
  vxMappedINIFile ini(dir.Path("a.ini").c_str());
  ASSERT_EQ(0, ini.Open(1));
  ini.SetVal("a", "k", std::string(64 * 1024, 'x').c_str());
  struct rlimit old;
  ASSERT_EQ(0, getrlimit(RLIMIT_FSIZE, &old));
  struct rlimit small = old;
  small.rlim_cur = 4096;
  auto oldHandler = signal(SIGXFSZ, SIG_IGN);
  ASSERT_EQ(0, setrlimit(RLIMIT_FSIZE, &small));
  int result = ini.Close(1);
  setrlimit(RLIMIT_FSIZE, &old);
  signal(SIGXFSZ, oldHandler);
  EXPECT_EQ(1, result);
  EXPECT_EQ("[a]\nk=1\n", ReadFile(dir.Path("a.ini")));
  EXPECT_EQ(std::vector<std::string>{"a.ini"}, Names(dir.path()));
}

TEST(IniFile, LongFileNamesCanBeSaved) {
  vxtest::TempDir dir;
  std::string path = dir.Path(std::string(250, 'n') + ".ini");
  WriteFile(path, "[a]\nk=1\n");
  vxMappedINIFile ini(path.c_str());
  ASSERT_EQ(0, ini.Open(1));
  ini.SetVal("a", "k", "2");
  ASSERT_EQ(0, ini.Close(1));
  EXPECT_EQ("[a]\nk=2\n", ReadFile(path));
}

TEST(IniFile, RebindingNeverReplacesAnotherExistingFile) {
  vxtest::TempDir dir;
  WriteFile(dir.Path("a.ini"), "[a]\nk=1\n");
  WriteFile(dir.Path("b.ini"), "[b]\n");
  vxMappedINIFile ini(dir.Path("a.ini").c_str());
  ASSERT_EQ(0, ini.Open(1));
  ini.SetFilename(dir.Path("b.ini").c_str());
  EXPECT_EQ(1, ini.Close(1));
  EXPECT_EQ("[b]\n", ReadFile(dir.Path("b.ini")));

  ASSERT_EQ(0, ini.Open(1));  // b.ini, now loaded
  ini.SetFilename(vxStringBase(dir.Path("c.ini").c_str()));
  EXPECT_EQ(0, ini.Close(1));
  EXPECT_EQ("[b]\n", ReadFile(dir.Path("c.ini")));
}

TEST(IniFile, MergeKeepsDestinationValuesAndAddsTheRestInSourceOrder) {
  vxtest::TempDir dir;
  WriteFile(dir.Path("dst.ini"), "[main]\nk=dest\n; end of main\n\n[dest]\nd=1\n");
  WriteFile(dir.Path("src.ini"),
            "[MAIN]\r\n; c\r\nK=src\r\nnew1 = a\r\nNEW1=dup\r\nnew2=b\r\n[other]\r\nx=1\r\n"
            "[Main]\r\nhidden=1\r\n[third]\r\n");
  vxMappedINIFile src(dir.Path("src.ini").c_str());
  vxMappedINIFile dst(dir.Path("dst.ini").c_str());
  ASSERT_EQ(0, src.Open(1));
  ASSERT_EQ(0, dst.Open(1));
  dst.MergeFrom(src);
  EXPECT_EQ(0, src.Close(0));
  ASSERT_EQ(0, dst.Close(1));
  EXPECT_EQ("[main]\nk=dest\nnew1 = a\nnew2=b\n; end of main\n\n[dest]\nd=1\n[other]\nx=1\n[third]\n",
            ReadFile(dir.Path("dst.ini")));
}

std::string ManyKeys(int count, int offset) {
  std::string text = "[big]\n";
  for (int i = 0; i < count; ++i) {
    text += "Key" + std::to_string(i + offset) + "=" + std::to_string(i + offset) + "\n";
  }
  return text;
}

TEST(IniFile, HundredThousandKeySectionsAnswerAndMergeCorrectly) {
  vxtest::TempDir dir;
  WriteFile(dir.Path("a.ini"), ManyKeys(100000, 0));
  WriteFile(dir.Path("b.ini"), ManyKeys(100000, 50000));
  vxMappedINIFile a(dir.Path("a.ini").c_str());
  vxMappedINIFile b(dir.Path("b.ini").c_str());
  ASSERT_EQ(0, a.Open(1));
  ASSERT_EQ(0, b.Open(1));
  for (int i = 0; i < 100000; i += 7) {
    ASSERT_EQ(std::to_string(i), a.GetVal("BIG", ("kEY" + std::to_string(i)).c_str()).str());
  }
  a.MergeFrom(b);
  EXPECT_EQ(150000u, a.GetPropertyList("big")->size());
  EXPECT_EQ("149999", a.GetVal("big", "key149999").str());
  ASSERT_EQ(0, a.Close(1));
  EXPECT_EQ(ManyKeys(150000, 0), ReadFile(dir.Path("a.ini")));
}

TEST(IniFile, LinesAddedThroughTheListAreFound) {
  vxMappedINIFile ini;
  ini.SetVal("s", "a", "1");
  ini.GetPropertyList("s")->push_back(new INILine("b", "2"));
  EXPECT_EQ("2", ini.GetVal("s", "B").str());
  ini.SetVal("s", "b", "3");
  EXPECT_EQ(2u, ini.GetPropertyList("s")->size());
  EXPECT_EQ("3", ini.GetVal("s", "b").str());
}

}  // namespace
