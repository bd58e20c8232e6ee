// The report's JSON writer and reader: every byte a name or value may hold comes back as written,
// no control byte reaches the text raw, and malformed or hostile input is refused whole.

#include <gtest/gtest.h>

#include <string>

#include "foundation/string/json_text.h"

namespace {

TEST(JsonText, StringsComeBackAsWrittenWithNoRawControlBytes) {
  const std::string texts[] = {
      "",
      "plain",
      "quote \" and backslash \\ and slash /",
      std::string("nul \0 inside", 12),
      "line\nfeed\r\ttab\b\f",
      "\x01\x1f\x7f",
      "caf\xc3\xa9 \xe2\x82\xac",  // UTF-8 passes through
      "\xff\xfe not UTF-8",         // nor is any other byte changed
  };
  for (const std::string& text : texts) {
    std::string json = "[";
    vxJsonAppendString(json, text);
    json += ", ";
    vxJsonAppendString(json, text);
    json += "]";
    for (char c : json) EXPECT_FALSE(static_cast<unsigned char>(c) < 0x20 || c == 0x7f) << json;
    vxJsonValue value;
    ASSERT_TRUE(vxJsonParse(json, value)) << json;
    ASSERT_EQ(2u, value.items.size());
    EXPECT_EQ(text, value.items[1].text) << json;
  }
}

TEST(JsonText, ReadsWhatTheReportHolds) {
  vxJsonValue value;
  ASSERT_TRUE(vxJsonParse(" {\"schema\": 1, \"n\": -42, \"ok\": true, \"no\": false, \"none\": null,"
                          "\n \"list\": [{\"a\": \"\\u00e9\\/\"}, []], \"empty\": {}} ",
                          value));
  EXPECT_EQ(1, value["schema"].number);
  EXPECT_EQ(-42, value["n"].number);
  EXPECT_TRUE(value["ok"].boolean);
  EXPECT_EQ(vxJsonValue::Kind::kBool, value["no"].kind);
  EXPECT_FALSE(value["no"].boolean);
  EXPECT_EQ(vxJsonValue::Kind::kNull, value["none"].kind);
  EXPECT_EQ("\xc3\xa9/", value["list"].items[0]["a"].text);
  EXPECT_EQ(vxJsonValue::Kind::kObject, value["empty"].kind);
  EXPECT_EQ(vxJsonValue::Kind::kNull, value["absent"]["deeper"].kind);
}

TEST(JsonText, RefusesMalformedInputWhole) {
  const std::string bad[] = {
      "",           "{",         "[1,]",           "{\"a\" 1}",     "{\"a\": 1,}",
      "\"open",     "\"a\\x\"",  "\"\\u12\"",      "\"\\u12G4\"",   "[1] 2",
      "tru",        "-",         "nul",            "{1: 2}",        "[\"a\"\"b\"]",
      std::string("\"raw \n line\""), std::string("\"raw \x01\""), std::string(100, '['),
  };
  for (const std::string& text : bad) {
    vxJsonValue value;
    value.number = 7;
    EXPECT_FALSE(vxJsonParse(text, value)) << text;
    EXPECT_EQ(vxJsonValue::Kind::kNull, value.kind) << text;
    EXPECT_TRUE(value.members.empty() && value.items.empty() && value.number == 0) << text;
  }
  vxJsonValue nested;
  EXPECT_TRUE(vxJsonParse(std::string(60, '[') + std::string(60, ']'), nested));
}

}  // namespace
