// Converts an arbitrary report template of the Halden edition: the input is the template
// ("Fuzz.mss"), then, after a form feed, the OBX standard template it is converted into (the
// shipped sample's without one). The old template is only read; a conversion into the shipped
// standard template keeps its sections in order (objects are switched, never removed); and a
// converted template is never replaced by a second run.

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "edition/halden_to_obx.h"
#include "foundation/inifile/ini_file.h"
#include "fuzz/scratch.h"

namespace {

const std::string& ShippedStandardTemplate() {
  static const std::string text = [] {
    std::string read;
    vxfuzz::Check(vxfuzz::ReadFile(VXM_SOURCE_DIR "/samples/obx/vxm_vxx/CompleteSummary.wct", &read),
                  "the shipped standard template can be read");
    return read;
  }();
  return text;
}

std::vector<vxStringBase> SectionNames(const std::string& path) {
  vxMappedINIFile file(path.c_str());
  return file.Open(0) == 0 ? file.GetSectionNames() : std::vector<vxStringBase>{};
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view input = vxfuzz::AsText(data, size);
  const std::vector<std::string_view> files = vxfuzz::SplitInput(input, 2);
  const bool shipped = input.find('\f') == std::string_view::npos;
  vxfuzz::ScratchRun run({"-P1:halsuite", "-P2:obx", "-V1:5.5", "-V2:3.0"});
  vxfuzz::WriteFile(run.Src("vxm_log/datfiles/Fuzz.mss"), files[0]);
  const std::string standard = run.Dst("vxm_vxx/CompleteSummary.wct");
  vxfuzz::WriteFile(standard, shipped ? std::string_view(ShippedStandardTemplate()) : files[1]);

  vxfuzz::Check(HaldenToOBXHelper(&run.manager()).DoHaldenToOBXTemplateFileMigrate() == 0,
                "the conversion returns 0");
  std::string source;
  vxfuzz::Check(vxfuzz::ReadFile(run.Src("vxm_log/datfiles/Fuzz.mss"), &source) &&
                    source == files[0],
                "the old template is never changed");
  const std::string target = run.Dst("vxm_vxx/Fuzz_vxmigrate.wct");
  std::string converted;
  if (!vxfuzz::ReadFile(target, &converted)) return 0;

  if (shipped) {
    const std::vector<vxStringBase> before = SectionNames(standard);
    const std::vector<vxStringBase> after = SectionNames(target);
    vxfuzz::Check(after.size() >= before.size() &&
                      std::equal(before.begin(), before.end(), after.begin()),
                  "the converted template keeps the standard template's sections");
  }
  HaldenToOBXHelper(&run.manager()).DoHaldenToOBXTemplateFileMigrate();
  std::string again;
  vxfuzz::Check(vxfuzz::ReadFile(target, &again) && again == converted,
                "a converted template is never replaced");
  return 0;
}
