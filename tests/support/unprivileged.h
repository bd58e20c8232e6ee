// Running part of a test as an ordinary user. CI runs as root, who reads and writes every file, so
// a test of an unreadable or read-only file forks, hands its folders to "nobody" and drops to that
// user in the child instead of skipping.

#ifndef VXMIGRATE_TESTS_SUPPORT_UNPRIVILEGED_H_
#define VXMIGRATE_TESTS_SUPPORT_UNPRIVILEGED_H_

#include <functional>
#include <string>
#include <vector>

namespace vxtest {

// Runs body in a child process as an unprivileged user (uid and gid 65534 when started as root,
// the caller's own user otherwise), after giving that user every entry below each of folders.
// True when the child ran body without a test failure. Expectations inside body print as usual.
bool AsUnprivilegedUser(const std::vector<std::string>& folders, const std::function<void()>& body);

}  // namespace vxtest

#endif  // VXMIGRATE_TESTS_SUPPORT_UNPRIVILEGED_H_
