// Path joins, name parts and the small folder operations that every migration step builds on.

#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdlib>
#include <string>

#include "foundation/files/file_manager.h"
#include "foundation/files/filename.h"
#include "support/test_files.h"

namespace {

struct JoinCase {
  const char* folder;
  const char* subFolder;  // null: the two-part join with isFile
  const char* name;
  unsigned int isFile;
  const char* expected;
};

class MakePathJoin : public testing::TestWithParam<JoinCase> {};

TEST_P(MakePathJoin, JoinsWithExactlyOneSeparator) {
  const JoinCase& c = GetParam();
  vxStringBase result(c.folder);  // the result may be one of the inputs
  if (c.subFolder == nullptr) {
    vxFileManager::MakePath(result, result, c.name, c.isFile);
  } else {
    vxFileManager::MakePath(result, result, c.subFolder, c.name);
  }
  EXPECT_EQ(c.expected, result.str());
}

INSTANTIATE_TEST_SUITE_P(
    Table, MakePathJoin,
    testing::Values(JoinCase{"/src", nullptr, "\\vxm_log\\datfiles", 0, "/src/vxm_log/datfiles/"},
                    JoinCase{"/src//", nullptr, "\\a\\b.ini", 1, "/src/a/b.ini"},
                    JoinCase{"/src", nullptr, "/", 0, "/src/"},  // the top folder itself
                    JoinCase{"/src", nullptr, "", 1, "/src"},
                    JoinCase{"/src\\", nullptr, "a\\\\b//c/", 1, "/src/a/b/c"},
                    JoinCase{"/", nullptr, "a", 1, "/a"},
                    JoinCase{"", nullptr, "a b/c d", 1, "a b/c d"},
                    JoinCase{"", nullptr, "", 0, ""},
                    JoinCase{"/d", "", "vxmigrate.log", 0, "/d/vxmigrate.log"},
                    JoinCase{"/d", "/", "p.wlp", 0, "/d/p.wlp"},
                    JoinCase{"/d/", "\\vxm_vxx\\reports", "/p.wlp", 0, "/d/vxm_vxx/reports/p.wlp"},
                    JoinCase{"/d", "sub", "", 0, "/d/sub/"}));

struct PartsCase {
  const char* path;
  const char* filename;
  const char* directory;
  const char* baseName;
  const char* extension;
};

class FilenameParts : public testing::TestWithParam<PartsCase> {};

TEST_P(FilenameParts, SplitsAtEitherSeparator) {
  const PartsCase& c = GetParam();
  vxFilename name(c.path);
  EXPECT_EQ(c.filename, name.Filename().str());
  EXPECT_EQ(c.directory, name.Directory().str());
  EXPECT_EQ(c.baseName, name.BaseName().str());
  EXPECT_EQ(c.extension, name.Extension().str());
}

INSTANTIATE_TEST_SUITE_P(
    Table, FilenameParts,
    testing::Values(PartsCase{"c:\\x\\b.tar.gz", "b.tar.gz", "c:\\x\\", "b.tar", "gz"},
                    PartsCase{"/home/u/.profile", ".profile", "/home/u/", ".profile", ""},
                    PartsCase{"dir.d/name", "name", "dir.d/", "name", ""},
                    PartsCase{"bare", "bare", "", "bare", ""},
                    PartsCase{"/folder/", "", "/folder/", "", ""}));

TEST(Filename, SetExtensionAndDupWorkOnTheNameOnly) {
  vxFilename name("x.d/name");
  name.SetExtension("wlp");
  EXPECT_EQ("x.d/name.wlp", name.Pathname().str());
  name.SetExtension("vxinibak");
  EXPECT_EQ("x.d/name.vxinibak", name.Pathname().str());
  char* copy = nullptr;
  ASSERT_EQ(0, vxFilename::Dup(&copy, "report.wlp", 6));
  EXPECT_STREQ("report", copy);
  free(copy);
  ASSERT_EQ(0, vxFilename::Dup(&copy, "ab", 100));  // never reads past the text's end
  EXPECT_STREQ("ab", copy);
  free(copy);
  EXPECT_NE(0, vxFilename::Dup(&copy, nullptr, -1));
  EXPECT_EQ(nullptr, copy);
}

TEST(FileManager, ModuleDirectoryEndsInASeparatorAndHoldsTheProgram) {
  vxStringBase folder;
  vxFileManager::GetModuleDirectory(folder);
  EXPECT_EQ(0, access((folder.str() + "files_paths_test").c_str(), X_OK));
}

TEST(FileManager, CreateDirectoryAndDeleteFileReportWhatIsThereAfterwards) {
  vxtest::TempDir tmp;
  vxStringBase deep(tmp.Path("a/b c/d").c_str());
  EXPECT_EQ(0, vxFileManager::CreateDirectory(deep, nullptr));
  EXPECT_EQ(0, vxFileManager::CreateDirectory(deep, nullptr));
  EXPECT_TRUE(vxFilename::IsDirectory(deep.c_str()));
  vxtest::WriteFile(tmp.Path("file"), "x");
  EXPECT_EQ(1, vxFileManager::CreateDirectory(tmp.Path("file/sub").c_str(), nullptr));
  EXPECT_EQ(0, vxFileManager::DeleteFile(tmp.Path("file").c_str(), 0));
  EXPECT_EQ(1, vxFileManager::DeleteFile(tmp.Path("file").c_str(), 0));
  EXPECT_EQ(0, vxFileManager::DeleteFile(tmp.Path("file").c_str(), 1));
}

}  // namespace
