// Hexadecimal digits as protected values and key texts use them: written in upper case, high digit
// first; read in either case. Header-only and pure.

#ifndef VXMIGRATE_CRYPT_HEX_DIGITS_H_
#define VXMIGRATE_CRYPT_HEX_DIGITS_H_

namespace vxcrypt {

// 0 to 15 for a hexadecimal digit of either case, -1 for any other character.
inline int HexDigitValue(char c) {
  if (c >= '0' && c <= '9') return c - '0';
  if (c >= 'A' && c <= 'F') return c - 'A' + 10;
  if (c >= 'a' && c <= 'f') return c - 'a' + 10;
  return -1;
}

// Writes the two upper-case digits of byte at out[0] (high) and out[1] (low).
inline void WriteHexByte(unsigned char byte, char* out) {
  static const char kDigits[] = "0123456789ABCDEF";
  out[0] = kDigits[byte >> 4];
  out[1] = kDigits[byte & 0x0F];
}

// Reads the byte written by the two digits at text[0] and text[1]. False, with *byte untouched,
// when either is not a hexadecimal digit; text[1] is not looked at when text[0] is not one, so a
// terminating zero in text[0] stops the reading there.
inline bool ReadHexByte(const char* text, unsigned char* byte) {
  int high = HexDigitValue(text[0]);
  if (high < 0) return false;
  int low = HexDigitValue(text[1]);
  if (low < 0) return false;
  *byte = static_cast<unsigned char>((high << 4) | low);
  return true;
}

}  // namespace vxcrypt

#endif  // VXMIGRATE_CRYPT_HEX_DIGITS_H_
