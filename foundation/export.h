// What libvxmigrate.so exports. The library is built with hidden visibility: only classes and
// functions marked VXM_EXPORT (the interface the host and plug-ins call) are visible to other
// modules; everything else may change without breaking an installed plug-in.

#ifndef VXMIGRATE_FOUNDATION_EXPORT_H_
#define VXMIGRATE_FOUNDATION_EXPORT_H_

#define VXM_EXPORT __attribute__((visibility("default")))

#endif  // VXMIGRATE_FOUNDATION_EXPORT_H_
