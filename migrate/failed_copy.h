// After a copy or a rewrite failed: which file to name. A read-only or full destination must not be reported
// as the readable source file that went into it.

#ifndef VXMIGRATE_MIGRATE_FAILED_COPY_H_
#define VXMIGRATE_MIGRATE_FAILED_COPY_H_

#include "foundation/string/string_base.h"

class vxMigrationManager;

// The error texts of a file that could not be read or written (three blanks, as the merges).
extern const char vxMsgUnableToOpenFile[];
extern const char vxMsgUnableToWriteFile[];

// True when the effective user can open path for reading.
bool vxCanRead(const vxStringBase& path);

// True when path plainly does not exist (no such file or folder). A file that could not be looked
// at (no permission, a path beyond the length limit) is not absent: the step failed on it.
bool vxIsAbsent(const vxStringBase& path);

// The failed copy's error text and the path it names: the source when it cannot be opened for
// reading, else the destination, which could not be written.
struct vxFailedCopy {
  const char* text;
  const vxStringBase* path;
};
vxFailedCopy vxBlameFailedCopy(const vxStringBase& source, const vxStringBase& destination);

// Logs the failed copy's error line.
void vxLogFailedCopy(vxMigrationManager& manager, const vxStringBase& source,
                     const vxStringBase& destination);

// The copy's result as the caller's success: true when it copied. A failed copy gets its error
// line; one whose source plainly does not exist gets none (there was nothing to carry over).
bool vxCopied(vxMigrationManager& manager, int copyResult, const vxStringBase& source,
              const vxStringBase& destination);

class vxMappedINIFile;
// Writes the settings file back (Close(1)); false, with the "Unable to write file" error line
// naming it logged, when that failed. The caller logs its success line only on true.
bool vxWroteBack(vxMigrationManager& manager, vxMappedINIFile& file);

#endif  // VXMIGRATE_MIGRATE_FAILED_COPY_H_
