// Builds a real manager over fresh source and destination folders for the driver's tests.

#ifndef VXMIGRATE_TESTS_MIGRATE_DRIVER_FIXTURE_H_
#define VXMIGRATE_TESTS_MIGRATE_DRIVER_FIXTURE_H_

#include <memory>
#include <string>
#include <vector>

#include "migrate/manager.h"
#include "support/test_files.h"

namespace vxtest {

// A manager over args, whose executable (plug-ins, "vxmigrate.ini") is args[0].
inline std::unique_ptr<vxMigrationManager> MakeManager(std::vector<std::string> args) {
  std::vector<char*> argv;
  for (std::string& arg : args) argv.push_back(&arg[0]);
  argv.push_back(nullptr);
  return std::make_unique<vxMigrationManager>(static_cast<int>(args.size()), argv.data(),
                                              vxStringBase(args[0].c_str()));
}

// A manager for products p1 -> p2, versions v1 -> v2, whose executable is "<root>/bin/vxmigrate".
inline std::unique_ptr<vxMigrationManager> MakeRun(const TempDir& root, const std::string& p1,
                                                   const std::string& p2, const std::string& v1,
                                                   const std::string& v2) {
  for (const char* folder : {"src", "dst", "bin"}) MakeDirs(root.Path(folder));
  return MakeManager({root.Path("bin/vxmigrate"), "-D1:" + root.Path("src"),
                      "-D2:" + root.Path("dst"), "-P1:" + p1, "-P2:" + p2, "-V1:" + v1,
                      "-V2:" + v2});
}

}  // namespace vxtest

#endif  // VXMIGRATE_TESTS_MIGRATE_DRIVER_FIXTURE_H_
