// The legacy encoding and the in-place conversions that profile migration and the edition
// conversion apply to stored passwords and user names.

#include "crypt/value_conversion.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "crypt/legacy_pad.h"
#include "crypt/protected_value.h"
#include "foundation/string/string_base.h"

namespace {

std::string Legacy(std::string text) {
  Obsolete_EncodePasswordOrUserName(&text[0]);
  return text.c_str();  // the encoding may end the text early
}

// Encoding is its own inverse, except that a byte which would become a carriage return or line
// feed is kept (it would break the settings-file line the value sits on) and one that meets its
// pad byte becomes zero and ends the text.
TEST(LegacyEncoding, IsItsOwnInverseKeepsLineBreakBytesAndEndsWhereAByteMeetsItsPad) {
  for (std::string text : {std::string("p@ssw0rd!"), std::string(150, 'w') + "xyz"}) {
    EXPECT_EQ(text.size(), Legacy(text).size());
    EXPECT_NE(text, Legacy(text));
    EXPECT_EQ(text, Legacy(Legacy(text)));
  }
  const unsigned char* pad = vxcrypt::kLegacyPad;
  std::string text = {'a', char(pad[1] ^ '\r'), 'b', char(pad[3] ^ '\n'), char(pad[4]), 't'};
  const std::string encoded = {char('a' ^ pad[0]), text[1], char('b' ^ pad[2]), text[3], '\0', 't'};
  Obsolete_EncodePasswordOrUserName(&text[0]);
  EXPECT_EQ(encoded, text);
}

// 492 bytes give 31 blocks, 996 characters and the zero: the most the working buffers take.
TEST(ConvertToProtectedValue, LegacyValueBecomesProtectedOnceAndReadsBackClear) {
  for (std::size_t n : {0, 1, 70, 492, 493, 1023, 1024}) {
    std::string clear(n, 'w');  // no pad byte turns 'w' into 0, CR or LF
    vxStringBase value(Legacy(clear).c_str());
    ASSERT_EQ(n > 492 ? 1 : 0, ConvertToProtectedValue(value)) << n;
    if (n > 492) {
      EXPECT_EQ(Legacy(clear), value.str());  // refused: left exactly as it was
      continue;
    }
    EXPECT_EQ(n == 0 ? 0 : 4 + 32 * ((n + 3) / 16 + 1), value.length());
    const vxStringBase once(value);
    EXPECT_EQ(0, ConvertToProtectedValue(value));
    EXPECT_EQ(once, value);
    EXPECT_EQ(0, DecryptToClearText(value));
    EXPECT_EQ(clear, value.str());
  }
}

// A value of 1024 characters or more is refused and left unchanged.
TEST(DecryptToClearText, ReadsEveryFormAndKeepsWhatItCannotRead) {
  const std::pair<std::string, std::string> values[] = {
      {"D9265FD237230134CD2AFFDC06B162A27CAB", "password"},
      {"D9365FD237230134CD2AFFDC06B162A27CAB", ""},  // does not decrypt
      // The previous generation's "ab": bytes 0 0 0 0 61 62 0 ..., each XORed with the next.
      {"000000610362" + std::string(68, '0'), "ab"},
      {Legacy("still legacy"), Legacy("still legacy")},
      {std::string(1023, 'p'), std::string(1023, 'p')},
      {std::string(1024, 'p'), std::string(1024, 'p')}};
  for (const auto& [stored, clear] : values) {
    vxStringBase value(stored.c_str());
    EXPECT_EQ(stored.size() < 1024 ? 0 : 1, DecryptToClearText(value));
    EXPECT_EQ(clear, value.str());
  }
}

// The one-step conversion to clear text must end exactly where protecting and then reading does,
// with the same result, for every form a stored value may be in.
TEST(ConvertToClearText, EndsWhereProtectingAndReadingEnds) {
  std::vector<std::string> stored = {
      "", "D9265FD237230134CD2AFFDC06B162A27CAB", "D9365FD237230134CD2AFFDC06B162A27CAB",
      "000000610362" + std::string(68, '0'),  // 80 digits: read as legacy here, not as old form
      std::string("\0hidden", 7), std::string(1023, 'p'), std::string(1024, 'p')};
  for (std::size_t n : {1, 8, 70, 491, 492, 493, 600, 1023}) {
    stored.push_back(Legacy(std::string(n, 'w')));
  }
  unsigned seed = 12345;
  for (int i = 0; i < 200; ++i) {  // printable texts as a user might have typed them
    std::string text(1 + i % 40, ' ');
    for (char& c : text) c = static_cast<char>(32 + (seed = seed * 1103515245 + 12345) % 95);
    stored.push_back(Legacy(text));
  }
  for (const std::string& s : stored) {
    vxStringBase twoSteps(s.c_str(), s.size());
    vxStringBase oneStep(twoSteps);
    const int expected = ConvertToProtectedValue(twoSteps);
    DecryptToClearText(twoSteps);
    EXPECT_EQ(expected, ConvertToClearText(oneStep)) << s;
    EXPECT_EQ(twoSteps.str(), oneStep.str()) << s;
  }
  vxStringBase password(Legacy("password").c_str());
  EXPECT_EQ(0, ConvertToClearText(password));
  EXPECT_EQ("password", password.str());
}

}  // namespace
