// One property line of an INI section: its key and value, plus what the writer needs to give the
// line back byte for byte when neither was changed (its spacing, its line end, and the comment or
// blank lines that stood before it).

#ifndef VXMIGRATE_FOUNDATION_INIFILE_INI_LINE_H_
#define VXMIGRATE_FOUNDATION_INIFILE_INI_LINE_H_

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "foundation/export.h"
#include "foundation/inifile/ini_text.h"
#include "foundation/string/string_base.h"

class VXM_EXPORT INILine {
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

  INILine();  // for the reader, which fills the layout below

  std::string_view Text(uint32_t begin, uint32_t end) const {
    if (!text_ || end <= begin) return std::string_view();
    return std::string_view(text_->data() + begin, end - begin);
  }
  std::string_view Leading() const { return Text(leadingBegin_, rawBegin_); }
  // The key as read (or as given to the constructor): what the section's index is keyed by.
  std::string_view LoadedKey() const { return Text(keyBegin_, keyEnd_); }
  std::string_view LoadedValue() const { return Text(valueBegin_, valueEnd_); }

  // The text the offsets below point into: the whole file the line was read from (shared with the
  // file's other lines and with copies taken into other files), or "key=value" for a line built
  // from a key and a value. Never changed once set, so views into it stay valid.
  std::shared_ptr<const std::string> text_;
  uint32_t leadingBegin_ = 0;  // [leadingBegin_, rawBegin_): comment, blank or stray lines before
  uint32_t rawBegin_ = 0;      // [rawBegin_, rawEnd_): the line itself, without its line end
  uint32_t keyBegin_ = 0;      // the key as read, blanks around it excluded
  uint32_t keyEnd_ = 0;
  uint32_t valueBegin_ = 0;    // the value as read, blanks around it excluded
  uint32_t valueEnd_ = 0;
  uint32_t rawEnd_ = 0;
  vxini::Eol eol_ = vxini::Eol::kFile;
  // Lines that stood before a removed neighbour, written before Leading() so that removing a key
  // never takes a comment with it. Usually null.
  std::unique_ptr<std::string> carried_;
};

// A section's property lines in file order. The INI file owns the lines; callers may read them and
// change m_value in place, but add, remove or rename keys only through vxMappedINIFile.
typedef std::vector<INILine*> INILineList;

#endif  // VXMIGRATE_FOUNDATION_INIFILE_INI_LINE_H_
