// The 64-byte pad of the legacy encoding: constant data of the previous product generation. Values
// encoded with it can only be read back with these exact bytes, so they never change.

#ifndef VXMIGRATE_CRYPT_LEGACY_PAD_H_
#define VXMIGRATE_CRYPT_LEGACY_PAD_H_

namespace vxcrypt {

constexpr int kLegacyPadSize = 64;
extern const unsigned char kLegacyPad[kLegacyPadSize];

}  // namespace vxcrypt

#endif  // VXMIGRATE_CRYPT_LEGACY_PAD_H_
