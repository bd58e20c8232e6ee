// The reference-shaped Twofish steps over nettle. The one thing to get right is the key: our key
// words are numbers, and the schedule reads each word from four key bytes, least significant first,
// so the bytes handed to nettle are each word's bytes in that order.

#include "crypt/twofish_instances.h"

#include <cstring>

#include "crypt/hex_digits.h"

namespace vxcrypt {

namespace {

bool IsSupportedKeySize(int keyBits) { return keyBits == 128 || keyBits == 192 || keyBits == 256; }

// The eight digits at text read as one number, most significant digit first. False when one of
// them is not a hexadecimal digit; the reading stops at the first such character, so a shorter
// text is never read past its terminating zero.
bool ParseKeyWord(const char* text, std::uint32_t* word) {
  std::uint32_t value = 0;
  for (int i = 0; i < 8; ++i) {
    int digit = HexDigitValue(text[i]);
    if (digit < 0) return false;
    value = (value << 4) | static_cast<std::uint32_t>(digit);
  }
  *word = value;
  return true;
}

// Checks shared by both block directions.
int CheckBlockCall(const TwofishCipherInstance* cipher, const TwofishKeyInstance* key,
                   std::uint8_t direction, const void* input, long long inputBits,
                   const void* output) {
  if (cipher == nullptr || !cipher->initialised || cipher->mode != kModeEcb) return kBadCipherState;
  if (key == nullptr || !key->scheduled) return kBadKeyInstance;
  if (key->direction != direction) return kBadKeyDirection;
  if (input == nullptr || output == nullptr || inputBits < 0) return kBadInputLength;
  return kTwofishOk;
}

std::size_t WholeBlockBytes(long long inputBits) {
  return static_cast<std::size_t>((inputBits + 127) / 128) * TWOFISH_BLOCK_SIZE;
}

}  // namespace

int MakeKey(TwofishKeyInstance* key, std::uint8_t direction, int keyBits) {
  if (key == nullptr) return kBadKeyInstance;
  if (direction != kDirectionEncrypt && direction != kDirectionDecrypt) return kBadKeyDirection;
  if (!IsSupportedKeySize(keyBits)) return kBadKeyMaterial;
  key->direction = direction;
  key->keyBits = keyBits;
  std::memset(key->keyWords, 0, sizeof(key->keyWords));
  key->scheduled = false;
  return kTwofishOk;
}

int CipherInit(TwofishCipherInstance* cipher, std::uint8_t mode) {
  if (cipher == nullptr) return kBadCipherState;
  if (mode != kModeEcb) return kBadCipherMode;
  cipher->mode = mode;
  cipher->initialised = true;
  return kTwofishOk;
}

int ReKey(TwofishKeyInstance* key) {
  if (key == nullptr || !IsSupportedKeySize(key->keyBits)) return kBadKeyInstance;
  std::uint8_t bytes[32];
  int words = key->keyBits / 32;
  for (int i = 0; i < words; ++i) {
    std::uint32_t w = key->keyWords[i];
    bytes[4 * i] = static_cast<std::uint8_t>(w);
    bytes[4 * i + 1] = static_cast<std::uint8_t>(w >> 8);
    bytes[4 * i + 2] = static_cast<std::uint8_t>(w >> 16);
    bytes[4 * i + 3] = static_cast<std::uint8_t>(w >> 24);
  }
  twofish_set_key(&key->schedule, static_cast<std::size_t>(key->keyBits / 8), bytes);
  key->scheduled = true;
  return kTwofishOk;
}

long long BlockEncrypt(const TwofishCipherInstance* cipher, const TwofishKeyInstance* key,
                       const std::uint8_t* input, long long inputBits, std::uint8_t* output) {
  int check = CheckBlockCall(cipher, key, kDirectionEncrypt, input, inputBits, output);
  if (check != kTwofishOk) return check;
  twofish_encrypt(&key->schedule, WholeBlockBytes(inputBits), output, input);
  return inputBits;
}

long long BlockDecrypt(const TwofishCipherInstance* cipher, const TwofishKeyInstance* key,
                       const std::uint8_t* input, long long inputBits, std::uint8_t* output) {
  int check = CheckBlockCall(cipher, key, kDirectionDecrypt, input, inputBits, output);
  if (check != kTwofishOk) return check;
  twofish_decrypt(&key->schedule, WholeBlockBytes(inputBits), output, input);
  return inputBits;
}

int PrepareTwofishInstances(TwofishKeyInstance* key, TwofishCipherInstance* cipher,
                            std::uint8_t direction, const char* keyText, int keyBits) {
  if (key == nullptr || cipher == nullptr || keyText == nullptr) return 0;
  std::memset(key, 0, sizeof(*key));
  std::memset(cipher, 0, sizeof(*cipher));
  if (MakeKey(key, direction, keyBits) != kTwofishOk) return 0;
  if (CipherInit(cipher, kModeEcb) != kTwofishOk) return 0;
  for (int i = 0; i < keyBits / 32; ++i) {
    if (!ParseKeyWord(keyText + 8 * i, &key->keyWords[i])) return 0;
  }
  return ReKey(key) == kTwofishOk ? 1 : 0;
}

}  // namespace vxcrypt
