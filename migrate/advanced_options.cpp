// Merges the advanced-option files of the profiles ("datfiles/<kind>/default.ini"): numbered
// entries, one section each, and a count. The new installation keeps its entries and their numbers;
// the old installation's entries it lacks are appended after them, numbered without gaps, and a
// number already taken by a section of the new file is never reused.

#include <memory>
#include <string>
#include <unordered_set>
#include <vector>

#include "foundation/files/file_manager.h"
#include "foundation/inifile/ini_file.h"
#include "migrate/failed_copy.h"
#include "migrate/internal/settings_number.h"
#include "migrate/manager.h"

namespace {

const char kDynamicPages[] = "/vxm_vxx/datfiles/dynamicpages/default.ini";
const char kSampleParams[] = "/vxm_vxx/datfiles/dynamicpages/sampleparams.txt";
const char kMigrated[] = "Advanced option file migrated: ";

vxStringBase SectionName(const vxStringBase& prefix, long number) {
  vxStringBase name(prefix);
  name.append(number);
  return name;
}

// The backup of an in-place run: the installer kept the old "x.ini" beside the new one as
// "x.vxinibak". Only the name's extension changes, never a folder that happens to hold ".ini".
void UseInPlaceBackup(vxStringBase& path) {
  if (path.endsWith(".ini", false)) {
    path.cut(4);
    path.append(".vxinibak");
  }
}

// The destination's entries of one family, as the merge adds to them: which identifiers they hold
// (ignoring case) and the number the next added entry takes.
//
// The entries are the sections numbered below the count. Their identifiers are indexed once; an
// added entry is compared with the destination's own entries only, never with entries the merge
// added. New numbers follow the count. A section that already sits at such a number (a count left
// behind by a hand edit) is never overwritten: the count grows over it, so it becomes one of the
// destination's entries, indexed like the others, and the new entry takes the next free number.
class EntryNumbering {
 public:
  EntryNumbering(const vxMappedINIFile& destination, const vxStringBase& prefix, const char* idKey,
                 long count)
      : destination_(destination), prefix_(prefix), idKey_(idKey), next_(count) {
    ids_.reserve(static_cast<size_t>(count));
    for (long j = 0; j < count; ++j) IndexEntry(j);
  }

  EntryNumbering(const EntryNumbering&) = delete;
  EntryNumbering& operator=(const EntryNumbering&) = delete;

  // True when the destination holds an entry with this identifier: the destination wins.
  bool Holds(const vxStringBase& id) const { return ids_.count(vxFoldCase(id.view())) != 0; }

  // Reserves the number for an entry about to be added; the count becomes that number plus one.
  long TakeNextNumber() {
    while (destination_.HasSection(SectionName(prefix_, next_))) {
      IndexEntry(next_);
      ++next_;
    }
    return next_++;
  }

 private:
  void IndexEntry(long number) {
    const INILineList* lines = destination_.GetPropertyList(SectionName(prefix_, number));
    if (lines != nullptr) ids_.insert(vxFoldCase(destination_.GetVal(lines, idKey_).view()));
  }

  const vxMappedINIFile& destination_;
  const vxStringBase prefix_;
  const vxStringBase idKey_;
  long next_;
  std::unordered_set<std::string> ids_;
};

// Products whose dynamic-page entries carry qualification keys numbered by entry.
bool HasNumberedQualifications(int sourceProduct) {
  return sourceProduct == 1 || sourceProduct == 2 || sourceProduct == 3 || sourceProduct == 6;
}

// The reporting-server products number every entry's qualification keys 0.
bool UsesQualificationZero(int destinationProduct) {
  return destinationProduct == 20 || destinationProduct == 21;
}

// A long qualification key ("Qualification4URL") renumbered for the entry's new place: the text
// from "URL" on (or the whole old key when it has no "URL") behind "Qualification" and the number.
// Keys of 16 characters or fewer are not numbered keys and stay.
bool RenumberQualificationKey(const vxStringBase& key, const std::string& number,
                              vxStringBase& renumbered) {
  static const char kQualification[] = "Qualification";
  const unsigned int prefixLength = sizeof(kQualification) - 1;
  if (key.length() <= prefixLength + 3 || !key.beginsWith(kQualification)) return false;
  unsigned int url = key.find("URL");
  vxStringBase rest = url == vxStringBase::BadIndex ? key : key.subString(url, key.length());
  renumbered = kQualification;
  renumbered.append(number.c_str());
  renumbered.append(rest);
  return true;
}

// Adds a source entry under its new section name, its qualification keys renumbered when number
// is given (otherwise the lines are copied as they are).
void AddEntry(vxMappedINIFile& destination, const vxStringBase& section, const INILineList& lines,
              const std::string* number) {
  if (number == nullptr) {
    destination.AddMapSection(section.c_str(), &lines);
    return;
  }
  std::vector<std::unique_ptr<INILine>> renamed;
  INILineList entry;
  vxStringBase key;
  for (INILine* line : lines) {
    if (RenumberQualificationKey(line->m_key, *number, key)) {
      renamed.push_back(std::make_unique<INILine>(*line));
      renamed.back()->m_key = key;
      entry.push_back(renamed.back().get());
    } else {
      entry.push_back(line);
    }
  }
  destination.AddMapSection(section.c_str(), &entry);
}

}  // namespace

int vxMigrationManager::MergeAdvancedOptionsFiles(const vxStringBase& sourceFile,
                                                  const vxStringBase& destinationFile,
                                                  const vxStringBase& prefix) {
  vxStringBase sourcePath;
  vxFileManager::MakePath(sourcePath, m_sourceDirectory, sourceFile, 1);
  if (IsInPlaceMigrate()) UseInPlaceBackup(sourcePath);
  vxMappedINIFile source(sourcePath);
  if (source.Open(0) != 0) return 1;

  vxStringBase destinationPath;
  vxFileManager::MakePath(destinationPath, m_destinationDirectory, destinationFile, 1);
  vxMappedINIFile destination(destinationPath);
  if (destination.Open(1) != 0) return 1;

  vxStringBase countKey(prefix);
  countKey.append("Count");
  const long sourceCount = vxsettings::ReadSettingsNumber(source.GetVal("Default", countKey));
  const long destinationCount =
      vxsettings::ReadSettingsNumber(destination.GetVal("Default", countKey));
  EntryNumbering numbering(destination, prefix, "profilename", destinationCount);

  // The literal backslash test is deliberate: only callers naming the file with backslashes ask
  // for qualification keys to be renumbered.
  const bool renumber = destinationFile.find("\\dynamicpages\\") != vxStringBase::BadIndex &&
                        HasNumberedQualifications(m_sourceProductID);

  for (long i = 0; i < sourceCount; ++i) {
    const INILineList* lines = source.GetPropertyList(SectionName(prefix, i));
    if (lines == nullptr) continue;
    if (numbering.Holds(source.GetVal(lines, "profilename"))) continue;
    const long number = numbering.TakeNextNumber();
    const std::string qualificationNumber =
        UsesQualificationZero(m_destinationProductID) ? "0" : std::to_string(number);
    AddEntry(destination, SectionName(prefix, number), *lines,
             renumber ? &qualificationNumber : nullptr);
    destination.SetVal("Default", countKey, number + 1);
  }

  if (!vxWroteBack(*this, destination)) return 1;
  Log(kMigrated, sourceFile.c_str());
  return 0;
}

namespace {

// The keys of a version-3 query-parameter entry, in the order they are written, and the old key
// each takes its value from (null: written empty; "=2", "=1": that fixed value).
struct QueryKey {
  const char* written;
  const char* from;
};
const QueryKey kQueryKeys[] = {
    {"qualification0url", "page"}, {"mapfile0", "mapfile"},     {"mapfile1", nullptr},
    {"parameter0", "parameter"},   {"parameter1", nullptr},     {"profilename", "profilename"},
    {"profileid", "profileid"},    {"profileversion", "=2"},    {"pagetype", "pagetype"},
    {"numparams", "=1"},           {"isregexp", "isregexp"},    {"displayparm", "displayparm"},
    {"displayparm1", nullptr},
};

// Writes one old dynamic-page entry as a version-3 query-parameter entry; keys of the old entry
// that the new layout has no place for are left behind.
void WriteQueryEntry(vxMappedINIFile& destination, const vxStringBase& section,
                     const vxMappedINIFile& source, const INILineList* old) {
  for (const QueryKey& key : kQueryKeys) {
    vxStringBase value;
    if (key.from != nullptr) {
      value = key.from[0] == '=' ? vxStringBase(key.from + 1) : source.GetVal(old, key.from);
    }
    destination.SetVal(section, key.written, value);
  }
}

}  // namespace

int vxMigrationManager::DoOBXMergeAdvancedOptionsFiles() {
  static const char* const kFiles[][2] = {
      {"/vxm_vxx/datfiles/contentgroups/default.ini", "contentgroupprofile"},
      {"/vxm_vxx/datfiles/pathsanalysis/default.ini", "pathsanalysisprofile"},
      {"/vxm_vxx/datfiles/urlreplacement/default.ini", "urlreplacementprofile"},
      {"/vxm_vxx/datfiles/tradequill/default.ini", "adcampaignprofile"},
      {"/vxm_vxx/datfiles/tradequill/default.ini", "productprofile"},
      {"/vxm_vxx/datfiles/tradequill/default.ini", "categoryprofile"},
  };
  // Each file stands by itself: one that cannot be opened does not stop the others.
  for (const auto& file : kFiles) MergeAdvancedOptionsFiles(file[0], file[0], file[1]);

  if (m_destinationVersionDescriptor == nullptr || m_destinationVersionDescriptor->m_major < 3) {
    MergeAdvancedOptionsFiles(kDynamicPages, kDynamicPages, "queryprofile");
    return 0;
  }

  // From version 3 on, dynamic pages are query-parameter entries of another layout.
  vxStringBase sourcePath;
  vxFileManager::MakePath(sourcePath, m_sourceDirectory, kDynamicPages, 1);
  if (IsInPlaceMigrate()) UseInPlaceBackup(sourcePath);
  if (!vxFileManager::Exists(sourcePath)) return 1;
  vxMappedINIFile source(sourcePath);
  if (source.Open(0) != 0) return 1;

  vxStringBase destinationPath;
  vxFileManager::MakePath(destinationPath, m_destinationDirectory, kDynamicPages, 1);
  if (!vxFileManager::Exists(destinationPath)) {
    // Nothing to merge into: the old file travels whole, with its sample parameters.
    const int copied =
        vxFileManager::CopyFile(sourcePath, destinationPath, 0, 1, 0, 0, 0, nullptr, nullptr);
    Log("INI file doesn't exist - file being copied: ", sourcePath.c_str());
    if (!vxCopied(*this, copied, sourcePath, destinationPath)) return 1;
    vxStringBase sourceSample;
    vxStringBase destinationSample;
    vxFileManager::MakePath(sourceSample, m_sourceDirectory, kSampleParams, 1);
    vxFileManager::MakePath(destinationSample, m_destinationDirectory, kSampleParams, 1);
    if (vxFileManager::Exists(sourceSample) && !vxFileManager::Exists(destinationSample)) {
      const int copiedSample = vxFileManager::CopyFile(sourceSample, destinationSample, 0, 1, 0,
                                                       0, 0, nullptr, nullptr);
      Log("TXT file doesn't exist - file being copied: ", sourceSample.c_str());
      if (!vxCopied(*this, copiedSample, sourceSample, destinationSample)) return 1;
    }
    return 0;
  }
  vxMappedINIFile destination(destinationPath);
  if (destination.Open(1) != 0) return 1;

  const long sourceCount =
      vxsettings::ReadSettingsNumber(source.GetVal("default", "queryprofilecount"));
  const long destinationCount =
      vxsettings::ReadSettingsNumber(destination.GetVal("default", "queryprofilecount"));
  EntryNumbering numbering(destination, "queryprofile", "profileid", destinationCount);

  for (long i = 0; i < sourceCount; ++i) {
    const INILineList* old = source.GetPropertyList(SectionName("queryprofile", i));
    if (old == nullptr) continue;
    if (numbering.Holds(source.GetVal(old, "profileid"))) continue;
    const long number = numbering.TakeNextNumber();
    WriteQueryEntry(destination, SectionName("queryprofile", number), source, old);
    destination.SetVal("default", "queryprofilecount", number + 1);
  }

  if (!vxWroteBack(*this, destination)) return 1;
  Log(kMigrated, kDynamicPages);
  return 0;
}
