// The host's command line and exit statuses, through the real host process: what each argument
// case prints on which stream, its status, and that a refused command line writes nothing.

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "run/host_run.h"
#include "support/test_files.h"

namespace vxtest {
namespace {

const char kHint[] = "Try 'vxmigrate --help' for the options.\n";

TEST(HostCommandLine, EachCaseHasItsStatusAndTextsAndRefusalsWriteNothing) {
  struct Case {
    Lines extra;      // after the six run options; "-" first: instead of them
    int status;
    std::string out;  // a part of standard output ("" : empty)
    std::string err;  // standard error exactly; "~" first: a part of it
  } cases[] = {
      {{"-", "--help"}, 0, "Exit status:\n  0  a plug-in ran", ""},
      {{"-", "-h"}, 0, "Usage: vxmigrate -D1:", ""},
      {{"--help"}, 0, "  5  another run holds the destination\n", ""},
      {{"-", "--version"}, 0, "vxmigrate 0.1\n", ""},
      {{"stray"}, 2, "", std::string("vxmigrate: unknown option 'stray'\n") + kHint},
      {{"-d1:/x"}, 2, "", std::string("vxmigrate: unknown option '-d1:/x'\n") + kHint},
      {{"-P2:obz"}, 2, "",
       "~vxmigrate: '-P2:obz': unknown product id 'obz'\naccepted product ids: pavsuite, halsuite,"},
      {{"-P1:nosuch"}, 2, "", "~'-P1:nosuch': unknown product id 'nosuch'\naccepted product ids:"},
      {{"-V1:9.x"}, 2, "", "~'-V1:9.x': '9.x' is not a version\naccepted versions: dotted numbers"},
      {{"-V2:abc"}, 2, "", "~'-V2:abc': 'abc' is not a version"},
      {{"-V2:1.2.3.4"}, 2, "", "~'-V2:1.2.3.4': '1.2.3.4' is not a version"},
      {{"-D1:"}, 2, "", "~vxmigrate: '-D1:': needs a folder, as -D1:<folder>\n"},
      {{"-D2"}, 2, "", "~vxmigrate: '-D2': needs a folder, as -D2:<folder>\n"},
      {{"-FT:maybe"}, 2, "", "~accepted values: Y, Yes, N, No\n"},
      // A command file would fill the line in and its destination would replace the scratch copy.
      {{"-", "-n", "-D2:/x", "-cmd:/x"}, 2, "",
       "~vxmigrate: a preview (-n) needs the whole run on the command line; missing -D1, -P1, "
       "-P2, -V1, -V2\n"},
      {{"-", "-D1:/a", "-P1:pavsuite"}, 2, "",
       std::string("vxmigrate: incomplete run: missing -D2, -P2, -V1, -V2, and no usable "
                   "migcmd.ini gives it\n") + kHint},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(::testing::PrintToString(c.extra));
    HostRun run({"p10_pavsuite"});
    // A complete command file beside the host: --help must not start the run it describes.
    const bool withCommandFile = c.status != 2;
    if (withCommandFile) {
      WriteFile(run.bin + "/migcmd.ini", "[main]\nD1=" + run.src + "\nD2=" + run.dst +
                                             "\nP1=pavsuite\nP2=pavsuite\nV1=5.0\nV2=5.5\n");
    }
    Lines options;
    if (c.extra.front() == "-") {
      options.assign(c.extra.begin() + 1, c.extra.end());
    } else {
      options = run.Options({"pavsuite", "pavsuite", "5.0", "5.5"});
      options.insert(options.end(), c.extra.begin(), c.extra.end());
    }
    EXPECT_EQ(c.status, run.Run(options));
    const std::string out = run.Out();
    const std::string err = run.Err();
    if (c.out.empty()) {
      EXPECT_EQ("", out);
    } else {
      EXPECT_TRUE(Has(out, c.out)) << out;
    }
    if (!c.err.empty() && c.err[0] == '~') {
      EXPECT_TRUE(Has(err, c.err.substr(1))) << err;
      EXPECT_TRUE(Has(err, kHint)) << err;
    } else {
      EXPECT_EQ(c.err, err);
    }
    EXPECT_FALSE(FileExists(run.log));
    EXPECT_FALSE(FileExists(run.dst + "/plugin_calls.txt"));
  }
}

// Every status a run can end with, each through a real run.
TEST(HostCommandLine, ExitStatusSaysHowTheRunEnded) {
  struct Case {
    const char* what;
    Lines plugins;
    bool ranges;
    Lines products;   // P1, P2, V1, V2
    int status;
    std::string out;  // a part of standard output, "$BIN" and "$DST" replaced
    std::string err;  // a part of standard error, the same
  } cases[] = {
      {"a plug-in ran", {"p10_pavsuite"}, true, {"pavsuite", "pavsuite", "5.0", "5.5"}, 0,
       "Plug-in:              $BIN/p10_pavsuite.so\n", ""},
      {"source version above the destination's", {"p10_pavsuite"}, true,
       {"pavsuite", "pavsuite", "5.1", "5.0"}, 1, "the run was refused by its checks",
       "Error: Cannot migrate because source version greater than destination version\n"},
      {"versions outside the ranges", {"p10_pavsuite"}, true, {"pavsuite", "pavsuite", "5.0", "9.9"},
       3, "versions 5.0 and 9.9 are outside the ranges of $BIN/p10_pavsuite.so: pavsuite 4.0 to 6.5, "
          "pavsuite 4.0 to 6.5 (from $BIN/vxmigrate.ini)", "Error: No appropriate migration"},
      {"no vxmigrate.ini", {"p10_pavsuite"}, false, {"pavsuite", "pavsuite", "5.0", "5.5"}, 3,
       "the version ranges file could not be read: $BIN/vxmigrate.ini",
       "Error: Can't open vxmigrate.ini - make sure it's present and isn't read only\n"},
      {"no plug-in for the pair", {"p10_pavsuite"}, true, {"tradeq", "tradeq", "2.0", "2.1"}, 3,
       "no plug-in serves tradeq to tradeq", ""},
      {"the plug-in lacks Migrate", {"p15_log_without_migrate"}, true, {"log", "log", "6.0", "6.1"}, 3,
       "$BIN/p15_log_without_migrate.so serves the products and versions but has no Migrate", ""},
      {"steps reported errors", {"halden_to_obx"}, true, {"halsuite", "obx", "5.5", "3.0"}, 4,
       "Errors:               1\n", "Error: Selected profile not found: ghost.wlp\n"},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.what);
    HostRun run(c.plugins, c.ranges);
    if (c.plugins.front() == "halden_to_obx") run.UseSamples();
    Lines options = run.Options(c.products);
    options.push_back("-PFLog:shop.wlp,ghost.wlp");
    EXPECT_EQ(c.status, run.Run(options)) << run.Err();
    const Tree marks = {{"$BIN", run.bin}, {"$DST", run.dst}};
    EXPECT_TRUE(Has(run.Out(), Expand(c.out, marks))) << run.Out();
    EXPECT_TRUE(Has(run.Err(), Expand(c.err, marks))) << run.Err();
  }
}

// A destination that is missing or a file: the checks say why, and the log cannot be made there.
TEST(HostCommandLine, DestinationThatIsNoFolderIsRefusedBeforeTheRun) {
  for (const char* name : {"nowhere", "file"}) {
    HostRun run({"p10_pavsuite"});
    const std::string destination = run.Path(name);
    if (name == std::string("file")) WriteFile(destination, "not a folder\n");
    Lines options = run.Options({"pavsuite", "pavsuite", "5.0", "5.5"});
    options[1] = "-D2:" + destination;
    EXPECT_EQ(1, run.Run(options));
    EXPECT_EQ("Error: Destination directory does not exist:  " + destination +
                  "\nvxmigrate: cannot write the log " + destination +
                  "/vxmigrate.log: Operation not permitted\n",
              run.Err());
    EXPECT_EQ(name == std::string("file") ? "not a folder\n" : "<missing>", ReadFile(destination));
  }
}

// A disk that takes nothing: the log is created but stays empty, so the run cannot end with 0.
TEST(HostCommandLine, LogThatLosesEntriesIsAnError) {
  HostRun run({"p10_pavsuite"});
  EXPECT_EQ(4, run.Run(run.Options({"pavsuite", "pavsuite", "5.0", "5.5"}), -1, true));
  EXPECT_EQ("", ReadFile(run.log));
  // The undo journal cannot be kept either, nor the report written: errors both.
  EXPECT_EQ("Error: No undo journal could be kept; this run cannot be undone: " + run.dst +
                "\nvxmigrate: the log " + run.log +
                " lost entries: File too large\nError: Unable to write file:   " + run.dst +
                "/vxmigrate-report.json\n",
            run.Err());
  EXPECT_TRUE(Has(run.Out(), "Errors:               2\nManual actions:       0\nLog:                  " +
                                 run.log + " (incomplete: File too large)\n"))
      << run.Out();
}

}  // namespace
}  // namespace vxtest
