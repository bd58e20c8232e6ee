// The report templates the Halden edition installs itself. The template conversion leaves them
// behind: the OBX edition brings its own standard template.

#ifndef VXMIGRATE_EDITION_STANDARD_TEMPLATES_H_
#define VXMIGRATE_EDITION_STANDARD_TEMPLATES_H_

// The standard template file names ("CompleteSummary_htm.mss", ...): 16 report families, each in
// the four output forms "_doc.mss", "_htm.mss", "_txt.mss" and "_xls.mss". The list ends at its
// first empty entry.
extern const char* const kHaldenStandardTemplates[];

// 1 when name (a bare file name) is one of the standard templates, ignoring ASCII case.
int IsHaldenStandardTemplate(const char* name);

#endif  // VXMIGRATE_EDITION_STANDARD_TEMPLATES_H_
