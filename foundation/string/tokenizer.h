// Walks a text and hands out the pieces between delimiter characters. The tokenizer keeps its own
// copy of the text, so the caller's string may change or go away while it walks.

#ifndef VXMIGRATE_FOUNDATION_STRING_TOKENIZER_H_
#define VXMIGRATE_FOUNDATION_STRING_TOKENIZER_H_

#include <string>

#include "foundation/export.h"
#include "foundation/string/string_base.h"

class VXM_EXPORT vxBStringTokenizer {
 public:
  // The list separator of comma-separated lists: ",".
  static const char* const m_csvToken;
  // The blank: " ".
  static const char* const m_spToken;

  // Each character of delimiters separates. With keepEmpty true (what the library passes) every
  // piece between two delimiters is handed out, empty ones included, so fields keep their places
  // ("a,,b" gives a, "", b); with false, runs of delimiters give no empty pieces. An empty text
  // gives no piece at all either way.
  vxBStringTokenizer(const vxStringBase& text, const char* delimiters, bool keepEmpty = true);
  // Default delimiters: blank, tab, carriage return and line feed; empty pieces are skipped.
  explicit vxBStringTokenizer(const vxStringBase& text);

  vxBStringTokenizer(const vxBStringTokenizer&) = delete;
  vxBStringTokenizer& operator=(const vxBStringTokenizer&) = delete;

  // Non-zero with the next piece in piece while pieces remain; 0 (piece emptied) at the end.
  int GetNext(vxStringBase& piece);

 private:
  std::string text_;
  std::string delimiters_;
  bool keepEmpty_;
  size_t position_ = 0;
  bool done_ = false;
};

#endif  // VXMIGRATE_FOUNDATION_STRING_TOKENIZER_H_
