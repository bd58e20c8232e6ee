// The manager's value conversions for stored passwords and user names: legacy or clear values into
// the protected form, and any stored form back into clear text.

#include <string>

#include "crypt/value_conversion.h"
#include "migrate/manager.h"

int vxMigrationManager::DoConvertEncryptedValue(vxStringBase& value) {
  if (ConvertToProtectedValue(value) != 0) {
    // Too long for the protected form's buffers: the stored value stays as it was.
    std::string length = std::to_string(value.length());
    Log("Error: Value too long to protect - left unchanged, characters: ", length.c_str());
  }
  return 0;
}

int vxMigrationManager::DoDecryptValue(vxStringBase& value) {
  DecryptToClearText(value);
  return 0;
}
