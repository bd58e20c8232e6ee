// Feeds arbitrary bytes to every reader and writer of stored passwords and user names. Output
// buffers are sized exactly as each function documents, so the address sanitizer reports any write
// past them; a value that does not read back as it was written, or a one-step conversion to clear
// text that ends elsewhere than protecting and reading, stops the run.
// Input: byte 0 is the capacity handed to the readers, byte 1 the key text's length, then the key
// text, then the stored text or value.

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <string>
#include <vector>

#include "crypt/protected_value.h"
#include "crypt/value_conversion.h"
#include "foundation/string/string_base.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size < 2) return 0;
  const std::size_t keyLength = data[1] < size - 2 ? data[1] : size - 2;
  std::string key(reinterpret_cast<const char*>(data + 2), keyLength);
  std::string text(reinterpret_cast<const char*>(data + 2 + keyLength), size - 2 - keyLength);

  unsigned long capacity = data[0], length = capacity;
  std::unique_ptr<unsigned char[]> output(new unsigned char[capacity]);
  if (VXUI_Decrypt(&text[0], output.get(), &length, nullptr) && length > capacity) std::abort();
  length = capacity;
  if (TwoFishDecrypt(&key[0], &text[0], output.get(), &length) && length > capacity) std::abort();

  std::vector<char> stored(5 + 32 * ((text.size() + 3) / 16 + 1));
  std::unique_ptr<unsigned char[]> back(new unsigned char[text.size()]);
  length = text.size();
  if (!VXUI_Encrypt(reinterpret_cast<unsigned char*>(&text[0]), text.size(), stored.data()) ||
      !VXUI_Decrypt(stored.data(), back.get(), &length, nullptr) || length != text.size() ||
      std::memcmp(back.get(), text.data(), length) != 0) {
    std::abort();
  }

  vxStringBase value(text.c_str()), raw(text.c_str()), direct(text.c_str());
  const int protectedResult = ConvertToProtectedValue(value);
  if (protectedResult == 0 && !VXUI_IsOurTwoFish(const_cast<char*>(value.c_str()))) {
    std::abort();
  }
  DecryptToClearText(value);
  DecryptToClearText(raw);
  // The one-step conversion to clear text must end where protecting and reading ends.
  if (ConvertToClearText(direct) != protectedResult || direct != value) std::abort();
  return 0;
}
