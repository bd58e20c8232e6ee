// The INI model on disk: a file opened, perhaps changed, and written back is byte-identical but for
// the bytes a change must touch; what cannot be read as settings is refused and never replaced; a
// file this object did not load is never replaced; writes are atomic.

#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <csignal>
#include <functional>
#include <string>
#include <utility>
#include <vector>

#include "foundation/inifile/ini_file.h"
#include "support/process_state.h"
#include "support/test_files.h"

namespace {

using vxtest::ReadFile;
using vxtest::WriteFile;
using Names = std::vector<std::string>;
using Ini = vxMappedINIFile;

struct RewriteCase {
  const char* name;
  std::string before;
  std::function<void(Ini&)> edit = nullptr;  // none: the file is written back unchanged
  std::string after = "";  // the file after the edit; empty: the same as before
  unsigned int flag = 1;
};

class IniRewrite : public testing::TestWithParam<RewriteCase> {};

TEST_P(IniRewrite, ChangesOnlyWhatWasChanged) {
  const RewriteCase& c = GetParam();
  vxtest::TempDir dir;
  WriteFile(dir.Path("x.ini"), c.before);
  Ini ini(dir.Path("x.ini").c_str());
  ASSERT_EQ(0, ini.Open(c.flag));
  if (c.edit) c.edit(ini);
  ASSERT_EQ(0, ini.Close(1));
  EXPECT_EQ(c.after.empty() ? c.before : c.after, ReadFile(dir.Path("x.ini")));
}

// Sets each section, key and value in turn.
std::function<void(Ini&)> Set(std::vector<std::array<const char*, 3>> sets) {
  return [sets](Ini& f) { for (const auto& s : sets) f.SetVal(s[0], s[1], s[2]); };
}

// Merges in a file holding text.
std::function<void(Ini&)> MergeFrom(const std::string& text) {
  return [text](Ini& f) {
    vxtest::TempDir dir;
    WriteFile(dir.Path("src.ini"), text);
    Ini src(dir.Path("src.ini").c_str());
    ASSERT_EQ(0, src.Open(1));
    f.MergeFrom(src);
  };
}

// Enough keys to make a section long, so that its lookups go through its index.
std::string Filler() {
  std::string text;
  for (int i = 0; i < 20; ++i) text += "f" + std::to_string(i) + "=" + std::to_string(i) + "\n";
  return text;
}

INSTANTIATE_TEST_SUITE_P(
    Files, IniRewrite,
    testing::Values(
        RewriteCase{"Empty", ""},
        RewriteCase{"CrlfPreambleAndOddLines",
                    "\xef\xbb\xbftop=1\r\n; note\r\n\r\n[m]\r\n  key  =  value \t\r\njust text\r\n"
                    "\tk2\t=\tv2\r\n=novalue\r\n[oops\r\n[[Filter1]]\r\n[ sp ] ; [x]\r\n"},
        RewriteCase{"MixedLoneCrNoFinalLineEnd", "[a]\rk=v\r\n\r\r\nx=y\nother=x\r\n[b]\nk=v"},
        RewriteCase{"CommentsAroundAndLast", "; one\n# two\n\n[main]\nkey=value\n; closing"},
        RewriteCase{"DupsAndNotUtf8", "[a]\nk=1\nK=2\n[A]\nk=3\n[m\xe9]\nk\xff=\xfe\xc3(\x80\n"},
        RewriteCase{"TenMegabyteLine", "[a]\nbig=" + std::string(10 << 20, 'x') + "\n"},
        // Lookups ignore case, tell an empty value from a missing key, and create nothing.
        RewriteCase{"LookupsCreateNothing", "[Main]\nKey = v \nl0=\n[[Filter1]]\nName=f\n",
                    [](Ini& f) {
                      EXPECT_EQ("v", f.GetVal("MAIN", "key").str());
                      EXPECT_EQ("f", f.GetVal(f.GetPropertyList("[filter1]"), "NAME").str());
                      vxStringBase value("stale");
                      EXPECT_EQ(0, f.GetVal("main", "L0", value));  // found, though empty
                      EXPECT_TRUE(value.isEmpty());
                      value = "stale";
                      EXPECT_NE(0, f.GetVal("main", "l1", value));  // a numbered walk ends here
                      EXPECT_TRUE(value.isEmpty() && f.GetVal("absent", "Key").isEmpty() &&
                                  f.GetPropertyList("absent") == nullptr);
                    }},
        RewriteCase{"NulByteWithFlagZero", std::string("[a]\nk=v\0w\n", 10), nullptr, "", 0},
        // Case ignored, spelling and spacing kept, the first of two keys set, new keys after the
        // section's last property line, new lines ending like the file's own.
        RewriteCase{"SetValChangesOnlyTheValue",
                    "[Defaults]\r\n  Path  =  old ; x \r\nk = \r\nk=2\r\n; tail\r\n\r\n[b]\r\nz=1",
                    Set({{"defaults", "PATH", "new"}, {"DEFAULTS", "K", "v"},
                         {"defaults", "added", "n"}, {"c", "k", "w"}}),
                    "[Defaults]\r\n  Path  =  new \r\nk = v\r\nk=2\r\nadded=n\r\n; tail\r\n\r\n"
                    "[b]\r\nz=1\r\n[c]\r\nk=w\r\n"},
        // A value with blanks at its ends takes the place of the line's spacing on that side, so
        // that setting it again leaves the line as it is instead of adding blanks on every run.
        RewriteCase{"ValueWithBlankEndsReplacesTheSpacing", "[a]\nk = old \t\nl=x  \n",
                    Set({{"a", "k", "  new "}, {"a", "l", "x  "}}), "[a]\nk =  new \nl=x  \n"},
        // A caller's text is written up to its first line break.
        RewriteCase{"NewSectionAfterPreambleOnly", "; only a comment",
                    Set({{"s", "n", "-42"}, {"s", "k", "x\n[evil]\nk=y"}, {"s", "", "v"}}),
                    "; only a comment\n[s]\nn=-42\nk=x\n"},
        RewriteCase{"RemovedKeysKeepComments", "[a]\n; about k\nk=1\nk=2\n; c\nlast=1\n\n[b]\n",
                    [](Ini& f) {
                      EXPECT_EQ(0, f.RemoveKey("a", "K"));
                      EXPECT_EQ("2", f.GetVal("a", "k").str());  // the duplicate it hid
                      EXPECT_EQ(0, f.RemoveKey("a", "last"));
                    },
                    "[a]\n; about k\nk=2\n; c\n\n[b]\n"},
        RewriteCase{"DoubledBracketsRenamed", "[[Filter1]]\r\nk = 1 \r\n",
                    [](Ini& f) { EXPECT_EQ(0, f.RenameSection("[filter1]", "Filter1")); },
                    "[Filter1]\r\nk = 1 \r\n"},
        // Updating sets values and adds keys (the first of a repeated key counts); adding keeps
        // the section's own values; a value set through the line list is written in place.
        RewriteCase{"MapSections", "[e]\na=1\nb=2\n[f]\nb=2\n[src]\nB=20\nc = 30\nc=31\n",
                    [](Ini& f) {
                      f.GetPropertyList("E")->at(0)->m_value = "9";
                      f.UpdateMapSection("E", f.GetPropertyList("src"));
                      f.AddMapSection("f", f.GetPropertyList("src"));
                      f.AddMapSection("new", f.GetPropertyList("f"));
                    },
                    "[e]\na=9\nb=20\nc = 30\n[f]\nb=2\nc = 30\n[src]\nB=20\nc = 30\nc=31\n"
                    "[new]\nb=2\nc = 30\n"},
        // The destination's values win; new keys and sections come in the source's order, without
        // the source's comments, ending like the destination's lines.
        RewriteCase{"MergeKeepsDestinationValues", "[main]\nk=dest\n; end of main\n\n[dest]\nd=1\n",
                    MergeFrom("[MAIN]\r\n; c\r\nK=src\r\nnew1 = a\r\nNEW1=dup\r\nnew2=b\r\n"
                              "[other]\r\nx=1\r\n[Main]\r\nhidden=1\r\n[third]\r\n"),
                    "[main]\nk=dest\nnew1 = a\nnew2=b\n; end of main\n\n[dest]\nd=1\n[other]\nx=1\n"
                    "[third]\n"},
        // Keys and sections that differ in case alone keep their own values: the exact spelling
        // finds its own line, any other spelling the first one.
        RewriteCase{"ExactSpellingFindsItsOwnKey",
                    "[Profile]\nLogFileUserName=server\nLogFileUsername=warehouse\nx=1\n",
                    [](Ini& ini) {
                      EXPECT_EQ("warehouse", ini.GetVal("Profile", "LogFileUsername").str());
                      EXPECT_EQ("server", ini.GetVal("PROFILE", "LOGFILEUSERNAME").str());
                      ini.SetVal("Profile", "LogFileUsername", vxStringBase("wh"));
                      EXPECT_EQ(0, ini.RemoveKey("Profile", "LogFileUserName"));
                      EXPECT_EQ("wh", ini.GetVal("profile", "logfileusername").str());
                    },
                    "[Profile]\nLogFileUsername=wh\nx=1\n"},
        // The same in a long section, found through its index rather than line by line.
        RewriteCase{"ExactSpellingInALongSection",
                    "[Profile]\n" + Filler() +
                        "LogFileUserName=server\nLogFileUsername=wh0\nd=1\nd=2\n",
                    [](Ini& ini) {
                      EXPECT_EQ("wh0", ini.GetVal("Profile", "LogFileUsername").str());
                      EXPECT_EQ("server", ini.GetVal("PROFILE", "LOGFILEUSERNAME").str());
                      EXPECT_EQ(0, ini.RemoveKey("Profile", "LogFileUserName"));
                      EXPECT_EQ("wh0", ini.GetVal("profile", "logfileusername").str());
                      EXPECT_EQ(0, ini.RemoveKey("Profile", "D"));
                      EXPECT_EQ("2", ini.GetVal("Profile", "d").str());  // the duplicate it hid
                      ini.SetVal("Profile", "New", vxStringBase("n"));
                      EXPECT_EQ("n", ini.GetVal("profile", "NEW").str());
                    },
                    "[Profile]\n" + Filler() + "LogFileUsername=wh0\nd=2\nNew=n\n"},
        RewriteCase{"MergeFromALongSection", "[main]\nk=dest\n",
                    MergeFrom("[MAIN]\n" + Filler() + "K=src\nnew1 = a\nNEW1=dup\n"),
                    "[main]\nk=dest\n" + Filler() + "new1 = a\n"},
        RewriteCase{"ExactSpellingFindsItsOwnSection", "[Main]\na=1\n[main]\na=2\n",
                    [](Ini& ini) {
                      EXPECT_EQ("1", ini.GetVal("MAIN", "a").str());
                      ini.SetVal("main", "a", vxStringBase("3"));
                      EXPECT_EQ(0, ini.RenameSection("Main", "Other"));
                      EXPECT_EQ("3", ini.GetVal("MAIN", "a").str());
                    },
                    "[Other]\na=1\n[main]\na=3\n"}),
    [](const testing::TestParamInfo<RewriteCase>& info) { return info.param.name; });

// Type and permission bits of whatever is at path (a link not followed); 0 when nothing is.
mode_t FileMode(const std::string& path) {
  struct stat st;
  return lstat(path.c_str(), &st) == 0 ? st.st_mode : 0;
}

// The content of a regular file, else its type and mode (reading a pipe would block).
std::string Snapshot(const std::string& path) {
  return S_ISREG(FileMode(path)) ? ReadFile(path) : "<kind " + std::to_string(FileMode(path)) + ">";
}

// Whatever stands where a settings file should be but cannot be read as one is left as it was.
TEST(IniFile, UnreadableFilesAreRefusedAndNeverReplaced) {
  const std::pair<const char*, std::function<void(const std::string&)>> kinds[] = {
      {"folder", [](const std::string& p) { vxtest::MakeDirs(p); }},
      {"binary", [](const std::string& p) { WriteFile(p, std::string("[a]\nk=\0\n", 8)); }},
      {"pipe", [](const std::string& p) { ASSERT_EQ(0, mkfifo(p.c_str(), 0644)); }}};
  for (const auto& [kind, make] : kinds) {
    SCOPED_TRACE(kind);
    vxtest::TempDir dir;
    make(dir.Path("s.ini"));
    std::string before = Snapshot(dir.Path("s.ini"));
    Ini ini(dir.Path("s.ini").c_str());
    EXPECT_NE(0, ini.Open(1));
    ini.SetVal("s", "k", "v");
    EXPECT_EQ(1, ini.Close(1));
    EXPECT_EQ(before, Snapshot(dir.Path("s.ini")));
    EXPECT_EQ(Names{"s.ini"}, vxtest::ListTree(dir.path()));
  }
}

// A conversion reads one file, changes a copy in memory and writes the result once under a new
// name: never over what is there, with the source's mode; an unchanged file is never rewritten.
TEST(IniFile, CreateAsWritesOnceAndCopiesInMemoryStayApart) {
  vxtest::TempDir dir;
  WriteFile(dir.Path("standard.ini"), "; keep\n[a]\nk=1\n");
  ASSERT_EQ(0, chmod(dir.Path("standard.ini").c_str(), 0640));
  Ini standard(dir.Path("standard.ini").c_str());
  ASSERT_EQ(0, standard.Open(1));
  Ini copy;
  copy.CopyFrom(standard);
  copy.SetVal("a", "k", "2");
  copy.SetVal("b", "n", "3");
  EXPECT_EQ("1", standard.GetVal("a", "k").str());
  EXPECT_EQ(0, copy.CreateAs(dir.Path("converted.ini").c_str()));
  EXPECT_EQ("; keep\n[a]\nk=2\n[b]\nn=3\n", ReadFile(dir.Path("converted.ini")));
  struct stat st;
  ASSERT_EQ(0, stat(dir.Path("converted.ini").c_str(), &st));
  EXPECT_EQ(0640u, st.st_mode & 07777);
  WriteFile(dir.Path("taken.ini"), "theirs\n");
  EXPECT_EQ(2, copy.CreateAs(dir.Path("taken.ini").c_str()));
  EXPECT_EQ("theirs\n", ReadFile(dir.Path("taken.ini")));
  EXPECT_EQ(0, copy.CreateAs(dir.Path("new/folder/made.ini").c_str()));
  EXPECT_EQ(1, copy.CreateAs(dir.Path("taken.ini/below.ini").c_str()));  // a file on the way
  EXPECT_EQ((Names{"converted.ini", "new", "new/folder", "new/folder/made.ini", "standard.ini",
                   "taken.ini"}),
            vxtest::ListTree(dir.path()));

  struct stat before;
  ASSERT_EQ(0, stat(dir.Path("standard.ini").c_str(), &before));
  standard.SetVal("a", "k", "1");  // the same value: nothing changed
  EXPECT_EQ(0, standard.Close(1));
  ASSERT_EQ(0, stat(dir.Path("standard.ini").c_str(), &st));
  EXPECT_EQ(before.st_ino, st.st_ino);
}

TEST(IniFile, CloseCreatesAMissingFileButNeverReplacesOneItDidNotLoad) {
  vxtest::TempDir dir;
  WriteFile(dir.Path("a.ini"), "[a]\nk=1\n");
  Ini ini(dir.Path("new.ini").c_str());
  EXPECT_NE(0, ini.Open(1));
  ini.SetVal("n", "k", "v");
  EXPECT_EQ(0, ini.Close(1));
  ini.SetFilename(dir.Path("a.ini").c_str());
  ASSERT_EQ(0, ini.Open(1));
  ini.SetVal("a", "k", "2");
  EXPECT_EQ(0, ini.Close(0));
  EXPECT_EQ(1, ini.Close(1));  // the changes were dropped and nothing is loaded any more
  ASSERT_EQ(0, ini.Open(1));
  ini.SetFilename(dir.Path("new.ini").c_str());
  EXPECT_EQ(1, ini.Close(1));
  ASSERT_EQ(0, ini.Open(1));  // new.ini, now loaded, may be saved under a new name
  std::string longName = dir.Path(std::string(250, 'n') + ".ini");  // no room left for a suffix
  ini.SetFilename(vxStringBase(longName.c_str()));
  EXPECT_EQ(0, ini.Close(1));
  EXPECT_EQ("[a]\nk=1\n" "[n]\nk=v\n" "[n]\nk=v\n",
            ReadFile(dir.Path("a.ini")) + ReadFile(dir.Path("new.ini")) + ReadFile(longName));
}

// A settings file copied as a link may point into the source installation: the link is replaced
// by a file with the old file's mode, and what it pointed to stays as it was.
TEST(IniFile, WritingReplacesALinkAndNeverWritesThroughIt) {
  vxtest::TempDir dir;
  WriteFile(dir.Path("source.ini"), "[a]\nk=1\n");
  chmod(dir.Path("source.ini").c_str(), 0640);
  ASSERT_EQ(0, symlink("source.ini", dir.Path("link.ini").c_str()));
  Ini ini(dir.Path("link.ini").c_str());
  ASSERT_EQ(0, ini.Open(1));
  ini.SetVal("a", "k", "2");
  ASSERT_EQ(0, ini.CloseFW(1));
  EXPECT_EQ("[a]\nk=1\n", ReadFile(dir.Path("source.ini")));
  EXPECT_EQ("[a]\nk=2\n", ReadFile(dir.Path("link.ini")));
  EXPECT_EQ(S_IFREG | 0640u, FileMode(dir.Path("link.ini")));
  EXPECT_EQ((Names{"link.ini", "source.ini"}), vxtest::ListTree(dir.path()));
}

// A disk that fills up mid-write, played by a file-size limit (which binds root too).
TEST(IniFile, FailedWriteKeepsTheOldFile) {
  vxtest::TempDir dir;
  WriteFile(dir.Path("a.ini"), "[a]\nk=1\n");
  Ini ini(dir.Path("a.ini").c_str());
  ASSERT_EQ(0, ini.Open(1));
  ini.SetVal("a", "k", std::string(64 * 1024, 'x').c_str());
  int result = 0;
  {
    // A write beyond the limit fails instead of killing the process.
    vxtest::ScopedSignalDisposition ignored(SIGXFSZ, SIG_IGN);
    vxtest::ScopedResourceLimit small(RLIMIT_FSIZE, 4096);
    ASSERT_TRUE(small.ok());
    result = ini.Close(1);
  }
  EXPECT_EQ(1, result);
  EXPECT_EQ("[a]\nk=1\n", ReadFile(dir.Path("a.ini")));
  EXPECT_EQ(Names{"a.ini"}, vxtest::ListTree(dir.path()));
}

}  // namespace
