// A small JSON writer and reader for the run's report: enough of the format for what we write
// (objects, arrays, strings, integers, true/false/null). The writer escapes every control byte
// and passes other bytes through, so names in any encoding come back as they went in. The reader
// refuses what it does not understand rather than guessing.

#ifndef VXMIGRATE_FOUNDATION_STRING_JSON_TEXT_H_
#define VXMIGRATE_FOUNDATION_STRING_JSON_TEXT_H_

#include <map>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "foundation/export.h"

// Appends text as a JSON string, quotes included.
void vxJsonAppendString(std::string& out, std::string_view text);

// A parsed JSON value. Objects keep their members sorted by name (the reader needs no order).
struct VXM_EXPORT vxJsonValue {
  enum class Kind { kNull, kBool, kNumber, kString, kArray, kObject };
  Kind kind = Kind::kNull;
  bool boolean = false;
  long long number = 0;
  std::string text;
  std::vector<vxJsonValue> items;
  std::map<std::string, vxJsonValue> members;

  // The member name of an object, or a shared null value when absent (or not an object).
  const vxJsonValue& operator[](const std::string& name) const;
};

// Parses text whole; false (and value null) on any fault.
VXM_EXPORT bool vxJsonParse(std::string_view text, vxJsonValue& value);

#endif  // VXMIGRATE_FOUNDATION_STRING_JSON_TEXT_H_
