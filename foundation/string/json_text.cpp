// JSON text in and out. The reader is recursive descent with a depth limit, so a hostile file
// cannot exhaust the stack.

#include "foundation/string/json_text.h"

#include <cstdio>
#include <cstdlib>

namespace {

const int kMaxDepth = 64;

class Reader {
 public:
  explicit Reader(std::string_view text) : text_(text) {}

  bool Whole(vxJsonValue& value) {
    if (!Value(value, 0)) return false;
    Blanks();
    return at_ == text_.size();
  }

 private:
  void Blanks() {
    while (at_ < text_.size() && (text_[at_] == ' ' || text_[at_] == '\n' || text_[at_] == '\r' ||
                                  text_[at_] == '\t')) {
      ++at_;
    }
  }
  bool Take(char c) {
    Blanks();
    if (at_ < text_.size() && text_[at_] == c) {
      ++at_;
      return true;
    }
    return false;
  }
  bool Word(std::string_view word) {
    if (text_.substr(at_, word.size()) != word) return false;
    at_ += word.size();
    return true;
  }
  static int Hex(char c) {
    if (c >= '0' && c <= '9') return c - '0';
    if (c >= 'a' && c <= 'f') return c - 'a' + 10;
    if (c >= 'A' && c <= 'F') return c - 'A' + 10;
    return -1;
  }
  void AppendUtf8(std::string& out, unsigned code) {
    if (code < 0x80) {
      out.push_back(static_cast<char>(code));
    } else if (code < 0x800) {
      out.push_back(static_cast<char>(0xC0 | (code >> 6)));
      out.push_back(static_cast<char>(0x80 | (code & 0x3F)));
    } else {
      out.push_back(static_cast<char>(0xE0 | (code >> 12)));
      out.push_back(static_cast<char>(0x80 | ((code >> 6) & 0x3F)));
      out.push_back(static_cast<char>(0x80 | (code & 0x3F)));
    }
  }
  bool String(std::string& out) {
    if (!Take('"')) return false;
    while (at_ < text_.size()) {
      char c = text_[at_++];
      if (c == '"') return true;
      if (static_cast<unsigned char>(c) < 0x20) return false;
      if (c != '\\') {
        out.push_back(c);
        continue;
      }
      if (at_ >= text_.size()) return false;
      char e = text_[at_++];
      switch (e) {
        case '"': case '\\': case '/': out.push_back(e); break;
        case 'b': out.push_back('\b'); break;
        case 'f': out.push_back('\f'); break;
        case 'n': out.push_back('\n'); break;
        case 'r': out.push_back('\r'); break;
        case 't': out.push_back('\t'); break;
        case 'u': {
          unsigned code = 0;
          for (int i = 0; i < 4; ++i) {
            int h = at_ < text_.size() ? Hex(text_[at_++]) : -1;
            if (h < 0) return false;
            code = code * 16 + static_cast<unsigned>(h);
          }
          AppendUtf8(out, code);
          break;
        }
        default: return false;
      }
    }
    return false;
  }
  bool Value(vxJsonValue& value, int depth) {
    if (depth > kMaxDepth) return false;
    Blanks();
    if (at_ >= text_.size()) return false;
    char c = text_[at_];
    if (c == '"') {
      value.kind = vxJsonValue::Kind::kString;
      return String(value.text);
    }
    if (c == '{') {
      ++at_;
      value.kind = vxJsonValue::Kind::kObject;
      if (Take('}')) return true;
      do {
        std::string name;
        if (!String(name) || !Take(':') || !Value(value.members[name], depth + 1)) return false;
      } while (Take(','));
      return Take('}');
    }
    if (c == '[') {
      ++at_;
      value.kind = vxJsonValue::Kind::kArray;
      if (Take(']')) return true;
      do {
        value.items.emplace_back();
        if (!Value(value.items.back(), depth + 1)) return false;
      } while (Take(','));
      return Take(']');
    }
    if (Word("true") || Word("false")) {
      value.kind = vxJsonValue::Kind::kBool;
      value.boolean = text_[at_ - 1] == 'e' && text_[at_ - 2] == 'u';
      return true;
    }
    if (Word("null")) return true;
    size_t start = at_;
    if (at_ < text_.size() && text_[at_] == '-') ++at_;
    while (at_ < text_.size() && text_[at_] >= '0' && text_[at_] <= '9') ++at_;
    if (at_ == start || (at_ == start + 1 && text_[start] == '-')) return false;
    value.kind = vxJsonValue::Kind::kNumber;
    value.number = strtoll(std::string(text_.substr(start, at_ - start)).c_str(), nullptr, 10);
    return true;
  }

  std::string_view text_;
  size_t at_ = 0;
};

}  // namespace

void vxJsonAppendString(std::string& out, std::string_view text) {
  out.push_back('"');
  for (unsigned char c : text) {
    if (c == '"' || c == '\\') {
      out.push_back('\\');
      out.push_back(static_cast<char>(c));
    } else if (c < 0x20 || c == 0x7f) {
      char escaped[8];
      snprintf(escaped, sizeof escaped, "\\u%04x", c);
      out += escaped;
    } else {
      out.push_back(static_cast<char>(c));
    }
  }
  out.push_back('"');
}

const vxJsonValue& vxJsonValue::operator[](const std::string& name) const {
  static const vxJsonValue kNull;
  auto found = members.find(name);
  return found == members.end() ? kNull : found->second;
}

bool vxJsonParse(std::string_view text, vxJsonValue& value) {
  value = vxJsonValue();
  Reader reader(text);
  if (reader.Whole(value)) return true;
  value = vxJsonValue();
  return false;
}
