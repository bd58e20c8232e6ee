// The file-system side of the INI model: reading a whole regular file in one go. Writing goes
// through the atomic writer of foundation/files/atomic_file.h.

#ifndef VXMIGRATE_FOUNDATION_INIFILE_INI_DISK_H_
#define VXMIGRATE_FOUNDATION_INIFILE_INI_DISK_H_

#include <sys/types.h>

#include <string>

namespace vxini {

// Reads the regular file at path into text. False when it is missing, unreadable, not a regular
// file (a folder, a device, a pipe), or too large for the model's 32-bit offsets.
// mode, when given, receives the file's permission bits.
bool ReadWholeFile(const std::string& path, std::string* text, mode_t* mode = nullptr);

}  // namespace vxini

#endif  // VXMIGRATE_FOUNDATION_INIFILE_INI_DISK_H_
