// Merges a plain comma-separated data file of the old installation into the new one's, line by
// line: the new installation keeps its text as it is, and each old record that no new record
// begins with is appended on a line of its own. The destination is rewritten atomically, so a
// failed write leaves it as it was.

#include <fcntl.h>

#include <cstdint>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "foundation/files/basic_file.h"
#include "foundation/files/file_manager.h"
#include "foundation/string/tokenizer.h"
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

// The destination text as its lines, with an index of every field prefix of every line.
//
// A record matches a destination line when its fields equal the line's first fields, that is when
// the record's bytes equal the line's bytes up to a separator or up to its end. So every such
// prefix of every line is indexed (by hash, checked against the line itself on a hit), and a
// lookup costs the length of the record, however long the destination grows.
//
// The text is the lines joined by line feeds. Appending strips white space from both ends of the
// text first; done line by line here, that touches only the lines at the two ends, and each line
// at most once or twice over the whole merge.
class DestinationText {
 public:
  explicit DestinationText(const std::string& text) {
    size_t start = 0;
    while (!text.empty()) {
      size_t end = text.find('\n', start);
      lines_.emplace_back(text, start, end == std::string::npos ? std::string::npos : end - start);
      if (end == std::string::npos) break;
      start = end + 1;
    }
    prefixes_.reserve(lines_.size() * 2);
    for (size_t i = 0; i < lines_.size(); ++i) IndexLine(i, true);
  }

  DestinationText(const DestinationText&) = delete;
  DestinationText& operator=(const DestinationText&) = delete;

  bool Matches(std::string_view record) const {
    auto range = prefixes_.equal_range(Hash(record));
    for (auto it = range.first; it != range.second; ++it) {
      const Prefix& prefix = it->second;
      if (prefix.length == record.size() &&
          std::string_view(lines_[prefix.line]).substr(0, prefix.length) == record) {
        return true;
      }
    }
    return false;
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
    lines_.emplace_back(record);
    IndexLine(lines_.size() - 1, true);
  }

  std::string Text() const {
    std::string text;
    for (size_t i = first_; i < lines_.size(); ++i) {
      if (i > first_) text.push_back('\n');
      text.append(lines_[i]);
    }
    return text;
  }

 private:
  struct Prefix {
    size_t line;
    size_t length;
  };

  // Adds (or removes) the index entries of one line: each prefix ending before a separator, and
  // the whole line. Empty lines have none; one trailing carriage return is not part of the line.
  void IndexLine(size_t line, bool add) {
    std::string_view text = WithoutCarriageReturn(lines_[line]);
    if (text.empty()) return;
    uint64_t hash = kHashStart;
    for (size_t i = 0; i <= text.size(); ++i) {
      if (i == text.size() || text[i] == kSeparator) {
        if (add) {
          prefixes_.emplace(hash, Prefix{line, i});
        } else {
          RemovePrefix(hash, line, i);
        }
      }
      if (i < text.size()) hash = HashStep(hash, text[i]);
    }
  }

  void RemovePrefix(uint64_t hash, size_t line, size_t length) {
    auto range = prefixes_.equal_range(hash);
    for (auto it = range.first; it != range.second; ++it) {
      if (it->second.line == line && it->second.length == length) {
        prefixes_.erase(it);
        return;
      }
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
    std::string& last = lines_.back();
    size_t end = last.size();
    while (IsWhite(last[end - 1])) --end;
    last.resize(end);
    IndexLine(lines_.size() - 1, true);
  }

  // Lines of white space at the start go, then the white space starting the first line left.
  void StripStart() {
    while (first_ < lines_.size() && AllWhite(lines_[first_])) {
      IndexLine(first_, false);
      lines_[first_].clear();
      lines_[first_].shrink_to_fit();
      ++first_;
    }
    if (first_ == lines_.size() || !IsWhite(lines_[first_].front())) return;
    IndexLine(first_, false);
    std::string& line = lines_[first_];
    size_t begin = 0;
    while (IsWhite(line[begin])) ++begin;
    line.erase(0, begin);
    IndexLine(first_, true);
  }

  std::vector<std::string> lines_;  // the lines before first_ were stripped away
  size_t first_ = 0;
  std::unordered_multimap<uint64_t, Prefix> prefixes_;
};

// The merged text, given the destination's text and the source's. Source records are taken in
// order up to the first empty line; a record is added unless a destination line (one added
// earlier included) begins with its fields.
std::string MergeRecords(const std::string& destination, const std::string& source) {
  DestinationText merged(destination);
  size_t start = 0;
  while (start < source.size()) {
    size_t end = source.find('\n', start);
    if (end == std::string::npos) end = source.size();
    std::string_view record =
        WithoutCarriageReturn(std::string_view(source).substr(start, end - start));
    if (record.empty()) break;  // the first empty line ends the records to merge
    if (!merged.Matches(record)) merged.Append(record);
    start = end + 1;
  }
  return merged.Text();
}

bool ReadWholeFile(const vxStringBase& path, unsigned int accessMode, vxStringBase& text) {
  vxBasicFile file(path, accessMode, accessMode, 0);
  if (file.Open() != 0) return false;
  const bool read = file.ReadAll(text) == 0;
  file.Close();
  return read;
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

  if (!vxFileManager::Exists(destinationPath)) {
    Log("TXT file doesn't exist - file being copied: ", sourcePath.c_str());
    return vxFileManager::CopyFile(sourcePath, destinationPath, 0, 1, 0, 0, 0, nullptr, nullptr);
  }

  // The old installation is only read, so it may sit on a read-only disk; the destination is
  // opened for writing, which also tells early whether it can be rewritten.
  vxStringBase sourceText;
  vxStringBase destinationText;
  if (!ReadWholeFile(sourcePath, O_RDONLY, sourceText)) return 1;
  if (!ReadWholeFile(destinationPath, O_RDWR, destinationText)) return 1;
  if (sourceText.isEmpty()) return 1;

  vxStringBase merged(MergeRecords(destinationText.str(), sourceText.str()));
  if (!RewriteFile(destinationPath, merged)) return 1;
  Log("Data File Merged: ", destinationFile);
  return 0;
}
