// The legacy encoding and the in-place conversions that profile migration and the edition
// conversion apply to stored passwords and user names.

#include <gtest/gtest.h>

#include <string>

#include "crypt/legacy_pad.h"
#include "crypt/protected_value.h"
#include "crypt/value_conversion.h"
#include "foundation/string/string_base.h"

namespace {

std::string Legacy(std::string text) {
  Obsolete_EncodePasswordOrUserName(&text[0]);
  return text.c_str();  // the encoding may end the text early
}

class LegacyEncoding : public ::testing::TestWithParam<std::string> {};

TEST_P(LegacyEncoding, IsItsOwnInverseAndChangesTheText) {
  std::string encoded = Legacy(GetParam());
  ASSERT_EQ(GetParam().size(), encoded.size());
  if (!GetParam().empty()) {
    EXPECT_NE(GetParam(), encoded);
  }
  EXPECT_EQ(GetParam(), Legacy(encoded));
}

// Longer than the pad, so that it repeats.
INSTANTIATE_TEST_SUITE_P(Texts, LegacyEncoding,
                         ::testing::Values("", "a", "Administrator", "p@ssw0rd!",
                                           std::string(150, 'w') + "xyz"));

TEST(LegacyEncodingEdges, KeepsLineBreaksAndEndsWhereAByteMeetsItsPad) {
  // A carriage return or line feed that would come out of the XOR is left as it was.
  std::string text = "a";
  text += static_cast<char>(vxcrypt::kLegacyPad[1] ^ '\r');
  text += static_cast<char>(vxcrypt::kLegacyPad[2] ^ '\n');
  text += "\r\n";
  std::string encoded = text;
  Obsolete_EncodePasswordOrUserName(&encoded[0]);
  EXPECT_EQ(text[1], encoded[1]);
  EXPECT_EQ(text[2], encoded[2]);
  EXPECT_NE(text[4], encoded[4]);  // a line feed in the text is encoded like any other byte

  ASSERT_NE(0, vxcrypt::kLegacyPad[1]);
  std::string meets = "a";
  meets += static_cast<char>(vxcrypt::kLegacyPad[1]);
  meets += "tail";
  Obsolete_EncodePasswordOrUserName(&meets[0]);
  EXPECT_EQ(1u, std::string(meets.c_str()).size());
  EXPECT_EQ("tail", meets.substr(2));  // nothing after the end is touched
  Obsolete_EncodePasswordOrUserName(nullptr);
}

TEST(ConvertToProtectedValue, LegacyValueBecomesProtectedAndReadsBackClear) {
  for (std::string clear : {"secret", "a much longer user name, with blanks", "x"}) {
    vxStringBase value(Legacy(clear).c_str());
    EXPECT_EQ(0, ConvertToProtectedValue(value));
    EXPECT_EQ(1, VXUI_IsOurTwoFish(const_cast<char*>(value.c_str())));
    vxStringBase once(value);
    EXPECT_EQ(0, ConvertToProtectedValue(value));  // already protected: untouched
    EXPECT_EQ(once, value);
    EXPECT_EQ(0, DecryptToClearText(value));
    EXPECT_EQ(clear, value.str());
  }
}

struct Sized {
  std::size_t clearLength;
  int result;
};

class ConvertSizes : public ::testing::TestWithParam<Sized> {};

// 492 bytes give 31 blocks, 996 characters and the zero: the most the buffers take.
TEST_P(ConvertSizes, ValuesBeyondTheWorkingBuffersAreLeftUnchanged) {
  std::string clear(GetParam().clearLength, 'w');  // no pad byte turns 'w' into 0, CR or LF
  vxStringBase value(Legacy(clear).c_str());
  vxStringBase before(value);
  EXPECT_EQ(GetParam().result, ConvertToProtectedValue(value));
  if (GetParam().result != 0) {
    EXPECT_EQ(before, value);
  } else {
    EXPECT_EQ(4 + 32 * ((clear.size() + 3) / 16 + 1), value.length());
    EXPECT_EQ(0, DecryptToClearText(value));
    EXPECT_EQ(clear, value.str());
  }
}

INSTANTIATE_TEST_SUITE_P(Lengths, ConvertSizes,
                         ::testing::Values(Sized{492, 0}, Sized{493, 1}, Sized{1023, 1},
                                           Sized{1024, 1}, Sized{5000, 1}));

struct Stored {
  std::string value;
  std::string clear;
};

class DecryptForms : public ::testing::TestWithParam<Stored> {};

TEST_P(DecryptForms, GiveTheClearTextOrKeepThePlainValue) {
  vxStringBase value(GetParam().value.c_str());
  EXPECT_EQ(0, DecryptToClearText(value));
  EXPECT_EQ(GetParam().clear, value.str());
}

INSTANTIATE_TEST_SUITE_P(
    Forms, DecryptForms,
    ::testing::Values(Stored{"", ""}, Stored{"D9265FD237230134CD2AFFDC06B162A27CAB", "password"},
                      Stored{"D9265FD237230134CD2AFFDC06B162A27CAA", "D9265FD237230134CD2AFFDC06B162A27CAA"},
                      Stored{"D9365FD237230134CD2AFFDC06B162A27CAB", ""},  // does not decrypt
                      // The previous generation's form of "ab" (bytes 0 0 0 0 61 62 0 ...), each
                      // byte XORed with the one after it.
                      Stored{"00000061" "0362" + std::string(68, '0'), "ab"},
                      Stored{Legacy("still legacy"), Legacy("still legacy")},
                      Stored{std::string(1023, 'p'), std::string(1023, 'p')}));

TEST(DecryptToClearText, ValueTooLongForTheBufferIsLeftUnchanged) {
  vxStringBase value(std::string(1024, 'p').c_str());
  EXPECT_EQ(1, DecryptToClearText(value));
  EXPECT_EQ(1024u, value.length());
}

}  // namespace
