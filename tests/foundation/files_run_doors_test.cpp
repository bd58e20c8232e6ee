// The run's doors: which writes and reads they admit between a source, a destination and the
// world outside them, whatever links and ".." the paths hold; names joined beneath a folder; and
// the file layer refusing what the doors refuse.

#include <gtest/gtest.h>
#include <unistd.h>

#include <string>
#include <utility>
#include <vector>

#include "foundation/files/file_manager.h"
#include "foundation/files/run_doors.h"
#include "foundation/inifile/ini_file.h"
#include "support/test_files.h"

namespace vxtest {
namespace {

// src, dst and out under one root, with links from each installation to the others.
class Layout {
 public:
  Layout() {
    WriteFile(Path("src/own.ini"), "[a]\nk=v\n");
    WriteFile(Path("out/secret.txt"), "secret\n");
    MakeDirs(Path("dst/sub"));
    Link("src/leak.txt", "out/secret.txt");
    Link("src/inside.txt", "src/own.ini");
    Link("dst/to_src", "src");
    Link("dst/to_out", "out");
    Link("dst/inner", "dst/sub");
    Link("dst/dangling", "out/missing");
  }
  std::string Path(const std::string& relative) const { return root_.Path(relative); }
  std::vector<std::string> refusals;
  vxRunDoors::Reporter Reporter() {
    return [this](const char* text, const char* path) {
      refusals.push_back(std::string(text) + path);
    };
  }

 private:
  void Link(const std::string& at, const std::string& to) {
    ASSERT_EQ(0, symlink(Path(to).c_str(), Path(at).c_str())) << at;
  }
  TempDir root_;
};

TEST(RunDoors, AdmitWritesOnlyIntoTheDestinationWhateverThePathHolds) {
  Layout layout;
  vxRunDoors doors(vxStringBase(layout.Path("src").c_str()),
                   vxStringBase(layout.Path("dst/").c_str()), layout.Reporter());
  EXPECT_FALSE(doors.InPlace() || doors.DestinationInsideSource());
  for (const auto& [path, admitted] : std::vector<std::pair<std::string, bool>>{
           {"dst/a.ini", true},
           {"dst/new/deeper/a.ini", true},  // folders still to be made
           {"dst/inner/a.ini", true},       // a link that stays inside
           {"dst/to_out", true},            // the link itself is replaced, not written through
           {"dst/to_src/a.ini", false},
           {"dst/to_out/a.ini", false},
           {"dst/dangling/a.ini", false},
           {"dst/../out/a.ini", false},
           {"dst/new/../../out/a.ini", false},
           {"dst/sub/..", false},
           {"src/a.ini", false},
           {"out/a.ini", false}}) {
    EXPECT_EQ(admitted, doors.AdmitWrite(layout.Path(path))) << path;
  }
  EXPECT_TRUE(doors.AdmitWriteInto(layout.Path("dst/inner")));
  EXPECT_FALSE(doors.AdmitWriteInto(layout.Path("dst/to_out")));
  EXPECT_EQ("Error: Refused to write inside the source installation: " + layout.Path("src/a.ini"),
            layout.refusals[layout.refusals.size() - 3]);
  EXPECT_EQ("Error: Refused to write outside the destination installation: " +
                layout.Path("dst/to_out"),
            layout.refusals.back());
}

TEST(RunDoors, AdmitReadsThatStayInsideTheInstallations) {
  Layout layout;
  vxRunDoors doors(vxStringBase(layout.Path("src").c_str()),
                   vxStringBase(layout.Path("dst").c_str()), layout.Reporter());
  for (const auto& [path, admitted] : std::vector<std::pair<std::string, bool>>{
           {"src/own.ini", true},
           {"src/inside.txt", true},
           {"dst/to_src/own.ini", true},
           {"src/nothing.ini", true},  // left to the reader to report as missing
           {"out/secret.txt", true},   // not an installation path: the host's own files
           {"src/leak.txt", false},
           {"dst/to_out/secret.txt", false},
           {"dst/to_out", false}}) {
    EXPECT_EQ(admitted, doors.AdmitRead(layout.Path(path))) << path;
  }
  // The file layer asks the doors: the leaking link reads as a missing file.
  vxMappedINIFile leak(vxStringBase(layout.Path("src/leak.txt").c_str()));
  EXPECT_NE(0, leak.Open(0));
  EXPECT_EQ(1, vxFileManager::CopyFile(vxStringBase(layout.Path("src/leak.txt").c_str()),
                                       vxStringBase(layout.Path("dst/leak.txt").c_str()), 0, 0, 0,
                                       0, 0, nullptr, nullptr));
  EXPECT_FALSE(FileExists(layout.Path("dst/leak.txt")));
  EXPECT_EQ("Error: Refused to read a file that leads outside the installations: " +
                layout.Path("src/leak.txt"),
            layout.refusals.back());
}

TEST(RunDoors, OneFolderIsInPlaceAndADestinationInsideTheSourceIsNeverWritten) {
  Layout layout;
  {
    vxRunDoors inPlace(vxStringBase(layout.Path("src").c_str()),
                       vxStringBase(layout.Path("dst/to_src").c_str()), nullptr);
    EXPECT_TRUE(inPlace.InPlace());
    EXPECT_TRUE(inPlace.AdmitWrite(layout.Path("src/a.ini")));
  }
  MakeDirs(layout.Path("src/new"));
  vxRunDoors nested(vxStringBase(layout.Path("src").c_str()),
                    vxStringBase(layout.Path("out/../src/new").c_str()), nullptr);
  EXPECT_TRUE(nested.DestinationInsideSource());
  EXPECT_FALSE(nested.AdmitWrite(layout.Path("src/new/vxmigrate.log")));
  // Without a destination nothing may be written, not even into the current folder.
  vxRunDoors none(vxStringBase(layout.Path("src").c_str()), vxStringBase(), nullptr);
  EXPECT_FALSE(none.AdmitWrite("vxmigrate.log"));
}

TEST(RunDoors, TheFileLayerWritesNothingTheDoorsRefuse) {
  Layout layout;
  vxRunDoors doors(vxStringBase(layout.Path("src").c_str()),
                   vxStringBase(layout.Path("dst").c_str()), layout.Reporter());
  const vxStringBase outsideIni(layout.Path("dst/to_out/new.ini").c_str());
  vxMappedINIFile ini(outsideIni);
  ini.SetVal("a", "k", vxStringBase("v"));
  EXPECT_NE(0, ini.Close(1));
  EXPECT_NE(0, vxFileManager::CreateDirectory(vxStringBase(layout.Path("dst/to_src/x").c_str()),
                                              nullptr));
  EXPECT_NE(0, vxFileManager::DeleteFile(vxStringBase(layout.Path("src/own.ini").c_str()), 0));
  // A tree copy into a destination whose sub-folder is a link out of it skips that sub-folder.
  WriteFile(layout.Path("src/tree/to_out/x.txt"), "x\n");
  WriteFile(layout.Path("src/tree/kept.txt"), "k\n");
  MakeDirs(layout.Path("dst/tree"));
  ASSERT_EQ(0, symlink(layout.Path("out").c_str(), layout.Path("dst/tree/to_out").c_str()));
  EXPECT_EQ(1, vxFileManager::CopyFile(vxStringBase(layout.Path("src/tree").c_str()),
                                       vxStringBase(layout.Path("dst/tree").c_str()), 1, 0, 0, 0,
                                       0, nullptr, nullptr));
  EXPECT_EQ("k\n", ReadFile(layout.Path("dst/tree/kept.txt")));
  EXPECT_EQ(std::vector<std::string>({"secret.txt"}), ListTree(layout.Path("out")));
  EXPECT_FALSE(FileExists(layout.Path("src/x")));
  EXPECT_EQ("[a]\nk=v\n", ReadFile(layout.Path("src/own.ini")));
}

TEST(RunDoors, JoinBeneathNeverClimbsAboveItsFolder) {
  for (const auto& [name, joined] : std::vector<std::pair<std::string, std::string>>{
           {"vxm_vxx/datfiles/profiles", "/opt/new/vxm_vxx/datfiles/profiles/"},
           {"\\vxm_vxx\\.\\profiles", "/opt/new/vxm_vxx/profiles/"},
           {"a/b/../../c", "/opt/new/c/"},
           {"/absolute/x", "/opt/new/absolute/x/"},
           {"..", ""},
           {"a/../../x", ""},
           {"..\\..\\..\\tmp\\outside", ""}}) {
    vxStringBase result("stale");
    EXPECT_EQ(!joined.empty(), vxRunDoors::JoinBeneath(result, vxStringBase("/opt/new"),
                                                       vxStringBase(name.c_str()), 0))
        << name;
    EXPECT_EQ(joined, result.str()) << name;
  }
}

}  // namespace
}  // namespace vxtest
