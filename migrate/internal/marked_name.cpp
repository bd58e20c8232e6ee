// Marked-copy names shared by the user-file, profile, alert and categories operations, so that a
// copy and the categories entry pointing at it are always spelt alike.

#include "migrate/internal/marked_name.h"

#include "foundation/files/filename.h"

const char kMigrationMark[] = "_vxmigrate";

bool CarriesMigrationMark(const vxStringBase& baseName) {
  return baseName.endsWith(kMigrationMark, true);
}

vxStringBase MarkedBaseName(const vxStringBase& baseName) {
  vxStringBase marked(baseName);
  if (!CarriesMigrationMark(marked)) marked.append(kMigrationMark);
  return marked;
}

vxStringBase MarkedFileName(const vxStringBase& fileName, const vxStringBase& extension) {
  vxStringBase marked = MarkedBaseName(vxFilename(fileName).BaseName());
  marked.append('.');
  marked.append(extension);
  return marked;
}

vxStringBase MarkedFileNameKeepingExtension(const vxStringBase& fileName) {
  vxFilename name(fileName);
  vxStringBase marked = MarkedBaseName(name.BaseName());
  vxStringBase extension = name.Extension();
  if (!extension.isEmpty()) {
    marked.append('.');
    marked.append(extension);
  }
  return marked;
}

vxStringBase LastPathComponent(const vxStringBase& path) {
  unsigned int slash = path.rfind('/');
  unsigned int backslash = path.rfind('\\');
  unsigned int last = slash;
  if (last == vxStringBase::BadIndex || (backslash != vxStringBase::BadIndex && backslash > last)) {
    last = backslash;
  }
  if (last == vxStringBase::BadIndex) return path;
  return path.subString(last + 1, path.length());
}
