// Published Twofish known answers driven through our key handling. They pass only when the key
// bytes handed to the cipher reproduce our key words: word i is key text digits 8i..8i+7 read as
// one number, and the cipher reads each word from four bytes, least significant first.

#include <gtest/gtest.h>

#include <cstdio>
#include <string>

#include "crypt/protected_value.h"
#include "crypt/twofish_instances.h"

namespace {

std::string Hex(const std::string& bytes) {
  std::string hex;
  char pair[3];
  for (char b : bytes) {
    std::snprintf(pair, sizeof(pair), "%02X", static_cast<unsigned char>(b));
    hex += pair;
  }
  return hex;
}

// Our key text for a published key: every four key bytes written as the number they make when
// read least significant first.
std::string KeyTextFor(const std::string& publishedKey) {
  std::string text;
  for (std::size_t i = 0; i < publishedKey.size(); i += 8) {
    for (int b = 3; b >= 0; --b) text += publishedKey.substr(i + 2 * b, 2);
  }
  return text;
}

std::string EncryptBlock(const std::string& keyText, const std::string& plain) {
  vxcrypt::TwofishKeyInstance key;
  vxcrypt::TwofishCipherInstance cipher;
  int keyBits = static_cast<int>(keyText.size() * 4);
  EXPECT_EQ(1, vxcrypt::PrepareTwofishInstances(&key, &cipher, vxcrypt::kDirectionEncrypt,
                                                keyText.c_str(), keyBits));
  std::uint8_t in[16], out[16];
  plain.copy(reinterpret_cast<char*>(in), 16);
  EXPECT_EQ(128, vxcrypt::BlockEncrypt(&cipher, &key, in, 128, out));
  return std::string(reinterpret_cast<char*>(out), 16);
}

// Iteration i encrypts the previous cipher text under the one before it followed by the front of
// the previous key, from an all-zero key and block.
TEST(TwofishKnownAnswers, ChainedVectorsOfBothKeySizes) {
  struct Published {
    std::size_t keyBytes;
    int iteration;
    const char* cipher;
  };
  const Published published[] = {
      {16, 1, "9F589F5CF6122C32B6BFEC2F2AE8C35A"}, {16, 2, "D491DB16E7B1C39E86CB086B789F5419"},
      {16, 3, "019F9809DE1711858FAAC3A3BA20FBC3"}, {16, 4, "6363977DE839486297E661C6C9D668EB"},
      {16, 5, "816D5BD0FAE35342BF2A7412C246F752"}, {16, 49, "5D9D4EEFFA9151575524F115815A12E0"},
      {32, 1, "57FF739D4DC92C1BD7FC01700CC8216F"}, {32, 2, "D43BB7556EA32E46F2A282B7D45B4E0D"},
      {32, 3, "90AFE91BB288544F2C32DC239B2635E6"}, {32, 49, "37FE26FF1CF66175F5DDF4C33B97A205"}};
  for (std::size_t keyBytes : {16u, 32u}) {
    std::string key(keyBytes, '\0'), plain(16, '\0');
    for (int i = 1; i <= 49; ++i) {
      std::string cipher = EncryptBlock(KeyTextFor(Hex(key)), plain);
      for (const Published& p : published) {
        if (p.keyBytes == keyBytes && p.iteration == i) {
          EXPECT_EQ(p.cipher, Hex(cipher)) << i;
        }
      }
      key = plain + key.substr(0, keyBytes - 16);
      plain = cipher;
    }
  }
}

const char kFullKey[] = "0123456789ABCDEFFEDCBA987654321000112233445566778899AABBCCDDEEFF";
const char kFullKeyCipher[] = "37527BE0052334B89F0CFCCAE87CFA20";

TEST(TwofishKnownAnswers, KeyTextIsReadAsWordsNotAsBytes) {
  EXPECT_EQ(kFullKeyCipher, Hex(EncryptBlock(KeyTextFor(kFullKey), std::string(16, '\0'))));
  EXPECT_NE(kFullKeyCipher, Hex(EncryptBlock(kFullKey, std::string(16, '\0'))));
}

// An empty value is one zero block (length field and filler): its text is the published cipher
// text of that block complemented (9F58... and 3752... above), and it reads back as length 0.
TEST(TwofishKnownAnswers, EmptyValueThroughTheKeyedFunctions) {
  struct Case {
    std::string keyText;
    const char* text;
  };
  for (Case c : {Case{std::string(32, '0'), "60A760A309EDD3CD494013D0D5173CA5"},
                 Case{KeyTextFor(kFullKey), "C8AD841FFADCCB4760F30335178305DF"}}) {
    char hex[33];
    unsigned char nothing = 0, value[4] = {0xEE};
    ASSERT_EQ(1, TwoFishEncrypt(&c.keyText[0], &nothing, 0, hex));
    EXPECT_STREQ(c.text, hex);
    unsigned long length = sizeof(value);
    ASSERT_EQ(1, TwoFishDecrypt(&c.keyText[0], hex, value, &length));
    EXPECT_EQ(0u, length);
  }
}

}  // namespace
