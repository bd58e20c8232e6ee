// The previous product generation's stored form of a password or user name: 80 hexadecimal digits
// for 40 bytes chained by XOR, the value in the last 36 of them. Read-only: nothing writes it now.

#ifndef VXMIGRATE_CRYPT_PREVIOUS_GENERATION_H_
#define VXMIGRATE_CRYPT_PREVIOUS_GENERATION_H_

namespace vxcrypt {

constexpr unsigned long kPreviousGenerationDigits = 80;
constexpr unsigned long kPreviousGenerationMaxValue = 36;

// Reads the 80 characters at text (either case) into value, zero-terminated: at most 36
// characters. False, with value untouched, when one of them is not a hexadecimal digit.
// REQUIRES: text holds at least 80 characters; value has room for 37.
bool DecodePreviousGeneration(const char* text, char* value);

}  // namespace vxcrypt

#endif  // VXMIGRATE_CRYPT_PREVIOUS_GENERATION_H_
