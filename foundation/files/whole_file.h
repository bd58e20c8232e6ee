// Reading a whole file in one go: the one reader under the INI model, the basic file, the run's
// journal and the host's report. A settings file is read with one read call in the common case
// (sized from fstat, plus one byte to see its end), and never blocks on a pipe or a device.

#ifndef VXMIGRATE_FOUNDATION_FILES_WHOLE_FILE_H_
#define VXMIGRATE_FOUNDATION_FILES_WHOLE_FILE_H_

#include <sys/types.h>

#include <cstddef>
#include <cstdint>
#include <string>

#include "foundation/export.h"

namespace vxfiles {

// The largest file read whole: offsets into a settings file's text are 32-bit.
constexpr size_t kMaxWholeFile = UINT32_MAX - 1;

// Reads fd from its current offset to its end into text. sizeHint is the expected size (0 when
// unknown). False (text empty) on a read error or when the content is longer than limit or than
// memory allows.
VXM_EXPORT bool ReadRest(int fd, size_t sizeHint, size_t limit, std::string* text);

// Reads the regular file at path into text, after the run's read door. False (text empty) when it
// is missing, unreadable, refused by the door, not a regular file (a folder, a device, a pipe), or
// longer than limit. mode, when given, receives the file's permission bits.
VXM_EXPORT bool ReadWholeFile(const std::string& path, std::string* text, mode_t* mode = nullptr,
                              size_t limit = kMaxWholeFile);

}  // namespace vxfiles

#endif  // VXMIGRATE_FOUNDATION_FILES_WHOLE_FILE_H_
