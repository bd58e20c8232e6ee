// The manager's value conversions for stored passwords and user names: legacy or clear values into
// the protected form, and any stored form back into clear text.

#include "crypt/value_conversion.h"
#include "migrate/manager.h"

int vxMigrationManager::DoConvertEncryptedValue(vxStringBase& value) {
  ConvertToProtectedValue(value);
  return 0;
}

int vxMigrationManager::DoDecryptValue(vxStringBase& value) {
  DecryptToClearText(value);
  return 0;
}
