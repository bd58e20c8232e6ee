// The INI model's lookups and changes: sections and the keys of long sections found through hash
// indexes that ignore ASCII case, the keys of short ones by a scan, values set in their line's
// place, keys and sections added after the existing ones, and whole sections and files merged in
// with this file's values winning. Reading and writing the file live in ini_reader.cpp and
// ini_writer.cpp.

#include <algorithm>
#include <unordered_set>

#include "foundation/inifile/ini_file.h"
#include "foundation/inifile/ini_section.h"

vxMappedINIFile::vxMappedINIFile() = default;

vxMappedINIFile::vxMappedINIFile(const char* filename) : filename_(filename) {}

vxMappedINIFile::vxMappedINIFile(const vxStringBase& filename) : filename_(filename) {}

vxMappedINIFile::~vxMappedINIFile() { Clear(); }

void vxMappedINIFile::SetFilename(const char* filename) { SetFilename(vxStringBase(filename)); }

void vxMappedINIFile::SetFilename(const vxStringBase& filename) {
  // What was loaded from one file gives no right to replace another.
  if (filename != filename_) loaded_ = false;
  filename_ = filename;
}

void vxMappedINIFile::CopyFrom(const vxMappedINIFile& other) {
  if (&other == this) return;
  Clear();
  loaded_ = false;
  text_ = other.text_;  // immutable and shared: the lines' layout points into it
  preambleEnd_ = other.preambleEnd_;
  fileEol_ = other.fileEol_;
  loadedMode_ = other.loadedMode_;
  for (const auto& from : other.sections_) {
    auto section = std::make_unique<Section>();
    section->name = from->name;
    section->headerPrefix = from->headerPrefix;
    section->headerSuffix = from->headerSuffix;
    section->nameFromCaller = from->nameFromCaller;
    section->headerEol = from->headerEol;
    section->trailingBegin = from->trailingBegin;
    section->trailingEnd = from->trailingEnd;
    section->carriedTrailing = from->carriedTrailing;
    section->lines.reserve(from->lines.size());
    for (const INILine* line : from->lines) {
      if (line != nullptr) section->lines.push_back(new INILine(*line));
    }
    sections_.push_back(std::move(section));
    IndexSection(sections_.back().get());
  }
}

void vxMappedINIFile::Clear() {
  sectionIndex_.clear();  // its keys point into the sections
  sectionExact_.clear();
  sections_.clear();
  text_.reset();
  preambleEnd_ = 0;
  loadedMode_ = 0;
  fileEol_ = vxini::Eol::kLF;
  duplicateSections_ = 0;
}

// A name spelt exactly as a section that differs from an earlier one in case alone finds that
// section; any other spelling finds the first section of the name, case ignored.
vxMappedINIFile::Section* vxMappedINIFile::FindSection(std::string_view name) const {
  auto it = sectionIndex_.find(name);
  if (it == sectionIndex_.end()) return nullptr;
  if (!sectionExact_.empty() && it->second->name != name) {
    auto exact = sectionExact_.find(name);
    if (exact != sectionExact_.end()) return exact->second;
  }
  return it->second;
}

void vxMappedINIFile::IndexSection(Section* section) {
  auto [first, added] = sectionIndex_.emplace(section->name, section);
  if (added) return;
  ++duplicateSections_;
  if (first->second->name != section->name) sectionExact_.emplace(section->name, section);
}

void vxMappedINIFile::RebuildSectionIndex() {
  sectionIndex_.clear();
  sectionExact_.clear();
  duplicateSections_ = 0;
  for (const auto& section : sections_) IndexSection(section.get());
}

vxMappedINIFile::Section* vxMappedINIFile::FindOrAddSection(std::string_view name) {
  if (Section* section = FindSection(name)) return section;
  auto section = std::make_unique<Section>();
  section->name.assign(name.data(), name.size());
  section->headerPrefix = "[";
  section->headerSuffix = "]";
  section->nameFromCaller = true;
  Section* added = section.get();
  sections_.push_back(std::move(section));
  IndexSection(added);
  return added;
}

INILine* vxMappedINIFile::FindLine(const Section& section, std::string_view key) const {
  if (!section.WantsIndex()) return section.Scan(key);
  section.EnsureIndex();
  INILine* found = FindIndexedLine(section, key);
  if (found == nullptr && section.keys->first.count(key) != 0) {
    // A caller renamed a key in place: index the lines afresh and trust only a verified hit.
    section.RebuildIndex();
    found = FindIndexedLine(section, key);
  }
  return found;
}

// The line of key as indexed, when its key (which callers may have changed) still matches.
INILine* vxMappedINIFile::FindIndexedLine(const Section& section, std::string_view key) const {
  const Section::KeyIndex& keys = *section.keys;
  auto it = keys.first.find(key);
  if (it == keys.first.end()) return nullptr;
  if (!keys.exact.empty() && it->second->m_key.view() != key) {
    auto exact = keys.exact.find(key);
    if (exact != keys.exact.end() && exact->second->m_key.view() == key) return exact->second;
  }
  return vxini::EqualsFolded(it->second->m_key.view(), key) ? it->second : nullptr;
}

void vxMappedINIFile::AppendLine(Section& section, INILine* line) {
  std::unique_ptr<INILine> owned(line);
  const bool indexed = section.IndexIsCurrent();
  section.lines.push_back(line);
  owned.release();
  // A current index is kept current; any other is built afresh when a lookup needs it.
  if (indexed) {
    section.Index(line);
    section.indexedCount = section.lines.size();
  } else {
    section.DropIndex();
  }
}

INILine* vxMappedINIFile::CopyForThisFile(const INILine& line) const {
  // The copy keeps its key, value and spacing; the comments around it stay in the other file and
  // it ends like this file's lines.
  INILine* copy = new INILine(line);
  copy->leadingBegin_ = copy->rawBegin_;
  copy->carried_.reset();
  copy->eol_ = vxini::Eol::kFile;
  return copy;
}

void vxMappedINIFile::CopyMissingKeys(Section& section, const INILineList& lines) {
  if (&lines == &section.lines) return;
  for (const INILine* line : lines) {
    // Also skips a key given twice: once copied, it is no longer missing.
    if (line == nullptr || line->m_key.isEmpty() || FindLine(section, line->m_key.view())) continue;
    AppendLine(section, CopyForThisFile(*line));
  }
}

const vxStringBase& vxMappedINIFile::GetVal(const vxStringBase& section,
                                            const vxStringBase& key) const {
  const Section* found = FindSection(section.view());
  const INILine* line = found ? FindLine(*found, key.view()) : nullptr;
  return line ? line->m_value : vxStringBase::NullStr;
}

int vxMappedINIFile::GetVal(const vxStringBase& section, const vxStringBase& key,
                            vxStringBase& value) const {
  const Section* found = FindSection(section.view());
  const INILine* line = found ? FindLine(*found, key.view()) : nullptr;
  if (line == nullptr) {
    value.makeNull();
    return 1;
  }
  value = line->m_value;
  return 0;
}

const vxStringBase& vxMappedINIFile::GetVal(const INILineList* lines,
                                            const vxStringBase& key) const {
  if (lines == nullptr) return vxStringBase::NullStr;
  auto it = std::find_if(lines->begin(), lines->end(), INILine::KeyCompare(key));
  return it == lines->end() ? vxStringBase::NullStr : (*it)->m_value;
}

void vxMappedINIFile::SetVal(const vxStringBase& section, const vxStringBase& key,
                             const vxStringBase& value) {
  // A line with an empty key would not read back as a property line.
  if (key.isEmpty()) return;
  Section* target = FindOrAddSection(section.view());
  if (INILine* line = FindLine(*target, key.view())) {
    line->m_value = value;
    return;
  }
  AppendLine(*target, new INILine(key, value));
}

void vxMappedINIFile::SetVal(const vxStringBase& section, const vxStringBase& key, long value) {
  vxStringBase text;
  text.append(value);
  SetVal(section, key, text);
}

int vxMappedINIFile::RemoveKey(const vxStringBase& section, const vxStringBase& key) {
  Section* found = FindSection(section.view());
  INILine* line = found ? FindLine(*found, key.view()) : nullptr;
  if (line == nullptr) return 1;
  INILineList& lines = found->lines;
  auto pos = std::find(lines.begin(), lines.end(), line);
  if (pos == lines.end()) return 1;

  // The comment and blank lines above the removed line stay, above whatever now follows it.
  std::string kept = line->carried_ ? *line->carried_ : std::string();
  kept.append(line->Leading());
  if (!kept.empty()) {
    if (pos + 1 != lines.end()) {
      INILine* next = *(pos + 1);
      if (next->carried_) kept.append(*next->carried_);
      next->carried_ = std::make_unique<std::string>(std::move(kept));
    } else {
      found->carriedTrailing.insert(0, kept);
    }
  }

  if (found->IndexIsCurrent()) {
    // Drop the index entry before the line (its key lives in the line's text); a later line with
    // the same key, if any, becomes the one found.
    Section::LineIndex& first = found->keys->first;
    auto entry = first.find(line->LoadedKey());
    if (entry != first.end() && entry->second == line) first.erase(entry);
    pos = lines.erase(pos);
    for (auto later = pos; later != lines.end(); ++later) {
      if (vxini::EqualsFolded((*later)->LoadedKey(), line->LoadedKey())) {
        first.emplace((*later)->LoadedKey(), *later);
        break;
      }
    }
    found->indexedCount = lines.size();
    // Spellings that differ in case alone: which line each spelling finds is rebuilt whole.
    if (!found->keys->exact.empty()) found->RebuildIndex();
  } else {
    lines.erase(pos);
    found->DropIndex();  // its keys live in the lines' texts, this one's included
  }
  delete line;
  return 0;
}

INILineList* vxMappedINIFile::GetPropertyList(const char* section) {
  if (section == nullptr) return nullptr;
  Section* found = FindSection(section);
  return found ? &found->lines : nullptr;
}

INILineList* vxMappedINIFile::GetPropertyList(const vxStringBase& section) {
  Section* found = FindSection(section.view());
  return found ? &found->lines : nullptr;
}

const INILineList* vxMappedINIFile::GetPropertyList(const vxStringBase& section) const {
  const Section* found = FindSection(section.view());
  return found ? &found->lines : nullptr;
}

void vxMappedINIFile::AddMapSection(const char* section, const INILineList* lines) {
  if (section == nullptr) return;
  Section* target = FindOrAddSection(section);
  if (lines != nullptr) CopyMissingKeys(*target, *lines);
}

void vxMappedINIFile::UpdateMapSection(const char* section, const INILineList* lines) {
  if (section == nullptr) return;
  Section* target = FindSection(section);
  if (target == nullptr) {
    AddMapSection(section, lines);
    return;
  }
  if (lines == nullptr || lines == &target->lines) return;
  std::unordered_set<std::string_view, vxini::FoldHash, vxini::FoldEqual> seen;
  for (const INILine* line : *lines) {
    if (line == nullptr || line->m_key.isEmpty()) continue;
    if (!seen.insert(line->m_key.view()).second) continue;  // a repeated key: the first counts
    if (INILine* existing = FindLine(*target, line->m_key.view())) {
      existing->m_value = line->m_value;
    } else {
      AppendLine(*target, CopyForThisFile(*line));
    }
  }
}

void vxMappedINIFile::MergeFrom(const vxMappedINIFile& other, vxIniMergeObserver* observer) {
  if (&other == this) return;
  for (const auto& from : other.sections_) {
    // A section repeated in the other file, in any spelling, is hidden there too: sections meet
    // their namesakes here ignoring case, so only the first of a name counts.
    if (other.sectionIndex_.find(from->name)->second != from.get()) continue;
    Section* target = FindOrAddSection(from->name);
    for (const INILine* line : from->lines) {
      if (line == nullptr || !from->IsFirstOfKey(line)) continue;
      const INILine* kept = FindLine(*target, line->m_key.view());
      if (kept != nullptr) {  // the destination wins
        if (observer != nullptr && !(kept->m_value == line->m_value)) {
          observer->KeyConflict(target->name, kept->m_key.view(), line->m_value.view(),
                                kept->m_value.view());
        }
        continue;
      }
      AppendLine(*target, CopyForThisFile(*line));
      if (observer != nullptr) observer->KeyAdded(target->name, line->m_key.view(), line->m_value.view());
    }
  }
}

int vxMappedINIFile::RenameSection(const vxStringBase& from, const vxStringBase& to) {
  Section* section = FindSection(from.view());
  if (section == nullptr) return 1;
  Section* existing = FindSection(to.view());
  if (existing != nullptr && existing != section) return 1;

  std::string oldName = section->name;
  if (!sectionExact_.empty()) {
    // Names that differ in case alone: which section each spelling finds is rebuilt whole.
    section->name = to.str();
    section->nameFromCaller = true;
    RebuildSectionIndex();
    return 0;
  }
  sectionIndex_.erase(section->name);
  section->name = to.str();
  section->nameFromCaller = true;
  sectionIndex_.emplace(section->name, section);
  if (duplicateSections_ > 0 && !vxini::EqualsFolded(oldName, section->name)) {
    // A later section of the old name was hidden behind this one; it is now the one found.
    for (const auto& other : sections_) {
      if (other.get() != section && vxini::EqualsFolded(other->name, oldName)) {
        sectionIndex_.emplace(other->name, other.get());
        --duplicateSections_;
        break;
      }
    }
  }
  return 0;
}

std::vector<vxStringBase> vxMappedINIFile::GetSectionNames() const {
  std::vector<vxStringBase> names;
  names.reserve(sections_.size());
  for (const auto& section : sections_) {
    if (FindSection(section->name) == section.get()) names.emplace_back(section->name);
  }
  return names;
}

bool vxMappedINIFile::HasSection(const vxStringBase& section) const {
  return FindSection(section.view()) != nullptr;
}
