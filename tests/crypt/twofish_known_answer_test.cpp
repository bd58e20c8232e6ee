// Published Twofish known answers driven through our key handling. They pass only when the key
// bytes handed to the cipher reproduce our key words exactly: word i is key text digits 8i..8i+7
// read as one number, and the cipher reads each word from four bytes, least significant first.

#include <gtest/gtest.h>

#include <cstdint>
#include <cstdio>
#include <map>
#include <string>
#include <vector>

#include "crypt/protected_value.h"
#include "crypt/twofish_instances.h"

namespace {

std::vector<std::uint8_t> FromHex(const std::string& hex) {
  std::vector<std::uint8_t> bytes;
  for (std::size_t i = 0; i + 1 < hex.size(); i += 2) {
    bytes.push_back(static_cast<std::uint8_t>(std::stoul(hex.substr(i, 2), nullptr, 16)));
  }
  return bytes;
}

std::string ToHex(const std::vector<std::uint8_t>& bytes) {
  std::string hex;
  char pair[3];
  for (std::uint8_t b : bytes) {
    std::snprintf(pair, sizeof(pair), "%02X", b);
    hex += pair;
  }
  return hex;
}

// The key text whose words give a published key's bytes: every group of four bytes written as the
// number those bytes make when read least significant first.
std::string KeyTextFor(const std::string& publishedKey) {
  std::string text;
  for (std::size_t i = 0; i < publishedKey.size(); i += 8) {
    for (int b = 3; b >= 0; --b) text += publishedKey.substr(i + 2 * b, 2);
  }
  return text;
}

std::string Complemented(const std::string& hex) {
  std::vector<std::uint8_t> bytes = FromHex(hex);
  for (std::uint8_t& b : bytes) b = static_cast<std::uint8_t>(~b);
  return ToHex(bytes);
}

std::vector<std::uint8_t> RunBlock(std::uint8_t direction, const std::string& keyText,
                                   const std::vector<std::uint8_t>& input) {
  vxcrypt::TwofishKeyInstance key;
  vxcrypt::TwofishCipherInstance cipher;
  int keyBits = static_cast<int>(keyText.size() * 4);
  EXPECT_EQ(1, vxcrypt::PrepareTwofishInstances(&key, &cipher, direction, keyText.c_str(), keyBits));
  std::vector<std::uint8_t> output(16);
  long long done = direction == vxcrypt::kDirectionEncrypt
                       ? vxcrypt::BlockEncrypt(&cipher, &key, input.data(), 128, output.data())
                       : vxcrypt::BlockDecrypt(&cipher, &key, input.data(), 128, output.data());
  EXPECT_EQ(128, done);
  return output;
}

struct ChainedVectors {
  int keyBytes;
  std::map<int, std::string> cipherTexts;  // iteration -> published cipher text
};

class TwofishChainedVectors : public ::testing::TestWithParam<ChainedVectors> {};

// Iteration I encrypts the previous cipher text under a key made of the one before it followed by
// the front of the previous key, starting from an all-zero key and block.
TEST_P(TwofishChainedVectors, MatchPublishedCipherTextsAndDecryptBack) {
  const ChainedVectors& vectors = GetParam();
  std::vector<std::uint8_t> key(vectors.keyBytes, 0);
  std::vector<std::uint8_t> plain(16, 0);
  for (int i = 1; i <= vectors.cipherTexts.rbegin()->first; ++i) {
    std::string keyText = KeyTextFor(ToHex(key));
    std::vector<std::uint8_t> cipher = RunBlock(vxcrypt::kDirectionEncrypt, keyText, plain);
    auto published = vectors.cipherTexts.find(i);
    if (published != vectors.cipherTexts.end()) {
      EXPECT_EQ(published->second, ToHex(cipher)) << "iteration " << i;
    }
    EXPECT_EQ(plain, RunBlock(vxcrypt::kDirectionDecrypt, keyText, cipher)) << "iteration " << i;
    std::vector<std::uint8_t> next(plain);
    next.insert(next.end(), key.begin(), key.end() - 16);
    key = next;
    plain = cipher;
  }
}

INSTANTIATE_TEST_SUITE_P(
    KeySizes, TwofishChainedVectors,
    ::testing::Values(ChainedVectors{16,
                                     {{1, "9F589F5CF6122C32B6BFEC2F2AE8C35A"},
                                      {2, "D491DB16E7B1C39E86CB086B789F5419"},
                                      {3, "019F9809DE1711858FAAC3A3BA20FBC3"},
                                      {4, "6363977DE839486297E661C6C9D668EB"},
                                      {5, "816D5BD0FAE35342BF2A7412C246F752"},
                                      {49, "5D9D4EEFFA9151575524F115815A12E0"}}},
                      ChainedVectors{32,
                                     {{1, "57FF739D4DC92C1BD7FC01700CC8216F"},
                                      {2, "D43BB7556EA32E46F2A282B7D45B4E0D"},
                                      {3, "90AFE91BB288544F2C32DC239B2635E6"},
                                      {49, "37FE26FF1CF66175F5DDF4C33B97A205"}}}));

const char kFullKey256[] = "0123456789ABCDEFFEDCBA987654321000112233445566778899AABBCCDDEEFF";
const char kFullKey256Cipher[] = "37527BE0052334B89F0CFCCAE87CFA20";

TEST(TwofishKeyText, GroupsOfFourKeyBytesAreReadAsNumbers) {
  std::vector<std::uint8_t> zero(16, 0);
  EXPECT_EQ(kFullKey256Cipher,
            ToHex(RunBlock(vxcrypt::kDirectionEncrypt, KeyTextFor(kFullKey256), zero)));
  // Taking the published digits as our key text gives another key altogether.
  EXPECT_NE(kFullKey256Cipher, ToHex(RunBlock(vxcrypt::kDirectionEncrypt, kFullKey256, zero)));
}

// An empty value is one block of zeros: the length field and filler. Its text is the published
// cipher text of the zero block, complemented.
TEST(TwofishKeyText, EmptyValueThroughTheExportedFunctionsGivesThePublishedBlock) {
  struct Case {
    std::string keyText;
    std::string cipher;
  };
  for (const Case& c : {Case{std::string(32, '0'), "9F589F5CF6122C32B6BFEC2F2AE8C35A"},
                        Case{std::string(64, '0'), "57FF739D4DC92C1BD7FC01700CC8216F"},
                        Case{KeyTextFor(kFullKey256), kFullKey256Cipher}}) {
    std::string keyText = c.keyText;
    unsigned char nothing = 0;
    char output[33];
    ASSERT_EQ(1, TwoFishEncrypt(&keyText[0], &nothing, 0, output));
    EXPECT_EQ(Complemented(c.cipher), output);

    std::string hex = Complemented(c.cipher);
    unsigned char value[4] = {0xEE, 0xEE, 0xEE, 0xEE};
    unsigned long length = sizeof(value);
    ASSERT_EQ(1, TwoFishDecrypt(&keyText[0], &hex[0], value, &length));
    EXPECT_EQ(0u, length);
    EXPECT_EQ(0xEE, value[0]);
  }
}

}  // namespace
