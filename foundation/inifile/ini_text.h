// Text helpers shared by the INI reader, writer and model: the ASCII case folding used by every
// section and key index (hash and equality agree, so a lookup never allocates), the line-end kinds
// a line may carry, and the rule that keeps a caller's text from breaking the file's line structure.

#ifndef VXMIGRATE_FOUNDATION_INIFILE_INI_TEXT_H_
#define VXMIGRATE_FOUNDATION_INIFILE_INI_TEXT_H_

#include <cstddef>
#include <cstdint>
#include <string_view>

namespace vxini {

inline unsigned char FoldByte(char c) {
  unsigned char u = static_cast<unsigned char>(c);
  return (u >= 'A' && u <= 'Z') ? static_cast<unsigned char>(u + ('a' - 'A')) : u;
}

inline bool EqualsFolded(std::string_view a, std::string_view b) {
  if (a.size() != b.size()) return false;
  for (size_t i = 0; i < a.size(); ++i) {
    if (FoldByte(a[i]) != FoldByte(b[i])) return false;
  }
  return true;
}

// FNV-1a over the folded bytes: names that differ only in ASCII case hash alike.
struct FoldHash {
  size_t operator()(std::string_view text) const {
    uint64_t h = 14695981039346656037ull;
    for (char c : text) {
      h ^= FoldByte(c);
      h *= 1099511628211ull;
    }
    return static_cast<size_t>(h ^ (h >> 32));
  }
};

struct FoldEqual {
  bool operator()(std::string_view a, std::string_view b) const { return EqualsFolded(a, b); }
};

// The line end a line is written with. kFile stands for the file's own style (its first line end),
// used by lines and sections that did not come from this file's text.
enum class Eol : unsigned char { kNone, kLF, kCRLF, kFile };

inline std::string_view EolText(Eol eol, Eol fileEol) {
  if (eol == Eol::kFile) eol = fileEol;
  switch (eol) {
    case Eol::kLF:
      return "\n";
    case Eol::kCRLF:
      return "\r\n";
    default:
      return "";
  }
}

// A key, value or section name set by a caller is written up to its first NUL, CR or LF: a line
// break would let it start lines of its own, and a NUL would make the file read as binary.
inline std::string_view OneLine(std::string_view text) {
  for (size_t i = 0; i < text.size(); ++i) {
    if (text[i] == '\0' || text[i] == '\r' || text[i] == '\n') return text.substr(0, i);
  }
  return text;
}

// Blanks trimmed around keys and values.
inline bool IsBlank(char c) { return c == ' ' || c == '\t' || c == '\r'; }

}  // namespace vxini

#endif  // VXMIGRATE_FOUNDATION_INIFILE_INI_TEXT_H_
