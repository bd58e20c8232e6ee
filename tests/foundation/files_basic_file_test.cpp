// Whole-file reading and writing; a rewrite replaces the file only once it is complete.

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <string>
#include <vector>

#include "foundation/files/basic_file.h"
#include "support/test_files.h"

namespace {

const unsigned int kRewrite = O_CREAT | O_TRUNC;  // 0x240, as the data-file merge passes it

int WriteWhole(const std::string& path, const std::string& text) {
  vxBasicFile file(path.c_str(), kRewrite, O_RDWR, 0);
  if (file.Open() != 0) return 1;
  unsigned long written = 0;
  if (file.Write(vxStringBase(text.data(), text.size()), written) != 0) return 1;
  if (written != text.size()) return 1;
  return file.Close();
}

TEST(BasicFile, ReadAllReturnsEveryByte) {
  vxtest::TempDir tmp;
  std::string content(200 * 1024, 'r');
  content[7] = '\0';
  content[150000] = '\n';
  vxtest::WriteFile(tmp.Path("data.txt"), content);
  vxBasicFile file(tmp.Path("data.txt").c_str(), O_RDWR, O_RDWR, 0);
  ASSERT_EQ(0, file.Open());
  vxStringBase text;
  ASSERT_EQ(0, file.ReadAll(text));
  EXPECT_EQ(content, text.str());
  EXPECT_EQ(0, file.Close());
}

TEST(BasicFile, RewriteReplacesContentKeepingModeButNeverWritesThroughALink) {
  vxtest::TempDir tmp;
  vxtest::WriteFile(tmp.Path("settings.txt"), "old content that is longer");
  ASSERT_EQ(0, chmod(tmp.Path("settings.txt").c_str(), 0640));
  ASSERT_EQ(0, WriteWhole(tmp.Path("settings.txt"), "new"));
  EXPECT_EQ("new", vxtest::ReadFile(tmp.Path("settings.txt")));
  struct stat st;
  ASSERT_EQ(0, stat(tmp.Path("settings.txt").c_str(), &st));
  EXPECT_EQ(0640u, st.st_mode & 07777);
  // A link may lead into the source installation: it is replaced, its target left alone.
  vxtest::WriteFile(tmp.Path("source.txt"), "source");
  ASSERT_EQ(0, symlink("source.txt", tmp.Path("link.txt").c_str()));
  ASSERT_EQ(0, WriteWhole(tmp.Path("link.txt"), "rewritten"));
  EXPECT_EQ("source", vxtest::ReadFile(tmp.Path("source.txt")));
  EXPECT_EQ("rewritten", vxtest::ReadFile(tmp.Path("link.txt")));
  EXPECT_EQ((std::vector<std::string>{"link.txt", "settings.txt", "source.txt"}),
            vxtest::ListTree(tmp.path()));
  vxBasicFile noCreate(tmp.Path("absent.txt").c_str(), O_TRUNC, O_RDWR, 0);
  EXPECT_NE(0, noCreate.Open());  // truncating without O_CREAT makes nothing
  ASSERT_EQ(0, WriteWhole(tmp.Path("new.txt"), "created"));
  EXPECT_EQ("created", vxtest::ReadFile(tmp.Path("new.txt")));
}

TEST(BasicFile, CrashBeforeCloseLeavesTheOldFileIntact) {
  vxtest::TempDir tmp;
  vxtest::WriteFile(tmp.Path("keywords.txt"), "line one\nline two\n");
  {
    vxBasicFile file(tmp.Path("keywords.txt").c_str(), kRewrite, O_RDWR, 0);
    ASSERT_EQ(0, file.Open());
    unsigned long written = 0;
    ASSERT_EQ(0, file.Write("half of the new", written));
    EXPECT_EQ(15u, written);
    // Destroyed without Close, as when the run dies mid-write.
  }
  EXPECT_EQ("line one\nline two\n", vxtest::ReadFile(tmp.Path("keywords.txt")));
  EXPECT_EQ((std::vector<std::string>{"keywords.txt"}), vxtest::ListTree(tmp.path()));
}

TEST(BasicFile, ReadOnlyFileCanBeReadButNotRewritten) {
  if (geteuid() == 0) GTEST_SKIP() << "root may write read-only files";
  vxtest::TempDir tmp;
  vxtest::WriteFile(tmp.Path("ro.txt"), "protected");
  ASSERT_EQ(0, chmod(tmp.Path("ro.txt").c_str(), 0444));
  vxBasicFile reader(tmp.Path("ro.txt").c_str(), O_RDWR, O_RDWR, 0);
  ASSERT_EQ(0, reader.Open());
  vxStringBase text;
  EXPECT_EQ(0, reader.ReadAll(text));
  EXPECT_EQ("protected", text.str());
  unsigned long written = 0;
  EXPECT_NE(0, reader.Write("x", written));
  reader.Close();
  EXPECT_NE(0, WriteWhole(tmp.Path("ro.txt"), "overwritten"));
  EXPECT_EQ("protected", vxtest::ReadFile(tmp.Path("ro.txt")));
}

}  // namespace
