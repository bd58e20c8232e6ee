// Product identity and the checks that decide whether a run may start and whether a plug-in
// accepts the run's versions ("vxmigrate.ini" beside the executable).

#include <sys/stat.h>
#include <unistd.h>

#include <string>

#include "foundation/files/file_manager.h"
#include "foundation/files/filename.h"
#include "foundation/files/run_doors.h"
#include "foundation/inifile/ini_file.h"
#include "migrate/manager.h"

namespace {

struct ProductEntry {
  int id;
  const char* text;
};

// In id order, ended by id 0.
const ProductEntry kProducts[] = {
    {1, "pavsuite"}, {2, "halsuite"},   {3, "mirsuite"},  {4, "tradeq"},       {5, "farm"},
    {6, "log"},      {7, "vvx"},        {8, "bastion"},   {9, "relaymap"},     {10, "addons"},
    {11, "sitechart"}, {12, "kitutil"}, {13, "watchdog"}, {14, "guard"},       {15, "halguard"},
    {16, "sysguard"}, {17, "vxobx_nt"}, {18, "vxobx_sun"}, {19, "vxobx_linux"}, {20, "obx"},
    {21, "tqrs"},    {0, nullptr}};

// A file where the folder should be is no installation folder either.
bool FolderExists(const vxStringBase& folder) {
  struct stat st;
  return stat(folder.c_str(), &st) == 0 && S_ISDIR(st.st_mode);
}

// The source folder without trailing separators ("/opt/a/" -> "/opt/a"), so that a trailing
// separator cannot hide a destination below it. The root itself stays "/".
vxStringBase WithoutTrailingSeparators(const vxStringBase& folder) {
  vxStringBase trimmed(folder);
  while (trimmed.length() > 1 &&
         (trimmed.at(trimmed.length() - 1) == '/' || trimmed.at(trimmed.length() - 1) == '\\')) {
    trimmed.cut(1);
  }
  return trimmed;
}

// "obx 1.0 to 4.5": a product's section of "vxmigrate.ini" as the user reads it.
std::string RangeText(const vxMappedINIFile& ranges, const vxStringBase& section) {
  return section.str() + " " + ranges.GetVal(section, "Low").str() + " to " +
         ranges.GetVal(section, "High").str();
}

}  // namespace

int vxMigrationManager::GetProductID(const char* text) {
  vxStringBase name(text);
  if (name.isEmpty()) return -1;
  for (const ProductEntry* entry = kProducts; entry->id != 0; ++entry) {
    if (name.equals(entry->text, false)) return entry->id;
  }
  return -1;
}

const char* vxMigrationManager::GetProductText(int id) {
  for (const ProductEntry* entry = kProducts; entry->id != 0; ++entry) {
    if (entry->id == id) return entry->text;
  }
  return nullptr;
}

int vxMigrationManager::DoCheckMigrateValidity() {
  if (!FolderExists(m_sourceDirectory)) {
    Log("Error: Source directory does not exist:  ", m_sourceDirectory.c_str());
    return 1;
  }
  if (!FolderExists(m_destinationDirectory)) {
    Log("Error: Destination directory does not exist:  ", m_destinationDirectory.c_str());
    return 1;
  }
  // A destination that continues the source text with a separator lies inside it. Found at
  // position 0 or 1 (a leading separator of either spelling), both count. The same text on both
  // sides is an in-place run, also when it ends in a separator.
  vxStringBase source = WithoutTrailingSeparators(m_sourceDirectory);
  unsigned int position = m_destinationDirectory.find(source, 0, true);
  if (position < 2 && !IsInPlaceMigrate()) {
    unsigned int after = position + source.length();
    if (m_destinationDirectory.find('\\', after) != vxStringBase::BadIndex ||
        m_destinationDirectory.find('/', after) != vxStringBase::BadIndex) {
      Log("Error: Destination directory cannot be child of source directory: ",
          m_destinationDirectory.c_str());
      return 1;
    }
  }
  // The texts may hide it: a link, "..", a bind mount. The real folders decide as well.
  if (m_doors != nullptr && m_doors->DestinationInsideSource()) {
    Log("Error: Destination directory cannot be child of source directory: ",
        m_destinationDirectory.c_str());
    return 1;
  }
  if (m_sourceProductID == -1) {
    Log("Error: Incorrect source product");
    return 1;
  }
  if (m_destinationProductID == -1) {
    Log("Error: Incorrect destination product");
    return 1;
  }
  // Only within one product is a step back refused; the third number is deliberately ignored.
  if (m_sourceProductID == m_destinationProductID) {
    const vxVersionDescriptor& from = *m_sourceVersionDescriptor;
    const vxVersionDescriptor& to = *m_destinationVersionDescriptor;
    if (to.m_major < from.m_major || (to.m_major == from.m_major && to.m_minor < from.m_minor)) {
      Log("Error: Cannot migrate because source version greater than destination version");
      return 1;
    }
  }
  int running = CheckEngineRunning(m_destinationProductID, *m_destinationVersionDescriptor, 0);
  if (running == 0) running = CheckEngineRunning(m_sourceProductID, *m_sourceVersionDescriptor, 1);
  if (running == 0) {
    running = CheckInterfaceRunning(m_destinationProductID, *m_destinationVersionDescriptor, 0);
  }
  if (running == 0) {
    running = CheckInterfaceRunning(m_sourceProductID, *m_sourceVersionDescriptor, 1);
  }
  return running;
}

int vxMigrationManager::DoCheckVersions(const vxStringBase& sourceSection,
                                        const vxStringBase& destinationSection) {
  vxStringBase path;
  vxFileManager::MakePath(path, vxFilename(m_executable).Directory(), "vxmigrate.ini", 1);
  vxMappedINIFile ranges(path);
  m_pluginSearch.rangesFile = path.str();
  if (ranges.Open(0) != 0) {
    Log("Error: Unable to open file:   ", path.c_str());
    return 2;
  }
  // Kept for the host, which shows the ranges when no plug-in accepted the versions.
  m_pluginSearch.ranges =
      RangeText(ranges, sourceSection) + ", " + RangeText(ranges, destinationSection);
  vxVersionDescriptor sourceLow(ranges.GetVal(sourceSection, "Low"));
  vxVersionDescriptor sourceHigh(ranges.GetVal(sourceSection, "High"));
  vxVersionDescriptor destinationLow(ranges.GetVal(destinationSection, "Low"));
  vxVersionDescriptor destinationHigh(ranges.GetVal(destinationSection, "High"));

  const vxVersionDescriptor& from = *m_sourceVersionDescriptor;
  const vxVersionDescriptor& to = *m_destinationVersionDescriptor;
  if (from < sourceLow || from > sourceHigh) return 1;
  if (to < destinationLow || to > destinationHigh) return 1;
  return 0;
}

int vxMigrationManager::DoBadMigration() {
  Log("No functions exist for migration of specified products - check names, versions");
  return 0;
}

bool vxMigrationManager::IsInlineMigrate() const {
  return m_sourceProductID == m_destinationProductID && m_sourceVersionDescriptor != nullptr &&
         m_destinationVersionDescriptor != nullptr &&
         m_sourceVersionDescriptor->IsInline(*m_destinationVersionDescriptor);
}

// Equal texts, or two spellings of one existing folder ("/opt/a" and "/opt/a/", or a link to it):
// copying a folder onto itself must never be taken for a side-by-side run, whose rewrites of the
// destination would then change the source.
bool vxMigrationManager::IsInPlaceMigrate() const {
  if (m_sourceDirectory.equals(m_destinationDirectory, true)) return true;
  struct stat source;
  struct stat destination;
  return !m_sourceDirectory.isEmpty() && !m_destinationDirectory.isEmpty() &&
         stat(m_sourceDirectory.c_str(), &source) == 0 &&
         stat(m_destinationDirectory.c_str(), &destination) == 0 && S_ISDIR(source.st_mode) &&
         source.st_dev == destination.st_dev && source.st_ino == destination.st_ino;
}

vxStringBase vxMigrationManager::GetFullSourceFilename(const char* name) const {
  vxStringBase path;
  vxFileManager::MakePath(path, m_sourceDirectory, vxStringBase::NullStr, name);
  return path;
}

vxStringBase vxMigrationManager::GetFullDestinationFilename(const char* name) const {
  vxStringBase path;
  vxFileManager::MakePath(path, m_destinationDirectory, vxStringBase::NullStr, name);
  return path;
}
