// The byte string every part of the library handles text with. It owns its bytes, keeps its length
// beside them (so a value may hold any byte, NUL included) and always offers a NUL-terminated view
// through c_str(). Not thread-safe; copy it to share it.

#ifndef VXMIGRATE_FOUNDATION_STRING_STRING_BASE_H_
#define VXMIGRATE_FOUNDATION_STRING_STRING_BASE_H_

#include <cstddef>
#include <string>
#include <string_view>

#include "foundation/export.h"

class VXM_EXPORT vxStringBase {
 public:
  // Result of a search that found nothing: the largest unsigned value, so "position < 2" excludes it.
  static const unsigned int BadIndex;
  // A constant empty string, passed where an operation wants an empty sub-folder or text.
  static const vxStringBase NullStr;

  // Which ends stripWhite cleans. kBoth (0x11) is what the callers pass.
  enum StripType { kLeading = 0x01, kTrailing = 0x10, kBoth = 0x11 };

  vxStringBase();
  vxStringBase(const char* text);  // NOLINT: implicit, callers pass literals freely. Null gives empty.
  vxStringBase(const char* text, size_t length);
  explicit vxStringBase(std::string_view text);
  vxStringBase(const vxStringBase& other);
  vxStringBase(vxStringBase&& other) noexcept;
  virtual ~vxStringBase();

  vxStringBase& operator=(const char* text);
  vxStringBase& operator=(const vxStringBase& other);
  vxStringBase& operator=(vxStringBase&& other) noexcept;

  // Always a valid NUL-terminated text ("" when empty).
  const char* c_str() const { return text_.c_str(); }
  unsigned int length() const { return static_cast<unsigned int>(text_.size()); }
  bool isEmpty() const { return text_.empty(); }
  std::string_view view() const { return text_; }
  const std::string& str() const { return text_; }

  // count 0 appends the whole text; otherwise at most count bytes of it.
  vxStringBase& append(const char* text, unsigned int count = 0);
  vxStringBase& append(const vxStringBase& other);
  vxStringBase& append(char c);
  vxStringBase& append(long value);  // decimal
  // count 0 inserts the whole text at the front.
  vxStringBase& prepend(const char* text, unsigned int count = 0);

  // REQUIRES: position < length().
  char& at(unsigned int position) { return text_[position]; }
  char at(unsigned int position) const { return text_[position]; }

  // Removes the last count characters (all of them when count >= length()).
  void cut(unsigned int count);
  // Removes the characters first..last, both included; last BadIndex (or past the end) removes to
  // the end. Nothing happens when first is past the end or first > last.
  void del(unsigned int first, unsigned int last);

  // Characters start..end, both included; an end at or past the length stops at the last character.
  // Empty when start is past the end or start > end.
  vxStringBase subString(unsigned int start, unsigned int end) const;
  // Splits at a delimiter: fills piece with the text from start up to (not including) the first
  // delimiter at or before last (last BadIndex: to the end), and returns the position just after
  // that delimiter, or BadIndex when none follows. flags is reserved (callers pass 0).
  unsigned int subString(char delimiter, vxStringBase& piece, unsigned int start, unsigned int last,
                         int flags = 0) const;

  // The case flag `exact` is true for a byte-exact comparison and false to ignore ASCII case.
  unsigned int find(const vxStringBase& needle, unsigned int start = 0, bool exact = true) const;
  unsigned int find(const char* needle, unsigned int start = 0, bool exact = true) const;
  // Only the first count bytes of needle (count 0: all of it).
  unsigned int find(const char* needle, unsigned int start, unsigned int count, bool exact) const;
  unsigned int find(char c, unsigned int start = 0, bool exact = true) const;
  // Last occurrence at or before start (start BadIndex or past the end: from the last character).
  unsigned int rfind(char c, unsigned int start = BadIndex, bool exact = true) const;

  bool equals(const vxStringBase& other, bool exact = true) const;
  bool equals(const char* other, bool exact = true) const;
  bool beginsWith(std::string_view prefix, bool exact = true) const;
  bool endsWith(std::string_view suffix, bool exact = true) const;

  // Replaces every occurrence of oldText at or after start by newText, left to right, never
  // rescanning replaced text. Returns the number of replacements.
  unsigned int replace(const char* oldText, const char* newText, unsigned int start = 0,
                       bool exact = true);

  // Removes blanks, tabs, carriage returns and line feeds at the ends the kind selects.
  void stripWhite(int kind = kBoth);

  // The text read as a decimal number: leading white space skipped, an optional sign, digits up to
  // the first non-digit; no digits give 0. Saturates at the long range instead of wrapping.
  long asLong() const;

  void makeNull() { text_.clear(); }

  bool operator==(const vxStringBase& other) const { return text_ == other.text_; }
  bool operator!=(const vxStringBase& other) const { return text_ != other.text_; }
  bool operator<(const vxStringBase& other) const { return text_ < other.text_; }

 private:
  std::string text_;
};

// ASCII case folding shared by every case-insensitive comparison and index.
VXM_EXPORT char vxFoldCase(char c);
VXM_EXPORT std::string vxFoldCase(std::string_view text);
VXM_EXPORT bool vxEqualsIgnoreCase(std::string_view a, std::string_view b);

#endif  // VXMIGRATE_FOUNDATION_STRING_STRING_BASE_H_
