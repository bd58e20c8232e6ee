// What the fuzz targets that read files share: one scratch folder per process (removed at exit),
// files written into it and read back, inputs split into the parts a target needs, and a real
// migration run between two installations inside it. A failed property aborts the process, which
// is how a target reports a finding.

#ifndef VXMIGRATE_FUZZ_SCRATCH_H_
#define VXMIGRATE_FUZZ_SCRATCH_H_

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "migrate/manager.h"

namespace vxfuzz {

// The process's scratch folder, made on first use; every path below is inside it.
const std::string& Scratch();
std::string ScratchPath(const std::string& relative);

// Writes text to path, making missing folders. Aborts when it cannot: a target that cannot lay out
// its input tests nothing.
void WriteFile(const std::string& path, std::string_view text);
// The file's bytes, or false when it cannot be read.
bool ReadFile(const std::string& path, std::string* text);
// Removes path and everything below it; nothing when absent.
void RemoveTree(const std::string& path);
// Removes everything below the folder path, which stays.
void EmptyFolder(const std::string& path);
// Makes the folder and any missing folders above it.
void MakeFolder(const std::string& path);

// The fuzzer's bytes as text.
inline std::string_view AsText(const std::uint8_t* data, std::size_t size) {
  return std::string_view(reinterpret_cast<const char*>(data), size);
}
// The input cut at each form feed into at most parts pieces (the last keeps any further ones), so
// that one input can hold the two files a merge reads.
std::vector<std::string_view> SplitInput(std::string_view input, std::size_t parts);

// Stops the run with a message naming the property that failed.
[[noreturn]] void Fail(const char* property);
inline void Check(bool holds, const char* property) {
  if (!holds) Fail(property);
}

// A migration run from "src" into "dst" of the scratch folder with the options given (products,
// versions, selections). Each target run starts from empty installations; the run's log is
// removed with them.
class ScratchRun {
 public:
  explicit ScratchRun(const std::vector<std::string>& options);

  ScratchRun(const ScratchRun&) = delete;
  ScratchRun& operator=(const ScratchRun&) = delete;

  std::string Src(const std::string& relative) const;
  std::string Dst(const std::string& relative) const;
  // The run's manager, built on first use so that the files can be laid out first.
  vxMigrationManager& manager();

 private:
  std::vector<std::string> arguments_;
  std::unique_ptr<vxMigrationManager> manager_;
};

}  // namespace vxfuzz

#endif  // VXMIGRATE_FUZZ_SCRATCH_H_
