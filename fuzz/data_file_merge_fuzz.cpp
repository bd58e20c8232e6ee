// Merges arbitrary comma-separated data files: the input is the old installation's "vxintra.txt",
// a form feed, then the new one's (none without a form feed). The old file is only read, and a
// second merge of the same old file adds nothing: every record the first one took in is matched.
// That holds for records without white space at either end only: the rule strips the text's ends
// before each record it adds, so a record added with a trailing blank can lose it and be added
// again by a second run (docs/DESIGN.md, "Data files").

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "fuzz/scratch.h"

namespace {

bool IsWhite(char c) { return c == ' ' || c == '\t' || c == '\r' || c == '\n'; }

// True when no record the merge reads (the lines up to the first empty one) starts or ends with
// white space once its carriage return is dropped.
bool RecordsHaveSolidEdges(std::string_view source) {
  while (!source.empty()) {
    const std::size_t end = source.find('\n');
    std::string_view record = source.substr(0, end);
    if (!record.empty() && record.back() == '\r') record.remove_suffix(1);
    if (record.empty()) return true;
    if (IsWhite(record.front()) || IsWhite(record.back())) return false;
    if (end == std::string_view::npos) return true;
    source.remove_prefix(end + 1);
  }
  return true;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view input = vxfuzz::AsText(data, size);
  const std::vector<std::string_view> files = vxfuzz::SplitInput(input, 2);
  vxfuzz::ScratchRun run({"-P1:halsuite", "-P2:halsuite", "-V1:5.5", "-V2:6.5"});
  vxfuzz::WriteFile(run.Src("vxintra.txt"), files[0]);
  if (input.find('\f') != std::string_view::npos) {
    vxfuzz::WriteFile(run.Dst("vxintra.txt"), files[1]);
  }

  const int result = run.manager().DoMergeCSVFile("vxintra.txt", "vxintra.txt");
  vxfuzz::Check(result == 0 || result == 1, "the merge returns 0 or 1");
  std::string source;
  vxfuzz::Check(vxfuzz::ReadFile(run.Src("vxintra.txt"), &source) && source == files[0],
                "the old installation is never changed");
  std::string merged;
  if (result != 0 || !RecordsHaveSolidEdges(files[0]) ||
      !vxfuzz::ReadFile(run.Dst("vxintra.txt"), &merged)) {
    return 0;
  }

  run.manager().DoMergeCSVFile("vxintra.txt", "vxintra.txt");
  std::string again;
  vxfuzz::Check(vxfuzz::ReadFile(run.Dst("vxintra.txt"), &again) && again == merged,
                "a second merge of the same file adds nothing");
  return 0;
}
