// The previous generation's reversible encoding of passwords and user names: each byte XORed with
// the pad byte at its position (the pad repeats every 64 bytes), except where the result would be a
// carriage return or line feed, which would break the settings-file line the value sits on.

#include "crypt/legacy_pad.h"
#include "crypt/protected_value.h"

void Obsolete_EncodePasswordOrUserName(char* text) {
  if (text == nullptr) return;
  int padPosition = 0;
  // A byte equal to its pad byte becomes zero and so ends the text: the loop stops right there,
  // exactly as if the length were measured again before every step.
  for (char* p = text; *p != '\0'; ++p) {
    unsigned char x = static_cast<unsigned char>(*p) ^ vxcrypt::kLegacyPad[padPosition];
    padPosition = (padPosition + 1) % vxcrypt::kLegacyPadSize;
    if (x == '\r' || x == '\n') continue;
    *p = static_cast<char>(x);
    if (x == 0) break;
  }
}
