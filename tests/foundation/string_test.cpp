// Behaviour of the string, tokenizer and version descriptor that the migration code relies on.

#include <gtest/gtest.h>

#include <climits>
#include <string>
#include <vector>

#include "foundation/string/string_base.h"
#include "foundation/string/tokenizer.h"
#include "foundation/string/version.h"

namespace {

TEST(StringBase, SearchesReportBadIndexAndRespectTheCaseFlag) {
  vxStringBase s("Section0_Name");
  EXPECT_EQ(vxStringBase::BadIndex, s.find("absent"));
  EXPECT_EQ(vxStringBase::BadIndex, s.find("name", 0, true));
  EXPECT_EQ(9u, s.find("name", 0, false));
  EXPECT_EQ(vxStringBase::BadIndex, s.find("Section", 1, true));
  EXPECT_EQ(vxStringBase::BadIndex, s.find("Sec", 100, true));  // start past the end
  EXPECT_EQ(2u, s.find("ctXX", 0, 2, true));                      // only the first two bytes
  EXPECT_EQ(8u, s.rfind('_'));
  EXPECT_EQ(vxStringBase::BadIndex, s.rfind('_', 7));
  EXPECT_EQ(vxStringBase::BadIndex, vxStringBase().rfind('/'));
  EXPECT_GT(vxStringBase::BadIndex, 2u);  // "position < 2" tests exclude it
}

TEST(StringBase, AppendPrependCutAndDelEditTheRightBytes) {
  vxStringBase s;
  s.append("abcdef", 0).append("xyz", 2).append('!').append(-42L);
  EXPECT_EQ("abcdefxy!-42", s.str());
  s.prepend("<<", 1);
  EXPECT_EQ("<abcdefxy!-42", s.str());
  s.del(0, 0);
  s.cut(1);
  EXPECT_EQ("abcdefxy!-4", s.str());
  s.del(0, 7);
  EXPECT_EQ("!-4", s.str());
  s.del(1, vxStringBase::BadIndex);
  EXPECT_EQ("!", s.str());
  s.cut(5);  // more than it holds
  EXPECT_TRUE(s.isEmpty());
  s.del(3, 4);  // nothing there: no effect, no crash
  EXPECT_TRUE(s.isEmpty());
}

TEST(StringBase, SubStringTakesInclusiveBoundsAndClampsTheEnd) {
  vxStringBase path("a/b/index.htm");
  unsigned int slash = path.rfind('/');
  EXPECT_EQ("a/b", path.subString(0, slash - 1).str());
  EXPECT_EQ("index.htm", path.subString(slash + 1, path.length()).str());
  EXPECT_TRUE(path.subString(50, 60).isEmpty());
  EXPECT_TRUE(path.subString(3, 2).isEmpty());
}

TEST(StringBase, DelimitedSubStringWalksAList) {
  vxStringBase list("a.wlp, b.wlp,,c.wlp,");
  std::vector<std::string> names;
  vxStringBase name;
  unsigned int position = 0;
  while (position != vxStringBase::BadIndex && position < list.length()) {
    position = list.subString(',', name, position, list.length() - 1);
    names.push_back(name.str());
  }
  EXPECT_EQ((std::vector<std::string>{"a.wlp", " b.wlp", "", "c.wlp"}), names);
}

TEST(StringBase, ReplaceStripAndEquals) {
  vxStringBase s("datfiles/x/DATFILES");
  EXPECT_EQ(2u, s.replace("datfiles", "console_datfiles", 0, false));
  EXPECT_EQ("console_datfiles/x/console_datfiles", s.str());
  vxStringBase again("aaa");
  EXPECT_EQ(3u, again.replace("a", "aa"));  // replaced text is not scanned again
  EXPECT_EQ("aaaaaa", again.str());
  vxStringBase padded(" \t value \r\n");
  padded.stripWhite(vxStringBase::kBoth);
  EXPECT_EQ("value", padded.str());
  EXPECT_TRUE(vxStringBase("Yes").equals("yes", false));
  EXPECT_FALSE(vxStringBase("Yes").equals("yes", true));
  EXPECT_FALSE(vxStringBase("Yes").equals("Yes ", false));
}

TEST(StringBase, AsLongReadsLeadingDigitsAndSaturates) {
  EXPECT_EQ(250, vxStringBase("250").asLong());
  EXPECT_EQ(-7, vxStringBase("  -7x").asLong());
  EXPECT_EQ(0, vxStringBase("abc").asLong());
  EXPECT_EQ(0, vxStringBase("").asLong());
  EXPECT_EQ(LONG_MAX, vxStringBase("99999999999999999999999").asLong());
  EXPECT_EQ(LONG_MIN, vxStringBase("-99999999999999999999999").asLong());
}

TEST(StringBase, HoldsBytesThatAreNotText) {
  std::string bytes("a\0b\xff", 4);
  vxStringBase s(bytes.data(), bytes.size());
  EXPECT_EQ(4u, s.length());
  EXPECT_EQ(2u, s.find('b'));
}

std::vector<std::string> Pieces(const char* text, const char* delimiters, bool keepEmpty) {
  vxBStringTokenizer tokenizer(vxStringBase(text), delimiters, keepEmpty);
  std::vector<std::string> pieces;
  vxStringBase piece;
  while (tokenizer.GetNext(piece)) pieces.push_back(piece.str());
  return pieces;
}

TEST(Tokenizer, KeepsEmptyFieldsInPlaceWhenAsked) {
  using V = std::vector<std::string>;
  EXPECT_EQ(V{}, Pieces("", ",", true));
  EXPECT_EQ((V{"a", "", "b"}), Pieces("a,,b", ",", true));
  EXPECT_EQ((V{"a", "b"}), Pieces("a,,b", ",", false));
  EXPECT_EQ((V{"a", ""}), Pieces("a,", ",", true));
  EXPECT_EQ((V{"/bin", "/usr/bin"}), Pieces("/bin:/usr/bin", ":", true));
  EXPECT_EQ((V{"exe", "zip"}), Pieces("exe zip", vxBStringTokenizer::m_spToken, true));
}

TEST(Version, ComparesNumbersNotText) {
  EXPECT_TRUE(vxVersionDescriptor("5.10") > vxVersionDescriptor("5.9"));
  EXPECT_TRUE(vxVersionDescriptor("5.1") == vxVersionDescriptor("5.1.0"));
  EXPECT_TRUE(vxVersionDescriptor("5.1.3") > vxVersionDescriptor("5.1"));
  EXPECT_TRUE(vxVersionDescriptor("6") > vxVersionDescriptor("5.99.99"));
  EXPECT_FALSE(vxVersionDescriptor("5.5") < vxVersionDescriptor("5.5"));
}

TEST(Version, MalformedTextsParseToZeroParts) {
  vxVersionDescriptor empty("");
  EXPECT_EQ(0, empty.m_major);
  EXPECT_EQ(0, empty.m_minor);
  vxVersionDescriptor odd("3.1.a");
  EXPECT_EQ(3, odd.m_major);
  EXPECT_EQ(1, odd.m_minor);
  EXPECT_EQ(0, odd.m_third);
  vxVersionDescriptor huge("99999999999.2");
  EXPECT_EQ(INT32_MAX, huge.m_major);
  EXPECT_EQ(2, huge.m_minor);
  EXPECT_TRUE(vxVersionDescriptor("beta") < vxVersionDescriptor("0.1"));
}

TEST(Version, InlineSuccessorSharesTheMajorNumber) {
  vxVersionDescriptor v55("5.5");
  EXPECT_TRUE(v55.IsInline(vxVersionDescriptor("5.7")));
  EXPECT_TRUE(v55.IsInline(vxVersionDescriptor("5.5")));
  EXPECT_FALSE(v55.IsInline(vxVersionDescriptor("6.0")));
  EXPECT_FALSE(v55.IsInline(vxVersionDescriptor("5.1")));
}

}  // namespace
