// One cached key per thread. A failed preparation leaves the entry empty, so a bad key text is
// refused again on every call and never stands in for a good one.

#include "crypt/key_schedule_cache.h"

#include <cstring>

namespace vxcrypt {

namespace {

// Zero-initialised as every thread_local of static storage is: no entry, nothing to construct.
struct CacheEntry {
  bool valid;
  int keyBits;
  char keyText[64];
  TwofishKeyPair instances;
};

bool Holds(const CacheEntry& entry, const char* keyText, int keyBits) {
  return entry.valid && entry.keyBits == keyBits &&
         std::memcmp(entry.keyText, keyText, static_cast<std::size_t>(keyBits / 4)) == 0;
}

}  // namespace

const TwofishKeyPair* CachedTwofishInstances(const char* keyText, int keyBits) {
  static thread_local CacheEntry entry;
  if (Holds(entry, keyText, keyBits)) return &entry.instances;
  entry.valid = false;
  TwofishKeyPair& pair = entry.instances;
  if (!PrepareTwofishInstances(&pair.encrypt, &pair.cipher, kDirectionEncrypt, keyText, keyBits)) {
    return nullptr;
  }
  // The schedule does not depend on the direction: the decrypt instance is a copy of it.
  pair.decrypt = pair.encrypt;
  pair.decrypt.direction = kDirectionDecrypt;
  std::memcpy(entry.keyText, keyText, static_cast<std::size_t>(keyBits / 4));
  entry.keyBits = keyBits;
  entry.valid = true;
  return &pair;
}

}  // namespace vxcrypt
