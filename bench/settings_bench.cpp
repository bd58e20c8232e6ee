// Settings merges on installations grown over years: data files, advanced-option files and
// keyword files of 10,000 and 100,000 entries (and more) on each side, half of the old entries
// already in the new file. The time per merge should grow about linearly with the entries.

#include <benchmark/benchmark.h>
#include <stdlib.h>

#include <filesystem>
#include <fstream>
#include <memory>
#include <string>
#include <vector>

#include "foundation/inifile/ini_file.h"
#include "migrate/manager.h"

namespace {

// Two installation folders in a fresh temporary folder and a manager over them.
class Installations {
 public:
  Installations() {
    std::string pattern = (std::filesystem::temp_directory_path() / "vxsettingsbench.XXXXXX").string();
    root_ = mkdtemp(&pattern[0]) != nullptr ? pattern : std::string();
    std::filesystem::create_directories(root_ + "/src");
    std::filesystem::create_directories(root_ + "/dst");
    std::vector<std::string> args = {root_ + "/vxmigrate", "-D1:" + root_ + "/src",
                                     "-D2:" + root_ + "/dst", "-P1:pavsuite", "-P2:pavsuite",
                                     "-V1:5.0", "-V2:5.5"};
    std::vector<char*> argv;
    for (std::string& arg : args) argv.push_back(&arg[0]);
    manager_ = std::make_unique<vxMigrationManager>(static_cast<int>(argv.size()), argv.data());
  }
  ~Installations() {
    manager_.reset();
    std::error_code ignored;
    std::filesystem::remove_all(root_, ignored);
  }

  vxMigrationManager& manager() { return *manager_; }
  std::string Path(const std::string& relative) const { return root_ + "/" + relative; }

  void Write(const std::string& relative, const std::string& text) {
    std::filesystem::path path(root_ + "/" + relative);
    std::filesystem::create_directories(path.parent_path());
    std::ofstream(path, std::ios::binary | std::ios::trunc) << text;
  }

 private:
  std::string root_;
  std::unique_ptr<vxMigrationManager> manager_;
};

// Old records: the even ones are prefixes of new lines (already there), the odd ones are new.
void BM_DataFileMerge(benchmark::State& state) {
  const long n = state.range(0);
  std::string destination;
  std::string source;
  for (long i = 0; i < n; ++i) {
    destination += "host" + std::to_string(i) + ".example.com,Robot " + std::to_string(i) + ",1\n";
    source += i % 2 == 0 ? "host" + std::to_string(i) + ".example.com,Robot " + std::to_string(i)
                         : "crawler" + std::to_string(i) + ".example.net,Spider,2";
    source += "\r\n";
  }
  Installations installations;
  installations.Write("src/spiders.txt", source);
  for (auto _ : state) {
    state.PauseTiming();
    installations.Write("dst/spiders.txt", destination);
    state.ResumeTiming();
    if (installations.manager().DoMergeCSVFile("spiders.txt", "spiders.txt") != 0) {
      state.SkipWithError("merge failed");
    }
  }
  state.SetItemsProcessed(state.iterations() * n * 2);
}
BENCHMARK(BM_DataFileMerge)->Arg(10000)->Arg(100000)->Arg(1000000)->Unit(benchmark::kMillisecond);

std::string AdvancedOptions(long count, long firstName) {
  std::string text = "[Default]\ncontentgroupprofileCount=" + std::to_string(count) + "\n";
  for (long i = 0; i < count; ++i) {
    text += "[contentgroupprofile" + std::to_string(i) + "]\nprofilename=Group " +
            std::to_string(firstName + i) + "\npattern=/area" + std::to_string(i) +
            "/*\nenabled=1\n";
  }
  return text;
}

// Half of the old entries carry names the new file has.
void BM_AdvancedOptionsMerge(benchmark::State& state) {
  const long n = state.range(0);
  const char kFile[] = "/vxm_vxx/datfiles/contentgroups/default.ini";
  Installations installations;
  installations.Write(std::string("src") + kFile, AdvancedOptions(n, n / 2));
  const std::string destination = AdvancedOptions(n, 0);
  for (auto _ : state) {
    state.PauseTiming();
    installations.Write(std::string("dst") + kFile, destination);
    state.ResumeTiming();
    if (installations.manager().MergeAdvancedOptionsFiles(kFile, kFile, "contentgroupprofile") != 0) {
      state.SkipWithError("merge failed");
    }
  }
  state.SetItemsProcessed(state.iterations() * n * 2);
}
// The same files read and written back unchanged, without merging: the INI model's share of
// the merge above.
void BM_AdvancedOptionsFilesOnly(benchmark::State& state) {
  const long n = state.range(0);
  const char kFile[] = "/vxm_vxx/datfiles/contentgroups/default.ini";
  Installations installations;
  installations.Write(std::string("src") + kFile, AdvancedOptions(n, n / 2));
  installations.Write(std::string("dst") + kFile, AdvancedOptions(n, 0));
  for (auto _ : state) {
    vxMappedINIFile source(installations.Path(std::string("src") + kFile).c_str());
    vxMappedINIFile destination(installations.Path(std::string("dst") + kFile).c_str());
    if (source.Open(0) != 0 || destination.Open(1) != 0) state.SkipWithError("open failed");
    if (source.Close(0) != 0 || destination.Close(1) != 0) state.SkipWithError("write failed");
  }
  state.SetItemsProcessed(state.iterations() * n * 2);
}
BENCHMARK(BM_AdvancedOptionsFilesOnly)->Arg(10000)->Arg(20000)->Arg(100000)->Unit(benchmark::kMillisecond);

BENCHMARK(BM_AdvancedOptionsMerge)->Arg(10000)->Arg(20000)->Arg(100000)->Unit(benchmark::kMillisecond);

std::string Keywords(long count, long firstName) {
  std::string list = "[SearchEngines]\n";
  std::string sections;
  for (long i = 0; i < count; ++i) {
    const std::string name = "Engine" + std::to_string(firstName + i);
    list += "Engine" + std::to_string(i + 1) + "=" + name + "\n";
    sections += "[" + name + "]\nDomain=" + name + ".com\nQuery=q\n";
  }
  return list + sections;
}

void BM_KeywordMerge(benchmark::State& state) {
  const long n = state.range(0);
  Installations installations;
  installations.Write("src/keywords.ini", Keywords(n, n / 2));
  const std::string destination = Keywords(n, 0);
  for (auto _ : state) {
    state.PauseTiming();
    installations.Write("dst/keywords.ini", destination);
    state.ResumeTiming();
    if (installations.manager().DoKeywordINIMerge() != 0) state.SkipWithError("merge failed");
  }
  state.SetItemsProcessed(state.iterations() * n * 2);
}
BENCHMARK(BM_KeywordMerge)->Arg(10000)->Arg(100000)->Unit(benchmark::kMillisecond);

}  // namespace

BENCHMARK_MAIN();
