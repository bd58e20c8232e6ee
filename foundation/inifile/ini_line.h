// One property line of an INI section: its key and value, plus what the writer needs to give the
// line back byte for byte when neither was changed (its spacing, its line end, and the comment or
// blank lines that stood before it).

#ifndef VXMIGRATE_FOUNDATION_INIFILE_INI_LINE_H_
#define VXMIGRATE_FOUNDATION_INIFILE_INI_LINE_H_

#include <string>
#include <vector>

#include "foundation/string/string_base.h"

class INILine {
 public:
  INILine(const vxStringBase& key, const vxStringBase& value);
  INILine(const INILine& other);             // a full copy, layout included
  INILine& operator=(const INILine&) = delete;
  virtual ~INILine();

  // The first two fields, read and changed directly by callers. A changed value (or key) is
  // written back in the line's own place with its own spacing.
  vxStringBase m_key;
  vxStringBase m_value;

  // Predicate for std::find_if over a section's lines: true for a line whose key equals the given
  // one, ignoring ASCII case (the same matching as every lookup of the INI model).
  class KeyCompare {
   public:
    explicit KeyCompare(const vxStringBase& key);
    explicit KeyCompare(const char* key);
    bool operator()(const INILine* line) const;

   private:
    std::string folded_;
  };

 private:
  friend class vxMappedINIFile;
  friend class INIFileReader;
  friend class INIFileWriter;

  std::string leading_;       // non-property lines (comments, blanks, stray text) before this one
  std::string raw_;           // the line as read, without its line end; empty for a new line
  std::string eol_;           // "\r\n", "\n", or "" for a last line without one
  std::string loadedKey_;     // key and value as read, to tell whether the caller changed them
  std::string loadedValue_;
  size_t valueOffset_ = 0;    // where the value starts within raw_
  size_t valueEnd_ = 0;       // where it ends (trailing blanks after it are kept)
};

// A section's property lines in file order. The INI file owns the lines; callers may read them and
// change m_value in place, but add, remove or rename keys only through vxMappedINIFile.
typedef std::vector<INILine*> INILineList;

#endif  // VXMIGRATE_FOUNDATION_INIFILE_INI_LINE_H_
