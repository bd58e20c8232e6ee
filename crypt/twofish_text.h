// The hexadecimal text form of a Twofish-encrypted value (the digits between a protected value's
// markers), read from a counted run of characters so that callers need not copy the digits out.

#ifndef VXMIGRATE_CRYPT_TWOFISH_TEXT_H_
#define VXMIGRATE_CRYPT_TWOFISH_TEXT_H_

#include <cstddef>

namespace vxcrypt {

// TwoFishDecrypt over hexLength characters at hex (no terminating zero needed). Same results.
int DecryptHexDigits(const char* keyText, const char* hex, std::size_t hexLength,
                     unsigned char* output, unsigned long* length);

}  // namespace vxcrypt

#endif  // VXMIGRATE_CRYPT_TWOFISH_TEXT_H_
