// Converts an arbitrary profile "fuzz.wlp" the way each product pair does: the input's first byte
// chooses the Halden-to-OBX edition conversion ('0'), the log product's upgrade ('1') or the OBX
// upgrade ('2'), modulo three; the rest of the first line is ignored and the profile follows. The
// old profile is only read, and a second run leaves the converted copy as the first left it (the
// log product rewrites its installed profiles in place, so that copy is converted twice).

#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>
#include <vector>

#include "edition/halden_to_obx.h"
#include "fuzz/scratch.h"

namespace {

struct Conversion {
  std::vector<std::string> options;
  const char* profile;  // the old profile, relative to the source
  const char* copy;     // the converted copy, relative to the destination
  const char* settings; // the server settings both installations hold ("" none)
  std::function<int(vxMigrationManager&)> run;
};

const Conversion& ConversionOf(std::uint8_t selector) {
  static const Conversion kConversions[] = {
      {{"-P1:halsuite", "-P2:obx", "-V1:5.5", "-V2:3.0", "-PFLog:fuzz.wlp"},
       "vxm_log/datfiles/fuzz.wlp", "vxm_vxx/datfiles/profiles/fuzz_vxmigrate.wlp",
       "[defaults]\nprofilesdir=vxm_vxx/datfiles/profiles\n",
       [](vxMigrationManager& m) { return HaldenToOBXHelper(&m).DoHaldenToOBXProfileFileMigrate(); }},
      {{"-P1:log", "-P2:log", "-V1:6.0", "-V2:6.5", "-PFLog:fuzz.wlp"},
       "p/fuzz.wlp", "p/fuzz_vxmigrate.wlp", "",
       [](vxMigrationManager& m) { return m.DoCopyLogProfiles("p", "*.wlp", "wlp", ""); }},
      {{"-P1:obx", "-P2:obx", "-V1:2.5", "-V2:3.0", "-PFLog:fuzz.wlp"},
       "vxm_vxx/datfiles/profiles/fuzz.wlp", "vxm_vxx/datfiles/profiles/fuzz_vxmigrate.wlp",
       "[defaults]\nprofilesdir=\n",
       [](vxMigrationManager& m) { return m.DoCopyOBXProfiles(); }},
  };
  return kConversions[selector % 3];
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size == 0) return 0;
  std::string_view profile = vxfuzz::AsText(data, size);
  const Conversion& conversion = ConversionOf(data[0]);
  const std::size_t lineEnd = profile.find('\n');
  profile.remove_prefix(lineEnd == std::string_view::npos ? profile.size() : lineEnd + 1);

  vxfuzz::ScratchRun run(conversion.options);
  vxfuzz::WriteFile(run.Src(conversion.profile), profile);
  if (*conversion.settings != '\0') {
    vxfuzz::WriteFile(run.Src("vxm_vxx/vxm_vxx.ini"), conversion.settings);
    vxfuzz::WriteFile(run.Dst("vxm_vxx/vxm_vxx.ini"), conversion.settings);
    vxfuzz::MakeFolder(run.Dst("vxm_vxx/datfiles/profiles"));
  }

  const int result = conversion.run(run.manager());
  vxfuzz::Check(result == 0 || result == 1, "the conversion returns 0 or 1");
  std::string source;
  vxfuzz::Check(vxfuzz::ReadFile(run.Src(conversion.profile), &source) && source == profile,
                "the old profile is never changed");
  std::string copy;
  if (!vxfuzz::ReadFile(run.Dst(conversion.copy), &copy)) return 0;
  conversion.run(run.manager());
  std::string again;
  vxfuzz::Check(vxfuzz::ReadFile(run.Dst(conversion.copy), &again) && again == copy,
                "a second run leaves the converted profile as it was");
  return 0;
}
