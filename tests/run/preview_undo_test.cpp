// Whole runs of the shipped host and plug-in over copies of the samples: a preview leaves the
// destination exactly as it was and reports what the real run then reports; undo gives back the
// exact tree from before a run, also after a run killed midway; the report shows a planted
// conflict with both values and never a protected value in clear.

#include <fcntl.h>
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <map>
#include <string>
#include <utility>
#include <vector>

#include "crypt/value_conversion.h"
#include "foundation/inifile/ini_file.h"
#include "foundation/string/json_text.h"
#include "migrate/installations_fixture.h"
#include "migrate/run_record.h"
#include "run/host_run.h"
#include "support/test_files.h"

namespace vxtest {
namespace {

// The destination as a user sees it: every file's mode and bytes, with mtimes when asked, and
// without the runs' history.
Tree Installation(const std::string& folder, bool withTimes) {
  Tree tree;
  for (const auto& [name, state] : TreeState(folder)) {
    struct stat st;
    if (name.rfind(".vxmigrate", 0) == 0) continue;
    tree[name] = state;
    if (withTimes && lstat((folder + "/" + name).c_str(), &st) == 0) {
      tree[name] += " @" + std::to_string(st.st_mtim.tv_sec) + "." + std::to_string(st.st_mtim.tv_nsec);
    }
  }
  return tree;
}

// Lines added at the end of a settings file, ending as its lines end (the Halden sample's settings
// end theirs in "\r\n").
void AppendLines(const std::string& path, const Lines& lines) {
  std::string text = ReadFile(path);
  const std::string lineEnd = text.find("\r\n") == std::string::npos ? "\n" : "\r\n";
  for (const std::string& line : lines) text += line + lineEnd;
  WriteFile(path, text);
}

// How the report shows a value planted on either side of a merge, by the value's form: each stored
// form of a user name or password masked whatever its key, other values as they are.
TEST(Report, MasksStoredCredentialsByTheirFormAndShowsEveryOtherValue) {
  struct Planted {
    std::string key, source;
    const char* kept;                     // null: the destination lacks the key
    std::string shownSource, shownKept;  // shownKept "-": the key was added
  };
  const std::string title = "Statistik f\xC3\xBCr B\xC3\xBCro", token(80, 'z'),
                    keptUser = Protected("kept-user");
  const Planted planted[] = {
      {"Account", Protected("stats-account"), nullptr, "<protected>", "-"},
      {"RelayUser", Protected("relay-user"), keptUser.c_str(), "<protected>", "<protected>"},
      {"Login", PreviousGenerationForm("old-login"), nullptr, "<protected>", "-"},
      {"Operator", LegacyEncoded("night-operator"), "admin", "<protected>", "admin"},
      {"ArchivePassword", "typed-in-clear", "other", "<protected>", "<protected>"},
      // The new installation's empty password won: the report must not hide that it is empty.
      {"PagerPassword", LegacyEncoded("pager-secret"), "", "<protected>", ""},
      {"Title", title, "Web Statistics", title, "Web Statistics"},
      {"Token", token, nullptr, token, "-"},  // 80 characters, not 80 digits
      {"Code", "abc", "abd", "abc", "abd"},
      {"Banner", "on\x1b[2Jair", "off", "on\x1b[2Jair", "off"}};  // a terminal's escape
  HostRun run({"halden_to_obx"});
  run.UseSamples();
  Lines source = {"[Notify]"}, kept = {"[Notify]"};
  for (const Planted& p : planted) {
    source.push_back(p.key + "=" + p.source);
    if (p.kept != nullptr) kept.push_back(p.key + "=" + p.kept);
  }
  AppendLines(run.src + "/vxm_log/vxm_log.ini", source);
  AppendLines(run.dst + "/vxm_vxx/vxm_vxx.ini", kept);
  ASSERT_EQ(0, run.Run(run.SampleOptions()));

  vxJsonValue report;
  ASSERT_TRUE(vxJsonParse(ReadFile(run.dst + "/vxmigrate-report.json"), report));
  std::map<std::string, std::pair<std::string, std::string>> shown;  // key: source, kept
  for (const vxJsonValue& merge : report["merges"].items) {
    for (const vxJsonValue& added : merge["added"].items) {
      if (added["section"].text == "Notify") shown[added["key"].text] = {added["value"].text, "-"};
    }
    for (const vxJsonValue& c : merge["conflicts"].items) {
      if (c["section"].text == "Notify") shown[c["key"].text] = {c["source"].text, c["kept"].text};
    }
  }
  for (const Planted& p : planted) {
    EXPECT_EQ(std::make_pair(p.shownSource, p.shownKept), shown[p.key]) << p.key;
  }
  // On the terminal a value can neither drive it nor hide that it is empty.
  ASSERT_EQ(0, run.Run({"--report", run.dst})) << run.Err();
  EXPECT_EQ(std::string::npos, run.Out().find('\x1b')) << run.Out();
  EXPECT_NE(std::string::npos, run.Out().find("[Notify] Banner\n      source: on\\x1b[2Jair\n"))
      << run.Out();
  EXPECT_NE(std::string::npos, run.Out().find("[Notify] PagerPassword\n      source: <protected>\n"
                                              "      kept:   (empty)\n"))
      << run.Out();
}

TEST(Undo, RefusesNamingFilesChangedSinceTheRunUnlessForced) {
  HostRun run({"halden_to_obx"});
  run.UseSamples();
  const auto before = Installation(run.dst, false);
  ASSERT_EQ(0, run.Run(run.SampleOptions()));
  WriteFile(run.dst + "/adviews.txt", "edited by hand\n");
  const auto edited = Installation(run.dst, false);
  EXPECT_EQ(1, run.Run({"--undo", run.dst}));
  EXPECT_NE(std::string::npos, run.Err().find("\n  adviews.txt\n")) << run.Err();
  EXPECT_EQ(edited, Installation(run.dst, false));
  ASSERT_EQ(0, run.Run({"--undo", run.dst, "--force"})) << run.Err();
  EXPECT_EQ(before, Installation(run.dst, false));
}

// Starts the host with args (args[0] its path) in folder, its output thrown away; and kills it
// once the journal holds records lines, unless it ended first (then the run is undone whole).
void KillWhenJournalHas(const std::string& folder, const Lines& args, const std::string& journal,
                        int records) {
  const int null = open("/dev/null", O_WRONLY | O_CLOEXEC);
  const pid_t child = StartProcess(args[0], args, folder, null, null);
  close(null);
  ASSERT_GT(child, 0);
  // Polled for up to a minute (a loaded machine starts the host slowly).
  for (int i = 0; i < 60000; ++i) {
    const std::string text = ReadFile(journal);
    if (std::count(text.begin(), text.end(), '\n') >= records) break;
    if (waitpid(child, nullptr, WNOHANG) == child) return;
    usleep(1000);
  }
  kill(child, SIGKILL);
  ExitStatus(child);
}

// Each shipped plug-in on copies of its samples, started with its command file's run as a whole
// command line.
class EveryShippedPlugin : public ::testing::TestWithParam<const char*> {};

TEST_P(EveryShippedPlugin, PreviewLeavesTheDestinationAsItWasAndReportsWhatTheRunDoes) {
  SampleRun run(GetParam());
  const std::string dst = run.Path(run.destination);
  const auto before = Installation(dst, true);
  Lines preview = run.RunOptions();
  preview.insert(preview.end(), {"-n", "-v"});  // -v: the whole report, as --report shows it
  ASSERT_EQ(0, run.Run(preview)) << run.Err();
  EXPECT_EQ(before, Installation(dst, true));
  const std::string title =
      "Preview of the migration into " + run.destination + " (nothing there was changed):\n";
  const size_t at = run.Out().find(title);
  ASSERT_NE(std::string::npos, at) << run.Out();
  const std::string previewed = run.Out().substr(at + title.size());
  for (const std::string& name : ListTree(run.Path(""))) {
    EXPECT_EQ(std::string::npos, name.find("vxpreview")) << name;
  }

  ASSERT_EQ(0, run.Run(run.RunOptions())) << run.Err();
  ASSERT_EQ(0, run.Run({"--report", run.destination})) << run.Err();
  EXPECT_EQ(run.Out(), previewed);
  EXPECT_NE(std::string::npos, previewed.find("Files:\n  ")) << previewed;
}

// Every file's mode is changed first: undo must give back modes as well as bytes.
TEST_P(EveryShippedPlugin, UndoGivesBackTheTreeFromBeforeTheRunAndKeepsTheUndoneLog) {
  SampleRun run(GetParam());
  const std::string dst = run.Path(run.destination);
  for (const auto& [name, content] : FilesBelow(dst)) chmod((dst + "/" + name).c_str(), 0600);
  const auto before = Installation(dst, false);
  ASSERT_EQ(0, run.Run(run.RunOptions())) << run.Err();
  ASSERT_NE(before, Installation(dst, false));
  const std::string log = ReadFile(dst + "/vxmigrate.log");
  ASSERT_EQ(0, run.Run({"--list-runs", run.destination}));
  EXPECT_TRUE(Has(run.Out(), "000001  ") && Has(run.Out(), "status 0")) << run.Out();
  ASSERT_EQ(0, run.Run({"--undo", run.destination})) << run.Err();
  EXPECT_EQ(before, Installation(dst, false));
  EXPECT_EQ(log, ReadFile(dst + "/.vxmigrate/runs/000001/vxmigrate.log"));
  EXPECT_EQ(1, run.Run({"--undo", run.destination}));  // nothing left to undo
}

// Killed at whatever point its journal has reached a few changes: undo still gives the tree back.
TEST_P(EveryShippedPlugin, UndoGivesBackTheTreeFromBeforeARunKilledMidway) {
  for (int changes : {2, 4, 5, 9}) {
    SampleRun run(GetParam());
    const std::string dst = run.Path(run.destination);
    const auto before = Installation(dst, false);
    KillWhenJournalHas(run.Path(""), run.Args(run.RunOptions()),
                       dst + "/.vxmigrate/runs/000001/journal", changes + 2);
    ASSERT_EQ(0, run.Run({"--undo", run.destination})) << changes << run.Err();
    EXPECT_EQ(before, Installation(dst, false)) << changes;
  }
}

// What each plug-in's samples hold for the report: a value the customer tuned that the new
// installation's default overrides, and stored credentials the merges meet.
struct StoredSecret {
  const char *file, *section, *key;  // in the source installation
  const char* clear;                 // what the stored form reads back to
};
struct PlantedInSamples {
  const char* plugin;
  const char *file, *section, *key, *source, *kept;  // the conflict; file in the destination
  std::vector<StoredSecret> secrets;
};

const PlantedInSamples& Planted(const std::string& plugin) {
  static const StoredSecret haldenMail[] = {
      {"vxm_log/vxm_log.ini", "Mail", "SmtpUser", "shopstats-mailer"},           // legacy
      {"vxm_log/vxm_log.ini", "Mail", "SmtpPassword", "Harbour-Lights-42"}};     // legacy
  static const PlantedInSamples planted[] = {
      {"halden_to_obx", "vxm_vxx/vxm_vxx.ini", "Mail", "SmtpServer", "mail.example.com",
       "localhost", {haldenMail[0], haldenMail[1]}},
      {"halsuite_to_halsuite", "vxm_log/vxm_log.ini", "Mail", "SmtpServer", "mail.example.com",
       "localhost",
       {haldenMail[0], haldenMail[1], {"vantix.ini", "Proxy", "ProxyUser", "gw-halden-01"}}},
      {"log_to_log", "vantix.ini", "General", "ScheduleStart", "02:30", "01:00",
       {{"vantix.ini", "Proxy", "ProxyUser", "proxy-shopstats"},                 // 80 digits
        {"vantix.ini", "Proxy", "ProxyPassword", "Nightly#Run2019"}}},           // legacy
      {"obx_to_obx", "vxm_vxx/vxm_vxx.ini", "Mail", "SmtpServer", "mail.example.com", "localhost",
       {{"vxm_vxx/vxm_vxx.ini", "Mail", "SmtpUser", "obx-reports"},              // protected
        {"vxm_vxx/vxm_vxx.ini", "Mail", "SmtpPassword", "Quarterly!Mail7"}}}};
  for (const PlantedInSamples& p : planted) {
    if (plugin == p.plugin) return p;
  }
  ADD_FAILURE() << plugin << " has no planted values";
  return planted[0];
}

// The clear text of a stored user name or password in any of its forms.
std::string ClearText(const std::string& stored) {
  vxStringBase value(stored.c_str());
  DecryptToClearText(value);  // protected and previous-generation forms
  if (value.str() == stored) ConvertToClearText(value);  // the legacy form
  return value.str();
}

// Every text a report holds: its raw JSON and each string in it, unescaped.
void CollectTexts(const vxJsonValue& value, std::vector<std::string>& texts) {
  if (value.kind == vxJsonValue::Kind::kString) texts.push_back(value.text);
  for (const vxJsonValue& item : value.items) CollectTexts(item, texts);
  for (const auto& [name, member] : value.members) {
    texts.push_back(name);
    CollectTexts(member, texts);
  }
}

TEST_P(EveryShippedPlugin, ReportNamesThePlantedConflictAndNoCredentialInClear) {
  const PlantedInSamples& planted = Planted(GetParam());
  SampleRun run(GetParam());
  // What must not show: each credential's clear text, and its stored form (the two older forms
  // read back without a key).
  std::vector<std::string> secrets;
  for (const StoredSecret& s : planted.secrets) {
    vxMappedINIFile settings(run.Path(run.source + "/" + s.file).c_str());
    ASSERT_EQ(0, settings.Open(1)) << s.file;
    const std::string stored = settings.GetVal(s.section, s.key).str();
    ASSERT_NE(stored, s.clear) << s.key << ": the sample must hold it in a stored form";
    ASSERT_EQ(s.clear, ClearText(stored)) << s.key;
    secrets.insert(secrets.end(), {s.clear, stored});
  }
  Lines preview = run.RunOptions();
  preview.push_back("-n");
  ASSERT_EQ(0, run.Run(preview)) << run.Err();
  std::vector<std::string> texts = {run.Out(), run.Err()};
  ASSERT_EQ(0, run.Run(run.RunOptions())) << run.Err();
  texts.insert(texts.end(), {run.Out(), run.Err()});
  const std::string reportText = ReadFile(run.Path(run.destination + "/" + kRunReportName));
  vxJsonValue report;
  ASSERT_TRUE(vxJsonParse(reportText, report)) << reportText;
  texts.push_back(reportText);
  CollectTexts(report, texts);
  ASSERT_EQ(0, run.Run({"--report", run.destination})) << run.Err();
  const std::string shown = run.Out();
  texts.push_back(shown);

  int found = 0;
  for (const vxJsonValue& merge : report["merges"].items) {
    if (merge["file"].text != planted.file) continue;
    for (const vxJsonValue& c : merge["conflicts"].items) {
      found += c["section"].text == planted.section && c["key"].text == planted.key &&
               c["source"].text == planted.source && c["kept"].text == planted.kept;
    }
  }
  for (const vxJsonValue& file : report["files"].items) {
    found += file["path"].text == planted.file && file["action"].text == "merged";
  }
  EXPECT_EQ(2, found) << reportText;  // the conflict, and its file as merged
  // --report: under its file, the key with both values.
  const std::string conflict = std::string("    [") + planted.section + "] " + planted.key +
                               "\n      source: " + planted.source + "\n      kept:   " +
                               planted.kept + "\n";
  const size_t file = shown.find(std::string("\n  ") + planted.file + "  (from ");
  ASSERT_NE(std::string::npos, file) << shown;
  size_t end = shown.find('\n', file + 1);  // the file's group: its lines indented by four
  while (end != std::string::npos && shown.compare(end + 1, 4, "    ") == 0) {
    end = shown.find('\n', end + 1);
  }
  EXPECT_NE(std::string::npos, shown.substr(file, end - file).find(conflict)) << shown;
  // The preview printed the conflicts and the counts of the report the run then wrote.
  EXPECT_NE(std::string::npos, texts[0].find(shown.substr(0, shown.find("Files:\n")))) << texts[0];
  EXPECT_NE(std::string::npos, texts[0].find(shown.substr(shown.rfind("Files: ")))) << texts[0];

  for (const std::string& secret : secrets) {
    for (size_t i = 0; i < texts.size(); ++i) {
      EXPECT_EQ(std::string::npos, texts[i].find(secret)) << secret << " shown in text " << i;
    }
  }
}

INSTANTIATE_TEST_SUITE_P(Samples, EveryShippedPlugin, ::testing::ValuesIn(kShippedPlugins));

}  // namespace
}  // namespace vxtest
