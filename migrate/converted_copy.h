// Carrying a settings file into the destination converted: the source is read, converted in
// memory and written once under its final name, never over an entry already there. A kill or a
// failed write therefore leaves either no file or the whole converted one, never an unconverted
// copy under the final name. What cannot be converted (a file that does not read as settings, a
// conversion that declines) is carried exactly as it is, as the migrations have always done.

#ifndef VXMIGRATE_MIGRATE_CONVERTED_COPY_H_
#define VXMIGRATE_MIGRATE_CONVERTED_COPY_H_

#include <functional>

#include "foundation/inifile/ini_file.h"
#include "foundation/string/string_base.h"

enum class vxConvertedCopy {
  kConverted,    // written converted
  kNotSettings,  // the source does not read as settings: copied as it is
  kDeclined,     // the conversion declined (it said why): copied as it is
  kExists,       // target was there already (perhaps since the check): left as it is
  kFailed,       // nothing could be written (the caller names the file that failed)
};

// Changes the profile in memory; false carries the source as it is instead.
using vxSettingsConversion = std::function<bool(vxMappedINIFile& content)>;

// REQUIRES: target names a file in an existing destination folder.
vxConvertedCopy WriteConvertedCopy(const vxStringBase& source, const vxStringBase& target,
                                   const vxSettingsConversion& convert);

// The same from content already in memory (a parsed standard file): a copy of it is converted.
vxConvertedCopy WriteConvertedCopy(const vxMappedINIFile& content, const vxStringBase& target,
                                   const vxSettingsConversion& convert);

#endif  // VXMIGRATE_MIGRATE_CONVERTED_COPY_H_
