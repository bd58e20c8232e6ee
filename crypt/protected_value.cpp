// Making and reading protected values ("D9" + digits + "AB") with the fixed key, and recognising
// the older forms a stored value may still be in. Every reader measures its input once and checks
// each count against the caller's capacity before writing.

#include "crypt/protected_value.h"

#include <cstddef>
#include <cstring>

#include "crypt/previous_generation.h"
#include "crypt/twofish_text.h"

namespace {

constexpr char kFixedKeyText[] = "E9D857A2932234ADC27EF075217EC990";
constexpr std::size_t kMarkerChars = 2;  // "D9" in front, "AB" behind
constexpr std::size_t kDigitsPerBlock = 32;

bool IsProtectedForm(const char* text, std::size_t length) {
  return length > 2 * kMarkerChars && (length - 2 * kMarkerChars) % kDigitsPerBlock == 0 &&
         text[0] == 'D' && text[1] == '9' && text[length - 2] == 'A' && text[length - 1] == 'B';
}

void SetFlag(unsigned int* flag, unsigned int value) {
  if (flag != nullptr) *flag = value;
}

// Plain text as it stands, cut to capacity - 1 characters when it does not fit whole so that the
// terminating zero always lies within the capacity. The count becomes the characters copied.
void CopyPlainValue(const char* input, std::size_t inputLength, unsigned char* output,
                    unsigned long* length) {
  unsigned long capacity = *length;
  std::size_t copied = 0;
  if (inputLength < capacity) {
    copied = inputLength;
  } else if (capacity > 0) {
    copied = capacity - 1;
  }
  if (capacity > 0) {
    std::memcpy(output, input, copied);
    output[copied] = '\0';
  }
  *length = static_cast<unsigned long>(copied);
}

}  // namespace

int VXUI_Encrypt(unsigned char* data, unsigned long length, char* output) {
  if (output == nullptr) return 0;
  if (length == 0) {
    output[0] = '\0';
    return 1;
  }
  if (data == nullptr) return 0;
  char key[sizeof(kFixedKeyText)];
  GetProtectedValueKey(key);
  if (!TwoFishEncrypt(key, data, length, output + kMarkerChars)) return 0;
  std::size_t digits = ((static_cast<std::size_t>(length) + 3) / 16 + 1) * kDigitsPerBlock;
  output[0] = 'D';
  output[1] = '9';
  std::memcpy(output + kMarkerChars + digits, "AB", 3);
  return 1;
}

int VXUI_Decrypt(char* input, unsigned char* output, unsigned long* length,
                 unsigned int* wasNotProtected) {
  if (input == nullptr || output == nullptr || length == nullptr) return 0;
  SetFlag(wasNotProtected, 0);
  unsigned long capacity = *length;
  if (capacity > 0) output[0] = '\0';
  std::size_t inputLength = std::strlen(input);

  if (IsProtectedForm(input, inputLength)) {
    char key[sizeof(kFixedKeyText)];
    GetProtectedValueKey(key);
    // A value that does not decrypt is still ours: the caller sees it as empty.
    if (!vxcrypt::DecryptHexDigits(key, input + kMarkerChars, inputLength - 2 * kMarkerChars,
                                   output, length)) {
      *length = 0;
    } else if (*length < capacity) {
      output[*length] = '\0';
    }
    return 1;
  }

  char previous[vxcrypt::kPreviousGenerationMaxValue + 1];
  // Eighty characters that are not all digits cannot be the old form: they are plain text.
  if (inputLength == vxcrypt::kPreviousGenerationDigits &&
      vxcrypt::DecodePreviousGeneration(input, previous)) {
    if (capacity <= vxcrypt::kPreviousGenerationMaxValue) return 0;
    std::size_t n = std::strlen(previous);
    std::memcpy(output, previous, n + 1);
    *length = static_cast<unsigned long>(n);
  } else {
    CopyPlainValue(input, inputLength, output, length);
  }
  SetFlag(wasNotProtected, 1);
  return 1;
}

int VXUI_IsOurTwoFish(char* text) {
  if (text == nullptr) return 0;
  std::size_t length = std::strlen(text);
  return length == 0 || IsProtectedForm(text, length) ? 1 : 0;
}

__attribute__((noinline)) void* TwoFishHere(unsigned long) {
  return __builtin_extract_return_addr(__builtin_return_address(0));
}

void GetProtectedValueKey(char* buffer) {
  if (buffer == nullptr) return;
  std::memcpy(buffer, kFixedKeyText, sizeof(kFixedKeyText));
}
