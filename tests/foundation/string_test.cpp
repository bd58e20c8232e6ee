// Behaviour of the string, tokenizer and version descriptor that the migration code relies on.

#include <gtest/gtest.h>

#include <climits>
#include <iterator>
#include <string>
#include <vector>

#include "foundation/string/string_base.h"
#include "foundation/string/tokenizer.h"
#include "foundation/string/version.h"

namespace {

using Pieces = std::vector<std::string>;
const unsigned int kBad = vxStringBase::BadIndex;

TEST(StringBase, SearchesEditsAndNumbersHandleTheEdges) {
  vxStringBase s(std::string_view("Section0_Name\0x", 15));
  EXPECT_EQ(9u, s.find("name", 0, false));
  EXPECT_EQ(kBad, s.find("name", 0, true));
  EXPECT_EQ(kBad, s.find("Sec", 100, true));
  EXPECT_EQ(2u, s.find("ctXX", 0, 2, true));  // only the first two bytes
  EXPECT_EQ(kBad, s.rfind('_', 7));
  EXPECT_EQ(kBad, vxStringBase().rfind('/'));
  EXPECT_EQ("Section0", s.subString(0, s.rfind('_') - 1).str());  // both bounds included
  EXPECT_EQ(std::string("Name\0x", 6), s.subString(s.rfind('_') + 1, 500).str());
  EXPECT_TRUE(s.subString(50, 60).isEmpty() && s.subString(3, 2).isEmpty());
  s.append(-42L).prepend("<<", 1);
  s.del(1, 8);
  s.cut(1);
  EXPECT_EQ(std::string("<_Name\0x-4", 10), s.str());
  s.del(6, kBad);
  EXPECT_EQ("<_Name", s.str());
  vxStringBase a("aaa/DATFILES");
  EXPECT_EQ(4u, a.replace("a", "aa", 0, false));  // replaced text is not scanned again
  EXPECT_EQ("aaaaaa/DaaTFILES", a.str());
  vxStringBase padded(" \t value \r\n");
  padded.stripWhite(vxStringBase::kBoth);
  EXPECT_EQ("value", padded.str());
  const std::pair<const char*, long> numbers[] = {{"  -7x", -7}, {"abc", 0},
      {"9999999999999999999", LONG_MAX}, {"-9999999999999999999", LONG_MIN}};
  for (auto [text, number] : numbers) EXPECT_EQ(number, vxStringBase(text).asLong()) << text;
}

Pieces Tokens(const char* text, bool keepEmpty) {
  vxBStringTokenizer tokenizer(vxStringBase(text), vxBStringTokenizer::m_csvToken, keepEmpty);
  Pieces pieces;
  for (vxStringBase piece; tokenizer.GetNext(piece);) pieces.push_back(piece.str());
  return pieces;
}

TEST(StringBase, ListsSplitIntoFieldsThatKeepTheirPlaces) {
  vxStringBase list("a.wlp, b.wlp,,c.wlp,");
  Pieces names;
  vxStringBase name;
  for (unsigned int at = 0; at != kBad && at < list.length();) {
    at = list.subString(',', name, at, list.length() - 1);
    names.push_back(name.str());
  }
  EXPECT_EQ((Pieces{"a.wlp", " b.wlp", "", "c.wlp"}), names);
  EXPECT_EQ(Pieces{}, Tokens("", true));
  EXPECT_EQ((Pieces{"a", "", "b", ""}), Tokens("a,,b,", true));
  EXPECT_EQ((Pieces{"a", "b"}), Tokens("a,,b,", false));
}

TEST(Version, OrdersByNumbersNotText) {
  const char* ascending[] = {"beta", "0.1", "5.1", "5.1.3", "5.9", "5.10", "5.99.99", "6"};
  for (size_t i = 0; i < std::size(ascending); ++i) {
    for (size_t j = 0; j < std::size(ascending); ++j) {
      vxVersionDescriptor a(ascending[i]), b(ascending[j]);
      EXPECT_EQ(i < j, a < b) << ascending[i] << " < " << ascending[j];
      EXPECT_EQ(i > j, a > b) << ascending[i] << " > " << ascending[j];
      EXPECT_EQ(i == j, a == b) << ascending[i] << " == " << ascending[j];
      EXPECT_EQ(i >= j && a.m_major == b.m_major, b.IsInline(a)) << ascending[i] << " inline";
    }
  }
  EXPECT_TRUE(vxVersionDescriptor("5.1") == vxVersionDescriptor("5.1.0"));
  EXPECT_EQ(INT32_MAX, vxVersionDescriptor("99999999999.2").m_major);  // saturates, never wraps
}

}  // namespace
