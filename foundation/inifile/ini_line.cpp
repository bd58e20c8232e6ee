// One property line of an INI section. A line built from a key and a value carries its own
// "key=value" text, so that every line, read or built, is written by the same splice.

#include "foundation/inifile/ini_line.h"

INILine::INILine() = default;

INILine::INILine(const vxStringBase& key, const vxStringBase& value) : m_key(key), m_value(value) {
  std::string_view k = vxini::OneLine(key.view());
  std::string_view v = vxini::OneLine(value.view());
  std::string text;
  text.reserve(k.size() + 1 + v.size());
  text.append(k).append(1, '=').append(v);
  keyEnd_ = static_cast<uint32_t>(k.size());
  valueBegin_ = keyEnd_ + 1;
  valueEnd_ = rawEnd_ = static_cast<uint32_t>(text.size());
  text_ = std::make_shared<const std::string>(std::move(text));
}

INILine::INILine(const INILine& other)
    : m_key(other.m_key),
      m_value(other.m_value),
      text_(other.text_),
      leadingBegin_(other.leadingBegin_),
      rawBegin_(other.rawBegin_),
      keyBegin_(other.keyBegin_),
      keyEnd_(other.keyEnd_),
      valueBegin_(other.valueBegin_),
      valueEnd_(other.valueEnd_),
      rawEnd_(other.rawEnd_),
      eol_(other.eol_) {
  if (other.carried_) carried_ = std::make_unique<std::string>(*other.carried_);
}

INILine::~INILine() = default;

INILine::KeyCompare::KeyCompare(const vxStringBase& key) : folded_(vxFoldCase(key.view())) {}

INILine::KeyCompare::KeyCompare(const char* key) : folded_(vxFoldCase(key ? key : "")) {}

bool INILine::KeyCompare::operator()(const INILine* line) const {
  return line != nullptr && vxini::EqualsFolded(line->m_key.view(), folded_);
}
