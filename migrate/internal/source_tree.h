// The walk over the source installation shared by the whole-tree copy and the whole-tree INI merge:
// every folder below the source folder first (links to folders are neither listed nor followed),
// the top folder last, so that its files are handled after all of its subfolders' files.

#ifndef VXMIGRATE_MIGRATE_INTERNAL_SOURCE_TREE_H_
#define VXMIGRATE_MIGRATE_INTERNAL_SOURCE_TREE_H_

#include <vector>

#include "foundation/files/file_info.h"
#include "foundation/string/string_base.h"
#include "foundation/string/tokenizer.h"

class vxMigrationManager;

// The folders of the walk, relative to the source folder; the last entry is the separator alone,
// which stands for the source folder itself.
std::vector<vxStringBase> vxListSourceFolders(vxMigrationManager& manager);

// Lists the files of one folder of the walk that match pattern, links as links, sorted. False when
// the folder is to be skipped: its path is empty, or it cannot be read (then one error line is
// logged). folderPath receives the folder's full path.
bool vxListSourceFiles(vxMigrationManager& manager, const vxStringBase& folder, const char* pattern,
                       vxStringBase& folderPath, vxFileInfoList& files);

// The next non-empty piece of a list of types or names, blanks around it dropped: "ini, dat,"
// names ini and dat. False at the end of the list.
bool vxNextListItem(vxBStringTokenizer& tokens, vxStringBase& item);

// The log line of a file that could not be copied; shared so every copy reports it alike.
extern const char vxMsgUnableToCopyFile[];

#endif  // VXMIGRATE_MIGRATE_INTERNAL_SOURCE_TREE_H_
