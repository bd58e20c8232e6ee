// Merges arbitrary search-engine lists: the input is the old installation's "keywords.ini", a
// form feed, then the new one's. The old file is only read, and the new installation keeps every
// engine it listed under its own number.

#include <cstddef>
#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include "foundation/inifile/ini_file.h"
#include "fuzz/scratch.h"

namespace {

const char kEngines[] = "SearchEngines";

// Each engine key of the file with the value a lookup gives it.
std::vector<std::pair<vxStringBase, vxStringBase>> Engines(const std::string& path) {
  std::vector<std::pair<vxStringBase, vxStringBase>> engines;
  vxMappedINIFile file(path.c_str());
  if (file.Open(0) != 0) return engines;
  const INILineList* lines = file.GetPropertyList(kEngines);
  if (lines == nullptr) return engines;
  for (const INILine* line : *lines) {
    engines.emplace_back(line->m_key, file.GetVal(kEngines, line->m_key));
  }
  return engines;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::vector<std::string_view> files = vxfuzz::SplitInput(vxfuzz::AsText(data, size), 2);
  vxfuzz::ScratchRun run({"-P1:halsuite", "-P2:halsuite", "-V1:5.5", "-V2:6.5"});
  vxfuzz::WriteFile(run.Src("keywords.ini"), files[0]);
  vxfuzz::WriteFile(run.Dst("keywords.ini"), files[1]);
  const auto before = Engines(run.Dst("keywords.ini"));

  const int result = run.manager().DoKeywordINIMerge();
  vxfuzz::Check(result == 0 || result == 1, "the merge returns 0 or 1");
  std::string source;
  vxfuzz::Check(vxfuzz::ReadFile(run.Src("keywords.ini"), &source) && source == files[0],
                "the old installation is never changed");
  if (result != 0) return 0;
  vxMappedINIFile merged(run.Dst("keywords.ini").c_str());
  vxfuzz::Check(merged.Open(0) == 0, "the merged file reads back");
  for (const auto& [key, value] : before) {
    vxfuzz::Check(merged.GetVal(kEngines, key) == value,
                  "the new installation keeps its engines under their numbers");
  }
  return 0;
}
