// Splits "-name:value" arguments into named options.

#include "foundation/files/command_line.h"

vxCommandLineParser::vxCommandLineParser(int argc, char** argv, char optionChar, char separator)
    : optionChar_(optionChar), separator_(separator) {
  for (int i = 0; argv != nullptr && i < argc; ++i) {
    arguments_.push_back(argv[i] != nullptr ? argv[i] : "");
  }
}

vxCommandLineParser::~vxCommandLineParser() = default;

int vxCommandLineParser::ParseCommand() {
  for (size_t i = 1; i < arguments_.size(); ++i) {
    const std::string& argument = arguments_[i];
    if (argument.size() < 2 || argument[0] != optionChar_) continue;
    // Only the first separator splits: values such as "C:\data" or "a:b" keep theirs.
    size_t split = argument.find(separator_, 1);
    std::string name = argument.substr(1, split == std::string::npos ? std::string::npos : split - 1);
    if (name.empty()) continue;
    std::string value = split == std::string::npos ? std::string() : argument.substr(split + 1);
    options_[name] = vxStringBase(value);
  }
  return Validate();
}

int vxCommandLineParser::Validate() {
  m_valid = 1;
  return m_valid;
}

int vxCommandLineParser::Exists(const char* name) const {
  return name != nullptr && options_.count(name) != 0 ? 1 : 0;
}

const vxStringBase& vxCommandLineParser::GetValue(const char* name) const {
  if (name == nullptr) return vxStringBase::NullStr;
  auto found = options_.find(name);
  return found == options_.end() ? vxStringBase::NullStr : found->second;
}

void vxCommandLineParser::SetValue(const char* name, const vxStringBase& value) {
  if (name == nullptr || *name == '\0') return;
  options_[name] = value;
}
