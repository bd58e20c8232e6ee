// Reads arbitrary bytes as a settings file and writes them back: the model keeps every byte, so a
// file read and written as a new file is byte-identical to its input, and so is a copy into which
// the file itself was merged (it already holds every key). Every section listed is found again.

#include <cstddef>
#include <cstdint>
#include <string>

#include "foundation/inifile/ini_file.h"
#include "fuzz/scratch.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string input(vxfuzz::AsText(data, size));
  const std::string path = vxfuzz::ScratchPath("settings.ini");
  const std::string written = vxfuzz::ScratchPath("written.ini");
  vxfuzz::WriteFile(path, input);
  vxfuzz::RemoveTree(written);

  vxMappedINIFile file(path.c_str());
  const bool binary = input.find('\0') != std::string::npos;
  const int opened = file.Open(binary && size % 2 == 0 ? 0 : 1);
  if (opened != 0) {
    vxfuzz::Check(binary, "only a file holding a NUL byte is refused");
    return 0;
  }
  for (const vxStringBase& name : file.GetSectionNames()) {
    vxfuzz::Check(file.HasSection(name) && file.GetPropertyList(name) != nullptr,
                  "every section listed is found by its name");
  }

  std::string text;
  vxfuzz::Check(file.CreateAs(vxStringBase(written.c_str())) == 0, "a read file can be written");
  vxfuzz::Check(vxfuzz::ReadFile(written, &text) && text == input,
                "a file read and written is byte-identical");

  vxMappedINIFile merged(written.c_str());
  merged.CopyFrom(file);
  merged.MergeFrom(file);
  vxfuzz::RemoveTree(written);
  vxfuzz::Check(merged.CreateAs(vxStringBase(written.c_str())) == 0, "a merged copy can be written");
  vxfuzz::Check(vxfuzz::ReadFile(written, &text) && text == input,
                "merging a file into its own copy changes nothing");
  vxfuzz::Check(file.Close(0) == 0, "closing without saving writes nothing and succeeds");
  return 0;
}
