// Names of marked copies: a user file carried into the new installation as its name without
// extension, "_vxmigrate", a dot and an extension, so that it cannot clash with the new
// installation's own files. A name that carries the mark already is not marked twice, so migrating
// an installation that still holds marked copies never piles up "_vxmigrate_vxmigrate" names.

#ifndef VXMIGRATE_MIGRATE_INTERNAL_MARKED_NAME_H_
#define VXMIGRATE_MIGRATE_INTERNAL_MARKED_NAME_H_

#include "foundation/string/string_base.h"

// "_vxmigrate"
extern const char kMigrationMark[];

// True when baseName ends in the mark (exact case: the mark is only ever written by this library).
bool CarriesMigrationMark(const vxStringBase& baseName);

// baseName followed by the mark, or baseName alone when it ends in the mark already.
vxStringBase MarkedBaseName(const vxStringBase& baseName);

// The marked copy's name of fileName (a bare name): its name without extension, marked, then "."
// and extension ("report.wlp", "wlp" -> "report_vxmigrate.wlp").
vxStringBase MarkedFileName(const vxStringBase& fileName, const vxStringBase& extension);

// The file name's own extension kept: "a.wlp" -> "a_vxmigrate.wlp", "a" -> "a_vxmigrate".
vxStringBase MarkedFileNameKeepingExtension(const vxStringBase& fileName);

// The part of path after its last '/' or '\\' (all of it when it has neither).
vxStringBase LastPathComponent(const vxStringBase& path);

#endif  // VXMIGRATE_MIGRATE_INTERNAL_MARKED_NAME_H_
