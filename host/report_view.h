// The run's report ("vxmigrate-report.json") as a person reads it: the conflicts first, grouped by
// file (keys both installations held with different values, where the destination's value was
// kept), then the files by action, the notices, the errors and the counts.

#ifndef VXMIGRATE_HOST_REPORT_VIEW_H_
#define VXMIGRATE_HOST_REPORT_VIEW_H_

#include <cstdio>
#include <string>

enum class ReportParts { kWhole, kSummaryAndConflicts };

// Prints the report held in text; false (nothing printed) when it is not a report we can read.
bool PrintReport(const std::string& text, ReportParts parts, FILE* out);

#endif  // VXMIGRATE_HOST_REPORT_VIEW_H_
