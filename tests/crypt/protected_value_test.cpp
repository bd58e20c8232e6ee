// The protected text form of stored passwords and user names, and the older forms a stored value
// may still be in: what files on disk hold must read back exactly, and no input may make a reader
// write past the capacity it was given.

#include "crypt/protected_value.h"

#include <gtest/gtest.h>

#include <cctype>
#include <cstdio>
#include <string>
#include <tuple>

#include "migrate/installations_fixture.h"

namespace {

unsigned char* Bytes(std::string& text) { return reinterpret_cast<unsigned char*>(&text[0]); }

std::string Encrypt(std::string value) {
  std::string output(5 + 32 * ((value.size() + 3) / 16 + 1), '\0');
  EXPECT_EQ(1, VXUI_Encrypt(Bytes(value), value.size(), &output[0]));
  return output.c_str();
}

// Result, value read and the "was not protected" flag.
using Reading = std::tuple<int, std::string, unsigned int>;

Reading Decrypt(std::string stored, unsigned long capacity = 1024) {
  std::string output(capacity + 16, '\xA5');
  unsigned long length = capacity;
  unsigned int flag = 7;
  int result = VXUI_Decrypt(&stored[0], Bytes(output), &length, &flag);
  EXPECT_EQ(std::string(16, '\xA5'), output.substr(capacity));  // nothing past the capacity
  return {result, output.substr(0, result ? length : 0), flag};
}

TEST(ProtectedValue, EveryLengthTo492IsUpperCaseHexAndReadsBackExactly) {
  for (std::size_t n = 0; n <= 492; ++n) {
    std::string value;
    for (std::size_t i = 0; i < n; ++i) value += static_cast<char>(i * 37 + n);
    std::string stored = Encrypt(value);
    ASSERT_EQ(n == 0 ? 0 : 4 + 32 * ((n + 3) / 16 + 1), stored.size());
    EXPECT_EQ(std::string::npos, stored.find_first_not_of("0123456789ABCDEF")) << stored;
    EXPECT_EQ(1, VXUI_IsOurTwoFish(&stored[0]));
    ASSERT_EQ(Reading(1, value, n == 0 ? 1 : 0), Decrypt(stored)) << n;  // empty counts as plain
  }
}

// Worked out with the cipher alone: the length as four little-endian bytes, the value, zero filler
// to whole blocks; the key words E9D857A2 932234AD C27EF075 217EC990 given to the cipher as the
// bytes A2 57 D8 E9 AD 34 22 93 75 F0 7E C2 90 C9 7E 21; each cipher byte complemented and written
// in upper case between "D9" and "AB".
const char kPassword[] = "D9265FD237230134CD2AFFDC06B162A27CAB";
const char kThirteen[] = "D94490629D44004D8847ED03EC5B35318339D036732A405FA799614A6DA3FD41CAAB";

TEST(ProtectedValue, WorkedValuesEncryptAndReadBackInEitherCase) {
  const std::pair<std::string, std::string> worked[] = {
      {"password", kPassword},
      {"twelve bytes", "D9C3904A68B097395C8FD24419C349F197AB"},
      {"thirteen byte", kThirteen}};
  for (const auto& [clear, stored] : worked) {
    EXPECT_EQ(stored, Encrypt(clear));
    std::string lower = stored;
    for (std::size_t i = 2; i + 2 < lower.size(); ++i) lower[i] = char(std::tolower(lower[i]));
    EXPECT_EQ(Reading(1, clear, 0), Decrypt(stored));
    EXPECT_EQ(Reading(1, clear, 0), Decrypt(lower));
  }
}

TEST(ProtectedValue, PreviousGenerationValuesReadAsClearTextGivenRoomFor37) {
  const std::string most = "thirty-six characters, the most: 36!";
  for (const auto& [clear, read] : {std::make_pair(std::string("cut\0here", 8), std::string("cut")),
                                    std::make_pair(most, most)}) {
    for (bool lowerCase : {false, true}) {
      std::string stored = vxtest::PreviousGenerationForm(clear, lowerCase);
      EXPECT_EQ(Reading(1, read, 1), Decrypt(stored, 37));
      EXPECT_EQ(0, std::get<0>(Decrypt(stored, 36)));
    }
  }
  // Eighty digits are the old form even with the markers: every byte XORed down to 0xAB.
  EXPECT_EQ(Reading(1, std::string(36, '\xAB'), 1), Decrypt("D9" + std::string(76, '0') + "AB"));
}

TEST(ProtectedValue, MalformedValuesReadAsPlainTextOrAsEmpty) {
  const std::string password = kPassword, digits = password.substr(2, 32);
  // Each text, and whether it has our shape.
  const std::pair<std::string, bool> malformed[] = {
      {"hunter2", false},
      {"D9AB", false},
      {std::string(password).replace(35, 1, "C"), false},
      {"d9" + digits + "ab", false},
      {"D9" + digits.substr(1) + "AB", false},
      {std::string(80, 'z'), false},
      {std::string(password).replace(9, 1, "G"), true},
      {std::string(password).replace(33, 1, "x"), true},
      {std::string(password).replace(2, 1, "3"), true},
      {"D9" + std::string(kThirteen + 34, 32) + std::string(kThirteen + 2, 32) + "AB", true}};
  for (auto [stored, ours] : malformed) {
    EXPECT_EQ(ours ? 1 : 0, VXUI_IsOurTwoFish(&stored[0])) << stored;
    // Our shape but not decryptable reads as the empty value; anything else as it stands.
    EXPECT_EQ(ours ? Reading(1, "", 0) : Reading(1, stored, 1), Decrypt(stored));
  }
}

// Protected values are cut to the capacity; plain text keeps room for its terminating zero.
TEST(ProtectedValue, ValuesLongerThanTheCapacityAreCutWithinIt) {
  const std::string value = "a value of 20 bytes.";
  for (unsigned long capacity : {0ul, 1ul, 19ul, 20ul, 21ul}) {
    EXPECT_EQ(value.substr(0, capacity), std::get<1>(Decrypt(Encrypt(value), capacity)));
    EXPECT_EQ(value.substr(0, capacity ? capacity - 1 : 0), std::get<1>(Decrypt(value, capacity)));
  }
}

}  // namespace
