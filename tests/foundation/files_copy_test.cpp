// Copies: an existing destination is kept unless replacing was asked for, nothing partial or
// temporary is ever left behind, and trees keep their links, modes and times.

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <string>
#include <vector>

#include "foundation/files/file_manager.h"
#include "foundation/files/temp_file.h"
#include "support/test_files.h"

namespace {

int Copy(const std::string& from, const std::string& to, unsigned int tree, unsigned int replace,
         unsigned int newerOnly = 0) {
  return vxFileManager::CopyFile(vxStringBase(from.c_str()), vxStringBase(to.c_str()), tree,
                                 replace, newerOnly, 0, 0, nullptr, nullptr);
}

void SetMtime(const std::string& path, time_t seconds) {
  struct timespec times[2] = {{seconds, 0}, {seconds, 0}};
  ASSERT_EQ(0, utimensat(AT_FDCWD, path.c_str(), times, AT_SYMLINK_NOFOLLOW));
}

struct stat Lstat(const std::string& path) {
  struct stat st = {};
  lstat(path.c_str(), &st);
  return st;
}

std::string LinkTarget(const std::string& path) {
  char buffer[256];
  ssize_t n = readlink(path.c_str(), buffer, sizeof buffer);
  return n < 0 ? "<not a link>" : std::string(buffer, static_cast<size_t>(n));
}

void ExpectNoTempFiles(const vxtest::TempDir& tmp) {
  for (const std::string& name : vxtest::ListTree(tmp.path())) {
    EXPECT_EQ(std::string::npos, name.find(".vxtmp.")) << name;
  }
}

TEST(CopyFile, SingleFileKeepsAnExistingDestinationUnlessReplacing) {
  vxtest::TempDir tmp;
  vxtest::WriteFile(tmp.Path("src.ini"), "new");
  const std::string old("old\0bytes", 9);
  vxtest::WriteFile(tmp.Path("dst.ini"), old);
  EXPECT_EQ(1, Copy(tmp.Path("src.ini"), tmp.Path("dst.ini"), 0, 0));
  EXPECT_EQ(old, vxtest::ReadFile(tmp.Path("dst.ini")));
  EXPECT_EQ(0, Copy(tmp.Path("src.ini"), tmp.Path("dst.ini"), 0, 1));
  EXPECT_EQ("new", vxtest::ReadFile(tmp.Path("dst.ini")));
  ExpectNoTempFiles(tmp);
}

TEST(CopyFile, SingleFileKeepsContentModeAndTimesAndCreatesParents) {
  vxtest::TempDir tmp;
  std::string content(3 * 1024 * 1024 + 17, 'x');  // more than one chunk of any copy loop
  for (size_t i = 0; i < content.size(); i += 4093) content[i] = static_cast<char>(i % 251);
  vxtest::WriteFile(tmp.Path("src.dat"), content);
  ASSERT_EQ(0, chmod(tmp.Path("src.dat").c_str(), 0751));
  SetMtime(tmp.Path("src.dat"), 1000000000);
  ASSERT_EQ(0, Copy(tmp.Path("src.dat"), tmp.Path("new/deeper/dst.dat"), 0, 0));
  EXPECT_EQ(content, vxtest::ReadFile(tmp.Path("new/deeper/dst.dat")));
  struct stat st = Lstat(tmp.Path("new/deeper/dst.dat"));
  EXPECT_EQ(0751u, st.st_mode & 07777);
  EXPECT_EQ(1000000000, st.st_mtime);
  // Another file system: the kernel copy refuses and plain reads and writes take over.
  if (access("/dev/shm", W_OK) != 0) GTEST_SKIP() << "no writable /dev/shm to copy across to";
  std::string other = "/dev/shm/vxm_copy_test_" + std::to_string(getpid());
  ASSERT_EQ(0, Copy(tmp.Path("src.dat"), other, 0, 0));
  EXPECT_EQ(content, vxtest::ReadFile(other));
  unlink(other.c_str());
}

TEST(CopyFile, CommitNeverReplacesANameThatAppearedMeanwhile) {
  vxtest::TempDir tmp;
  int dirFd = open(tmp.path().c_str(), O_RDONLY | O_DIRECTORY);
  std::string temp;
  int fd = vxfiles::CreateTempFileAt(dirFd, "dst", 0600, temp);
  ASSERT_GE(fd, 0);
  ASSERT_EQ(4, write(fd, "ours", 4));
  close(fd);
  vxtest::WriteFile(tmp.Path("dst"), "theirs");  // created between our check and our rename
  EXPECT_EQ(-1, vxfiles::CommitTempAt(dirFd, temp.c_str(), "dst", false));
  EXPECT_EQ(EEXIST, errno);
  EXPECT_EQ("theirs", vxtest::ReadFile(tmp.Path("dst")));
  EXPECT_EQ(0, vxfiles::CommitTempAt(dirFd, temp.c_str(), "dst", true));
  EXPECT_EQ("ours", vxtest::ReadFile(tmp.Path("dst")));
  close(dirFd);
}

struct NewerCase {
  time_t sourceTime;
  int result;
  const char* content;
};

class CopyNewerOnly : public testing::TestWithParam<NewerCase> {};

TEST_P(CopyNewerOnly, ReplacesOnlyAnOlderDestination) {
  vxtest::TempDir tmp;
  vxtest::WriteFile(tmp.Path("src"), "source");
  vxtest::WriteFile(tmp.Path("dst"), "destination");
  SetMtime(tmp.Path("src"), GetParam().sourceTime);
  SetMtime(tmp.Path("dst"), 2000000000);
  EXPECT_EQ(GetParam().result, Copy(tmp.Path("src"), tmp.Path("dst"), 0, 1, 1));
  EXPECT_EQ(GetParam().content, vxtest::ReadFile(tmp.Path("dst")));
}

INSTANTIATE_TEST_SUITE_P(Times, CopyNewerOnly,
                         testing::Values(NewerCase{2000000001, 0, "source"},
                                         NewerCase{2000000000, 1, "destination"},
                                         NewerCase{1000000000, 1, "destination"}));

TEST(CopyFile, RefusalsLeaveTheDestinationAsItWas) {
  vxtest::TempDir tmp;
  vxtest::WriteFile(tmp.Path("src"), "x");
  vxtest::WriteFile(tmp.Path("dst/keep"), "kept");
  EXPECT_EQ(1, Copy(tmp.Path("src"), tmp.Path("dst"), 0, 1));  // never a folder with a file
  EXPECT_EQ(1, Copy(tmp.Path("missing"), tmp.Path("out/a"), 0, 1));
  EXPECT_EQ(1, Copy(tmp.Path("dst"), tmp.Path("out/b"), 0, 1));  // a folder is no single file
  EXPECT_EQ(1, Copy(tmp.Path("missing/*.ini"), tmp.Path("out"), 1, 1));
  EXPECT_EQ(1, Copy(tmp.Path("missing"), tmp.Path("out"), 1, 1));
  EXPECT_EQ((std::vector<std::string>{"dst", "dst/keep", "src"}), vxtest::ListTree(tmp.path()));
}

TEST(CopyFile, PatternCopiesTheMatchingFilesOfOneFolder) {
  vxtest::TempDir tmp;
  for (const char* name :
       {"a.wlp", "b c.wlp", "x.ini", "p.dat/r1", "p.dat/r2.txt", "p.dat/sub/deep"}) {
    vxtest::WriteFile(tmp.Path(std::string("src/") + name), name);
  }
  ASSERT_EQ(0, Copy(tmp.Path("src/*.wlp"), tmp.Path("dst/profiles"), 1, 1));
  EXPECT_EQ((std::vector<std::string>{"a.wlp", "b c.wlp"}),
            vxtest::ListTree(tmp.Path("dst/profiles")));
  ASSERT_EQ(0, Copy(tmp.Path("src/p.dat/*.*"), tmp.Path("dst/p.dat"), 1, 1));
  EXPECT_EQ((std::vector<std::string>{"r1", "r2.txt"}), vxtest::ListTree(tmp.Path("dst/p.dat")));
  // Nothing matching: nothing to do, and no empty folder made for it.
  EXPECT_EQ(0, Copy(tmp.Path("src/*.none"), tmp.Path("dst/none"), 1, 1));
  EXPECT_FALSE(vxtest::FileExists(tmp.Path("dst/none")));
}

TEST(CopyFile, TreeCopyKeepsStructureLinksModesAndTimes) {
  vxtest::TempDir tmp;
  for (const char* name : {"top.ini", "a b/one file.txt", "a b/c/d/deep.dat", ".hidden/h"}) {
    vxtest::WriteFile(tmp.Path(std::string("src/") + name), name);
  }
  vxtest::MakeDirs(tmp.Path("src/empty"));
  ASSERT_EQ(0, symlink("../top.ini", tmp.Path("src/a b/link").c_str()));
  ASSERT_EQ(0, symlink("nowhere", tmp.Path("src/dangling").c_str()));
  ASSERT_EQ(0, symlink("..", tmp.Path("src/a b/c/loop").c_str()));
  ASSERT_EQ(0, chmod(tmp.Path("src/top.ini").c_str(), 0640));
  SetMtime(tmp.Path("src/a b/c/d/deep.dat"), 1234567890);
  SetMtime(tmp.Path("src/a b/c/d"), 1111111111);
  ASSERT_EQ(0, chmod(tmp.Path("src/a b/c").c_str(), 0555));  // read-only folders copy too

  ASSERT_EQ(0, Copy(tmp.Path("src"), tmp.Path("dst"), 1, 1));
  EXPECT_EQ((std::vector<std::string>{".hidden", ".hidden/h", "a b", "a b/c", "a b/c/d",
                                      "a b/c/d/deep.dat", "a b/c/loop", "a b/link",
                                      "a b/one file.txt", "dangling", "empty", "top.ini"}),
            vxtest::ListTree(tmp.Path("dst")));
  EXPECT_EQ("a b/c/d/deep.dat", vxtest::ReadFile(tmp.Path("dst/a b/c/d/deep.dat")));
  EXPECT_EQ("../top.ini", LinkTarget(tmp.Path("dst/a b/link")));
  EXPECT_EQ("nowhere", LinkTarget(tmp.Path("dst/dangling")));
  EXPECT_EQ("..", LinkTarget(tmp.Path("dst/a b/c/loop")));
  EXPECT_EQ(0640u, Lstat(tmp.Path("dst/top.ini")).st_mode & 07777);
  EXPECT_EQ(0555u, Lstat(tmp.Path("dst/a b/c")).st_mode & 07777);
  EXPECT_EQ(1234567890, Lstat(tmp.Path("dst/a b/c/d/deep.dat")).st_mtime);
  EXPECT_EQ(1111111111, Lstat(tmp.Path("dst/a b/c/d")).st_mtime);
  ExpectNoTempFiles(tmp);
}

TEST(CopyFile, TreeCopyMergesIntoAnExistingTreeAndGoesOnAfterAFailure) {
  vxtest::TempDir tmp;
  vxtest::WriteFile(tmp.Path("src/a/same.ini"), "source");
  vxtest::WriteFile(tmp.Path("src/a/new.ini"), "fresh");
  vxtest::WriteFile(tmp.Path("src/blocked/x"), "x");
  vxtest::WriteFile(tmp.Path("src/z.ini"), "z");
  vxtest::WriteFile(tmp.Path("dst/a/same.ini"), "destination");
  vxtest::WriteFile(tmp.Path("dst/blocked"), "a file where the source has a folder");
  EXPECT_EQ(1, Copy(tmp.Path("src"), tmp.Path("dst"), 1, 0));
  EXPECT_EQ("destination", vxtest::ReadFile(tmp.Path("dst/a/same.ini")));
  EXPECT_EQ("fresh", vxtest::ReadFile(tmp.Path("dst/a/new.ini")));
  EXPECT_EQ("z", vxtest::ReadFile(tmp.Path("dst/z.ini")));
  EXPECT_EQ("a file where the source has a folder", vxtest::ReadFile(tmp.Path("dst/blocked")));
  EXPECT_EQ(0, Copy(tmp.Path("src/a"), tmp.Path("dst/a"), 1, 0));  // kept files are no failure
  EXPECT_EQ(0, Copy(tmp.Path("src/a"), tmp.Path("dst/a"), 1, 1));
  EXPECT_EQ("source", vxtest::ReadFile(tmp.Path("dst/a/same.ini")));
}

TEST(CopyFile, TreeCopyIntoItsOwnSubFolderEnds) {
  vxtest::TempDir tmp;
  vxtest::WriteFile(tmp.Path("src/a/f"), "f");
  ASSERT_EQ(0, Copy(tmp.Path("src"), tmp.Path("src/a/copy"), 1, 1));
  EXPECT_EQ((std::vector<std::string>{"a", "a/copy", "a/copy/a", "a/copy/a/f", "a/f"}),
            vxtest::ListTree(tmp.Path("src")));
}

TEST(CopyFile, UnwritableDestinationFolderLeavesNothingBehind) {
  if (geteuid() == 0) GTEST_SKIP() << "root writes into read-only folders";
  vxtest::TempDir tmp;
  vxtest::WriteFile(tmp.Path("src/a.ini"), "a");
  vxtest::MakeDirs(tmp.Path("dst"));
  ASSERT_EQ(0, chmod(tmp.Path("dst").c_str(), 0555));
  EXPECT_EQ(1, Copy(tmp.Path("src/a.ini"), tmp.Path("dst/a.ini"), 0, 1));
  EXPECT_EQ(1, Copy(tmp.Path("src"), tmp.Path("dst"), 1, 1));
  EXPECT_TRUE(vxtest::ListTree(tmp.Path("dst")).empty());
}

TEST(CopyFile, UnreadableSourceGivesNoDestinationFile) {
  if (geteuid() == 0) GTEST_SKIP() << "root reads unreadable files";
  vxtest::TempDir tmp;
  vxtest::WriteFile(tmp.Path("src/secret.ini"), "s");
  vxtest::WriteFile(tmp.Path("src/open.ini"), "o");
  ASSERT_EQ(0, chmod(tmp.Path("src/secret.ini").c_str(), 0));
  EXPECT_EQ(1, Copy(tmp.Path("src/secret.ini"), tmp.Path("dst/secret.ini"), 0, 1));
  EXPECT_FALSE(vxtest::FileExists(tmp.Path("dst")));
  EXPECT_EQ(1, Copy(tmp.Path("src"), tmp.Path("dst"), 1, 1));
  EXPECT_EQ((std::vector<std::string>{"open.ini"}), vxtest::ListTree(tmp.Path("dst")));
}

}  // namespace
