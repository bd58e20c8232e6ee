// Static folder and file operations: listings, path joins, copies, deletes. Listings are sorted
// bytewise so two runs over the same tree do the same thing; the recursive folder listing never
// follows a symbolic link to a folder. A copy never leaves a partial destination file and replaces
// an existing one only when asked to.

#ifndef VXMIGRATE_FOUNDATION_FILES_FILE_MANAGER_H_
#define VXMIGRATE_FOUNDATION_FILES_FILE_MANAGER_H_

#include <vector>

#include "foundation/export.h"
#include "foundation/files/file_info.h"
#include "foundation/files/filename.h"
#include "foundation/string/string_base.h"

class VXM_EXPORT vxFileManager {
 public:
  // The platform's path separator.
  static const char m_slash;

  // Fills list with the files of folder (not descending) whose names match pattern (shell
  // wildcards; "*" and "*.*" match every name; "" matches every name), sorted bytewise. Folders are
  // never listed. followLinks 1: a symbolic link to a file is listed with the attributes of the
  // file it points to, and dangling links are left out; 0: links are listed as links. A missing
  // folder gives an empty list. Returns the number of entries added.
  static int GetFileList(const vxStringBase& folder, const char* pattern, vxFileInfoList& list,
                         unsigned int followLinks);
  // Fills list with the sub-folders of folder whose names match pattern ("" matches all), sorted.
  // recursive 1: every folder below, as paths relative to folder ("a", "a/b", "c"), depth first;
  // 0: the direct sub-folders' names. listLinkedFolders 1 also lists symbolic links to folders (as
  // entries, never descended into); 0 leaves them out. Returns the number of entries added.
  static int GetFolderList(const vxStringBase& folder, const char* pattern,
                           std::vector<vxStringBase>& list, unsigned int recursive,
                           unsigned int listLinkedFolders);

  // Joins folder and name with one separator. Backslashes in name become '/'. isFile 1 gives a
  // file path; 0 a folder path ending in a separator. Empty parts are left out; an empty result
  // stays empty.
  static void MakePath(vxStringBase& result, const vxStringBase& folder, const vxStringBase& name,
                       unsigned int isFile);
  // Joins folder, sub-folder (NullStr for none) and name, each join with one separator.
  static void MakePath(vxStringBase& result, const vxStringBase& folder,
                       const vxStringBase& subFolder, const vxStringBase& name);

  // Copies from to to and returns 0 on success, 1 on any failure.
  //  tree:      0 copies one file to a file path. 1: from is a folder (its whole tree is copied into
  //             the folder to) or a pattern "folder/*.ext" (the matching files of that folder, not
  //             descending, are copied into the folder to).
  //  replace:   1 allows replacing an existing destination file; 0 leaves it untouched.
  //  newerOnly: with replace 1, replaces an existing destination only when the source is newer.
  //  reserved1, reserved2, text1, text2: unused; callers pass 0 and null.
  // Missing destination folders are created. Each file is written to a temporary name in its
  // destination folder and renamed into place, keeping the source's mode and times; the kernel's
  // copy_file_range is used where it works. Symbolic links are copied as links, never followed.
  [[nodiscard]] static int CopyFile(const vxStringBase& from, const vxStringBase& to, unsigned int tree,
                      unsigned int replace, unsigned int newerOnly, unsigned int reserved1,
                      unsigned int reserved2, const char* text1, const char* text2);
  [[nodiscard]] static int CopyFile(const vxFilename& from, const vxFilename& to, unsigned int tree,
                      unsigned int replace, unsigned int newerOnly, unsigned int reserved1,
                      unsigned int reserved2, const char* text1, const char* text2);

  // Removes a file. 0 on success; with missingIsSuccess 1 a file that is not there also gives 0.
  [[nodiscard]] static int DeleteFile(const vxStringBase& path, unsigned int missingIsSuccess);
  // Creates the folder and any missing parents (mode 0777 less the umask). 0 when it exists
  // afterwards. attributes is unused (callers pass null).
  [[nodiscard]] static int CreateDirectory(const vxStringBase& path, const void* attributes);
  // The process's current folder (empty when it cannot be read).
  static void GetCurrentDirectory(vxStringBase& result);
  // The running program's real file as the kernel reports it (empty when it cannot be read).
  static void GetModulePath(vxStringBase& result);
  // The folder of the running program, ending in a separator (empty when unknown).
  static void GetModuleDirectory(vxStringBase& result);
  // True when something (file, folder, link) is at path.
  static bool Exists(const vxStringBase& path);
};

#endif  // VXMIGRATE_FOUNDATION_FILES_FILE_MANAGER_H_
