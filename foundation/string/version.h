// A dotted product version ("5.10.2") held as three numbers and ordered by them, major first.
// Parsing never fails: a missing or unreadable number counts as 0 (see the .cpp for the rule).

#ifndef VXMIGRATE_FOUNDATION_STRING_VERSION_H_
#define VXMIGRATE_FOUNDATION_STRING_VERSION_H_

#include <cstdint>

#include "foundation/export.h"
#include "foundation/string/string_base.h"

class VXM_EXPORT vxVersionDescriptor {
 public:
  explicit vxVersionDescriptor(const char* text);
  explicit vxVersionDescriptor(const vxStringBase& text);
  virtual ~vxVersionDescriptor();

  // Numbers compared from the left: 5.10 > 5.9, 5.1 == 5.1.0.
  bool operator<(const vxVersionDescriptor& other) const;
  bool operator>(const vxVersionDescriptor& other) const;
  bool operator==(const vxVersionDescriptor& other) const;

  // True when other is an in-line successor of this version: the same major number (the same
  // product line) and not older.
  bool IsInline(const vxVersionDescriptor& other) const;

  // Callers read these directly.
  int32_t m_major = 0;
  int32_t m_minor = 0;
  int32_t m_third = 0;
};

#endif  // VXMIGRATE_FOUNDATION_STRING_VERSION_H_
