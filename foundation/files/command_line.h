// Named options from a command line: each argument "-name:value" (option character and separator
// as given) becomes an option; "-name" alone is an option with an empty value. Names are matched
// exactly. Arguments that do not start with the option character are ignored.

#ifndef VXMIGRATE_FOUNDATION_FILES_COMMAND_LINE_H_
#define VXMIGRATE_FOUNDATION_FILES_COMMAND_LINE_H_

#include <cstdint>
#include <map>
#include <string>
#include <vector>

#include "foundation/export.h"
#include "foundation/string/string_base.h"

class VXM_EXPORT vxCommandLineParser {
 public:
  // Keeps copies of the arguments (argv[0] is the program name and is not an option).
  vxCommandLineParser(int argc, char** argv, char optionChar, char separator);
  virtual ~vxCommandLineParser();

  vxCommandLineParser(const vxCommandLineParser&) = delete;
  vxCommandLineParser& operator=(const vxCommandLineParser&) = delete;

  // Splits the arguments into options (a later repeat of a name wins), then runs Validate.
  virtual int ParseCommand();
  // Sets and returns the validity flag; the base class accepts every command line.
  virtual int Validate();

  // Non-zero when the option is present, also when its value is empty.
  int Exists(const char* name) const;
  int Exists(const vxStringBase& name) const { return Exists(name.c_str()); }
  // The option's value; an empty text when absent.
  const vxStringBase& GetValue(const char* name) const;
  const vxStringBase& GetValue(const vxStringBase& name) const { return GetValue(name.c_str()); }
  // Sets or adds the option.
  void SetValue(const char* name, const vxStringBase& value);

  int IsValid() const { return m_valid; }
  const std::vector<std::string>& Arguments() const { return arguments_; }

 protected:
  int32_t m_valid = 0;  // 1 valid, 0 not

 private:
  std::vector<std::string> arguments_;
  char optionChar_;
  char separator_;
  std::map<std::string, vxStringBase> options_;
};

#endif  // VXMIGRATE_FOUNDATION_FILES_COMMAND_LINE_H_
