// The protected text form of stored passwords and user names, and the older forms a stored value
// may still be in: what files on disk hold must read back exactly, and no input may make a reader
// write past the capacity it was given.

#include <gtest/gtest.h>

#include <cctype>
#include <cstring>
#include <string>
#include <vector>

#include "crypt/protected_value.h"

namespace {

std::string Encrypt(const std::string& value) {
  std::vector<char> output(5 + 32 * ((value.size() + 3) / 16 + 1), '\x7F');
  std::string copy(value);
  EXPECT_EQ(1, VXUI_Encrypt(reinterpret_cast<unsigned char*>(&copy[0]), copy.size(), output.data()));
  return output.data();
}

struct Reading {
  int result;
  std::string value;
  unsigned int wasNotProtected;
};

// Reads stored with the given capacity; also checks that nothing past the capacity was written.
Reading Decrypt(std::string stored, unsigned long capacity = 1024) {
  std::vector<unsigned char> output(capacity + 16, 0xA5);
  unsigned long length = capacity;
  unsigned int flag = 7;
  Reading r;
  r.result = VXUI_Decrypt(&stored[0], output.data(), &length, &flag);
  for (std::size_t i = capacity; i < output.size(); ++i) EXPECT_EQ(0xA5, output[i]) << i;
  r.value.assign(reinterpret_cast<char*>(output.data()), r.result ? length : 0);
  r.wasNotProtected = flag;
  return r;
}

// Bytes of every value 0 to 255, zero and 0xFF included, varying with the length.
std::string SampleValue(std::size_t length) {
  std::string value;
  for (std::size_t i = 0; i < length; ++i) value += static_cast<char>((i * 37 + length) & 0xFF);
  return value;
}

class ProtectedRoundTrip : public ::testing::TestWithParam<int> {};

TEST_P(ProtectedRoundTrip, EveryLengthReadsBackExactly) {
  std::string value = SampleValue(static_cast<std::size_t>(GetParam()));
  std::string stored = Encrypt(value);
  std::size_t blocks = (value.size() + 3) / 16 + 1;
  ASSERT_EQ(value.empty() ? 0 : 4 + 32 * blocks, stored.size());
  EXPECT_EQ(1, VXUI_IsOurTwoFish(&stored[0]));
  for (char c : stored) EXPECT_TRUE(std::isdigit(c) || (c >= 'A' && c <= 'F')) << stored;

  Reading r = Decrypt(stored);
  EXPECT_EQ(1, r.result);
  EXPECT_EQ(value, r.value);
  EXPECT_EQ(value.empty() ? 1u : 0u, r.wasNotProtected);  // the empty text counts as plain

  // The same through the keyed functions with a 256-bit key.
  std::string key(64, 'c');
  std::vector<char> hex(32 * blocks + 1);
  std::string copy(value);
  ASSERT_EQ(1, TwoFishEncrypt(&key[0], reinterpret_cast<unsigned char*>(&copy[0]), copy.size(),
                              hex.data()));
  std::vector<unsigned char> back(value.size() + 1);
  unsigned long length = back.size();
  ASSERT_EQ(1, TwoFishDecrypt(&key[0], hex.data(), back.data(), &length));
  EXPECT_EQ(value, std::string(back.begin(), back.begin() + length));
}

INSTANTIATE_TEST_SUITE_P(Lengths0To492, ProtectedRoundTrip, ::testing::Range(0, 493));

// Worked out with the cipher alone from the rules: the length as four little-endian bytes, the
// value, zero filler to whole blocks; the fixed key's words E9D857A2 932234AD C27EF075 217EC990
// given to the cipher as the bytes A2 57 D8 E9 AD 34 22 93 75 F0 7E C2 90 C9 7E 21; every cipher
// byte complemented and written in upper case between "D9" and "AB".
struct KnownValue {
  std::string clear;
  std::string stored;
};

class ProtectedKnownValues : public ::testing::TestWithParam<KnownValue> {};

TEST_P(ProtectedKnownValues, EncryptToTheWorkedTextAndReadBackInEitherCase) {
  EXPECT_EQ(GetParam().stored, Encrypt(GetParam().clear));
  EXPECT_EQ(GetParam().clear, Decrypt(GetParam().stored).value);
  std::string lower = GetParam().stored;
  for (std::size_t i = 2; i + 2 < lower.size(); ++i) lower[i] = static_cast<char>(std::tolower(lower[i]));
  Reading r = Decrypt(lower);
  EXPECT_EQ(GetParam().clear, r.value);
  EXPECT_EQ(0u, r.wasNotProtected);
}

INSTANTIATE_TEST_SUITE_P(
    Values, ProtectedKnownValues,
    ::testing::Values(
        KnownValue{"a", "D960DD7EC77115455AD583997CCBBA0600AB"},
        KnownValue{"password", "D9265FD237230134CD2AFFDC06B162A27CAB"},
        KnownValue{"twelve bytes", "D9C3904A68B097395C8FD24419C349F197AB"},
        KnownValue{"thirteen byte",
                   "D94490629D44004D8847ED03EC5B35318339D036732A405FA799614A6DA3FD41CAAB"},
        KnownValue{"exactly 28 bytes of a value.",
                   "D9B9DD58F11F347D875C34C539BDCBA76508887CB39B0B4A57C157A7D508A25D11AB"}));

// The previous generation's form of clear: 40 bytes, four of no meaning and the value with zero
// filler, each byte but the last XORed with the byte after it as it was before, in hexadecimal.
std::string PreviousGenerationForm(const std::string& clear, bool lowerCase) {
  unsigned char plain[40] = {0x13, 0x57, 0x9B, 0xDF};
  std::memcpy(plain + 4, clear.data(), clear.size());
  std::string text;
  for (int i = 0; i < 40; ++i) {
    unsigned char b = i < 39 ? plain[i] ^ plain[i + 1] : plain[i];
    char pair[3];
    std::snprintf(pair, sizeof(pair), lowerCase ? "%02x" : "%02X", b);
    text += pair;
  }
  return text;
}

struct OldValue {
  std::string clear;
  std::string read;  // the value ends at its first zero byte
};

class PreviousGeneration : public ::testing::TestWithParam<OldValue> {};

TEST_P(PreviousGeneration, ReadsAsClearTextAndIsReportedUnprotected) {
  for (bool lowerCase : {false, true}) {
    std::string stored = PreviousGenerationForm(GetParam().clear, lowerCase);
    Reading r = Decrypt(stored);
    EXPECT_EQ(1, r.result);
    EXPECT_EQ(GetParam().read, r.value);
    EXPECT_EQ(1u, r.wasNotProtected);
    EXPECT_EQ(0, VXUI_IsOurTwoFish(&stored[0]));
    // It needs room for 36 characters and the terminating zero.
    EXPECT_EQ(1, Decrypt(stored, 37).result);
    EXPECT_EQ(0, Decrypt(stored, 36).result);
  }
}

INSTANTIATE_TEST_SUITE_P(
    Values, PreviousGeneration,
    ::testing::Values(OldValue{"", ""}, OldValue{"x", "x"}, OldValue{"user name", "user name"},
                      OldValue{"thirty-six characters, the most: 36!", "thirty-six characters, the most: 36!"},
                      OldValue{std::string("cut\0here", 8), "cut"}));

TEST(PreviousGeneration, EightyCharactersWithMarkersAreNeverTakenAsProtected) {
  std::string stored = "D9" + std::string(76, '0') + "AB";
  Reading r = Decrypt(stored);
  EXPECT_EQ(1u, r.wasNotProtected);
  EXPECT_EQ(0, VXUI_IsOurTwoFish(&stored[0]));
}

struct StoredText {
  const char* name;
  std::string stored;
  bool ours;          // VXUI_IsOurTwoFish
  std::string value;  // what VXUI_Decrypt reads
  unsigned int wasNotProtected;
};

class StoredForms : public ::testing::TestWithParam<StoredText> {};

TEST_P(StoredForms, AreRecognisedAndReadAsTheirFormSays) {
  const StoredText& t = GetParam();
  std::string stored = t.stored;
  EXPECT_EQ(t.ours ? 1 : 0, VXUI_IsOurTwoFish(&stored[0]));
  Reading r = Decrypt(t.stored);
  EXPECT_EQ(1, r.result);
  EXPECT_EQ(t.value, r.value);
  EXPECT_EQ(t.wasNotProtected, r.wasNotProtected);
}

std::string WithDigit(std::string text, std::size_t position, char digit) {
  text[position] = digit;
  return text;
}

// A value protected with another 128-bit key.
std::string ProtectedWithOtherKey(std::string clear) {
  std::string key(32, '7');
  char hex[33];
  EXPECT_EQ(1, TwoFishEncrypt(&key[0], reinterpret_cast<unsigned char*>(&clear[0]), clear.size(), hex));
  return std::string("D9") + hex + "AB";
}

const std::string kPassword = "D9265FD237230134CD2AFFDC06B162A27CAB";
const std::string kThirteen =
    "D94490629D44004D8847ED03EC5B35318339D036732A405FA799614A6DA3FD41CAAB";

INSTANTIATE_TEST_SUITE_P(
    Forms, StoredForms,
    ::testing::Values(
        StoredText{"Empty", "", true, "", 1},
        StoredText{"Plain", "hunter2", false, "hunter2", 1},
        StoredText{"MarkersOnly", "D9AB", false, "D9AB", 1},
        StoredText{"WrongSuffix", WithDigit(kPassword, 35, 'C'), false, WithDigit(kPassword, 35, 'C'), 1},
        StoredText{"LowerCaseMarkers", "d9" + kPassword.substr(2, 32) + "ab", false,
                   "d9" + kPassword.substr(2, 32) + "ab", 1},
        StoredText{"OddDigitCount", kPassword.substr(0, 33) + "AB", false,
                   kPassword.substr(0, 33) + "AB", 1},
        StoredText{"EightyNonHexCharacters", std::string(80, 'z'), false, std::string(80, 'z'), 1},
        // Ours by its shape but not decryptable: read as the empty value.
        StoredText{"NonHexDigit", WithDigit(kPassword, 9, 'G'), true, "", 0},
        StoredText{"NonHexDigitLastPair", WithDigit(kPassword, 33, 'x'), true, "", 0},
        StoredText{"AllNonHex", "D9" + std::string(32, '#') + "AB", true, "", 0},
        StoredText{"ChangedDigit", WithDigit(kPassword, 2, '3'), true, "", 0},
        StoredText{"ArbitraryDigits", "D9" + std::string(32, '0') + "AB", true, "", 0},
        StoredText{"BlocksSwapped", "D9" + kThirteen.substr(34, 32) + kThirteen.substr(2, 32) + "AB",
                   true, "", 0},
        StoredText{"OtherKey", ProtectedWithOtherKey("password"), true, "", 0}),
    [](const ::testing::TestParamInfo<StoredText>& info) { return info.param.name; });

class SmallCapacity : public ::testing::TestWithParam<unsigned long> {};

TEST_P(SmallCapacity, ProtectedValueIsCutToTheCapacity) {
  std::string value = "a value of 20 bytes.";
  std::string stored = Encrypt(value);
  unsigned long capacity = GetParam();
  Reading r = Decrypt(stored, capacity);
  EXPECT_EQ(1, r.result);
  EXPECT_EQ(value.substr(0, capacity), r.value);

  // The keyed reader leaves the capacity as the count when the value is longer.
  char key[33];
  GetProtectedValueKey(key);
  std::string hex = stored.substr(2, stored.size() - 4);
  std::vector<unsigned char> output(capacity + 1, 0xA5);
  unsigned long length = capacity;
  ASSERT_EQ(1, TwoFishDecrypt(key, &hex[0], output.data(), &length));
  EXPECT_EQ(std::min<unsigned long>(capacity, value.size()), length);
  EXPECT_EQ(0xA5, output[capacity]);
}

TEST_P(SmallCapacity, PlainValueIsCutAndTerminatedWithinTheCapacity) {
  std::string value = "plain text of 24 bytes..";
  unsigned long capacity = GetParam();
  Reading r = Decrypt(value, capacity);
  EXPECT_EQ(1, r.result);
  if (capacity > value.size()) {
    EXPECT_EQ(value, r.value);
  } else {
    // Cut to leave room for the terminating zero.
    EXPECT_EQ(value.substr(0, capacity > 0 ? capacity - 1 : 0), r.value);
  }
}

INSTANTIATE_TEST_SUITE_P(Capacities, SmallCapacity,
                         ::testing::Values(0ul, 1ul, 7ul, 19ul, 20ul, 21ul, 24ul, 25ul, 64ul));

TEST(ProtectedValue, KeyedFunctionsRefuseBadArgumentsWithoutWriting) {
  char key[33];
  GetProtectedValueKey(key);
  EXPECT_EQ(32u, std::strlen(key));
  GetProtectedValueKey(nullptr);
  unsigned char data[4] = {'a', 'b', 'c', 'd'};
  char output[40] = "untouched";
  unsigned char bytes[8] = {0};
  unsigned long length = sizeof(bytes);
  std::string hex = kPassword.substr(2, 32);
  std::string shortKey(31, 'A'), longKey(33, 'A'), key192(48, 'A'), badKey = "G" + std::string(31, 'A');
  std::string halfBlock = hex.substr(0, 16), extraDigit = hex + "F", extraByte = hex + "FF";

  EXPECT_EQ(0, TwoFishEncrypt(nullptr, data, 4, output));
  EXPECT_EQ(0, TwoFishEncrypt(key, nullptr, 4, output));
  EXPECT_EQ(0, TwoFishEncrypt(key, data, 4, nullptr));
  for (std::string* k : {&shortKey, &longKey, &key192, &badKey}) {
    EXPECT_EQ(0, TwoFishEncrypt(&(*k)[0], data, 4, output)) << *k;
    EXPECT_EQ(0, TwoFishDecrypt(&(*k)[0], &hex[0], bytes, &length)) << *k;
  }
  EXPECT_STREQ("untouched", output);
  EXPECT_EQ(0, TwoFishDecrypt(nullptr, &hex[0], bytes, &length));
  EXPECT_EQ(0, TwoFishDecrypt(key, nullptr, bytes, &length));
  EXPECT_EQ(0, TwoFishDecrypt(key, &hex[0], nullptr, &length));
  EXPECT_EQ(0, TwoFishDecrypt(key, &hex[0], bytes, nullptr));
  EXPECT_EQ(0, TwoFishDecrypt(key, &halfBlock[0], bytes, &length));
  EXPECT_EQ(0, TwoFishDecrypt(key, &extraByte[0], bytes, &length));
  EXPECT_EQ(sizeof(bytes), length);
  // A trailing odd digit is ignored.
  ASSERT_EQ(1, TwoFishDecrypt(key, &extraDigit[0], bytes, &length));
  EXPECT_EQ("password", std::string(bytes, bytes + length));

  EXPECT_EQ(0, VXUI_Encrypt(data, 4, nullptr));
  EXPECT_EQ(0, VXUI_Encrypt(nullptr, 4, output));
  EXPECT_EQ(1, VXUI_Encrypt(nullptr, 0, output));
  EXPECT_STREQ("", output);
  EXPECT_EQ(0, VXUI_Decrypt(nullptr, bytes, &length, nullptr));
  EXPECT_EQ(0, VXUI_Decrypt(&hex[0], nullptr, &length, nullptr));
  EXPECT_EQ(0, VXUI_Decrypt(&hex[0], bytes, nullptr, nullptr));
  EXPECT_EQ(0, VXUI_IsOurTwoFish(nullptr));
}

}  // namespace
