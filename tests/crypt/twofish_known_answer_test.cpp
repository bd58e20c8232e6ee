// Published Twofish known answers driven through our key handling. They pass only when the key
// bytes handed to the cipher reproduce our key words: word i is key text digits 8i..8i+7 read as
// one number, and the cipher reads each word from four bytes, least significant first.

#include <gtest/gtest.h>

#include <map>
#include <string>
#include <vector>

#include "crypt/protected_value.h"
#include "crypt/twofish_instances.h"

namespace {

std::string Hex(const std::string& bytes) {
  static const char kDigits[] = "0123456789ABCDEF";
  std::string hex;
  for (unsigned char b : bytes) hex += {kDigits[b >> 4], kDigits[b & 15]};
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

std::string EncryptBlock(const std::string& keyText, std::string block) {
  vxcrypt::TwofishKeyInstance key;
  vxcrypt::TwofishCipherInstance cipher;
  auto* bytes = reinterpret_cast<std::uint8_t*>(&block[0]);
  EXPECT_EQ(1, vxcrypt::PrepareTwofishInstances(&key, &cipher, vxcrypt::kDirectionEncrypt,
                                                keyText.c_str(), int(keyText.size() * 4)));
  EXPECT_EQ(128, vxcrypt::BlockEncrypt(&cipher, &key, bytes, 128, bytes));
  return block;
}

// Iteration i encrypts the previous cipher text under the one before it followed by the front of
// the previous key, from an all-zero key and block.
TEST(TwofishKnownAnswers, ChainedVectorsOfBothKeySizes) {
  // The cipher texts of iterations 1 and 49.
  const std::map<std::size_t, std::vector<std::string>> published = {
      {16, {"9F589F5CF6122C32B6BFEC2F2AE8C35A", "5D9D4EEFFA9151575524F115815A12E0"}},
      {32, {"57FF739D4DC92C1BD7FC01700CC8216F", "37FE26FF1CF66175F5DDF4C33B97A205"}}};
  std::map<std::size_t, std::vector<std::string>> computed;
  for (std::size_t keyBytes : {16u, 32u}) {
    std::string key(keyBytes, '\0'), plain(16, '\0');
    for (int i = 1; i <= 49; ++i) {
      std::string cipher = EncryptBlock(KeyTextFor(Hex(key)), plain);
      if (i == 1 || i == 49) computed[keyBytes].push_back(Hex(cipher));
      key = plain + key.substr(0, keyBytes - 16);
      plain = cipher;
    }
  }
  EXPECT_EQ(published, computed);
}

// An empty value is one zero block (length field and filler), so its text is the published cipher
// text of that block complemented; it matches only with the key given as words.
TEST(TwofishKnownAnswers, EmptyValueIsThePublishedZeroBlockComplemented) {
  const std::string published = "0123456789ABCDEFFEDCBA987654321000112233445566778899AABBCCDDEEFF";
  const char complemented[] = "C8AD841FFADCCB4760F30335178305DF";  // of 37527BE0052334B8...
  std::string words = KeyTextFor(published), bytes = published;
  char hex[33];
  unsigned char nothing = 0;
  ASSERT_EQ(1, TwoFishEncrypt(&words[0], &nothing, 0, hex));
  EXPECT_STREQ(complemented, hex);
  ASSERT_EQ(1, TwoFishEncrypt(&bytes[0], &nothing, 0, hex));
  EXPECT_STRNE(complemented, hex);
}

}  // namespace
