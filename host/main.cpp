// The vxmigrate host: builds the migration manager from its command line and runs the migration.
// An incomplete command line (and no usable "migcmd.ini") prints the usage text and exits 1 without
// writing a log; otherwise the exit status is the run's result.

#include <cstdio>

#include "migrate/manager.h"

namespace {

const char kUsage[] =
    "Usage: vxmigrate -D1:<source folder> -D2:<destination folder>\n"
    "                 -P1:<source product> -P2:<destination product>\n"
    "                 -V1:<source version> -V2:<destination version>\n"
    "                 [-FT:Y|N] [-cmd:<command file or its folder>]\n"
    "                 [-PFLog:<profiles>] [-PFProxy:<profiles>] [-PFStream:<profiles>]\n"
    "                 [-PFLink:<profiles>] [-PFAlert:<profiles>]\n"
    "\n"
    "  -D1, -D2     source and destination installation folders\n"
    "  -P1, -P2     source and destination product ids (for example pavsuite, obx)\n"
    "  -V1, -V2     source and destination versions (for example 5.5, 6.0)\n"
    "  -FT          Y (default) copies profile data folders with their profiles; N does not\n"
    "  -cmd         command file \"migcmd.ini\", or the folder holding it; read when the\n"
    "               command line is incomplete (default: the folder of vxmigrate)\n"
    "  -PFLog, -PFProxy, -PFStream, -PFLink, -PFAlert\n"
    "               comma-separated profile file names to migrate (default: all)\n";

}  // namespace

int main(int argc, char** argv) {
  vxMigrationManager manager(argc, argv);
  if (!manager.IsValid()) {
    fputs(kUsage, stderr);
    return 1;
  }
  if (manager.IsDestinationBusy()) {
    fprintf(stderr,
            "vxmigrate: another run is migrating into %s; nothing was written. Try again when it "
            "has finished.\n",
            manager.GetDestinationDirectory().c_str());
    return 5;
  }
  int result = manager.DoMigration();
  const vxLogFile* log = manager.GetLog();
  if (log->IsOpen()) {
    printf("VXMigrate log: %s\n", log->GetFilename().c_str());
  } else {
    // Typically a destination folder that does not exist: the log has nowhere to go.
    fprintf(stderr, "vxmigrate: cannot write the log %s\n", log->GetFilename().c_str());
  }
  return result;
}
