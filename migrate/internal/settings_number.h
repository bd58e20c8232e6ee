// Reading numbers out of settings files that may hold anything: a hand-edited count of "abc",
// "-5" or "99999999999999999999" reads the same on 32- and 64-bit builds, never wraps and never
// makes a caller loop for ever. Every count and limit the settings migrations read goes through it.

#ifndef VXMIGRATE_MIGRATE_INTERNAL_SETTINGS_NUMBER_H_
#define VXMIGRATE_MIGRATE_INTERNAL_SETTINGS_NUMBER_H_

#include "foundation/string/string_base.h"

namespace vxsettings {

// The largest count or limit taken from a settings file. No installation has anywhere near a
// million entries of one kind; a larger value is a damaged file, not a real count.
constexpr long kMaxSettingsNumber = 1000000;

// The text read as vxStringBase::asLong reads it (leading blanks, sign, digits up to the first
// other character; no digits give 0), then held within [0, kMaxSettingsNumber].
inline long ReadSettingsNumber(const vxStringBase& text) {
  long value = text.asLong();
  if (value < 0) return 0;
  if (value > kMaxSettingsNumber) return kMaxSettingsNumber;
  return value;
}

}  // namespace vxsettings

#endif  // VXMIGRATE_MIGRATE_INTERNAL_SETTINGS_NUMBER_H_
