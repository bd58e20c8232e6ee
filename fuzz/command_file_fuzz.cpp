// Reads arbitrary bytes as the command file "migcmd.ini" of a run started with "-cmd:<folder>"
// alone. The run must take its folders, products and versions from the file's "main" section and
// be valid exactly when the file names a known destination product. The run writes its log into
// the destination it is given, so a destination other than a plain name (resolved inside the
// scratch folder) is not started.

#include <unistd.h>

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "foundation/inifile/ini_file.h"
#include "fuzz/scratch.h"
#include "migrate/manager.h"

namespace {

// A name that stays inside the current folder, so that the run writes nowhere else.
bool IsPlainName(const vxStringBase& name) {
  const std::string text = name.str();
  return !text.empty() && text != ".." && text.find_first_of("/\\") == std::string::npos;
}

// Relative folders of the file resolve in an empty folder of the scratch folder.
void EnterWorkFolder() {
  static const bool entered = [] {
    vxfuzz::MakeFolder(vxfuzz::ScratchPath("work"));
    return chdir(vxfuzz::ScratchPath("work").c_str()) == 0;
  }();
  vxfuzz::Check(entered, "the work folder can be entered");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  EnterWorkFolder();
  const std::string folder = vxfuzz::ScratchPath("cmd");
  vxfuzz::WriteFile(folder + "/migcmd.ini", vxfuzz::AsText(data, size));

  vxMappedINIFile file((folder + "/migcmd.ini").c_str());
  if (file.Open(0) != 0 || !IsPlainName(file.GetVal("main", "D2"))) return 0;

  std::vector<std::string> arguments = {vxfuzz::ScratchPath("bin/vxmigrate"), "-cmd:" + folder};
  std::vector<char*> argv = {&arguments[0][0], &arguments[1][0], nullptr};
  {
    vxMigrationManager run(2, argv.data(), vxStringBase(arguments[0].c_str()));
    const bool known = vxMigrationManager::GetProductID(file.GetVal("main", "P2").c_str()) > 0;
    vxfuzz::Check(run.IsValid() == known, "valid exactly when the destination product is known");
    if (run.IsValid()) {
      vxfuzz::Check(run.GetSourceDirectory() == file.GetVal("main", "D1") &&
                        run.GetDestinationDirectory() == file.GetVal("main", "D2") &&
                        run.GetSourceVersion() == file.GetVal("main", "V1") &&
                        run.GetDestinationVersion() == file.GetVal("main", "V2") &&
                        run.GetSourceProduct() == file.GetVal("main", "P1"),
                    "the run takes its values from the file");
    }
  }
  vxfuzz::EmptyFolder(vxfuzz::ScratchPath("work"));
  return 0;
}
