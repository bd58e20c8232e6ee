// Feeds arbitrary bytes to every reader and writer of stored passwords and user names. Output
// buffers are sized exactly as each function documents, so the address sanitizer reports any write
// or read past them; a value that does not read back as it was written stops the run.
//
// Input: byte 0 is the capacity handed to the readers, byte 1 the key text's length, then the key
// text, then the stored text or value.

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <string>
#include <vector>

#include "crypt/legacy_pad.h"
#include "crypt/protected_value.h"
#include "crypt/value_conversion.h"
#include "foundation/string/string_base.h"

namespace {

void Check(bool condition) {
  if (!condition) std::abort();
}

// A heap block of exactly size bytes, never a null pointer (size 0 included).
std::unique_ptr<unsigned char[]> Exactly(std::size_t size) {
  return std::unique_ptr<unsigned char[]>(new unsigned char[size]);
}

void ReadStoredText(std::string text, unsigned long capacity) {
  std::unique_ptr<unsigned char[]> output = Exactly(capacity);
  unsigned long length = capacity;
  unsigned int flag = 0;
  if (VXUI_Decrypt(&text[0], output.get(), &length, &flag)) Check(length <= capacity);
  VXUI_IsOurTwoFish(&text[0]);

  char key[33];
  GetProtectedValueKey(key);
  length = capacity;
  if (TwoFishDecrypt(key, &text[0], output.get(), &length)) Check(length <= capacity);
}

void RoundTrip(std::string value) {
  std::size_t blocks = (value.size() + 3) / 16 + 1;
  std::vector<char> stored(5 + 32 * blocks);
  unsigned char* data = reinterpret_cast<unsigned char*>(&value[0]);
  Check(VXUI_Encrypt(data, value.size(), stored.data()) == 1);
  std::vector<unsigned char> back(value.size() + 1);
  unsigned long length = back.size();
  unsigned int flag = 0;
  Check(VXUI_Decrypt(stored.data(), back.data(), &length, &flag) == 1);
  Check(length == value.size() && std::memcmp(back.data(), value.data(), length) == 0);
}

void KeyedRoundTrip(std::string key, std::string value) {
  std::vector<char> hex(32 * ((value.size() + 3) / 16 + 1) + 1);
  unsigned char* data = reinterpret_cast<unsigned char*>(&value[0]);
  if (!TwoFishEncrypt(&key[0], data, value.size(), hex.data())) return;
  std::unique_ptr<unsigned char[]> back = Exactly(value.size());
  unsigned long length = value.size();
  Check(TwoFishDecrypt(&key[0], hex.data(), back.get(), &length) == 1);
  Check(length == value.size() && std::memcmp(back.get(), value.data(), length) == 0);
}

// Encoding twice gives the text back unless a byte meets its pad byte or a line break is involved.
void LegacyTwice(std::string text) {
  bool invertible = true;
  for (std::size_t i = 0; i < std::strlen(text.c_str()); ++i) {
    unsigned char c = static_cast<unsigned char>(text[i]);
    unsigned char pad = vxcrypt::kLegacyPad[i % vxcrypt::kLegacyPadSize];
    if (c == pad || c == '\r' || c == '\n') invertible = false;
  }
  std::string before = text;
  Obsolete_EncodePasswordOrUserName(&text[0]);
  Obsolete_EncodePasswordOrUserName(&text[0]);
  if (invertible) Check(text == before);
}

void Conversions(const std::string& text) {
  vxStringBase value(text.c_str());
  if (ConvertToProtectedValue(value) == 0)
    Check(VXUI_IsOurTwoFish(const_cast<char*>(value.c_str())));
  DecryptToClearText(value);
  vxStringBase raw(text.c_str());
  DecryptToClearText(raw);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size < 2) return 0;
  unsigned long capacity = data[0];
  std::size_t keyLength = data[1] < size - 2 ? data[1] : size - 2;
  std::string key(reinterpret_cast<const char*>(data + 2), keyLength);
  std::string rest(reinterpret_cast<const char*>(data + 2 + keyLength), size - 2 - keyLength);

  ReadStoredText(rest, capacity);
  RoundTrip(rest);
  KeyedRoundTrip(key.c_str(), rest);
  LegacyTwice(rest);
  Conversions(rest);
  return 0;
}
