// The main settings file, "vantix.ini": the old installation's values are merged into the new
// installation's file, then the log-analysis settings are brought up to date. The result is always
// 0; what happened is in the run log.

#include "migrate/manager.h"

int vxMigrationManager::DoVantixINIMerge() {
  // In place the live "vantix.ini" already belongs to the new installation; the old values
  // survive only in the backup the installer left beside it.
  const char* sourceName = IsInPlaceMigrate() ? "\\vantix.vxinibak" : "\\vantix.ini";
  vxStringBase source = GetFullSourceFilename(sourceName);
  vxStringBase destination = GetFullDestinationFilename("\\vantix.ini");
  MergeINIFiles(source.c_str(), destination.c_str());
  DoVXMLogINIChange();
  return 0;
}
