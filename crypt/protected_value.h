// Protected values: the text form of stored passwords and user names, "D9" + upper-case hexadecimal
// of the complemented Twofish (ECB) encryption of the value + "AB". The reader also takes the
// previous generation's 80-digit form and plain text. All functions are safe on any input: a bad
// value gives the failure result, never a read or write past a buffer the caller sized as
// documented. The Twofish key schedule of the last key used is kept per thread, so calls from
// several threads need no locking and only the first call with a key pays for its schedule.

#ifndef VXMIGRATE_CRYPT_PROTECTED_VALUE_H_
#define VXMIGRATE_CRYPT_PROTECTED_VALUE_H_

#include "foundation/export.h"

// Encrypts length bytes of data with the key given as 32 or 64 hexadecimal digits; output receives
// the hexadecimal digits alone and a terminating zero (room for 32 * blocks + 1 characters, blocks
// = (length + 3) / 16 + 1). 1 on success, 0 on failure.
VXM_EXPORT int TwoFishEncrypt(char* keyText, unsigned char* data, unsigned long length, char* output);
// The reverse. *length is the capacity of output on entry and the value's length (capped to the
// capacity) on success; no terminating zero is added. 1 on success, 0 on failure.
VXM_EXPORT int TwoFishDecrypt(char* keyText, char* hexText, unsigned char* output, unsigned long* length);

// Makes a protected value of length bytes (length 0: the empty text). output needs room for
// 5 + 32 * blocks characters. 1 on success, 0 on failure.
VXM_EXPORT int VXUI_Encrypt(unsigned char* data, unsigned long length, char* output);
// Reads a protected, previous-generation or plain value into output (capacity *length on entry,
// the value's length on return). *wasNotProtected (may be null) is set to 1 when the input was not
// in the protected form. 1 on success, 0 on failure.
VXM_EXPORT int VXUI_Decrypt(char* input, unsigned char* output, unsigned long* length,
                 unsigned int* wasNotProtected);
// 1 when text is empty or in the protected form; 0 otherwise, also for null.
VXM_EXPORT int VXUI_IsOurTwoFish(char* text);
// Returns the address it was called from; nothing depends on it.
VXM_EXPORT void* TwoFishHere(unsigned long unused);
// Copies the fixed key text (32 digits and a terminating zero) into buffer (33 characters at least).
VXM_EXPORT void GetProtectedValueKey(char* buffer);

// The previous product generation's reversible encoding of a password or user name, in place. It is
// its own inverse for texts without carriage returns, line feeds or bytes equal to the pad's.
VXM_EXPORT void Obsolete_EncodePasswordOrUserName(char* text);

#endif  // VXMIGRATE_CRYPT_PROTECTED_VALUE_H_
