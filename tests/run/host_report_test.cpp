// What the host tells the user about a real run of the shipped plug-in over the samples: the
// terminal's errors, notices and summary; failures that used to pass in silence; a second run
// that changes nothing; one log entry per line whatever a file name holds.

#include <gtest/gtest.h>
#include <limits.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstring>
#include <filesystem>
#include <map>
#include <string>
#include <vector>

#include "run/host_run.h"
#include "support/test_files.h"

namespace vxtest {
namespace {

const int kNobody = 65534;

TEST(HostReport, NoticesGoToStandardErrorAndTheSummaryCountsTheRun) {
  HostRun run({"halden_to_obx"});
  run.UseSamples();
  EXPECT_EQ(0, run.Run(run.SampleOptions()));
  EXPECT_EQ("** OBX version does not support Spanish language reports - changed to English\n"
            "** OBX does not support new day/time filters - MUST manually change: Weekend visitors\n",
            run.Err());
  EXPECT_EQ("Plug-in:              " + run.bin + "/halden_to_obx.so\n"
            "Files copied:         1\n"
            "INI files merged:     8\n"
            "Templates converted:  2\n"
            "Profiles converted:   2\n"
            "Files kept (existed): 0\n"
            "Errors:               0\n"
            "Manual actions:       2\n"
            "Log:                  " + run.log + "\n",
            run.Out());

  // A second run keeps what the first made, says so, and changes no byte but its records.
  const Tree first = WithoutBookkeeping(TreeState(run.dst));
  EXPECT_EQ(0, run.Run(run.SampleOptions()));
  EXPECT_TRUE(Has(run.Out(), "Profiles converted:   0\nFiles kept (existed): 2\n")) << run.Out();
  EXPECT_EQ(first, WithoutBookkeeping(TreeState(run.dst)));
  EXPECT_EQ(TreeState(VXM_SOURCE_DIR "/samples/halden"), TreeState(run.src));
}

TEST(HostReport, QuietKeepsOnlyErrorsAndVerbosePrintsEveryEntry) {
  HostRun run({"halden_to_obx"});
  run.UseSamples();
  Lines options = run.SampleOptions();
  options.push_back("-q");
  options.push_back("-PFLog:ghost.wlp");
  EXPECT_EQ(4, run.Run(options));
  EXPECT_EQ("", run.Out());
  EXPECT_EQ("Error: Selected profile not found: ghost.wlp\n", run.Err());

  options.back() = "-v";
  options[options.size() - 2] = "-PFLog:shop.wlp";
  EXPECT_EQ(0, run.Run(options));
  // Every entry but the two notices (on standard error) is printed in the log's order, the header's
  // blank entry as one empty line; the summary follows.
  Lines printed;
  for (const std::string& entry : LogEntries(run.log)) {
    if (entry == "\r") continue;
    if (entry.rfind("** OBX", 0) != 0) printed.push_back(entry);
  }
  std::string expected;
  for (const std::string& line : printed) expected += line + "\n";
  EXPECT_EQ(0u, run.Out().find(expected)) << run.Out();
  EXPECT_TRUE(Has(run.Out(), "Plug-in:              ")) << run.Out();
}

// Each case breaks one file for the unprivileged user the run drops to, and names the error that
// must reach both standard error and the log.
TEST(HostReport, EveryFailedReadOrWriteNamesItsFile) {
  struct Case {
    const char* file;   // under the test root
    mode_t mode;
    std::string error;  // "$SRC" and "$DST" stand for the installations
    int errors;         // in the summary
  } cases[] = {
      {"src/adviews.txt", 0, "Error: Unable to open file:   $SRC/adviews.txt", 1},
      {"dst/adviews.txt", 0444, "Error: Unable to write file:   $DST/adviews.txt", 1},
      {"src/keywords.ini", 0, "Error: Unable to open file:   $SRC/keywords.ini", 1},
      {"dst/keywords.ini", 0, "Error: Unable to open file:   $DST/keywords.ini", 1},
      // Only the destination's profile folder is read-only: the readable source is not to blame.
      {"dst/vxm_vxx/datfiles/profiles", 0555,
       "Error: Unable to write file:   $DST/vxm_vxx/datfiles/profiles/shop_vxmigrate.wlp", 2},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.file);
    HostRun run({"halden_to_obx"});
    run.UseSamples();
    run.GiveTo(kNobody);
    chmod(run.Path(c.file).c_str(), c.mode);
    EXPECT_EQ(4, run.Run(run.SampleOptions(), kNobody)) << run.Err();
    const std::string error = Expand(c.error, {{"$SRC", run.src}, {"$DST", run.dst}});
    EXPECT_TRUE(Has(run.Err(), error + "\n")) << run.Err();
    EXPECT_TRUE(Has(run.Out(), "Errors:               " + std::to_string(c.errors) + "\n"))
        << run.Out();
    const std::string log = ReadFile(run.log);
    EXPECT_TRUE(Has(log, error)) << log;
    EXPECT_FALSE(Has(log, "Error: Unable to open file:   " + run.src + "/vxm_log/datfiles/shop.wlp"));
  }
}

// Paths near the system's limit: a destination folder so deep that the converted profiles'
// temporary files' paths would not fit. Files are written relative to their open folder, so the
// profiles still arrive, and the run reports no error.
TEST(HostReport, PathsNearTheLengthLimitStillTakeTheirFiles) {
  HostRun run({"halden_to_obx"});
  std::string deep = run.dst;
  while (deep.size() < 3800) deep += "/" + std::string(200, 'd');
  // 4040 bytes: the samples' own files still fit below it, the converted profiles do not.
  deep += "/" + std::string(4040 - deep.size() - 1, 'e');
  MakeDirs(deep);
  std::filesystem::copy(VXM_SOURCE_DIR "/samples/halden", run.src,
                        std::filesystem::copy_options::recursive);
  std::filesystem::copy(VXM_SOURCE_DIR "/samples/obx", deep, std::filesystem::copy_options::recursive);
  Lines options = run.SampleOptions();
  options[1] = "-D2:" + deep;
  EXPECT_EQ(0, run.Run(options)) << run.Err();
  for (const char* profile : {"cluster", "shop"}) {
    const std::string target = deep + "/vxm_vxx/datfiles/profiles/" + profile + "_vxmigrate.wlp";
    EXPECT_GT(target.size() + strlen(".x.vxtmp.XXXXXX"), static_cast<size_t>(PATH_MAX));
    EXPECT_EQ(0, access(target.c_str(), F_OK)) << profile;
  }
}

TEST(HostReport, LineEndsInAFileNameStayInsideTheirEntry) {
  HostRun run({"halden_to_obx"});
  run.UseSamples();
  std::filesystem::copy_file(run.src + "/vxm_log/datfiles/shop.wlp",
                             run.src + "/vxm_log/datfiles/two\nlines\r.wlp");
  EXPECT_EQ(0, run.Run(run.SampleOptions()));
  const std::string copied = "Profile file copied: " + run.src + "/vxm_log/datfiles/two\\nlines\\r.wlp";
  Lines entries = LogEntries(run.log);
  // The header's blank entry is the only one spanning lines (three: "\r", "\r", "").
  int found = 0;
  for (size_t i = 11; i < entries.size(); ++i) found += entries[i].rfind(copied, 0) == 0 ? 1 : 0;
  EXPECT_EQ(1, found);
  // Every line after the header starts with its time stamp: no entry was split.
  const std::string text = ReadFile(run.log);
  size_t lines = 0;
  for (size_t at = text.find("\n\n") + 2; at < text.size(); at = text.find('\n', at) + 1, ++lines) {
    EXPECT_TRUE(isdigit(static_cast<unsigned char>(text[at]))) << text.substr(at, 40);
  }
  EXPECT_EQ(entries.size() - 11, lines);
}

}  // namespace
}  // namespace vxtest
