// Writing an INI file back: every piece that was read is given back byte for byte, a changed key or
// value is spliced into its line between the line's own spacing, and new lines end like the file's
// first line. Close(1) never replaces an existing file this object did not load, and leaves a
// loaded file alone when nothing in it changed; CreateAs never replaces anything.

#include <algorithm>
#include <cerrno>
#include <functional>

#include "foundation/files/atomic_file.h"
#include "foundation/inifile/ini_file.h"
#include "foundation/inifile/ini_section.h"

class INIFileWriter {
 public:
  // Receives the rendered text in order, a chunk at a time; false stops the rendering.
  using Sink = std::function<bool(std::string_view)>;

  INIFileWriter(const vxMappedINIFile& file, Sink sink)
      : file_(file), sink_(std::move(sink)), fileEol_(vxini::EolText(file.fileEol_, vxini::Eol::kLF)) {
    if (file.text_) text_ = *file.text_;
    // Most settings files are a few kilobytes: a chunk's worth of room for each would cost a large
    // allocation (and its page faults) per file written or compared.
    buffer_.reserve(std::min(kChunk, text_.size()) + 4096);
  }
  INIFileWriter(const INIFileWriter&) = delete;
  INIFileWriter& operator=(const INIFileWriter&) = delete;

  // False when a write failed.
  bool Render();

 private:
  void Put(std::string_view data) {
    if (data.empty()) return;
    buffer_.append(data);
    atLineStart_ = data.back() == '\n';
    if (buffer_.size() >= kChunk) Flush();
  }
  void Flush();
  // Starts a new line (or run of lines): the line before it, when the file ended without a line
  // end there, gets one first.
  void StartLine();
  void PutLines(std::string_view lines);
  void PutProperty(const INILine& line);
  std::string_view FileText(uint32_t begin, uint32_t end) const {
    return end > begin ? text_.substr(begin, end - begin) : std::string_view();
  }

  const vxMappedINIFile& file_;
  Sink sink_;
  std::string_view fileEol_;
  std::string_view text_;
  std::string buffer_;
  bool ok_ = true;
  bool atLineStart_ = true;

  static constexpr size_t kChunk = 1 << 20;
};

void INIFileWriter::Flush() {
  if (ok_ && !buffer_.empty()) ok_ = sink_(buffer_);
  buffer_.clear();
}

void INIFileWriter::StartLine() {
  if (!atLineStart_) Put(fileEol_);
}

void INIFileWriter::PutLines(std::string_view lines) {
  if (lines.empty()) return;
  StartLine();
  Put(lines);
}

void INIFileWriter::PutProperty(const INILine& line) {
  if (line.carried_) PutLines(*line.carried_);
  PutLines(line.Leading());
  StartLine();
  // Unchanged texts are given back as read; changed ones are kept to one line.
  std::string_view key = line.m_key.view();
  if (key != line.LoadedKey()) key = vxini::OneLine(key);
  std::string_view value = line.m_value.view();
  std::string_view beforeValue = line.Text(line.keyEnd_, line.valueBegin_);
  std::string_view afterValue = line.Text(line.valueEnd_, line.rawEnd_);
  if (value != line.LoadedValue()) {
    value = vxini::OneLine(value);
    // A value read back loses the blanks at its ends to the line's spacing. A new value that
    // brings blanks of its own replaces that spacing on its side, so that setting it again (as
    // every re-run of a migration does) writes the same line instead of one blank more each time.
    if (!value.empty() && vxini::IsBlank(value.front())) {
      while (!beforeValue.empty() && vxini::IsBlank(beforeValue.back())) beforeValue.remove_suffix(1);
    }
    if (!value.empty() && vxini::IsBlank(value.back())) afterValue = std::string_view();
  }
  Put(line.Text(line.rawBegin_, line.keyBegin_));
  Put(key);
  Put(beforeValue);
  Put(value);
  Put(afterValue);
  Put(vxini::EolText(line.eol_, file_.fileEol_));
}

bool INIFileWriter::Render() {
  PutLines(FileText(0, file_.preambleEnd_));
  for (const auto& section : file_.sections_) {
    StartLine();
    Put(section->headerPrefix);
    Put(section->nameFromCaller ? vxini::OneLine(section->name) : section->name);
    Put(section->headerSuffix);
    Put(vxini::EolText(section->headerEol, file_.fileEol_));
    for (const INILine* line : section->lines) {
      if (line != nullptr) PutProperty(*line);
    }
    PutLines(section->carriedTrailing);
    PutLines(FileText(section->trailingBegin, section->trailingEnd));
  }
  Flush();
  return ok_;
}

// Renders the content and compares it with the text it was read from, without writing anything.
bool vxMappedINIFile::SameAsLoaded() const {
  if (!text_) return false;
  const std::string& original = *text_;
  size_t offset = 0;
  INIFileWriter compare(*this, [&](std::string_view chunk) {
    if (original.compare(offset, chunk.size(), chunk) != 0) return false;
    offset += chunk.size();
    return true;
  });
  return compare.Render() && offset == original.size();
}

int vxMappedINIFile::Write(bool flushToDisk) {
  int result = 1;
  try {
    vxfiles::ReplaceTarget target;
    // An existing file that was never loaded (or failed to load) is not ours to replace.
    if (vxfiles::ResolveReplaceTarget(filename_.str(), &target) && (loaded_ || !target.exists)) {
      // Unchanged: a rewrite would only cost a new inode and lose the file's times.
      if (loaded_ && target.exists && SameAsLoaded()) return 0;
      vxfiles::AtomicFileWriter out;
      INIFileWriter writer(*this, [&out](std::string_view chunk) { return out.Append(chunk); });
      if (out.Begin(target) && writer.Render() && out.Commit(flushToDisk)) result = 0;
    }
  } catch (...) {
    result = 1;
  }
  return result;
}

int vxMappedINIFile::CreateAs(const vxStringBase& path) {
  try {
    vxfiles::ReplaceTarget target;
    target.path = path.str();
    target.mode = loadedMode_ != 0 ? loadedMode_ : vxfiles::NewFileMode();
    vxfiles::AtomicFileWriter out;
    INIFileWriter writer(*this, [&out](std::string_view chunk) { return out.Append(chunk); });
    if (!out.Begin(target, true) || !writer.Render()) return 1;
    if (out.Commit(false, false)) return 0;
    return errno == EEXIST ? 2 : 1;
  } catch (...) {
    return 1;
  }
}

int vxMappedINIFile::Close(unsigned int save) {
  int result = save != 0 ? Write(false) : 0;
  Clear();
  loaded_ = false;
  return result;
}

int vxMappedINIFile::CloseFW(unsigned int save) {
  int result = save != 0 ? Write(true) : 0;
  Clear();
  loaded_ = false;
  return result;
}
