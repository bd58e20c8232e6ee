// Splits a text at delimiter characters, handing out one piece per call.

#include "foundation/string/tokenizer.h"

const char* const vxBStringTokenizer::m_csvToken = ",";
const char* const vxBStringTokenizer::m_spToken = " ";

vxBStringTokenizer::vxBStringTokenizer(const vxStringBase& text, const char* delimiters,
                                       bool keepEmpty)
    : text_(text.str()), delimiters_(delimiters ? delimiters : ""), keepEmpty_(keepEmpty) {}

vxBStringTokenizer::vxBStringTokenizer(const vxStringBase& text)
    : text_(text.str()), delimiters_(" \t\r\n"), keepEmpty_(false) {}

int vxBStringTokenizer::GetNext(vxStringBase& piece) {
  piece.makeNull();
  while (!done_) {
    if (text_.empty()) {
      done_ = true;
      break;
    }
    size_t end = text_.find_first_of(delimiters_, position_);
    if (end == std::string::npos) {
      end = text_.size();
      done_ = true;  // the piece after the last delimiter is the last one
    }
    std::string_view found = std::string_view(text_).substr(position_, end - position_);
    position_ = end + 1;
    if (!found.empty() || keepEmpty_) {
      piece = vxStringBase(found);
      return 1;
    }
  }
  return 0;
}
