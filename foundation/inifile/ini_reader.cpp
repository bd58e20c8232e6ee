// Reading an INI file: the whole file is read in one go and split into sections and property lines
// that point into the one text, so that a file of any size costs one allocation for its text plus
// its line objects, and every byte can be written back as read.

#include <cstring>
#include <memory>

#include "foundation/files/whole_file.h"
#include "foundation/inifile/ini_file.h"
#include "foundation/inifile/ini_section.h"

class INIFileReader {
 public:
  static void Parse(vxMappedINIFile& file, std::shared_ptr<const std::string> text);

 private:
  struct Span {
    size_t begin;
    size_t end;
  };
  static bool ParseHeader(const char* d, size_t first, size_t end, Span* name);
  static bool ParseProperty(const char* d, size_t first, size_t end, Span* key, Span* value);
};

// A header is "[" name "]" with anything after it. The name runs to the last "]" before a
// comment that follows the first "]", so "[[Filter1]]" names "[Filter1]" and "[a] ; [b]" names "a".
bool INIFileReader::ParseHeader(const char* d, size_t first, size_t end, Span* name) {
  const void* found = memchr(d + first + 1, ']', end - first - 1);
  if (found == nullptr) return false;
  size_t firstClose = static_cast<const char*>(found) - d;
  size_t comment = firstClose + 1;
  while (comment < end && d[comment] != ';' && d[comment] != '#') ++comment;
  size_t close = comment - 1;
  while (d[close] != ']') --close;  // stops at firstClose at the latest
  size_t begin = first + 1;
  while (begin < close && vxini::IsBlank(d[begin])) ++begin;
  while (close > begin && vxini::IsBlank(d[close - 1])) --close;
  *name = {begin, close};
  return true;
}

// A property line is a key, "=", and a value; comment lines (";" or "#") and lines without "=" or
// with an empty key are not, and stay as text.
bool INIFileReader::ParseProperty(const char* d, size_t first, size_t end, Span* key, Span* value) {
  if (first >= end || d[first] == ';' || d[first] == '#') return false;
  const void* found = memchr(d + first, '=', end - first);
  if (found == nullptr) return false;
  size_t equals = static_cast<const char*>(found) - d;
  size_t keyEnd = equals;
  while (keyEnd > first && vxini::IsBlank(d[keyEnd - 1])) --keyEnd;
  if (keyEnd == first) return false;
  size_t valueBegin = equals + 1;
  while (valueBegin < end && vxini::IsBlank(d[valueBegin])) ++valueBegin;
  size_t valueEnd = end;
  while (valueEnd > valueBegin && vxini::IsBlank(d[valueEnd - 1])) --valueEnd;
  *key = {first, keyEnd};
  *value = {valueBegin, valueEnd};
  return true;
}

void INIFileReader::Parse(vxMappedINIFile& file, std::shared_ptr<const std::string> text) {
  using Section = vxMappedINIFile::Section;
  const char* d = text->data();
  const size_t n = text->size();
  file.text_ = text;
  const size_t bom = (n >= 3 && memcmp(d, "\xEF\xBB\xBF", 3) == 0) ? 3 : 0;
  bool eolSeen = false;
  Section* current = nullptr;
  size_t pending = 0;  // start of the non-property lines not yet given to a line or section

  for (size_t pos = 0; pos < n;) {
    const void* found = memchr(d + pos, '\n', n - pos);
    size_t end = n;
    size_t next = n;
    vxini::Eol eol = vxini::Eol::kNone;
    if (found != nullptr) {
      end = static_cast<const char*>(found) - d;
      next = end + 1;
      eol = vxini::Eol::kLF;
      if (end > pos && d[end - 1] == '\r') {
        --end;
        eol = vxini::Eol::kCRLF;
      }
    }
    if (!eolSeen && eol != vxini::Eol::kNone) {
      file.fileEol_ = eol;
      eolSeen = true;
    }
    size_t first = pos == 0 ? bom : pos;
    while (first < end && vxini::IsBlank(d[first])) ++first;

    Span name, key, value;
    if (first < end && d[first] == '[' && ParseHeader(d, first, end, &name)) {
      if (current != nullptr) {
        current->trailingBegin = static_cast<uint32_t>(pending);
        current->trailingEnd = static_cast<uint32_t>(pos);
      } else {
        file.preambleEnd_ = static_cast<uint32_t>(pos);
      }
      auto section = std::make_unique<Section>();
      section->name.assign(d + name.begin, name.end - name.begin);
      section->headerPrefix.assign(d + pos, name.begin - pos);
      section->headerSuffix.assign(d + name.end, end - name.end);
      section->headerEol = eol;
      current = section.get();
      file.sections_.push_back(std::move(section));
      file.IndexSection(current);
      pending = next;
    } else if (current != nullptr && ParseProperty(d, first, end, &key, &value)) {
      auto line = std::unique_ptr<INILine>(new INILine());
      line->text_ = text;
      line->leadingBegin_ = static_cast<uint32_t>(pending);
      line->rawBegin_ = static_cast<uint32_t>(pos);
      line->keyBegin_ = static_cast<uint32_t>(key.begin);
      line->keyEnd_ = static_cast<uint32_t>(key.end);
      line->valueBegin_ = static_cast<uint32_t>(value.begin);
      line->valueEnd_ = static_cast<uint32_t>(value.end);
      line->rawEnd_ = static_cast<uint32_t>(end);
      line->eol_ = eol;
      line->m_key = vxStringBase(std::string_view(d + key.begin, key.end - key.begin));
      line->m_value = vxStringBase(std::string_view(d + value.begin, value.end - value.begin));
      current->lines.push_back(line.get());
      line.release();
      pending = next;
    }
    pos = next;
  }
  if (current != nullptr) {
    current->trailingBegin = static_cast<uint32_t>(pending);
    current->trailingEnd = static_cast<uint32_t>(n);
  } else {
    file.preambleEnd_ = static_cast<uint32_t>(n);
  }
}

int vxMappedINIFile::Open(unsigned int flag) {
  Clear();
  loaded_ = false;
  try {
    auto text = std::make_shared<std::string>();
    if (!vxfiles::ReadWholeFile(filename_.str(), text.get(), &loadedMode_)) return 1;
    // Flag 1 reads settings files: one holding a NUL byte is binary and never taken for one.
    if (flag != 0 && memchr(text->data(), '\0', text->size()) != nullptr) return 1;
    INIFileReader::Parse(*this, std::move(text));
    loaded_ = true;
    return 0;
  } catch (...) {
    Clear();
    return 1;
  }
}
