// Twofish key and cipher instances driven in the steps of the published reference interface
// (makeKey, cipherInit, reKey, blockEncrypt, blockDecrypt), with nettle doing the cipher work.
// Instances are plain values owned by the caller, normally on its stack for one call; nothing here
// keeps state between calls, so every function is reentrant.

#ifndef VXMIGRATE_CRYPT_TWOFISH_INSTANCES_H_
#define VXMIGRATE_CRYPT_TWOFISH_INSTANCES_H_

#include <nettle/twofish.h>

#include <cstdint>

namespace vxcrypt {

// Results, as the reference interface numbers them.
constexpr int kTwofishOk = 1;
constexpr int kBadKeyDirection = -1;
constexpr int kBadKeyMaterial = -2;
constexpr int kBadKeyInstance = -3;
constexpr int kBadCipherMode = -4;
constexpr int kBadCipherState = -5;
constexpr int kBadInputLength = -6;

constexpr std::uint8_t kDirectionEncrypt = 0;
constexpr std::uint8_t kDirectionDecrypt = 1;
constexpr std::uint8_t kModeEcb = 1;

struct TwofishKeyInstance {
  std::uint8_t direction;
  int keyBits;  // 128, 192 or 256
  // Key word i stands for key bytes 4i to 4i+3, least significant byte first: the schedule reads
  // the key as little-endian words.
  std::uint32_t keyWords[8];
  bool scheduled;  // set by ReKey, cleared by MakeKey
  twofish_ctx schedule;
};

struct TwofishCipherInstance {
  std::uint8_t mode;
  bool initialised;
};

// Starts a key: direction and size, words all zero, no schedule yet (the caller stores the key
// words and then calls ReKey).
int MakeKey(TwofishKeyInstance* key, std::uint8_t direction, int keyBits);
// Only electronic code book is offered, and it takes no initialisation vector.
int CipherInit(TwofishCipherInstance* cipher, std::uint8_t mode);
// Builds the schedule from the key words.
int ReKey(TwofishKeyInstance* key);

// Encrypt or decrypt inputBits bits in whole blocks: a partial last block counts as a whole one.
// The result is inputBits on success, a negative code otherwise.
// REQUIRES: input and output hold (inputBits + 127) / 128 whole blocks; they may be the same.
long long BlockEncrypt(const TwofishCipherInstance* cipher, const TwofishKeyInstance* key,
                       const std::uint8_t* input, long long inputBits, std::uint8_t* output);
long long BlockDecrypt(const TwofishCipherInstance* cipher, const TwofishKeyInstance* key,
                       const std::uint8_t* input, long long inputBits, std::uint8_t* output);

// Clears both instances, makes the key for direction and keyBits, sets up ECB, takes key word i
// from key text digits 8i to 8i+7 read as one number, most significant digit first, and builds the
// schedule. 1 on success; 0 for a null argument, a key text whose first keyBits / 4 characters are
// not all hexadecimal digits, or a failing step.
int PrepareTwofishInstances(TwofishKeyInstance* key, TwofishCipherInstance* cipher,
                            std::uint8_t direction, const char* keyText, int keyBits);

}  // namespace vxcrypt

#endif  // VXMIGRATE_CRYPT_TWOFISH_INSTANCES_H_
