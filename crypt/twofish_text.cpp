// TwoFishEncrypt and TwoFishDecrypt: a value, preceded by its length as four little-endian bytes,
// encrypted in whole Twofish blocks (ECB), each ciphertext byte complemented and written as two
// upper-case digits. The reader trusts nothing in its input: every count is checked against the
// bytes actually decrypted before anything is copied. The key's instances come from the per-thread
// cache: building the schedule is what a call would otherwise spend nearly all its time on.

#include "crypt/twofish_text.h"

#include <climits>
#include <cstdint>
#include <cstdlib>
#include <cstring>

#include "crypt/hex_digits.h"
#include "crypt/key_schedule_cache.h"
#include "crypt/protected_value.h"
#include "crypt/twofish_instances.h"

namespace vxcrypt {

namespace {

constexpr std::size_t kLengthFieldBytes = 4;

// A zero-filled heap buffer released on every way out. Empty when memory ran out.
class ZeroedBuffer {
 public:
  explicit ZeroedBuffer(std::size_t size)
      : bytes_(static_cast<std::uint8_t*>(std::calloc(size == 0 ? 1 : size, 1))) {}
  ~ZeroedBuffer() { std::free(bytes_); }
  ZeroedBuffer(const ZeroedBuffer&) = delete;
  ZeroedBuffer& operator=(const ZeroedBuffer&) = delete;

  std::uint8_t* get() const { return bytes_; }

 private:
  std::uint8_t* bytes_;
};

// The key size in bits a key text stands for, or 0 when it is neither 128 nor 256 bits. Looks at
// no more than 65 characters, so an unterminated giant key text costs nothing.
int KeyBitsOf(const char* keyText) {
  std::size_t digits = strnlen(keyText, 65);
  if (digits == 32) return 128;
  if (digits == 64) return 256;
  return 0;
}

// The largest value TwoFishEncrypt takes: its length must fit the four-byte field and the text
// form (32 digits a block, plus a zero) must be countable in a size_t.
constexpr unsigned long MaxEncryptLength() {
  std::uint64_t bySizeT = (static_cast<std::uint64_t>(SIZE_MAX) - 1) / 32 * 16 - 32;
  std::uint64_t limit = bySizeT < UINT32_MAX ? bySizeT : UINT32_MAX;
  return limit < ULONG_MAX ? static_cast<unsigned long>(limit) : ULONG_MAX;
}

std::uint32_t ReadLittleEndian32(const std::uint8_t* bytes) {
  return static_cast<std::uint32_t>(bytes[0]) | static_cast<std::uint32_t>(bytes[1]) << 8 |
         static_cast<std::uint32_t>(bytes[2]) << 16 | static_cast<std::uint32_t>(bytes[3]) << 24;
}

}  // namespace

int DecryptHexDigits(const char* keyText, const char* hex, std::size_t hexLength,
                     unsigned char* output, unsigned long* length) {
  if (keyText == nullptr || hex == nullptr || output == nullptr || length == nullptr) return 0;
  int keyBits = KeyBitsOf(keyText);
  if (keyBits == 0) return 0;
  // A trailing odd digit is ignored. Anything but whole blocks cannot be a ciphertext.
  std::size_t count = hexLength / 2;
  if (count == 0 || count % TWOFISH_BLOCK_SIZE != 0) return 0;

  ZeroedBuffer buffer(count);
  if (buffer.get() == nullptr) return 0;
  for (std::size_t i = 0; i < count; ++i) {
    unsigned char byte;
    if (!ReadHexByte(hex + 2 * i, &byte)) return 0;
    buffer.get()[i] = static_cast<std::uint8_t>(~byte);
  }

  const TwofishKeyPair* instances = CachedTwofishInstances(keyText, keyBits);
  if (instances == nullptr) return 0;
  long long bits = static_cast<long long>(count) * 8;
  if (BlockDecrypt(&instances->cipher, &instances->decrypt, buffer.get(), bits, buffer.get()) !=
      bits) {
    return 0;
  }

  // A length field claiming more bytes than were decrypted means a wrong key or a damaged text.
  std::uint32_t stored = ReadLittleEndian32(buffer.get());
  if (stored > count - kLengthFieldBytes) return 0;
  if (stored < *length) *length = stored;
  std::memcpy(output, buffer.get() + kLengthFieldBytes, *length);
  return 1;
}

}  // namespace vxcrypt

int TwoFishEncrypt(char* keyText, unsigned char* data, unsigned long length, char* output) {
  using namespace vxcrypt;  // NOLINT: the exported functions live outside the namespace
  if (keyText == nullptr || data == nullptr || output == nullptr) return 0;
  int keyBits = KeyBitsOf(keyText);
  if (keyBits == 0 || length > MaxEncryptLength()) return 0;

  std::size_t blocks = (static_cast<std::size_t>(length) + 3) / TWOFISH_BLOCK_SIZE + 1;
  std::size_t bytes = blocks * TWOFISH_BLOCK_SIZE;
  ZeroedBuffer buffer(bytes);  // the zeros after the value are the filler
  if (buffer.get() == nullptr) return 0;
  std::uint32_t field = static_cast<std::uint32_t>(length);
  for (std::size_t i = 0; i < kLengthFieldBytes; ++i) {
    buffer.get()[i] = static_cast<std::uint8_t>(field >> (8 * i));
  }
  std::memcpy(buffer.get() + kLengthFieldBytes, data, length);

  const TwofishKeyPair* instances = CachedTwofishInstances(keyText, keyBits);
  if (instances == nullptr) return 0;
  long long bits = static_cast<long long>(length) * 8 + 32;
  if (BlockEncrypt(&instances->cipher, &instances->encrypt, buffer.get(), bits, buffer.get()) !=
      bits) {
    return 0;
  }

  for (std::size_t i = 0; i < bytes; ++i) {
    WriteHexByte(static_cast<unsigned char>(~buffer.get()[i]), output + 2 * i);
  }
  output[2 * bytes] = '\0';
  return 1;
}

int TwoFishDecrypt(char* keyText, char* hexText, unsigned char* output, unsigned long* length) {
  if (hexText == nullptr) return 0;
  return vxcrypt::DecryptHexDigits(keyText, hexText, std::strlen(hexText), output, length);
}
