// Dotted versions. Parsing rule: up to three numbers separated by '.', each read as the decimal
// digits at its start (a component "1a" reads as 1, "a" or "" as 0); missing components are 0 and
// further ones are ignored. An empty or unreadable text is therefore 0.0.0, older than every real
// version. Numbers saturate at INT32_MAX instead of wrapping.

#include "foundation/string/version.h"

#include <cstdint>
#include <string>

namespace {

int32_t ReadComponent(const std::string& text, size_t& position) {
  while (position < text.size() && (text[position] == ' ' || text[position] == '\t')) ++position;
  int64_t value = 0;
  while (position < text.size() && text[position] >= '0' && text[position] <= '9') {
    value = value * 10 + (text[position] - '0');
    if (value > INT32_MAX) value = INT32_MAX;
    ++position;
  }
  // Skip whatever else belongs to this component ("1a", "beta") up to the next dot.
  while (position < text.size() && text[position] != '.') ++position;
  if (position < text.size()) ++position;
  return static_cast<int32_t>(value);
}

}  // namespace

vxVersionDescriptor::vxVersionDescriptor(const char* text)
    : vxVersionDescriptor(vxStringBase(text)) {}

vxVersionDescriptor::vxVersionDescriptor(const vxStringBase& text) {
  const std::string& s = text.str();
  size_t position = 0;
  m_major = ReadComponent(s, position);
  m_minor = ReadComponent(s, position);
  m_third = ReadComponent(s, position);
}

vxVersionDescriptor::~vxVersionDescriptor() = default;

bool vxVersionDescriptor::operator<(const vxVersionDescriptor& other) const {
  if (m_major != other.m_major) return m_major < other.m_major;
  if (m_minor != other.m_minor) return m_minor < other.m_minor;
  return m_third < other.m_third;
}

bool vxVersionDescriptor::operator>(const vxVersionDescriptor& other) const {
  return other < *this;
}

bool vxVersionDescriptor::operator==(const vxVersionDescriptor& other) const {
  return !(*this < other) && !(other < *this);
}

bool vxVersionDescriptor::IsInline(const vxVersionDescriptor& other) const {
  return other.m_major == m_major && !(other < *this);
}
