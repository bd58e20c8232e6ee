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
  const char* name;
  unsigned int isFile;
  const char* expected;
};

class MakePathJoin : public testing::TestWithParam<JoinCase> {};

TEST_P(MakePathJoin, JoinsWithExactlyOneSeparator) {
  const JoinCase& c = GetParam();
  vxStringBase result("stale");
  vxFileManager::MakePath(result, c.folder, c.name, c.isFile);
  EXPECT_EQ(c.expected, result.str()) << "folder '" << c.folder << "' name '" << c.name << "'";
}

INSTANTIATE_TEST_SUITE_P(
    Table, MakePathJoin,
    testing::Values(JoinCase{"/src", "\\vxm_log\\datfiles", 0, "/src/vxm_log/datfiles/"},
                    JoinCase{"/src", "\\vxm_log\\datfiles\\", 0, "/src/vxm_log/datfiles/"},
                    JoinCase{"/src/", "vantix.ini", 1, "/src/vantix.ini"},
                    JoinCase{"/src//", "\\vxm_log\\vxm_log.ini", 1, "/src/vxm_log/vxm_log.ini"},
                    JoinCase{"/src", "/", 0, "/src/"},  // the top folder itself
                    JoinCase{"/src", "", 0, "/src/"},
                    JoinCase{"/src", "", 1, "/src"},
                    JoinCase{"/src\\", "a", 1, "/src/a"},
                    JoinCase{"/src", "a\\\\b//c", 1, "/src/a/b/c"},
                    JoinCase{"/", "a", 1, "/a"},
                    JoinCase{"/", "", 0, "/"},
                    JoinCase{"", "a/b", 1, "a/b"},
                    JoinCase{"", "", 0, ""},
                    JoinCase{"", "", 1, ""},
                    JoinCase{"/my dir", "name with blanks.ini", 1, "/my dir/name with blanks.ini"}));

struct JoinThreeCase {
  const char* folder;
  const char* subFolder;
  const char* name;
  const char* expected;
};

class MakePathThreeParts : public testing::TestWithParam<JoinThreeCase> {};

TEST_P(MakePathThreeParts, JoinsEachPartWithOneSeparator) {
  const JoinThreeCase& c = GetParam();
  vxStringBase result;
  vxFileManager::MakePath(result, c.folder, c.subFolder, c.name);
  EXPECT_EQ(c.expected, result.str());
}

INSTANTIATE_TEST_SUITE_P(
    Table, MakePathThreeParts,
    testing::Values(
        JoinThreeCase{"/d", "", "vxmigrate.log", "/d/vxmigrate.log"},
        JoinThreeCase{"/d", "/", "p.wlp", "/d/p.wlp"},
        JoinThreeCase{"/d/", "\\vxm_vxx\\datfiles\\reports", "p.wlp", "/d/vxm_vxx/datfiles/reports/p.wlp"},
        JoinThreeCase{"/d", "a/", "/b.ini", "/d/a/b.ini"},
        JoinThreeCase{"/d", "sub", "", "/d/sub/"},
        JoinThreeCase{"", "", "", ""}));

TEST(MakePath, ResultMayBeOneOfItsInputs) {
  vxStringBase path("/src");
  vxFileManager::MakePath(path, path, "x\\y", 0);
  EXPECT_EQ("/src/x/y/", path.str());
}

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
    testing::Values(PartsCase{"a/b.ini", "b.ini", "a/", "b", "ini"},
                    PartsCase{"c:\\x\\b.tar.gz", "b.tar.gz", "c:\\x\\", "b.tar", "gz"},
                    PartsCase{"/home/u/.profile", ".profile", "/home/u/", ".profile", ""},
                    PartsCase{"dir.d/name", "name", "dir.d/", "name", ""},
                    PartsCase{"/x/trailing.", "trailing.", "/x/", "trailing", ""},
                    PartsCase{"bare", "bare", "", "bare", ""},
                    PartsCase{"/folder/", "", "/folder/", "", ""},
                    PartsCase{"", "", "", "", ""}));

TEST(Filename, SetExtensionReplacesOnlyTheNamesExtension) {
  vxFilename a("x.d/b.ini");
  a.SetExtension("vxinibak");
  EXPECT_EQ("x.d/b.vxinibak", a.Pathname().str());
  vxFilename b("x.d/name");
  b.SetExtension("wlp");
  EXPECT_EQ("x.d/name.wlp", b.Pathname().str());
  b.SetExtension("");
  EXPECT_EQ("x.d/name", b.Pathname().str());
}

TEST(Filename, DupCopiesTheAskedBytesIntoAFreshBuffer) {
  char* copy = nullptr;
  ASSERT_EQ(0, vxFilename::Dup(&copy, "report.wlp", -1));
  EXPECT_STREQ("report.wlp", copy);
  free(copy);
  ASSERT_EQ(0, vxFilename::Dup(&copy, "report.wlp", 6));
  EXPECT_STREQ("report", copy);
  free(copy);
  ASSERT_EQ(0, vxFilename::Dup(&copy, "ab", 100));  // never reads past the text's end
  EXPECT_STREQ("ab", copy);
  free(copy);
  copy = reinterpret_cast<char*>(1);
  EXPECT_NE(0, vxFilename::Dup(&copy, nullptr, -1));
  EXPECT_EQ(nullptr, copy);
}

TEST(FileManager, ModuleDirectoryEndsInASeparatorAndHoldsTheProgram) {
  vxStringBase folder;
  vxFileManager::GetModuleDirectory(folder);
  ASSERT_FALSE(folder.isEmpty());
  EXPECT_EQ('/', folder.str().back());
  EXPECT_EQ(0, access((folder.str() + "files_paths_test").c_str(), X_OK));
}

TEST(FileManager, CreateDirectoryMakesParentsAndAcceptsExistingFolders) {
  vxtest::TempDir tmp;
  vxStringBase deep(tmp.Path("a/b c/d").c_str());
  EXPECT_EQ(0, vxFileManager::CreateDirectory(deep, nullptr));
  EXPECT_TRUE(vxFilename::IsDirectory(deep.c_str()));
  EXPECT_EQ(0, vxFileManager::CreateDirectory(deep, nullptr));
  vxtest::WriteFile(tmp.Path("file"), "x");
  EXPECT_EQ(1, vxFileManager::CreateDirectory(tmp.Path("file").c_str(), nullptr));
  EXPECT_EQ(1, vxFileManager::CreateDirectory(tmp.Path("file/sub").c_str(), nullptr));
}

TEST(FileManager, DeleteFileCountsAMissingFileAsDoneOnlyWhenAsked) {
  vxtest::TempDir tmp;
  vxtest::WriteFile(tmp.Path("f"), "x");
  EXPECT_EQ(0, vxFileManager::DeleteFile(tmp.Path("f").c_str(), 0));
  EXPECT_FALSE(vxtest::FileExists(tmp.Path("f")));
  EXPECT_EQ(1, vxFileManager::DeleteFile(tmp.Path("f").c_str(), 0));
  EXPECT_EQ(0, vxFileManager::DeleteFile(tmp.Path("f").c_str(), 1));
  EXPECT_EQ(1, vxFileManager::DeleteFile(tmp.path().c_str(), 1));  // a folder is not a file
}

}  // namespace
