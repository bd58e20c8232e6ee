// The protected text form of stored passwords and user names, and the older forms a stored value
// may still be in: what files on disk hold must read back exactly, and no input may make a reader
// write past the capacity it was given.

#include "crypt/protected_value.h"

#include <gtest/gtest.h>

#include <cctype>
#include <cstdio>
#include <cstring>
#include <string>
#include <vector>

namespace {

std::string Encrypt(std::string value) {
  std::vector<char> output(5 + 32 * ((value.size() + 3) / 16 + 1));
  EXPECT_EQ(1,
            VXUI_Encrypt(reinterpret_cast<unsigned char*>(&value[0]), value.size(), output.data()));
  return output.data();
}

struct Reading {
  int result;
  std::string value;
  unsigned int wasNotProtected;
};

// Reads stored with the given capacity, checking that nothing past the capacity was written.
Reading Decrypt(std::string stored, unsigned long capacity = 1024) {
  std::vector<unsigned char> output(capacity + 16, 0xA5);
  unsigned long length = capacity;
  Reading r{0, "", 7};
  r.result = VXUI_Decrypt(&stored[0], output.data(), &length, &r.wasNotProtected);
  for (std::size_t i = capacity; i < output.size(); ++i) EXPECT_EQ(0xA5, output[i]) << i;
  r.value.assign(reinterpret_cast<char*>(output.data()), r.result ? length : 0);
  return r;
}

class ProtectedRoundTrip : public ::testing::TestWithParam<int> {};

TEST_P(ProtectedRoundTrip, EveryLengthReadsBackExactly) {
  std::string value;
  for (int i = 0; i < GetParam(); ++i) value += static_cast<char>(i * 37 + GetParam());
  std::string stored = Encrypt(value);
  ASSERT_EQ(value.empty() ? 0 : 4 + 32 * ((value.size() + 3) / 16 + 1), stored.size());
  EXPECT_EQ(1, VXUI_IsOurTwoFish(&stored[0]));
  for (char c : stored) EXPECT_TRUE(std::isdigit(c) || (c >= 'A' && c <= 'F')) << stored;
  Reading r = Decrypt(stored);
  EXPECT_EQ(value, r.value);
  EXPECT_EQ(value.empty() ? 1u : 0u, r.wasNotProtected);  // the empty text counts as plain
}

INSTANTIATE_TEST_SUITE_P(Lengths0To492, ProtectedRoundTrip, ::testing::Range(0, 493));

// Worked out with the cipher alone: the length as four little-endian bytes, the value, zero filler
// to whole blocks; the key words E9D857A2 932234AD C27EF075 217EC990 given to the cipher as the
// bytes A2 57 D8 E9 AD 34 22 93 75 F0 7E C2 90 C9 7E 21; each cipher byte complemented and written
// in upper case between "D9" and "AB".
const char kPassword[] = "D9265FD237230134CD2AFFDC06B162A27CAB";
const char kThirteen[] = "D94490629D44004D8847ED03EC5B35318339D036732A405FA799614A6DA3FD41CAAB";

TEST(ProtectedValue, WorkedValuesEncryptAndReadBackInEitherCase) {
  const std::pair<std::string, std::string> worked[] = {
      {"a", "D960DD7EC77115455AD583997CCBBA0600AB"},
      {"password", kPassword},
      {"twelve bytes", "D9C3904A68B097395C8FD24419C349F197AB"},
      {"thirteen byte", kThirteen},
      {"exactly 28 bytes of a value.",
       "D9B9DD58F11F347D875C34C539BDCBA76508887CB39B0B4A57C157A7D508A25D11AB"}};
  for (const auto& [clear, stored] : worked) {
    EXPECT_EQ(stored, Encrypt(clear));
    std::string lower = stored;
    for (std::size_t i = 2; i + 2 < lower.size(); ++i)
      lower[i] = static_cast<char>(std::tolower(lower[i]));
    EXPECT_EQ(clear, Decrypt(stored).value);
    EXPECT_EQ(clear, Decrypt(lower).value);
  }
}

// The previous generation's form: four bytes of no meaning, the value and zero filler (40 bytes),
// each byte but the last XORed with the one after it, in hexadecimal of either case.
std::string PreviousGenerationForm(const std::string& clear, bool lowerCase) {
  unsigned char plain[40] = {0x13, 0x57, 0x9B, 0xDF};
  std::memcpy(plain + 4, clear.data(), clear.size());
  std::string text;
  for (int i = 0; i < 40; ++i) {
    char pair[3];
    std::snprintf(pair, sizeof(pair), lowerCase ? "%02x" : "%02X",
                  i < 39 ? plain[i] ^ plain[i + 1] : plain[i]);
    text += pair;
  }
  return text;
}

TEST(ProtectedValue, PreviousGenerationValuesReadAsClearTextGivenRoomFor37) {
  const std::pair<std::string, std::string> values[] = {
      {"", ""},
      {"user name", "user name"},
      {std::string("cut\0here", 8), "cut"},
      {"thirty-six characters, the most: 36!", "thirty-six characters, the most: 36!"}};
  for (const auto& [clear, read] : values) {
    for (bool lowerCase : {false, true}) {
      std::string stored = PreviousGenerationForm(clear, lowerCase);
      Reading r = Decrypt(stored);
      EXPECT_EQ(read, r.value);
      EXPECT_EQ(1u, r.wasNotProtected);
      EXPECT_EQ(1, Decrypt(stored, 37).result);
      EXPECT_EQ(0, Decrypt(stored, 36).result);
    }
  }
}

struct StoredText {
  const char* name;
  std::string stored;
  bool ours;          // by its shape
  std::string value;  // what is read
};

class StoredForms : public ::testing::TestWithParam<StoredText> {};

TEST_P(StoredForms, AreRecognisedAndReadAsTheirShapeSays) {
  StoredText t = GetParam();
  EXPECT_EQ(t.ours ? 1 : 0, VXUI_IsOurTwoFish(&t.stored[0]));
  Reading r = Decrypt(t.stored);
  EXPECT_EQ(1, r.result);
  EXPECT_EQ(t.value, r.value);
  EXPECT_EQ(t.ours && !t.stored.empty() ? 0u : 1u, r.wasNotProtected);
}

std::string With(std::string text, std::size_t position, char c) {
  text[position] = c;
  return text;
}

std::string ProtectedWithOtherKey(std::string clear) {
  std::string key(32, '7');
  char hex[33] = "";  // left empty on failure, which the test then reports
  TwoFishEncrypt(&key[0], reinterpret_cast<unsigned char*>(&clear[0]), clear.size(), hex);
  return std::string("D9") + hex + "AB";
}

const std::string kDigits = std::string(kPassword).substr(2, 32);
const std::string kEighty = "D9" + std::string(76, '0') + "AB";

INSTANTIATE_TEST_SUITE_P(
    Forms, StoredForms,
    ::testing::Values(
        StoredText{"Empty", "", true, ""}, StoredText{"Plain", "hunter2", false, "hunter2"},
        StoredText{"MarkersOnly", "D9AB", false, "D9AB"},
        StoredText{"WrongSuffix", With(kPassword, 35, 'C'), false, With(kPassword, 35, 'C')},
        StoredText{"LowerCaseMarkers", "d9" + kDigits + "ab", false, "d9" + kDigits + "ab"},
        StoredText{"OddDigitCount", "D9" + kDigits.substr(1) + "AB", false,
                   "D9" + kDigits.substr(1) + "AB"},
        // Eighty digits are the old form even with the markers: every byte XORed down to 0xAB.
        StoredText{"EightyWithMarkers", kEighty, false, std::string(36, '\xAB')},
        StoredText{"EightyNonHex", std::string(80, 'z'), false, std::string(80, 'z')},
        // Ours by shape but not decryptable: read as the empty value.
        StoredText{"NonHexDigit", With(kPassword, 9, 'G'), true, ""},
        StoredText{"NonHexLastPair", With(kPassword, 33, 'x'), true, ""},
        StoredText{"ChangedDigit", With(kPassword, 2, '3'), true, ""},
        StoredText{"BlocksSwapped",
                   "D9" + std::string(kThirteen + 34, 32) + std::string(kThirteen + 2, 32) + "AB",
                   true, ""},
        StoredText{"OtherKey", ProtectedWithOtherKey("password"), true, ""}),
    [](const ::testing::TestParamInfo<StoredText>& info) { return info.param.name; });

class SmallCapacity : public ::testing::TestWithParam<unsigned long> {};

TEST_P(SmallCapacity, ValuesAreCutWithinTheCapacity) {
  unsigned long capacity = GetParam();
  std::string value = "a value of 20 bytes.";
  EXPECT_EQ(value.substr(0, capacity), Decrypt(Encrypt(value), capacity).value);
  // Plain text keeps room for its terminating zero.
  std::string plain =
      capacity > value.size() ? value : value.substr(0, capacity ? capacity - 1 : 0);
  EXPECT_EQ(plain, Decrypt(value, capacity).value);

  // The keyed reader leaves the capacity as the count when the value is longer.
  char key[33];
  GetProtectedValueKey(key);
  std::string hex = Encrypt(value).substr(2, 32 * 2);
  std::vector<unsigned char> output(capacity + 1, 0xA5);
  unsigned long length = capacity;
  ASSERT_EQ(1, TwoFishDecrypt(key, &hex[0], output.data(), &length));
  EXPECT_EQ(std::min<unsigned long>(capacity, value.size()), length);
  EXPECT_EQ(0xA5, output[capacity]);
}

INSTANTIATE_TEST_SUITE_P(Capacities, SmallCapacity,
                         ::testing::Values(0ul, 1ul, 19ul, 20ul, 21ul, 64ul));

TEST(ProtectedValue, BadArgumentsFailWithoutWriting) {
  char key[33];
  GetProtectedValueKey(key);
  unsigned char data[8] = "abcd";
  char output[40] = "untouched";
  unsigned long length = sizeof(data);
  std::string hex = kDigits;
  for (std::string k : {std::string(31, 'A'), std::string(48, 'A'), "G" + std::string(31, 'A')}) {
    EXPECT_EQ(0, TwoFishEncrypt(&k[0], data, 4, output)) << k;
    EXPECT_EQ(0, TwoFishDecrypt(&k[0], &hex[0], data, &length)) << k;
  }
  for (std::string h : {hex.substr(0, 16), hex + "FF", std::string()}) {
    EXPECT_EQ(0, TwoFishDecrypt(key, &h[0], data, &length)) << h;
  }
  EXPECT_EQ(0, TwoFishEncrypt(nullptr, data, 4, output) + TwoFishEncrypt(key, nullptr, 4, output) +
                   TwoFishEncrypt(key, data, 4, nullptr) +
                   TwoFishDecrypt(nullptr, &hex[0], data, &length) +
                   TwoFishDecrypt(key, nullptr, data, &length) +
                   TwoFishDecrypt(key, &hex[0], nullptr, &length) +
                   TwoFishDecrypt(key, &hex[0], data, nullptr) + VXUI_Encrypt(nullptr, 4, output) +
                   VXUI_Decrypt(nullptr, data, &length, nullptr) +
                   VXUI_Decrypt(output, data, nullptr, nullptr) + VXUI_IsOurTwoFish(nullptr));
  EXPECT_STREQ("untouched", output);
  EXPECT_EQ(sizeof(data), length);
  std::string odd = hex + "F";  // a trailing odd digit is ignored
  ASSERT_EQ(1, TwoFishDecrypt(key, &odd[0], data, &length));
  EXPECT_EQ("password", std::string(data, data + length));
}

}  // namespace
