// The library's byte string. Searches return BadIndex when nothing is found; every position
// argument is checked, so a caller's off-by-one gives an empty result instead of a crash.

#include "foundation/string/string_base.h"

#include <cerrno>
#include <climits>
#include <cstdlib>
#include <cstring>

const unsigned int vxStringBase::BadIndex = UINT_MAX;
const vxStringBase vxStringBase::NullStr;

char vxFoldCase(char c) { return (c >= 'A' && c <= 'Z') ? static_cast<char>(c - 'A' + 'a') : c; }

std::string vxFoldCase(std::string_view text) {
  std::string folded(text);
  for (char& c : folded) c = vxFoldCase(c);
  return folded;
}

bool vxEqualsIgnoreCase(std::string_view a, std::string_view b) {
  if (a.size() != b.size()) return false;
  for (size_t i = 0; i < a.size(); ++i) {
    if (vxFoldCase(a[i]) != vxFoldCase(b[i])) return false;
  }
  return true;
}

namespace {

bool IsWhite(char c) { return c == ' ' || c == '\t' || c == '\r' || c == '\n'; }

// Position of needle in haystack at or after start, optionally ignoring case.
size_t FindText(std::string_view haystack, std::string_view needle, size_t start, bool exact) {
  if (start > haystack.size()) return std::string_view::npos;
  if (exact) return haystack.find(needle, start);
  if (needle.empty()) return start;
  for (size_t i = start; i + needle.size() <= haystack.size(); ++i) {
    if (vxEqualsIgnoreCase(haystack.substr(i, needle.size()), needle)) return i;
  }
  return std::string_view::npos;
}

unsigned int ToIndex(size_t position) {
  return position == std::string_view::npos || position >= UINT_MAX
             ? vxStringBase::BadIndex
             : static_cast<unsigned int>(position);
}

}  // namespace

vxStringBase::vxStringBase() = default;
vxStringBase::vxStringBase(const char* text) : text_(text ? text : "") {}
vxStringBase::vxStringBase(const char* text, size_t length) : text_(text ? text : "", text ? length : 0) {}
vxStringBase::vxStringBase(std::string_view text) : text_(text) {}
vxStringBase::vxStringBase(const vxStringBase& other) = default;
vxStringBase::vxStringBase(vxStringBase&& other) noexcept = default;
vxStringBase::~vxStringBase() = default;

vxStringBase& vxStringBase::operator=(const char* text) {
  text_ = text ? text : "";
  return *this;
}
vxStringBase& vxStringBase::operator=(const vxStringBase& other) = default;
vxStringBase& vxStringBase::operator=(vxStringBase&& other) noexcept = default;

vxStringBase& vxStringBase::append(const char* text, unsigned int count) {
  if (text == nullptr) return *this;
  if (count == 0) {
    text_.append(text);
  } else {
    text_.append(text, strnlen(text, count));
  }
  return *this;
}

vxStringBase& vxStringBase::append(const vxStringBase& other) {
  text_.append(other.text_);
  return *this;
}

vxStringBase& vxStringBase::append(char c) {
  text_.push_back(c);
  return *this;
}

vxStringBase& vxStringBase::append(long value) {
  text_.append(std::to_string(value));
  return *this;
}

vxStringBase& vxStringBase::prepend(const char* text, unsigned int count) {
  if (text == nullptr) return *this;
  size_t n = count == 0 ? strlen(text) : strnlen(text, count);
  text_.insert(0, text, n);
  return *this;
}

void vxStringBase::cut(unsigned int count) {
  text_.resize(count >= text_.size() ? 0 : text_.size() - count);
}

void vxStringBase::del(unsigned int first, unsigned int last) {
  if (first >= text_.size() || first > last) return;
  size_t end = (last == BadIndex || last >= text_.size()) ? text_.size() : size_t(last) + 1;
  text_.erase(first, end - first);
}

vxStringBase vxStringBase::subString(unsigned int start, unsigned int end) const {
  if (start >= text_.size() || start > end) return vxStringBase();
  size_t stop = end >= text_.size() ? text_.size() : size_t(end) + 1;
  return vxStringBase(std::string_view(text_).substr(start, stop - start));
}

unsigned int vxStringBase::subString(char delimiter, vxStringBase& piece, unsigned int start,
                                     unsigned int last, int /*flags*/) const {
  piece.makeNull();
  if (start >= text_.size()) return BadIndex;
  size_t stop = (last == BadIndex || last >= text_.size()) ? text_.size() : size_t(last) + 1;
  if (start >= stop) return BadIndex;
  size_t found = std::string_view(text_).substr(0, stop).find(delimiter, start);
  if (found == std::string_view::npos) {
    piece.text_.assign(text_, start, stop - start);
    return BadIndex;
  }
  piece.text_.assign(text_, start, found - start);
  return ToIndex(found + 1);
}

unsigned int vxStringBase::find(const vxStringBase& needle, unsigned int start, bool exact) const {
  return ToIndex(FindText(text_, needle.text_, start, exact));
}

unsigned int vxStringBase::find(const char* needle, unsigned int start, bool exact) const {
  if (needle == nullptr) return BadIndex;
  return ToIndex(FindText(text_, needle, start, exact));
}

unsigned int vxStringBase::find(const char* needle, unsigned int start, unsigned int count,
                                bool exact) const {
  if (needle == nullptr) return BadIndex;
  size_t n = count == 0 ? strlen(needle) : strnlen(needle, count);
  return ToIndex(FindText(text_, std::string_view(needle, n), start, exact));
}

unsigned int vxStringBase::find(char c, unsigned int start, bool exact) const {
  char folded = vxFoldCase(c);
  for (size_t i = start; i < text_.size(); ++i) {
    if (text_[i] == c || (!exact && vxFoldCase(text_[i]) == folded)) return ToIndex(i);
  }
  return BadIndex;
}

unsigned int vxStringBase::rfind(char c, unsigned int start, bool exact) const {
  if (text_.empty()) return BadIndex;
  size_t i = (start == BadIndex || start >= text_.size()) ? text_.size() - 1 : start;
  char folded = vxFoldCase(c);
  for (;; --i) {
    if (text_[i] == c || (!exact && vxFoldCase(text_[i]) == folded)) return ToIndex(i);
    if (i == 0) return BadIndex;
  }
}

bool vxStringBase::equals(const vxStringBase& other, bool exact) const {
  return exact ? text_ == other.text_ : vxEqualsIgnoreCase(text_, other.text_);
}

bool vxStringBase::equals(const char* other, bool exact) const {
  std::string_view that = other ? other : "";
  return exact ? text_ == that : vxEqualsIgnoreCase(text_, that);
}

bool vxStringBase::beginsWith(std::string_view prefix, bool exact) const {
  if (prefix.size() > text_.size()) return false;
  std::string_view head = std::string_view(text_).substr(0, prefix.size());
  return exact ? head == prefix : vxEqualsIgnoreCase(head, prefix);
}

bool vxStringBase::endsWith(std::string_view suffix, bool exact) const {
  if (suffix.size() > text_.size()) return false;
  std::string_view tail = std::string_view(text_).substr(text_.size() - suffix.size());
  return exact ? tail == suffix : vxEqualsIgnoreCase(tail, suffix);
}

unsigned int vxStringBase::replace(const char* oldText, const char* newText, unsigned int start,
                                   bool exact) {
  if (oldText == nullptr || *oldText == '\0') return 0;
  std::string_view from = oldText;
  std::string_view to = newText ? newText : "";
  unsigned int replaced = 0;
  std::string result;
  size_t copied = 0;
  size_t position = FindText(text_, from, start, exact);
  while (position != std::string_view::npos) {
    result.append(text_, copied, position - copied);
    result.append(to);
    copied = position + from.size();
    ++replaced;
    position = FindText(text_, from, copied, exact);
  }
  if (replaced > 0) {
    result.append(text_, copied, std::string::npos);
    text_.swap(result);
  }
  return replaced;
}

void vxStringBase::stripWhite(int kind) {
  size_t begin = 0;
  size_t end = text_.size();
  if (kind & kTrailing) {
    while (end > begin && IsWhite(text_[end - 1])) --end;
  }
  if (kind & kLeading) {
    while (begin < end && IsWhite(text_[begin])) ++begin;
  }
  text_ = text_.substr(begin, end - begin);
}

long vxStringBase::asLong() const {
  // strtol saturates at LONG_MIN/LONG_MAX and sets ERANGE instead of wrapping; the text is always
  // NUL-terminated, and stray bytes after the digits end the number.
  errno = 0;
  return strtol(text_.c_str(), nullptr, 10);
}
