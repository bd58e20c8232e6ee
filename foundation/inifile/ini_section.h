// One section of a vxMappedINIFile: its header line, its property lines in file order, the
// non-property lines after the last property line, and, for a section of many lines, a lazily
// built index from the key (ASCII case ignored) to the first line holding it. Keys that differ from
// that first line's only in case are also indexed by their exact spelling, so a lookup spelt
// exactly as a later key finds that key. Internal to the INI model; owns its lines.

#ifndef VXMIGRATE_FOUNDATION_INIFILE_INI_SECTION_H_
#define VXMIGRATE_FOUNDATION_INIFILE_INI_SECTION_H_

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <unordered_map>

#include "foundation/inifile/ini_file.h"
#include "foundation/inifile/ini_line.h"
#include "foundation/inifile/ini_text.h"

struct vxMappedINIFile::Section {
  using LineIndex = std::unordered_map<std::string_view, INILine*, vxini::FoldHash, vxini::FoldEqual>;
  using ExactIndex = std::unordered_map<std::string_view, INILine*>;

  // The index of a long section, built when a lookup first needs it.
  struct KeyIndex {
    LineIndex first;  // views into the lines' own immutable text
    ExactIndex exact;  // only keys that differ from an earlier key in case alone
  };

  Section() = default;
  ~Section() {
    keys.reset();  // its views point into the lines' texts
    for (INILine* line : lines) delete line;
  }
  Section(const Section&) = delete;
  Section& operator=(const Section&) = delete;

  // Sections shorter than this are searched line by line: most sections (a template's report
  // objects, a search engine, a profile's server) hold a handful of keys, and an index would cost
  // them more to build and free than the few lookups it would speed up.
  static constexpr size_t kIndexedFrom = 16;
  bool WantsIndex() const { return lines.size() >= kIndexedFrom; }
  bool IndexIsCurrent() const { return keys != nullptr && indexedCount == lines.size(); }
  void DropIndex() {
    keys.reset();
    indexedCount = static_cast<size_t>(-1);
  }

  // The line a lookup of key finds in a short section: the first spelt exactly so, else the first
  // whose key matches with ASCII case ignored (what the index gives a long one).
  INILine* Scan(std::string_view key) const {
    INILine* folded = nullptr;
    for (INILine* line : lines) {
      if (line == nullptr) continue;
      std::string_view candidate = line->m_key.view();
      if (candidate == key) return line;
      if (folded == nullptr && vxini::EqualsFolded(candidate, key)) folded = line;
    }
    return folded;
  }

  // True for the first line holding this line's key as read (ASCII case ignored); a repeated key
  // further down is hidden behind it.
  bool IsFirstOfKey(const INILine* line) const {
    if (!WantsIndex()) {
      for (const INILine* other : lines) {
        if (other == line) return true;
        if (other != nullptr && vxini::EqualsFolded(other->LoadedKey(), line->LoadedKey())) {
          return false;
        }
      }
      return false;
    }
    EnsureIndex();
    auto first = keys->first.find(line->LoadedKey());
    return first != keys->first.end() && first->second == line;
  }

  // Makes the index match the lines when their number changed since it was built.
  void EnsureIndex() const {
    if (!IndexIsCurrent()) RebuildIndex();
  }
  void RebuildIndex() const {
    keys = std::make_unique<KeyIndex>();
    keys->first.reserve(lines.size());
    for (INILine* line : lines) {
      if (line != nullptr) Index(line);
    }
    indexedCount = lines.size();
  }
  // The first line of a key stays the one found; a later one spelt otherwise is found by its
  // exact spelling.
  void Index(INILine* line) const {
    auto [first, added] = keys->first.emplace(line->LoadedKey(), line);
    if (!added && first->second->LoadedKey() != line->LoadedKey()) {
      keys->exact.emplace(line->LoadedKey(), line);
    }
  }

  // The header line is written as prefix + name + suffix + line end, so that an unchanged name
  // gives the line back as read and a renamed one keeps the brackets' surroundings.
  std::string name;            // the text between the outer brackets, blanks around it trimmed
  std::string headerPrefix;    // e.g. "[" or "  [ "
  std::string headerSuffix;    // e.g. "]" or "]  ; note"
  bool nameFromCaller = false;  // set by a caller: written up to its first line break
  vxini::Eol headerEol = vxini::Eol::kFile;

  INILineList lines;
  // [trailingBegin, trailingEnd) of the file's text: comment, blank or stray lines after the last
  // property line. New keys go before them, so a section's closing blank line stays last.
  uint32_t trailingBegin = 0;
  uint32_t trailingEnd = 0;
  std::string carriedTrailing;  // lines kept from removed property lines, written before those

  mutable std::unique_ptr<KeyIndex> keys;  // null until built: short sections never build one
  mutable size_t indexedCount = static_cast<size_t>(-1);
};

#endif  // VXMIGRATE_FOUNDATION_INIFILE_INI_SECTION_H_
