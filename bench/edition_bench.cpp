// Times the edition conversion of a large Halden installation (5,000 user report templates and
// 5,000 analysis profiles) into a fresh OBX installation: the whole conversion, and the template and
// profile steps by themselves. Each iteration converts into a new destination.

#include <benchmark/benchmark.h>
#include <unistd.h>

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <memory>
#include <string>
#include <vector>

#include "crypt/protected_value.h"
#include "edition/halden_to_obx.h"
#include "migrate/manager.h"

namespace {

namespace fs = std::filesystem;

const int kTemplates = 5000;
const int kProfiles = 5000;
const char* const kFamilies[] = {"TopPages", "TopEntryPage", "ExitPages", "Referrers", "Browsers",
                                 "Platforms", "Countries", "SearchPhrases", "Downloads", "Visitors",
                                 "HourlyActivity", "DailyActivity", "ServerErrors", "Domains",
                                 "Directories", "FileTypes"};

void Write(const fs::path& path, const std::string& text) {
  fs::create_directories(path.parent_path());
  std::ofstream(path, std::ios::binary) << text;
}

std::string Legacy(const std::string& plain) {
  std::vector<char> buffer(plain.begin(), plain.end());
  buffer.push_back('\0');
  Obsolete_EncodePasswordOrUserName(buffer.data());
  return buffer.data();
}

// A template of 16 report sections, graph and table in turn.
std::string Template(int n) {
  std::string text = "[SaveAs]\nSaveReportAs=report" + std::to_string(n) + (n % 5 ? ".htm" : ".xls") +
                     "\n\n[general]\ndescription=Report " + std::to_string(n) +
                     "\n\n[style]\nreportstyle=Corporate\nreportlanguage=english\nhelpcards=Y\n\n"
                     "[content]\n";
  for (int k = 0; k < 16; ++k) {
    const std::string key = "Section" + std::to_string(k) + "_";
    text += key + "Name=" + kFamilies[(n + k) % 16] + "_SectionItem\n";
    text += key + "ItemType=" + (k % 2 ? "2" : "1") + "\n";
    text += key + "GraphType=" + std::to_string(k % 8) + "\n" + key + "elements=" +
            std::to_string(10 + k) + "\n" + key + "SubElements=5\n";
  }
  return text;
}

std::string Profile(int n) {
  std::string text = "[Profile]\nName=Site " + std::to_string(n) + "\n";
  if (n % 3 == 0) {
    text += "IsServerCluster=1\n";
    for (int s = 1; s <= 3; ++s) {
      const std::string suffix = s == 1 ? "" : std::to_string(s);
      text += "ServerName" + suffix + "=node" + std::to_string(s) + ".example.com\n";
      text += "LogFilePath" + suffix + (s == 2 ? "=ftp://logs.example.com/access.log\n"
                                               : "=file:///var/log/a.log|file:///var/log/b.log\n");
      text += "LogFileUserName" + suffix + "=" + Legacy("loguser") + "\n";
      text += "LogFilePassword" + suffix + "=" + Legacy("logpass") + "\n";
    }
  } else {
    text += "IsServerCluster=0\nServerName=web.example.com\nLogFilePath=file:///var/log/web/" +
            std::to_string(n) + ".log\nLogFileUserName=" + Legacy("loguser") +
            "\nLogFilePassword=" + Legacy("logpass") + "\n";
  }
  text += "HomePageName=/srv/www/site" + std::to_string(n) + "/index.html\nHomePageUsername=" +
          Legacy("admin") + "\nHomePagePassword=" + Legacy("secret") +
          "\nIncludeQueries=Y\nincludecontentgroups=*\nincludepathsanalysisprofiles=*\n\n"
          "[[Filter1]]\nName=Weekdays\nDayTimeEnabled=0\n";
  return text;
}

std::string OptionFile(const char* prefix, int count) {
  std::string text = "[Default]\n" + std::string(prefix) + "Count=" + std::to_string(count) + "\n";
  for (int i = 0; i < count; ++i) {
    text += "\n[" + std::string(prefix) + std::to_string(i) + "]\nprofilename=Option " +
            std::to_string(i) + "\nprofileid=" + std::to_string(100 + i) + "\n";
  }
  return text;
}

void BuildHalden(const fs::path& src) {
  Write(src / "vxm_log/vxm_log.ini",
        "[Defaults]\nDownloadTypes=exe zip msi\nDocumentTypes=htm html\n"
        "TitleCacheLifespan=172800\n\n[cookie]\nvantixplugin=1\n");
  for (int n = 0; n < kTemplates; ++n) {
    Write(src / ("vxm_log/datfiles/Report" + std::to_string(n) + ".mss"), Template(n));
  }
  for (int n = 0; n < kProfiles; ++n) {
    Write(src / ("vxm_log/datfiles/site" + std::to_string(n) + ".wlp"), Profile(n));
  }
  Write(src / "vxm_log/datfiles/contentgroups/default.ini", OptionFile("ContentGroupProfile", 40));
  Write(src / "vxm_log/datfiles/pathsanalysis/default.ini", OptionFile("PathsAnalysisProfile", 20));
  Write(src / "adviews.txt", "Home,/index.html\n");
  Write(src / "vxintra.txt", "10.0.0.0,Office\n");
  Write(src / "keywords.ini", "[SearchEngines]\nEngine1=Seekr\n\n[Seekr]\nquery=s\n");
}

void BuildOBX(const fs::path& dst) {
  Write(dst / "vxm_vxx/vxm_vxx.ini", "[defaults]\nprofilesdir=vxm_vxx/datfiles/profiles\n");
  std::string wct = "[general]\nversion=2.0\n\n[content]\nreportobjects=48\nhelpcards=Y\n";
  int object = 0;
  for (const char* family : kFamilies) {
    const char* const kinds[][2] = {{"Chapter", "CHAPTER"}, {"Graph", "Graph"}, {"Table", "Table"}};
    for (const auto& kind : kinds) {
      wct += "\n[Object" + std::to_string(++object) + "]\nname=" + family + kind[0] + "\ntype=" +
             kind[1] + "\ninclude=Y\ngraphtype=MULTIBAR\ngraphelements=10\ntableelements1=20\n"
             "tableelements2=0\n";
    }
  }
  Write(dst / "vxm_vxx/CompleteSummary.wct", wct);
  Write(dst / "vxm_vxx/datfiles/contentgroups/default.ini", OptionFile("ContentGroupProfile", 5));
  Write(dst / "vxm_vxx/datfiles/pathsanalysis/default.ini", OptionFile("PathsAnalysisProfile", 0));
  Write(dst / "vxm_vxx/datfiles/dynamicpages/default.ini", "[default]\nqueryprofilecount=0\n");
  Write(dst / "adviews.txt", "Home,/index.html\n");
  Write(dst / "vxintra.txt", "10.0.0.0,Office\n");
  Write(dst / "keywords.ini", "[SearchEngines]\nEngine1=Seekr\n\n[Seekr]\nquery=s\n");
}

const fs::path& Root() {
  static const fs::path root = [] {
    fs::path path = fs::temp_directory_path() / ("vxm_edition_bench." + std::to_string(getpid()));
    fs::remove_all(path);
    BuildHalden(path / "src");
    return path;
  }();
  return root;
}

std::unique_ptr<vxMigrationManager> MakeManager(const fs::path& dst) {
  std::vector<std::string> args = {(Root() / "vxmigrate").string(), "-D1:" + (Root() / "src").string(),
                                    "-D2:" + dst.string(), "-P1:halsuite", "-P2:obx", "-V1:5.5",
                                    "-V2:3.0"};
  std::vector<char*> argv;
  for (std::string& arg : args) argv.push_back(&arg[0]);
  argv.push_back(nullptr);
  return std::make_unique<vxMigrationManager>(static_cast<int>(args.size()), argv.data());
}

enum Step { kWhole, kTemplatesOnly, kProfilesOnly };

void BM_HaldenToOBX(benchmark::State& state) {
  const Step step = static_cast<Step>(state.range(0));
  const fs::path dst = Root() / "dst";
  for (auto _ : state) {
    state.PauseTiming();
    fs::remove_all(dst);
    BuildOBX(dst);
    std::unique_ptr<vxMigrationManager> manager = MakeManager(dst);
    HaldenToOBXHelper helper(manager.get());
    state.ResumeTiming();
    if (step == kWhole) helper.DoHaldenToOBXMigrate();
    if (step == kTemplatesOnly) helper.DoHaldenToOBXTemplateFileMigrate();
    if (step == kProfilesOnly) helper.DoHaldenToOBXProfileFileMigrate();
  }
  const int files = step == kWhole ? kTemplates + kProfiles
                                   : step == kTemplatesOnly ? kTemplates : kProfiles;
  state.counters["files/s"] =
      benchmark::Counter(static_cast<double>(files) * state.iterations(),
                         benchmark::Counter::kIsRate);
  fs::remove_all(dst);
}

BENCHMARK(BM_HaldenToOBX)
    ->ArgName("step")
    ->Arg(kWhole)
    ->Arg(kTemplatesOnly)
    ->Arg(kProfilesOnly)
    ->Unit(benchmark::kMillisecond)
    ->UseRealTime()
    ->Iterations(3);

}  // namespace

int main(int argc, char** argv) {
  benchmark::Initialize(&argc, argv);
  if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 1;
  benchmark::RunSpecifiedBenchmarks();
  benchmark::Shutdown();
  fs::remove_all(Root());
  return 0;
}
