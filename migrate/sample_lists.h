// The sample files each product edition installs itself. Migrations leave them behind: the new
// installation brings its own copies.

#ifndef VXMIGRATE_MIGRATE_SAMPLE_LISTS_H_
#define VXMIGRATE_MIGRATE_SAMPLE_LISTS_H_

#include "foundation/export.h"

// The comma-separated names (no blanks) of the samples of one kind that a product installs, as an
// exclusion list of bare file names. product is a product id text ("halsuite", "obx", ...), kind a
// profile or file type ("wlp" log-analysis profiles, "prx" proxy profiles, "slp" streaming
// profiles, "llp" link profiles, "alp" alert profiles, "arp" auto-report profiles, "mss" report
// templates, "wct" server report templates). Both are matched ignoring case. "" when the product
// ships none of that kind.
VXM_EXPORT const char* GetSampleFileList(const char* product, const char* kind);

#endif  // VXMIGRATE_MIGRATE_SAMPLE_LISTS_H_
