// Copies: an existing destination is kept unless replacing was asked for, nothing partial or
// temporary is ever left behind, and trees keep their links, modes and times.

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <string>
#include <vector>

#include "foundation/files/file_manager.h"
#include "support/test_files.h"
#include "support/unprivileged.h"

namespace {

using vxtest::ListTree;
using vxtest::ReadFile;
using Names = std::vector<std::string>;

int Copy(const std::string& from, const std::string& to, unsigned int tree, unsigned int replace,
         unsigned int newerOnly = 0) {
  return vxFileManager::CopyFile(vxStringBase(from.c_str()), vxStringBase(to.c_str()), tree,
                                 replace, newerOnly, 0, 0, nullptr, nullptr);
}

// Writes each file below folder with its own name as content.
void WriteFiles(const std::string& folder, std::initializer_list<const char*> names) {
  for (const char* name : names) vxtest::WriteFile(folder + "/" + name, name);
}

void SetMtime(const std::string& path, time_t seconds) {
  struct timespec times[2] = {{seconds, 0}, {seconds, 0}};
  ASSERT_EQ(0, utimensat(AT_FDCWD, path.c_str(), times, AT_SYMLINK_NOFOLLOW));
}

// What a copy keeps of an entry: its kind and permission bits, its time to the nanosecond, and
// its content or link target.
std::string Kept(const std::string& path) {
  struct stat st = {};
  char target[256] = {};  // stays empty unless path is a link
  if (lstat(path.c_str(), &st) != 0 || readlink(path.c_str(), target, 255) >= 255) return "?";
  return std::to_string(st.st_mode) + " " + std::to_string(st.st_mtim.tv_sec) + "." +
         std::to_string(st.st_mtim.tv_nsec) + " " + (S_ISREG(st.st_mode) ? ReadFile(path) : target);
}

TEST(CopyFile, SingleFileReplacesAnExistingDestinationOnlyWhenAsked) {
  vxtest::TempDir tmp;
  const std::string src = tmp.Path("src.ini"), dst = tmp.Path("dst.ini"), old("old\0bytes", 9);
  vxtest::WriteFile(src, "new");
  // replace, newerOnly, the source's time (the destination's is 1000), result, content after
  struct { unsigned int replace, newerOnly; time_t sourceTime; int result; std::string content; }
  cases[] = {{0, 0, 1001, 1, old}, {0, 1, 1001, 1, old}, {1, 1, 1000, 1, old}, {1, 1, 999, 1, old},
             {1, 1, 1001, 0, "new"}, {1, 0, 999, 0, "new"}};
  for (const auto& c : cases) {
    vxtest::WriteFile(dst, old);
    SetMtime(dst, 1000);
    SetMtime(src, c.sourceTime);
    EXPECT_EQ(c.result, Copy(src, dst, 0, c.replace, c.newerOnly)) << c.replace << c.newerOnly;
    EXPECT_EQ(c.content, ReadFile(dst)) << c.replace << c.newerOnly << " " << c.sourceTime;
  }
  EXPECT_EQ((Names{"dst.ini", "src.ini"}), ListTree(tmp.path()));
}

TEST(CopyFile, SingleFileKeepsContentModeAndTimesAndCreatesParents) {
  vxtest::TempDir tmp;
  std::string content(3 * 1024 * 1024 + 17, 'x');  // more than one chunk of any copy loop
  for (size_t i = 0; i < content.size(); i += 4093) content[i] = static_cast<char>(i % 251);
  vxtest::WriteFile(tmp.Path("src.dat"), content);
  ASSERT_EQ(0, chmod(tmp.Path("src.dat").c_str(), 0751));
  ASSERT_EQ(0, Copy(tmp.Path("src.dat"), tmp.Path("new/deeper/dst.dat"), 0, 0));
  EXPECT_TRUE(Kept(tmp.Path("src.dat")) == Kept(tmp.Path("new/deeper/dst.dat")));
  // Another file system: the kernel copy refuses and plain reads and writes take over.
  ASSERT_EQ(0, access("/dev/shm", W_OK)) << "no writable /dev/shm to copy across to";
  std::string other = "/dev/shm/vxm_copy_test_" + std::to_string(getpid());
  ASSERT_EQ(0, Copy(tmp.Path("src.dat"), other, 0, 0));
  EXPECT_TRUE(content == ReadFile(other));
  unlink(other.c_str());
}

TEST(CopyFile, PatternCopiesMatchingFilesAndRefusalsChangeNothing) {
  vxtest::TempDir tmp;
  WriteFiles(tmp.Path("src"), {"a.wlp", "b c.wlp", "x.ini", "p.dat/r", "p.dat/r.txt", "p.dat/s/x"});
  ASSERT_EQ(0, Copy(tmp.Path("src/*.wlp"), tmp.Path("dst/profiles"), 1, 1));
  ASSERT_EQ(0, Copy(tmp.Path("src/p.dat/*.*"), tmp.Path("dst/p.dat"), 1, 1));
  // Nothing matching: nothing to do, and no empty folder made for it.
  EXPECT_EQ(0, Copy(tmp.Path("src/*.none"), tmp.Path("dst/none"), 1, 1));
  // A file never replaces a folder, and a folder is no single file.
  EXPECT_EQ(1, Copy(tmp.Path("src/x.ini"), tmp.Path("dst/p.dat"), 0, 1));
  EXPECT_EQ(1, Copy(tmp.Path("src/p.dat"), tmp.Path("dst/f"), 0, 1));
  EXPECT_EQ(1, Copy(tmp.Path("missing"), tmp.Path("dst/f"), 0, 1));
  EXPECT_EQ(1, Copy(tmp.Path("missing/*.ini"), tmp.Path("dst/f"), 1, 1));
  EXPECT_EQ((Names{"p.dat", "p.dat/r", "p.dat/r.txt", "profiles", "profiles/a.wlp",
                   "profiles/b c.wlp"}),
            ListTree(tmp.Path("dst")));
}

TEST(CopyFile, TreeCopyKeepsStructureLinksModesAndTimes) {
  vxtest::TempDir tmp;
  WriteFiles(tmp.Path("src"), {"top.ini", "a b/one file.txt", "a b/c/d/deep.dat", ".hidden/h"});
  vxtest::MakeDirs(tmp.Path("src/empty"));
  ASSERT_EQ(0, symlink("../top.ini", tmp.Path("src/a b/link").c_str()));
  ASSERT_EQ(0, symlink("nowhere", tmp.Path("src/dangling").c_str()));
  ASSERT_EQ(0, symlink("..", tmp.Path("src/a b/c/loop").c_str()));
  ASSERT_EQ(0, chmod(tmp.Path("src/top.ini").c_str(), 0640));
  SetMtime(tmp.Path("src/a b/c/d"), 1111111111);
  ASSERT_EQ(0, chmod(tmp.Path("src/a b/c").c_str(), 0555));  // read-only folders copy too
  ASSERT_EQ(0, Copy(tmp.Path("src"), tmp.Path("dst"), 1, 1));
  const Names names = ListTree(tmp.Path("src"));
  ASSERT_EQ(names, ListTree(tmp.Path("dst")));
  for (const std::string& name : names) {
    EXPECT_EQ(Kept(tmp.Path("src/" + name)), Kept(tmp.Path("dst/" + name))) << name;
  }
  // Into its own sub-folder: the copy leaves itself out instead of recursing.
  ASSERT_EQ(0, Copy(tmp.Path("src/a b"), tmp.Path("src/a b/c/d/copy"), 1, 1));
  EXPECT_EQ("a b/c/d/deep.dat", ReadFile(tmp.Path("src/a b/c/d/copy/c/d/deep.dat")));
  EXPECT_FALSE(vxtest::FileExists(tmp.Path("src/a b/c/d/copy/c/d/copy")));
}

TEST(CopyFile, TreeCopyKeepsExistingFilesAndGoesOnAfterAFailure) {
  vxtest::TempDir tmp;
  WriteFiles(tmp.Path("src"), {"a/same.ini", "a/new.ini", "blocked/x", "z.ini"});
  WriteFiles(tmp.Path("dst"), {"a/same.ini", "blocked"});  // a file where the source has a folder
  vxtest::WriteFile(tmp.Path("src/a/same.ini"), "source");
  EXPECT_EQ(1, Copy(tmp.Path("src"), tmp.Path("dst"), 1, 0));
  EXPECT_EQ((Names{"a", "a/new.ini", "a/same.ini", "blocked", "z.ini"}), ListTree(tmp.Path("dst")));
  EXPECT_EQ(0, Copy(tmp.Path("src/a"), tmp.Path("dst/a"), 1, 0));  // kept files are no failure
  EXPECT_EQ("a/same.ini", ReadFile(tmp.Path("dst/a/same.ini")));
  EXPECT_EQ(0, Copy(tmp.Path("src/a"), tmp.Path("dst/a"), 1, 1));
  EXPECT_EQ("source", ReadFile(tmp.Path("dst/a/same.ini")));
}

TEST(CopyFile, UnreadableSourceLeavesNoPartialFile) {
  vxtest::TempDir tmp;
  WriteFiles(tmp.Path("src"), {"secret.ini", "open.ini"});
  EXPECT_TRUE(vxtest::AsUnprivilegedUser({tmp.path()}, [&tmp] {
    ASSERT_EQ(0, chmod(tmp.Path("src/secret.ini").c_str(), 0));
    EXPECT_EQ(1, Copy(tmp.Path("src/secret.ini"), tmp.Path("dst/secret.ini"), 0, 1));
    EXPECT_EQ(1, Copy(tmp.Path("src"), tmp.Path("dst"), 1, 1));
    EXPECT_EQ((Names{"open.ini"}), ListTree(tmp.Path("dst")));
  }));
}

}  // namespace
