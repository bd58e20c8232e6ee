// Reading the previous generation's 80-digit form. Each stored byte was XORed with the already
// decoded byte after it, so decoding runs from the end: the last byte stands as it is.

#include "crypt/previous_generation.h"

#include "crypt/hex_digits.h"

namespace vxcrypt {

bool DecodePreviousGeneration(const char* text, char* value) {
  constexpr int kBytes = static_cast<int>(kPreviousGenerationDigits / 2);
  constexpr int kValueStart = kBytes - static_cast<int>(kPreviousGenerationMaxValue);
  unsigned char bytes[kBytes];
  for (int i = 0; i < kBytes; ++i) {
    if (!ReadHexByte(text + 2 * i, &bytes[i])) return false;
  }
  for (int i = kBytes - 2; i >= 0; --i) bytes[i] ^= bytes[i + 1];

  // The first four bytes carry nothing of the value; it ends at its first zero byte.
  int n = 0;
  for (int i = kValueStart; i < kBytes && bytes[i] != 0; ++i) {
    value[n++] = static_cast<char>(bytes[i]);
  }
  value[n] = '\0';
  return true;
}

}  // namespace vxcrypt
