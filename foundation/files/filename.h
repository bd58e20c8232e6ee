// A path and its parts. Both '/' and '\\' separate folders when a path is examined; the text is
// kept as given.

#ifndef VXMIGRATE_FOUNDATION_FILES_FILENAME_H_
#define VXMIGRATE_FOUNDATION_FILES_FILENAME_H_

#include "foundation/export.h"
#include "foundation/string/string_base.h"

class VXM_EXPORT vxFilename {
 public:
  vxFilename();
  explicit vxFilename(const char* path);  // null gives an empty path
  explicit vxFilename(const vxStringBase& path);
  vxFilename(const vxFilename& other);
  vxFilename& operator=(const vxFilename& other);
  virtual ~vxFilename();

  // The full path text.
  const vxStringBase& Pathname() const { return path_; }
  // The name part: everything after the last separator ("a/b.ini" -> "b.ini").
  vxStringBase Filename() const;
  // The folder part with its closing separator ("a/b.ini" -> "a/"); empty for a bare name.
  vxStringBase Directory() const;
  // The name without its extension ("b.tar.gz" -> "b.tar"; ".profile" -> ".profile").
  vxStringBase BaseName() const;
  // The extension without its dot ("b.ini" -> "ini"); empty when the name has none.
  vxStringBase Extension() const;
  // Replaces (or adds) the extension of the name part; ext is given without its dot.
  void SetExtension(const char* ext);

  // Non-zero when path is an existing folder (a link to a folder counts).
  static int IsDirectory(const char* path);
  // Duplicates length bytes of source (-1: all of it) into a new buffer that the caller frees with
  // free(). *target is null when source is null or memory ran out. Returns 0 on success.
  static int Dup(char** target, const char* source, int length);

 private:
  vxStringBase path_;
};

#endif  // VXMIGRATE_FOUNDATION_FILES_FILENAME_H_
