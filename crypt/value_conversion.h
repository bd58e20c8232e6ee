// The two in-place conversions of a stored password or user name that profile migration and the
// edition conversion use: legacy-encoded to protected, and any stored form to clear text, plus the
// two in one step for values that must end in clear text. All work in 1024-character buffers; a
// value that does not fit is left exactly as it was.

#ifndef VXMIGRATE_CRYPT_VALUE_CONVERSION_H_
#define VXMIGRATE_CRYPT_VALUE_CONVERSION_H_

#include "foundation/export.h"
#include "foundation/string/string_base.h"

// Replaces a legacy-encoded value by the protected form of its clear text; a value already
// protected, or empty, is left alone. 0 when done or nothing was to do; 1 when the value (1024
// characters or more) or its protected form (clear text over 492 bytes) would not fit the working
// buffers, or encryption failed: the value is then unchanged.
VXM_EXPORT int ConvertToProtectedValue(vxStringBase& value);

// Replaces a protected or previous-generation value by its clear text (a protected value that does
// not decrypt becomes empty); any other value stays as it is. The clear text ends at its first zero
// byte. 0 when done; 1 when the value has 1024 characters or more and was left unchanged.
VXM_EXPORT int DecryptToClearText(vxStringBase& value);

// The clear text that ConvertToProtectedValue followed by DecryptToClearText leaves, and the first
// one's result, without encrypting anything: a legacy-encoded value is decoded, a protected or
// empty one is read as DecryptToClearText reads it. A legacy value whose clear text is over 492
// bytes gives 1 and is read as DecryptToClearText reads it, as that pair of calls would.
VXM_EXPORT int ConvertToClearText(vxStringBase& value);

#endif  // VXMIGRATE_CRYPT_VALUE_CONVERSION_H_
