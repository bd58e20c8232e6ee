// The migration's command line: "-D1:folder -D2:folder -P1:product -P2:product -V1:version
// -V2:version" and the optional "-FT", "-cmd", "-PFLog", "-PFProxy", "-PFStream", "-PFLink",
// "-PFAlert". Validate accepts a run whose six values are present and whose destination product is
// known; it writes nothing.

#ifndef VXMIGRATE_MIGRATE_CMDLINE_PARSER_H_
#define VXMIGRATE_MIGRATE_CMDLINE_PARSER_H_

#include "foundation/export.h"
#include "foundation/files/command_line.h"

class VXM_EXPORT MigrationCmdLineParser : public vxCommandLineParser {
 public:
  MigrationCmdLineParser(int argc, char** argv);
  ~MigrationCmdLineParser() override;

  int Validate() override;
};

#endif  // VXMIGRATE_MIGRATE_CMDLINE_PARSER_H_
