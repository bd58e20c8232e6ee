// The texts the host prints for --help and --version. The exit-status table here is the one the
// README and the manual page show; keep the three alike.

#ifndef VXMIGRATE_HOST_USAGE_H_
#define VXMIGRATE_HOST_USAGE_H_

// The whole --help text, ending in a line feed.
extern const char kHostUsage[];
// "vxmigrate <version>\n".
extern const char kHostVersion[];
// One line pointing to --help, after a usage error.
extern const char kHostHint[];

#endif  // VXMIGRATE_HOST_USAGE_H_
