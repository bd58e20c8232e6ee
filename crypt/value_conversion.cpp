// Converting stored values between their forms in fixed 1024-character working buffers. A value
// is measured before it is copied, so no buffer is ever overrun: what does not fit is refused.

#include "crypt/value_conversion.h"

#include <cstring>

#include "crypt/protected_value.h"

namespace {

constexpr unsigned int kWorkingBufferChars = 1024;

// Copies value with its terminating zero; false when it does not fit.
bool CopyToWorkingBuffer(const vxStringBase& value, char (&buffer)[kWorkingBufferChars]) {
  if (value.length() >= kWorkingBufferChars) return false;
  std::memcpy(buffer, value.c_str(), value.length() + 1);
  return true;
}

// Characters a protected value of length bytes takes, its terminating zero included.
unsigned long ProtectedChars(unsigned long length) { return 5 + 32 * ((length + 3) / 16 + 1); }

}  // namespace

int ConvertToProtectedValue(vxStringBase& value) {
  char clear[kWorkingBufferChars];
  if (!CopyToWorkingBuffer(value, clear)) return 1;
  if (VXUI_IsOurTwoFish(clear)) return 0;
  // The value is taken to be legacy-encoded; the encoding is its own inverse.
  Obsolete_EncodePasswordOrUserName(clear);
  unsigned long length = static_cast<unsigned long>(std::strlen(clear));
  if (ProtectedChars(length) > kWorkingBufferChars) return 1;
  char protectedText[kWorkingBufferChars];
  if (!VXUI_Encrypt(reinterpret_cast<unsigned char*>(clear), length, protectedText)) return 1;
  value = protectedText;
  return 0;
}

int DecryptToClearText(vxStringBase& value) {
  char stored[kWorkingBufferChars];
  if (!CopyToWorkingBuffer(value, stored)) return 1;
  // One more than the capacity handed over, so the clear text can always be terminated.
  unsigned char clear[kWorkingBufferChars + 1];
  unsigned long length = kWorkingBufferChars;
  if (!VXUI_Decrypt(stored, clear, &length, nullptr)) return 1;
  clear[length] = '\0';
  value = reinterpret_cast<const char*>(clear);
  return 0;
}

int ConvertToClearText(vxStringBase& value) {
  char text[kWorkingBufferChars];
  if (!CopyToWorkingBuffer(value, text)) return 1;
  if (VXUI_IsOurTwoFish(text)) return DecryptToClearText(value);
  Obsolete_EncodePasswordOrUserName(text);
  // Where the protected form would not fit, the two-step conversion keeps the stored value and
  // only reads it: the result must not depend on which way a caller goes.
  if (ProtectedChars(static_cast<unsigned long>(std::strlen(text))) > kWorkingBufferChars) {
    DecryptToClearText(value);
    return 1;
  }
  value = text;
  return 0;
}
