// Twofish instances kept for the last key text used on each thread. Building the key schedule costs
// some three hundred times one block's encryption, and a run protects and reads all its values with
// one key, so the schedule is built once and reused. Each thread has its own entry: no locking, and
// nothing a caller holds is changed by another thread.

#ifndef VXMIGRATE_CRYPT_KEY_SCHEDULE_CACHE_H_
#define VXMIGRATE_CRYPT_KEY_SCHEDULE_CACHE_H_

#include "crypt/twofish_instances.h"

namespace vxcrypt {

// Encrypt and decrypt instances of one key, sharing one ECB cipher instance.
struct TwofishKeyPair {
  TwofishKeyInstance encrypt;
  TwofishKeyInstance decrypt;
  TwofishCipherInstance cipher;
};

// The instances for the first keyBits / 4 characters of keyText, built by PrepareTwofishInstances
// on the first call with that text (exact characters: "e9.." and "E9.." are two entries in turn)
// and reused while this thread asks for the same text. Null where PrepareTwofishInstances fails.
// The result stays valid until this thread asks for another key text or size.
// REQUIRES: keyBits is 128 or 256 and keyText holds keyBits / 4 characters.
const TwofishKeyPair* CachedTwofishInstances(const char* keyText, int keyBits);

}  // namespace vxcrypt

#endif  // VXMIGRATE_CRYPT_KEY_SCHEDULE_CACHE_H_
