// The host's --help and --version texts.

#include "host/usage.h"

const char kHostUsage[] =
    "Usage: vxmigrate -D1:<source folder> -D2:<destination folder>\n"
    "                 -P1:<source product> -P2:<destination product>\n"
    "                 -V1:<source version> -V2:<destination version>\n"
    "                 [-FT:Y|N] [-cmd:<command file or its folder>]\n"
    "                 [-PFLog:<profiles>] [-PFProxy:<profiles>] [-PFStream:<profiles>]\n"
    "                 [-PFLink:<profiles>] [-PFAlert:<profiles>] [-q | -v]\n"
    "       vxmigrate --help | -h | --version\n"
    "\n"
    "Carries the settings of one installation (the source) into another (the destination).\n"
    "\n"
    "  -D1, -D2     source and destination installation folders\n"
    "  -P1, -P2     source and destination product ids (for example halsuite, obx)\n"
    "  -V1, -V2     source and destination versions, dotted numbers (for example 5.5, 3.0)\n"
    "  -FT          Y (default) copies profile data folders with their profiles; N does not\n"
    "  -cmd         command file \"migcmd.ini\", or the folder holding it; read when the\n"
    "               command line is incomplete (default: the folder of vxmigrate)\n"
    "  -PFLog, -PFProxy, -PFStream, -PFLink, -PFAlert\n"
    "               comma-separated profile file names to migrate (default: all)\n"
    "  -q           quiet: print only errors\n"
    "  -v           verbose: also print every log entry\n"
    "  -h, --help   print this text and exit\n"
    "  --version    print the version and exit\n"
    "\n"
    "Errors and notices that need manual action are printed as they are logged; a summary\n"
    "follows. The full log is vxmigrate.log in the destination folder.\n"
    "\n"
    "Exit status:\n"
    "  0  a plug-in ran and no step reported an error\n"
    "  1  the run was refused by its checks (folders, products, versions, servers, log)\n"
    "  2  usage error: unknown option or unusable value; nothing was written\n"
    "  3  no plug-in served the products and versions\n"
    "  4  the plug-in ran and some steps reported errors\n"
    "  5  another run holds the destination\n";

const char kHostVersion[] = "vxmigrate " VXM_VERSION "\n";

const char kHostHint[] = "Try 'vxmigrate --help' for the options.\n";
