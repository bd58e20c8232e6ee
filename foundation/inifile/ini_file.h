// An INI settings file held in memory as sections of key-value lines. Lookups of sections and keys
// ignore ASCII case and keep the spelling on disk; a name spelt exactly as one on disk finds that
// one first, so two keys that differ in case alone keep their own values. Each lookup costs
// constant average time (a short section is scanned, which is cheaper than hashing for a handful
// of keys). A file opened and written back unchanged is byte-identical. Close(1) replaces the
// file atomically and never replaces an existing file that this object did not load. Not
// thread-safe.

#ifndef VXMIGRATE_FOUNDATION_INIFILE_INI_FILE_H_
#define VXMIGRATE_FOUNDATION_INIFILE_INI_FILE_H_

#include <sys/types.h>

#include <memory>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "foundation/export.h"
#include "foundation/inifile/ini_line.h"
#include "foundation/inifile/ini_text.h"
#include "foundation/string/string_base.h"

// Told what a merge does to the file merged into, key by key. Values are as the files hold them.
class VXM_EXPORT vxIniMergeObserver {
 public:
  virtual ~vxIniMergeObserver() = default;
  // The key came from the other file.
  virtual void KeyAdded(std::string_view section, std::string_view key, std::string_view value) = 0;
  // Both files hold the key with different values; this file's value stays.
  virtual void KeyConflict(std::string_view section, std::string_view key,
                           std::string_view otherValue, std::string_view keptValue) = 0;
};

class VXM_EXPORT vxMappedINIFile {
 public:
  vxMappedINIFile();
  explicit vxMappedINIFile(const char* filename);
  explicit vxMappedINIFile(const vxStringBase& filename);
  virtual ~vxMappedINIFile();  // frees the lines; never writes

  vxMappedINIFile(const vxMappedINIFile&) = delete;
  vxMappedINIFile& operator=(const vxMappedINIFile&) = delete;

  // Rebinds the object to another file name, so that Close(1) writes there. The content stays.
  void SetFilename(const char* filename);
  void SetFilename(const vxStringBase& filename);
  const vxStringBase& GetFilename() const { return filename_; }

  // Reads the file into sections, replacing any content. 0 on success; non-zero when the file
  // cannot be read (missing, unreadable, a folder) and, with flag 1, when it holds a NUL byte (a
  // binary file is never taken for settings). On failure the object stays bound to its name and
  // empty, so a later Close(1) still creates a missing file.
  int Open(unsigned int flag = 1);

  // save 1: writes the sections back atomically (temporary file in the same folder, then rename;
  // the file's mode kept); a loaded file whose content did not change is left untouched. save 0:
  // drops the changes. Returns 0 on success; 1 when writing failed or was refused because the
  // file exists but was not loaded by this object.
  [[nodiscard]] int Close(unsigned int save);
  // As Close, and with save 1 the file and its folder are also flushed to disk before returning.
  [[nodiscard]] int CloseFW(unsigned int save);

  // Writes the sections to path as a new file, atomically, and never replaces an entry already
  // there (nor one that appears meanwhile). The file takes the mode of the file the content was
  // read from, else 0666 less the umask; missing folders are made. The object stays bound to its
  // own name. 0 written; 1 failed; 2 path exists and was left as it is.
  [[nodiscard]] int CreateAs(const vxStringBase& path);

  // Makes this object a copy of other's content (sections, lines, layout) in memory, as if read
  // from the same text; its own name stays, and it counts as not loaded from it.
  void CopyFrom(const vxMappedINIFile& other);

  // The value, or an empty text when the section or key is absent (nothing is created).
  const vxStringBase& GetVal(const vxStringBase& section, const vxStringBase& key) const;
  // Fills value (emptied when absent). 0 when the key was found, non-zero otherwise.
  int GetVal(const vxStringBase& section, const vxStringBase& key, vxStringBase& value) const;
  // The value of key within one section's lines (a linear walk: sections handed out are small).
  const vxStringBase& GetVal(const INILineList* lines, const vxStringBase& key) const;

  // Sets the value, adding the key after the section's last property line (and the section at the
  // end of the file) when absent. With a key present twice, the first one is set.
  void SetVal(const vxStringBase& section, const vxStringBase& key, const vxStringBase& value);
  void SetVal(const vxStringBase& section, const vxStringBase& key, long value);

  // Removes the first property line with that key; 0 when one was removed, 1 when absent.
  int RemoveKey(const vxStringBase& section, const vxStringBase& key);

  // The section's lines, or null when there is no such section.
  INILineList* GetPropertyList(const char* section);
  INILineList* GetPropertyList(const vxStringBase& section);
  const INILineList* GetPropertyList(const vxStringBase& section) const;

  // Adds a section holding copies of the given lines at the end of the file. When the section
  // exists already it keeps its lines and gains copies of the keys it lacks (this file wins).
  void AddMapSection(const char* section, const INILineList* lines);
  // Sets, in an existing section, every key of the given lines to the given value, adding keys it
  // lacks; keys the lines do not hold stay. A missing section is added as by AddMapSection.
  void UpdateMapSection(const char* section, const INILineList* lines);

  // Adds every section and key of other that this file lacks; where both hold a key, this file's
  // value stays (the destination wins). New keys go after their section's last property line, new
  // sections at the end, both in other's order.
  void MergeFrom(const vxMappedINIFile& other, vxIniMergeObserver* observer = nullptr);

  // Renames a section in place (its lines stay). 0 on success; 1 when from is absent or to exists.
  int RenameSection(const vxStringBase& from, const vxStringBase& to);
  // Section names in file order, spelt as on disk.
  std::vector<vxStringBase> GetSectionNames() const;
  bool HasSection(const vxStringBase& section) const;
  // True after a successful Open.
  bool IsLoaded() const { return loaded_; }

 private:
  struct Section;  // defined in ini_section.h
  using SectionIndex =
      std::unordered_map<std::string_view, Section*, vxini::FoldHash, vxini::FoldEqual>;

  Section* FindSection(std::string_view name) const;
  void IndexSection(Section* section);
  void RebuildSectionIndex();
  INILine* FindIndexedLine(const Section& section, std::string_view key) const;
  Section* FindOrAddSection(std::string_view name);
  // The first line of the section with that key, or null. A long section's index is rebuilt when
  // the callers changed its list behind the object's back.
  INILine* FindLine(const Section& section, std::string_view key) const;
  void AppendLine(Section& section, INILine* line);   // takes ownership
  INILine* CopyForThisFile(const INILine& line) const;
  void CopyMissingKeys(Section& section, const INILineList& lines);
  void Clear();
  [[nodiscard]] int Write(bool flushToDisk);
  bool SameAsLoaded() const;

  vxStringBase filename_;
  bool loaded_ = false;
  mode_t loadedMode_ = 0;  // permission bits of the file the content was read from; 0: none
  std::shared_ptr<const std::string> text_;  // the file as read; sections point into it
  uint32_t preambleEnd_ = 0;                 // [0, preambleEnd_): lines before the first section
  vxini::Eol fileEol_ = vxini::Eol::kLF;     // line end for new lines: the file's first, else LF
  std::vector<std::unique_ptr<Section>> sections_;  // file order
  SectionIndex sectionIndex_;                       // name -> first section of that name
  std::unordered_map<std::string_view, Section*> sectionExact_;  // later sections spelt otherwise
  size_t duplicateSections_ = 0;                    // sections hidden behind an earlier namesake

  friend class INIFileReader;
  friend class INIFileWriter;
};

#endif  // VXMIGRATE_FOUNDATION_INIFILE_INI_FILE_H_
