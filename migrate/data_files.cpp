// Merges a plain comma-separated data file of the old installation into the new one's, line by
// line: the new installation keeps its text as it is, and each old record that no new record
// begins with is appended on a line of its own. The destination is rewritten atomically, so a
// failed write leaves it as it was.

#include <fcntl.h>

#include <cstddef>
#include <cstdint>
#include <new>
#include <string>
#include <string_view>
#include <vector>

#include "foundation/files/basic_file.h"
#include "foundation/files/file_manager.h"
#include "foundation/string/tokenizer.h"
#include "migrate/failed_copy.h"
#include "migrate/manager.h"

namespace {

// Records split into fields at this one character.
const char kSeparator = vxBStringTokenizer::m_csvToken[0];

bool IsWhite(char c) { return c == ' ' || c == '\t' || c == '\r' || c == '\n'; }

bool AllWhite(std::string_view text) {
  for (char c : text) {
    if (!IsWhite(c)) return false;
  }
  return true;
}

// A line without the one carriage return a CRLF file leaves at its end.
std::string_view WithoutCarriageReturn(std::string_view line) {
  if (!line.empty() && line.back() == '\r') line.remove_suffix(1);
  return line;
}

// FNV-1a: cheap, and incremental, so the hashes of every field prefix of a line cost one pass.
constexpr uint64_t kHashStart = 14695981039346656037ULL;
uint64_t HashStep(uint64_t hash, char c) {
  return (hash ^ static_cast<unsigned char>(c)) * 1099511628211ULL;
}
uint64_t Hash(std::string_view text) {
  uint64_t hash = kHashStart;
  for (char c : text) hash = HashStep(hash, c);
  return hash;
}

// A hash multiset of (hash, line, length) entries in one flat table with linear probing: an insert
// or lookup touches one or two neighbouring slots instead of chasing list nodes across memory,
// which keeps merges of hundreds of thousands of lines linear in practice. A slot keeps the hash
// folded to 32 bits (its place follows from those bits too, so the table can grow); callers
// confirm a hit against the text itself.
// REQUIRES: line numbers and lengths below UINT32_MAX - 1 (see kMaxMergedSize).
class PrefixIndex {
 public:
  explicit PrefixIndex(size_t expectedEntries) {
    // Sized for the expected entries up to a point; beyond it the table grows as it fills.
    const size_t wanted = expectedEntries < (size_t{1} << 24) ? expectedEntries : size_t{1} << 24;
    size_t capacity = 16;
    while (capacity * 7 < wanted * 10) capacity *= 2;
    slots_.assign(capacity, Slot{0, kEmpty, 0});
  }

  PrefixIndex(const PrefixIndex&) = delete;
  PrefixIndex& operator=(const PrefixIndex&) = delete;

  void Add(uint64_t hash, size_t line, size_t length) {
    if ((used_ + 1) * 10 > slots_.size() * 7) Grow();
    Place(Slot{Tag(hash), static_cast<uint32_t>(line), static_cast<uint32_t>(length)});
  }

  void Remove(uint64_t hash, size_t line, size_t length) {
    const uint32_t tag = Tag(hash);
    for (size_t at = Start(tag); slots_[at].line != kEmpty; at = (at + 1) & Mask()) {
      const Slot& slot = slots_[at];
      if (slot.tag == tag && slot.line == line && slot.length == length) {
        slots_[at].line = kRemoved;
        return;
      }
    }
  }

  // True when accept(line, length) is true for some entry that may have this hash.
  template <typename Accept>
  bool Find(uint64_t hash, Accept accept) const {
    const uint32_t tag = Tag(hash);
    for (size_t at = Start(tag); slots_[at].line != kEmpty; at = (at + 1) & Mask()) {
      const Slot& slot = slots_[at];
      if (slot.tag == tag && slot.line != kRemoved && accept(slot.line, slot.length)) {
        return true;
      }
    }
    return false;
  }

 private:
  struct Slot {
    uint32_t tag;
    uint32_t line;  // kEmpty or kRemoved for a slot without an entry
    uint32_t length;
  };
  static constexpr uint32_t kEmpty = UINT32_MAX;
  static constexpr uint32_t kRemoved = UINT32_MAX - 1;

  static uint32_t Tag(uint64_t hash) { return static_cast<uint32_t>(hash ^ (hash >> 32)); }
  size_t Mask() const { return slots_.size() - 1; }
  size_t Start(uint32_t tag) const {
    uint64_t mixed = tag * 0xff51afd7ed558ccdULL;
    return static_cast<size_t>(mixed ^ (mixed >> 32)) & Mask();
  }

  void Place(const Slot& entry) {
    size_t at = Start(entry.tag);
    while (slots_[at].line != kEmpty && slots_[at].line != kRemoved) at = (at + 1) & Mask();
    if (slots_[at].line == kEmpty) ++used_;
    slots_[at] = entry;
  }

  // Doubles the table (or, when removed marks fill it, rebuilds it at the same size).
  void Grow() {
    std::vector<Slot> old;
    old.swap(slots_);
    size_t live = 0;
    for (const Slot& slot : old) live += (slot.line != kEmpty && slot.line != kRemoved) ? 1 : 0;
    slots_.assign(live * 2 > old.size() ? old.size() * 2 : old.size(), Slot{0, kEmpty, 0});
    used_ = 0;
    for (const Slot& slot : old) {
      if (slot.line != kEmpty && slot.line != kRemoved) Place(slot);
    }
  }

  std::vector<Slot> slots_;
  size_t used_ = 0;  // slots holding an entry or a removed mark
};

// The destination text as its lines, with an index of every field prefix of every line.
//
// A record matches a destination line when its fields equal the line's first fields, that is when
// the record's bytes equal the line's bytes up to a separator or up to its end. So every such
// prefix of every line is indexed (by hash, checked against the line itself on a hit), and a
// lookup costs the length of the record, however long the destination grows.
//
// The text is the lines joined by line feeds. Appending strips white space from both ends of the
// text first; done line by line here, that touches only the lines at the two ends, and each line
// at most once or twice over the whole merge. Stripping only shortens or drops lines, and added
// lines are the source's records, so every line is a view into one of the two texts.
// REQUIRES: the destination text and every appended record outlive the object.
class DestinationText {
 public:
  // expectedEntries: about how many prefixes will be indexed, so the index is sized once.
  DestinationText(std::string_view text, size_t expectedEntries) : prefixes_(expectedEntries) {
    size_t start = 0;
    while (!text.empty()) {
      size_t end = text.find('\n', start);
      lines_.push_back(text.substr(start, end == std::string_view::npos ? end : end - start));
      if (end == std::string_view::npos) break;
      start = end + 1;
    }
    for (size_t i = 0; i < lines_.size(); ++i) IndexLine(i, true);
  }

  DestinationText(const DestinationText&) = delete;
  DestinationText& operator=(const DestinationText&) = delete;

  bool Matches(std::string_view record) const {
    return prefixes_.Find(Hash(record), [&](size_t line, size_t length) {
      return length == record.size() && lines_[line].substr(0, length) == record;
    });
  }

  // Strips white space from both ends of the text, adds a line feed unless the text then ends
  // with one (only an empty text does), then the record.
  void Append(std::string_view record) {
    StripEnd();
    StripStart();
    if (first_ == lines_.size()) {
      lines_.clear();
      first_ = 0;
      lines_.emplace_back();  // the empty text gains a line feed, so an empty line comes first
    }
    lines_.push_back(record);
    IndexLine(lines_.size() - 1, true);
  }

  std::string Text() const {
    size_t size = 0;
    for (size_t i = first_; i < lines_.size(); ++i) size += lines_[i].size() + 1;
    std::string text;
    text.reserve(size);
    for (size_t i = first_; i < lines_.size(); ++i) {
      if (i > first_) text.push_back('\n');
      text.append(lines_[i]);
    }
    return text;
  }

 private:
  // Adds (or removes) the index entries of one line: each prefix ending before a separator, and
  // the whole line. Empty lines have none; one trailing carriage return is not part of the line.
  void IndexLine(size_t line, bool add) {
    std::string_view text = WithoutCarriageReturn(lines_[line]);
    if (text.empty()) return;
    uint64_t hash = kHashStart;
    for (size_t i = 0; i <= text.size(); ++i) {
      if (i == text.size() || text[i] == kSeparator) {
        if (add) {
          prefixes_.Add(hash, line, i);
        } else {
          prefixes_.Remove(hash, line, i);
        }
      }
      if (i < text.size()) hash = HashStep(hash, text[i]);
    }
  }

  // Lines of white space at the end go, then the white space ending the last line left.
  void StripEnd() {
    while (first_ < lines_.size() && AllWhite(lines_.back())) {
      IndexLine(lines_.size() - 1, false);
      lines_.pop_back();
    }
    if (first_ == lines_.size() || !IsWhite(lines_.back().back())) return;
    IndexLine(lines_.size() - 1, false);
    std::string_view& last = lines_.back();
    while (IsWhite(last.back())) last.remove_suffix(1);
    IndexLine(lines_.size() - 1, true);
  }

  // Lines of white space at the start go, then the white space starting the first line left.
  void StripStart() {
    while (first_ < lines_.size() && AllWhite(lines_[first_])) {
      IndexLine(first_, false);
      ++first_;
    }
    if (first_ == lines_.size() || !IsWhite(lines_[first_].front())) return;
    IndexLine(first_, false);
    std::string_view& line = lines_[first_];
    while (IsWhite(line.front())) line.remove_prefix(1);
    IndexLine(first_, true);
  }

  std::vector<std::string_view> lines_;  // the lines before first_ were stripped away
  size_t first_ = 0;
  PrefixIndex prefixes_;
};

// The merged text, given the destination's text and the source's. Source records are taken in
// order up to the first empty line; a record is added unless a destination line (one added
// earlier included) begins with its fields.
std::string MergeRecords(std::string_view destination, std::string_view source) {
  // Every separator and line end of the destination ends an indexed prefix; each old record
  // adds at least one when it is appended.
  size_t expectedEntries = 16;
  for (char c : destination) expectedEntries += (c == kSeparator || c == '\n') ? 1 : 0;
  for (char c : source) expectedEntries += c == '\n' ? 1 : 0;
  DestinationText merged(destination, expectedEntries);
  size_t start = 0;
  while (start < source.size()) {
    size_t end = source.find('\n', start);
    if (end == std::string_view::npos) end = source.size();
    std::string_view record = WithoutCarriageReturn(source.substr(start, end - start));
    if (record.empty()) break;  // the first empty line ends the records to merge
    if (!merged.Matches(record)) merged.Append(record);
    start = end + 1;
  }
  return merged.Text();
}

// Line numbers and lengths are kept in 32 bits. Data files are lists of a few megabytes; two
// texts together this large are not data files and are refused.
const size_t kMaxMergedSize = UINT32_MAX - 8;

bool ReadWholeFile(const vxStringBase& path, unsigned int accessMode, vxStringBase& text) {
  vxBasicFile file(path, accessMode, accessMode, 0);
  if (file.Open() != 0) return false;
  return file.ReadAll(text) == 0;
}

bool RewriteFile(const vxStringBase& path, const vxStringBase& text) {
  vxBasicFile file(path, O_CREAT | O_TRUNC, O_RDWR, 0);
  if (file.Open() != 0) return false;
  unsigned long written = 0;
  const bool wrote = file.Write(text, written) == 0 && written == text.length();
  // Close renames the new text into place; after a failed write it leaves the old file alone.
  return file.Close() == 0 && wrote;
}

}  // namespace

int vxMigrationManager::DoMergeCSVFile(const char* sourceFile, const char* destinationFile) {
  if (IsInPlaceMigrate()) return 0;  // one installation: nothing to merge
  if (sourceFile == nullptr || destinationFile == nullptr) return 1;

  vxStringBase sourcePath;
  vxStringBase destinationPath;
  vxFileManager::MakePath(sourcePath, m_sourceDirectory, sourceFile, 1);
  vxFileManager::MakePath(destinationPath, m_destinationDirectory, destinationFile, 1);

  // Every failure gets its error line, naming the side that failed.
  if (!vxFileManager::Exists(destinationPath)) {
    Log("TXT file doesn't exist - file being copied: ", sourcePath.c_str());
    const int copied =
        vxFileManager::CopyFile(sourcePath, destinationPath, 0, 1, 0, 0, 0, nullptr, nullptr);
    vxCopied(*this, copied, sourcePath, destinationPath);
    return copied;
  }

  // The old installation is only read, so it may sit on a read-only disk; the destination is
  // opened for writing, which also tells early whether it can be rewritten.
  vxStringBase sourceText;
  vxStringBase destinationText;
  if (!ReadWholeFile(sourcePath, O_RDONLY, sourceText)) {
    if (!vxIsAbsent(sourcePath)) Log(vxMsgUnableToOpenFile, sourcePath.c_str());
    return 1;
  }
  if (!ReadWholeFile(destinationPath, O_RDWR, destinationText)) {
    Log(vxCanRead(destinationPath) ? vxMsgUnableToWriteFile : vxMsgUnableToOpenFile,
                          destinationPath.c_str());
    return 1;
  }
  if (sourceText.isEmpty()) return 1;
  const size_t destinationSize = destinationText.str().size();
  if (destinationSize > kMaxMergedSize ||
      sourceText.str().size() > kMaxMergedSize - destinationSize) {
    return 1;
  }

  vxStringBase merged;
  try {
    merged = vxStringBase(MergeRecords(destinationText.view(), sourceText.view()));
  } catch (const std::bad_alloc&) {
    return 1;  // out of memory: the destination stays as it was
  }
  if (!RewriteFile(destinationPath, merged)) {
    Log(vxMsgUnableToWriteFile, destinationPath.c_str());
    return 1;
  }
  Log("Data File Merged: ", destinationFile);
  return 0;
}
