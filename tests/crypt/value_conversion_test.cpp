// The legacy encoding and the in-place conversions that profile migration and the edition
// conversion apply to stored passwords and user names.

#include "crypt/value_conversion.h"

#include <gtest/gtest.h>

#include <string>

#include "crypt/legacy_pad.h"
#include "crypt/protected_value.h"
#include "foundation/string/string_base.h"

namespace {

std::string Legacy(std::string text) {
  Obsolete_EncodePasswordOrUserName(&text[0]);
  return text.c_str();  // the encoding may end the text early
}

TEST(LegacyEncoding, IsItsOwnInverseOverMoreThanOnePad) {
  for (std::string text :
       {std::string("Administrator"), std::string("p@ssw0rd!"), std::string(150, 'w') + "xyz"}) {
    std::string encoded = Legacy(text);
    ASSERT_EQ(text.size(), encoded.size());
    EXPECT_NE(text, encoded);
    EXPECT_EQ(text, Legacy(encoded));
  }
}

TEST(LegacyEncoding, NeverMakesLineBreaksAndEndsWhereAByteMeetsItsPad) {
  std::string text = "a";
  text += static_cast<char>(vxcrypt::kLegacyPad[1] ^ '\r');  // would become a carriage return
  text += static_cast<char>(vxcrypt::kLegacyPad[2] ^ '\n');  // would become a line feed
  text += static_cast<char>(vxcrypt::kLegacyPad[3]);         // becomes zero: the end
  text += "tail";
  std::string encoded = text;
  Obsolete_EncodePasswordOrUserName(&encoded[0]);
  EXPECT_EQ(text.substr(1, 2), encoded.substr(1, 2));
  EXPECT_EQ('\0', encoded[3]);
  EXPECT_EQ("tail", encoded.substr(4));  // nothing after the end is touched
  Obsolete_EncodePasswordOrUserName(nullptr);
}

struct Conversion {
  std::size_t clearLength;
  int result;  // 1: too long for the working buffers, left unchanged
};

class ConvertToProtected : public ::testing::TestWithParam<Conversion> {};

// 492 bytes give 31 blocks, 996 characters and the zero: the most the buffers take.
TEST_P(ConvertToProtected, LegacyValueBecomesProtectedOnceAndReadsBackClear) {
  std::string clear(GetParam().clearLength, 'w');  // no pad byte turns 'w' into 0, CR or LF
  vxStringBase value(Legacy(clear).c_str());
  vxStringBase before(value);
  EXPECT_EQ(GetParam().result, ConvertToProtectedValue(value));
  if (GetParam().result != 0) {
    EXPECT_EQ(before, value);
    return;
  }
  EXPECT_EQ(clear.empty() ? 0 : 4 + 32 * ((clear.size() + 3) / 16 + 1), value.length());
  vxStringBase once(value);
  EXPECT_EQ(0, ConvertToProtectedValue(value));
  EXPECT_EQ(once, value);
  EXPECT_EQ(0, DecryptToClearText(value));
  EXPECT_EQ(clear, value.str());
}

INSTANTIATE_TEST_SUITE_P(Lengths, ConvertToProtected,
                         ::testing::Values(Conversion{0, 0}, Conversion{1, 0}, Conversion{70, 0},
                                           Conversion{492, 0}, Conversion{493, 1},
                                           Conversion{1023, 1}, Conversion{1024, 1}));

TEST(DecryptToClearText, ReadsEveryFormAndKeepsWhatItCannotRead) {
  const std::pair<std::string, std::string> values[] = {
      {"D9265FD237230134CD2AFFDC06B162A27CAB", "password"},
      {"D9365FD237230134CD2AFFDC06B162A27CAB", ""},  // does not decrypt
      // The previous generation's "ab": bytes 0 0 0 0 61 62 0 ..., each XORed with the next.
      {"00000061"
       "0362" +
           std::string(68, '0'),
       "ab"},
      {Legacy("still legacy"), Legacy("still legacy")},
      {std::string(1023, 'p'), std::string(1023, 'p')}};
  for (const auto& [stored, clear] : values) {
    vxStringBase value(stored.c_str());
    EXPECT_EQ(0, DecryptToClearText(value));
    EXPECT_EQ(clear, value.str());
  }
  vxStringBase tooLong(std::string(1024, 'p').c_str());
  EXPECT_EQ(1, DecryptToClearText(tooLong));
  EXPECT_EQ(1024u, tooLong.length());
}

}  // namespace
