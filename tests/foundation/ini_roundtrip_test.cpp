// What an INI file looks like on disk after it was opened, perhaps changed, and written back: an
// unchanged file is byte-identical, and a change touches only the bytes it must.

#include <gtest/gtest.h>

#include <algorithm>
#include <functional>
#include <string>

#include "foundation/inifile/ini_file.h"
#include "support/test_files.h"

namespace {

struct RoundTripCase {
  const char* name;
  std::string text;
  unsigned int flag;
};

class IniRoundTrip : public testing::TestWithParam<RoundTripCase> {};

TEST_P(IniRoundTrip, UnchangedFileIsWrittenBackByteForByte) {
  vxtest::TempDir dir;
  std::string path = dir.Path("odd.ini");
  vxtest::WriteFile(path, GetParam().text);
  vxMappedINIFile ini(path.c_str());
  ASSERT_EQ(0, ini.Open(GetParam().flag));
  ASSERT_EQ(0, ini.Close(1));
  EXPECT_EQ(GetParam().text, vxtest::ReadFile(path));
}

INSTANTIATE_TEST_SUITE_P(
    OddFiles, IniRoundTrip,
    testing::Values(
        RoundTripCase{"Empty", "", 1},
        RoundTripCase{"OnlyComments", "; one\n# two\n\n", 1},
        RoundTripCase{"Crlf", "[main]\r\nkey=value\r\n\r\n[next]\r\nk=v\r\n", 1},
        RoundTripCase{"MixedEndings", "[main]\nkey=value\r\nother=x\n[b]\r\nk=v\n", 1},
        RoundTripCase{"NoFinalLineEnd", "[main]\nkey=value", 1},
        RoundTripCase{"CommentLast", "[main]\nkey=value\n; closing", 1},
        RoundTripCase{"Preamble", "loose=1\n; note\n\n[main]\nkey=value\n", 1},
        RoundTripCase{"SpacesAroundEquals", "[main]\n  key   =   value  \t\n\tk2\t=\tv2\n", 1},
        RoundTripCase{"LinesWithoutEquals", "[main]\njust text\nkey=value\n=novalue\n[oops\n", 1},
        RoundTripCase{"Duplicates", "[a]\nk=1\nK=2\n[A]\nk=3\n", 1},
        RoundTripCase{"DoubledBrackets", "[[Filter1]]\nName=x\n[ spaced ] ; note [x]\n", 1},
        RoundTripCase{"NotUtf8", "[m\xe9]\nk\xff=\xfe\xc3(\x80\nbom=\xef\xbb\xbf\n", 1},
        RoundTripCase{"ByteOrderMark", "\xef\xbb\xbf[main]\r\nkey=value\r\n", 1},
        RoundTripCase{"LoneCarriageReturns", "[a]\rk=v\r\n\r\r\nx=y\r", 1},
        RoundTripCase{"NulByteWithFlagZero", std::string("[a]\nk=v\0w\n", 10), 0}),
    [](const testing::TestParamInfo<RoundTripCase>& info) { return info.param.name; });

struct EditCase {
  const char* name;
  std::string before;
  std::function<void(vxMappedINIFile&)> edit;
  std::string after;
};

class IniEdit : public testing::TestWithParam<EditCase> {};

TEST_P(IniEdit, ChangesOnlyWhatWasChanged) {
  vxtest::TempDir dir;
  std::string path = dir.Path("edit.ini");
  vxtest::WriteFile(path, GetParam().before);
  vxMappedINIFile ini(path.c_str());
  ASSERT_EQ(0, ini.Open(1));
  GetParam().edit(ini);
  ASSERT_EQ(0, ini.Close(1));
  EXPECT_EQ(GetParam().after, vxtest::ReadFile(path));
}

void Set(vxMappedINIFile& ini, const char* s, const char* k, const char* v) { ini.SetVal(s, k, v); }

INSTANTIATE_TEST_SUITE_P(
    Edits, IniEdit,
    testing::Values(
        EditCase{"ChangedValueKeepsPlaceAndSpacing", "[a]\r\n  k  =  old ; x \r\nz=1\r\n",
                 [](vxMappedINIFile& f) { Set(f, "a", "k", "new"); }, "[a]\r\n  k  =  new \r\nz=1\r\n"},
        EditCase{"EmptyValueGetsOneAfterTheBlanks", "[a]\nk = \n",
                 [](vxMappedINIFile& f) { Set(f, "a", "k", "v"); }, "[a]\nk = v\n"},
        EditCase{"CaseIgnoredSpellingKept", "[Defaults]\nPath=1\n",
                 [](vxMappedINIFile& f) { Set(f, "defaults", "PATH", "2"); }, "[Defaults]\nPath=2\n"},
        EditCase{"FirstOfDuplicateKeysIsSet", "[a]\nk=1\nk=2\n",
                 [](vxMappedINIFile& f) { Set(f, "a", "K", "3"); }, "[a]\nk=3\nk=2\n"},
        EditCase{"NewKeyAfterLastPropertyLine", "[a]\nx=1\n; tail\n\n[b]\ny=2\n",
                 [](vxMappedINIFile& f) { Set(f, "a", "new", "v"); },
                 "[a]\nx=1\nnew=v\n; tail\n\n[b]\ny=2\n"},
        EditCase{"NewLinesUseTheFileLineEnd", "[a]\r\nx=1",
                 [](vxMappedINIFile& f) { Set(f, "a", "n", "v"); Set(f, "b", "k", "w"); },
                 "[a]\r\nx=1\r\nn=v\r\n[b]\r\nk=w\r\n"},
        EditCase{"NewSectionAtEndAfterPreambleOnly", "; only a comment",
                 [](vxMappedINIFile& f) { f.SetVal("s", "n", -42L); }, "; only a comment\n[s]\nn=-42\n"},
        EditCase{"CallerTextStaysOnOneLine", "[a]\nk=1\n",
                 [](vxMappedINIFile& f) { Set(f, "a", "k", "x\n[evil]\nk=y"); Set(f, "a", "", "v"); },
                 "[a]\nk=x\n"},
        EditCase{"RemovedKeyLeavesItsComment", "[a]\n; about k\nk=1\nz=2\n",
                 [](vxMappedINIFile& f) { EXPECT_EQ(0, f.RemoveKey("a", "K")); }, "[a]\n; about k\nz=2\n"},
        EditCase{"RemovedLastKeyKeepsTrailingLines", "[a]\nx=1\n; c\nk=1\n\n[b]\n",
                 [](vxMappedINIFile& f) { EXPECT_EQ(0, f.RemoveKey("a", "k")); }, "[a]\nx=1\n; c\n\n[b]\n"},
        EditCase{"RemovingFirstDuplicateUncoversSecond", "[a]\nk=1\nk=2\n",
                 [](vxMappedINIFile& f) {
                   EXPECT_EQ(0, f.RemoveKey("a", "k"));
                   EXPECT_EQ("2", f.GetVal("a", "k").str());
                 },
                 "[a]\nk=2\n"},
        EditCase{"DoubledBracketsRenamed", "[[Filter1]]\r\nName=x\r\n",
                 [](vxMappedINIFile& f) { EXPECT_EQ(0, f.RenameSection("[filter1]", "Filter1")); },
                 "[Filter1]\r\nName=x\r\n"},
        EditCase{"UpdateMapSectionSetsAndAddsKeys", "[e]\na=1\nb=2\n[src]\nB=20\nc = 30\nc=31\n",
                 [](vxMappedINIFile& f) { f.UpdateMapSection("E", f.GetPropertyList("src")); },
                 "[e]\na=1\nb=20\nc = 30\n[src]\nB=20\nc = 30\nc=31\n"},
        EditCase{"AddMapSectionKeepsExistingValues", "[e]\na=1\nb=2\n[src]\nB=20\nc=30\n",
                 [](vxMappedINIFile& f) {
                   f.AddMapSection("e", f.GetPropertyList("src"));
                   f.AddMapSection("copy", f.GetPropertyList("src"));
                 },
                 "[e]\na=1\nb=2\nc=30\n[src]\nB=20\nc=30\n[copy]\nB=20\nc=30\n"},
        EditCase{"ValueChangedThroughTheLineList", "[a]\nk = 1 \n",
                 [](vxMappedINIFile& f) {
                   INILineList* lines = f.GetPropertyList("A");
                   auto it = std::find_if(lines->begin(), lines->end(), INILine::KeyCompare("K"));
                   ASSERT_NE(lines->end(), it);
                   (*it)->m_value = "2";
                 },
                 "[a]\nk = 2 \n"}),
    [](const testing::TestParamInfo<EditCase>& info) { return info.param.name; });

TEST(IniRoundTrip, TenMegabyteLineSurvives) {
  vxtest::TempDir dir;
  std::string path = dir.Path("huge.ini");
  std::string text = "[a]\nbig=" + std::string(10 << 20, 'x') + "\nk=v\n";
  vxtest::WriteFile(path, text);
  vxMappedINIFile ini(path.c_str());
  ASSERT_EQ(0, ini.Open(1));
  EXPECT_EQ(10u << 20, ini.GetVal("a", "big").length());
  ini.SetVal("a", "k", "w");
  ASSERT_EQ(0, ini.Close(1));
  text.replace(text.size() - 2, 1, "w");
  EXPECT_TRUE(text == vxtest::ReadFile(path));
}

}  // namespace
