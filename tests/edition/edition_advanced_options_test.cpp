// Dynamic-page query profiles converted into the layout of the destination's OBX version.

#include <string>
#include <vector>

#include "edition/halden_to_obx.h"
#include "tests/edition/edition_fixture.h"

namespace {

using vxtest::EditionRun;
using vxtest::ReadFile;
using vxtest::WriteFile;

const char kSource[] = "/vxm_log/datfiles/dynamicpages/default.ini";
const char kDestination[] = "/vxm_vxx/datfiles/dynamicpages/default.ini";

TEST(EditionAdvancedOptions, OldLayoutAddsOnlyUnknownProfiles) {
  EditionRun run("2.5", {}, "halsuite", false);
  WriteFile(run.src() + kSource,
            "[Default]\nQueryProfileCount=4\n\n"
            "[QueryProfile0]\nProfileID=11\nQualification0URL=/product.asp\nParameter0=id\n"
            "MapFile0=products.map\n\n"
            "[QueryProfile1]\nProfileID=5\nQualification1URL=/old.asp\n\n"
            "[QueryProfile3]\nProfileID=12\nQualification3URL=/search.asp\nParameter0=q\n");
  WriteFile(run.dst() + kDestination,
            "[Default]\nQueryProfileCount=3\n\n[QueryProfile0]\nProfileID=4\n\n"
            "[QueryProfile1]\nProfileID=5\n\n[QueryProfile2]\nProfileID=6\n");
  EXPECT_EQ(HaldenToOBXHelper(run.manager()).DoMergeAdvancedOptionsFiles(), 0);
  EXPECT_EQ(ReadFile(run.dst() + kDestination),
            "[Default]\nQueryProfileCount=5\n\n[QueryProfile0]\nProfileID=4\n\n"
            "[QueryProfile1]\nProfileID=5\n\n[QueryProfile2]\nProfileID=6\n"
            "[QueryProfile3]\nProfileID=11\nQualification0URL=/product.asp\nParameter0=id\n"
            "MapFile0=products.map\nPage=/product.asp\nParameter=id\nMapFile=products.map\n"
            "[QueryProfile4]\nProfileID=12\nQualification3URL=/search.asp\nParameter0=q\n"
            "Page=/search.asp\nParameter=q\nMapFile=\n");
  const std::string migrated =
      "Advanced option file migrated: \\vxm_log\\datfiles\\dynamicpages\\default.ini";
  EXPECT_EQ(run.NewLog(), (std::vector<std::string>{migrated, migrated}));
}

TEST(EditionAdvancedOptions, NewLayoutFillsTheFirstQualification) {
  EditionRun run("3.0", {}, "halsuite", false);
  WriteFile(run.dst() + kDestination,
            "[default]\nqueryprofilecount=3\n\n[queryprofile0]\nprofileid=1\nqualification0url=\n"
            "qualification4url=/only4.asp\n\n[queryprofile1]\nprofileid=2\n\n"
            "[queryprofile2]\nprofileid=3\nqualification0url=/kept.asp\nqualification1url=/x\n");
  EXPECT_EQ(HaldenToOBXHelper(run.manager()).DoMergeAdvancedOptionsFiles(), 0);
  EXPECT_EQ(ReadFile(run.dst() + kDestination),
            "[default]\nqueryprofilecount=3\n\n[queryprofile0]\nprofileid=1\n"
            "qualification0url=/only4.asp\nqualification4url=/only4.asp\n\n"
            "[queryprofile1]\nprofileid=2\n\n"
            "[queryprofile2]\nprofileid=3\nqualification0url=/kept.asp\nqualification1url=/x\n");
  EXPECT_EQ(run.NewLog(), std::vector<std::string>{"Advanced option file migrated: " + run.dst() +
                                                   kDestination});
}

// Without a destination file (or, for the old layout, a Halden file) nothing is written.
TEST(EditionAdvancedOptions, UnopenableDynamicPagesGiveOne) {
  for (const char* version : {"2.0", "3.0"}) {
    EditionRun run(version, {}, "halsuite", false);
    EXPECT_EQ(HaldenToOBXHelper(run.manager()).DoMergeAdvancedOptionsFiles(), 1) << version;
    WriteFile(run.src() + kSource,
              "[Default]\nQueryProfileCount=1\n\n[QueryProfile0]\nProfileID=1\n");
    EXPECT_EQ(HaldenToOBXHelper(run.manager()).DoMergeAdvancedOptionsFiles(), 1) << version;
    EXPECT_EQ(vxtest::ListTree(run.dst()), std::vector<std::string>{"vxmigrate.log"});
  }
}

}  // namespace
