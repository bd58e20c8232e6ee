// Whole-file reading and writing; a rewrite replaces the file only once it is complete.

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <string>
#include <vector>

#include "foundation/files/basic_file.h"
#include "foundation/files/whole_file.h"
#include "support/test_files.h"
#include "support/unprivileged.h"

namespace {

using vxtest::ReadFile;

// Rewrites path with text (O_CREAT | O_TRUNC, as the data-file merge does); with close false the
// file is destroyed unclosed, as when a run dies mid-write.
int Rewrite(const std::string& path, const std::string& text, bool close = true) {
  vxBasicFile file(path.c_str(), O_CREAT | O_TRUNC, O_RDWR, 0);
  unsigned long written = 0;
  if (file.Open() != 0 || file.Write(vxStringBase(text.c_str()), written) != 0) return 1;
  return written != text.size() ? 1 : close ? file.Close() : 0;
}

TEST(BasicFile, RewriteIsAtomicKeepsTheModeAndNeverWritesThroughALink) {
  vxtest::TempDir tmp;
  vxtest::WriteFile(tmp.Path("settings.txt"), "old content that is longer");
  ASSERT_EQ(0, chmod(tmp.Path("settings.txt").c_str(), 0640));
  ASSERT_EQ(0, Rewrite(tmp.Path("settings.txt"), "half of the new", false));
  EXPECT_EQ("old content that is longer", ReadFile(tmp.Path("settings.txt")));
  ASSERT_EQ(0, Rewrite(tmp.Path("settings.txt"), "new"));
  EXPECT_EQ("new", ReadFile(tmp.Path("settings.txt")));
  struct stat st;
  ASSERT_EQ(0, lstat(tmp.Path("settings.txt").c_str(), &st));
  EXPECT_EQ(S_IFREG | 0640u, st.st_mode);
  // A link may lead into the source installation: it is replaced, its target left alone.
  vxtest::WriteFile(tmp.Path("source.txt"), "source");
  ASSERT_EQ(0, symlink("source.txt", tmp.Path("link.txt").c_str()));
  ASSERT_EQ(0, Rewrite(tmp.Path("link.txt"), "rewritten"));
  EXPECT_EQ("source", ReadFile(tmp.Path("source.txt")));
  EXPECT_EQ("rewritten", ReadFile(tmp.Path("link.txt")));
  ASSERT_EQ(0, Rewrite(tmp.Path("new.txt"), "created"));
  EXPECT_EQ((std::vector<std::string>{"link.txt", "new.txt", "settings.txt", "source.txt"}),
            vxtest::ListTree(tmp.path()));
}

TEST(BasicFile, ReadOnlyFileIsReadWholeButNeverRewritten) {
  vxtest::TempDir tmp;
  std::string content(200 * 1024, 'r');
  content[7] = '\0';
  vxtest::WriteFile(tmp.Path("ro.txt"), content);
  ASSERT_EQ(0, chmod(tmp.Path("ro.txt").c_str(), 0444));
  vxBasicFile reader(tmp.Path("ro.txt").c_str(), O_RDWR, O_RDWR, 0);
  vxStringBase text;
  ASSERT_EQ(0, reader.Open());
  EXPECT_EQ(0, reader.ReadAll(text));
  EXPECT_TRUE(content == text.str());
  // Root may write read-only files; an ordinary user must not get round the mode by a rename.
  EXPECT_TRUE(vxtest::AsUnprivilegedUser({tmp.path()}, [&] {
    EXPECT_NE(0, Rewrite(tmp.Path("ro.txt"), "overwritten"));
    EXPECT_TRUE(content == ReadFile(tmp.Path("ro.txt")));
  }));
}

// What is not a regular file is refused at Open: a pipe would make the open or the read wait for a
// writer forever, and a device such as /dev/zero would never end.
struct SpecialFile {
  const char* name;  // under the temporary folder, or an absolute path
  unsigned int accessMode;
};

class BasicFileSpecial : public ::testing::TestWithParam<SpecialFile> {};

TEST_P(BasicFileSpecial, IsRefusedAtOpen) {
  vxtest::TempDir tmp;
  ASSERT_EQ(0, mkfifo(tmp.Path("pipe").c_str(), 0600));
  ASSERT_EQ(0, mkdir(tmp.Path("folder").c_str(), 0700));
  const std::string path = GetParam().name[0] == '/' ? GetParam().name : tmp.Path(GetParam().name);
  vxBasicFile file(path.c_str(), GetParam().accessMode, GetParam().accessMode, 0);
  ASSERT_NE(0, file.Open());  // and never reaches a read that would not end
  vxStringBase text;
  EXPECT_NE(0, file.ReadAll(text));
}

INSTANTIATE_TEST_SUITE_P(NotRegular, BasicFileSpecial,
                         ::testing::Values(SpecialFile{"pipe", O_RDONLY}, SpecialFile{"pipe", O_RDWR},
                                           SpecialFile{"/dev/zero", O_RDONLY},
                                           SpecialFile{"folder", O_RDONLY}));

// The one whole-file reader: exact bytes whatever the size against its first guess, a limit that
// refuses rather than truncates, and only regular files by path.
TEST(WholeFile, ReadsExactBytesRefusesOverLimitAndOnlyRegularFilesByPath) {
  vxtest::TempDir tmp;
  std::string big(300 * 1024 + 7, '\0');
  for (size_t i = 0; i < big.size(); ++i) big[i] = static_cast<char>(i * 7 + i / 251);
  vxtest::WriteFile(tmp.Path("big"), big);
  vxtest::WriteFile(tmp.Path("empty"), "");
  std::string text = "stale";
  mode_t mode = 0;
  ASSERT_EQ(0, chmod(tmp.Path("big").c_str(), 0640));
  ASSERT_TRUE(vxfiles::ReadWholeFile(tmp.Path("big"), &text, &mode));
  EXPECT_TRUE(text == big);
  EXPECT_EQ(0640u, mode);
  ASSERT_TRUE(vxfiles::ReadWholeFile(tmp.Path("empty"), &text));
  EXPECT_EQ("", text);
  EXPECT_FALSE(vxfiles::ReadWholeFile(tmp.Path("big"), &text, nullptr, big.size() - 1));
  EXPECT_EQ("", text);
  EXPECT_TRUE(vxfiles::ReadWholeFile(tmp.Path("big"), &text, nullptr, big.size()));
  EXPECT_FALSE(vxfiles::ReadWholeFile(tmp.Path("missing"), &text));
  EXPECT_FALSE(vxfiles::ReadWholeFile(tmp.path(), &text));

  // A descriptor of unknown size (a pipe) is read in growing chunks, and the limit still holds.
  for (const size_t limit : {big.size(), big.size() - 1}) {
    int ends[2];
    ASSERT_EQ(0, pipe(ends));
    const pid_t writer = fork();
    if (writer == 0) {
      close(ends[0]);
      _exit(write(ends[1], big.data(), big.size()) == static_cast<ssize_t>(big.size()) ? 0 : 1);
    }
    close(ends[1]);
    const bool read = vxfiles::ReadRest(ends[0], 0, limit, &text);
    close(ends[0]);
    int status = 0;
    waitpid(writer, &status, 0);
    EXPECT_EQ(limit == big.size(), read) << limit;
    EXPECT_TRUE(read ? text == big : text.empty()) << limit;
  }
}

}  // namespace
