// The per-thread key schedule kept between calls: a value must come out exactly as with a schedule
// built for it alone, whatever key was used before, on whichever thread.

#include "crypt/key_schedule_cache.h"

#include <gtest/gtest.h>

#include <cstring>
#include <string>
#include <thread>
#include <vector>

#include "crypt/protected_value.h"

namespace {

const std::string kFixed = "E9D857A2932234ADC27EF075217EC990";
const std::string kOther = "00112233445566778899AABBCCDDEEFF";
const std::string kLong = kOther + kFixed;
const std::string kNotHex = "E9D857A2932234ADC27EF075217EC99G";  // differs from kFixed at the end

// One block encrypted with instances prepared for this call alone, as hex; "" when refused.
std::string FreshEncrypt(const std::string& keyText, std::string block) {
  vxcrypt::TwofishKeyInstance key;
  vxcrypt::TwofishCipherInstance cipher;
  if (!vxcrypt::PrepareTwofishInstances(&key, &cipher, vxcrypt::kDirectionEncrypt, keyText.c_str(),
                                        int(keyText.size() * 4))) {
    return "";
  }
  auto* bytes = reinterpret_cast<std::uint8_t*>(&block[0]);
  vxcrypt::BlockEncrypt(&cipher, &key, bytes, 128, bytes);
  return block;
}

// The same through the cache, decrypted again with the cached decrypt instance; "" when refused.
std::string CachedEncrypt(const std::string& keyText, std::string block) {
  const vxcrypt::TwofishKeyPair* pair =
      vxcrypt::CachedTwofishInstances(keyText.c_str(), int(keyText.size() * 4));
  if (pair == nullptr) return "";
  auto* bytes = reinterpret_cast<std::uint8_t*>(&block[0]);
  std::string plain = block;
  vxcrypt::BlockEncrypt(&pair->cipher, &pair->encrypt, bytes, 128, bytes);
  std::string cipherText = block;
  vxcrypt::BlockDecrypt(&pair->cipher, &pair->decrypt, bytes, 128, bytes);
  EXPECT_EQ(plain, block) << keyText;
  return cipherText;
}

// Keys in an order that hits and misses the cache, a refused key between good ones included: a
// refused key must neither be served from the entry of a key it shares a prefix with nor leave
// the previous schedule in place for the next key.
TEST(KeyScheduleCache, EveryKeySequenceGivesTheSameBlocksAsAFreshSchedule) {
  const std::vector<std::string> sequence = {kFixed, kFixed, kOther,  kFixed, kNotHex, kNotHex,
                                             kFixed, kLong,  kOther, kLong,  kNotHex, kOther};
  std::string block = "sixteen bytes!!!";
  for (const std::string& key : sequence) {
    const std::string fresh = FreshEncrypt(key, block);
    EXPECT_EQ(key == kNotHex, fresh.empty()) << key;
    EXPECT_EQ(fresh, CachedEncrypt(key, block)) << key;
    if (!fresh.empty()) block = fresh;  // a new block each time, so no answer is stale by chance
  }
}

// Each thread keeps its own entry: threads alternating two keys never see each other's schedule.
TEST(KeyScheduleCache, ThreadsWithDifferentKeysGetTheirOwnResults) {
  const std::string block = "a block of text.";
  const std::string expected[2] = {FreshEncrypt(kFixed, block), FreshEncrypt(kOther, block)};
  std::vector<std::thread> threads;
  int mismatches[4] = {};
  for (int t = 0; t < 4; ++t) {
    threads.emplace_back([&, t] {
      for (int i = 0; i < 500; ++i) {
        const int k = (t + i / 7) % 2;
        if (CachedEncrypt(k == 0 ? kFixed : kOther, block) != expected[k]) ++mismatches[t];
      }
    });
  }
  for (std::thread& thread : threads) thread.join();
  for (int count : mismatches) EXPECT_EQ(0, count);
}

}  // namespace
