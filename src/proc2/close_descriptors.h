// Closes the descriptors a freshly forked child must not carry into the program it executes.
// Meant for the time between fork and exec: it allocates nothing and calls only system calls.

#ifndef VXMIGRATE_SRC_PROC2_CLOSE_DESCRIPTORS_H_
#define VXMIGRATE_SRC_PROC2_CLOSE_DESCRIPTORS_H_

namespace vxproc2 {

// The descriptor limit to fall back on; call it before the fork (sysconf is not signal-safe).
long DescriptorLimit();

// Closes every descriptor from 3 up: with close_range when the kernel has it, else those listed
// in /proc/self/fd, else every number below limit.
void CloseDescriptorsFrom3(long limit);

}  // namespace vxproc2

#endif  // VXMIGRATE_SRC_PROC2_CLOSE_DESCRIPTORS_H_
