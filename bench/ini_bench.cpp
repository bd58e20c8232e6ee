// Speed of the INI model on big installations: opening, parsing and writing back a 50 MB settings
// file, looking keys up in a 100,000-key section, and merging two 100,000-key files. The input
// files are generated once under /tmp and reused by later runs.

#include <benchmark/benchmark.h>
#include <sys/stat.h>

#include <cstdio>
#include <fstream>
#include <string>
#include <vector>

#include "foundation/inifile/ini_file.h"

namespace {

const char kBigFile[] = "/tmp/vxm_ini_bench_50mb.ini";
const size_t kBigSize = 50u << 20;

size_t FileSize(const std::string& path) {
  struct stat st;
  return stat(path.c_str(), &st) == 0 ? static_cast<size_t>(st.st_size) : 0;
}

// Sections of 200 property lines with a comment, a blank line and mixed spacing, like a large
// profile folder's settings collected into one file.
void MakeBigFile() {
  if (FileSize(kBigFile) >= kBigSize) return;
  std::ofstream out(kBigFile, std::ios::binary | std::ios::trunc);
  size_t written = 0;
  char line[160];
  for (int section = 0; written < kBigSize; ++section) {
    int n = snprintf(line, sizeof line, "; profile %d\n[Profile%d]\n", section, section);
    out.write(line, n);
    written += static_cast<size_t>(n);
    for (int key = 0; key < 200; ++key) {
      n = snprintf(line, sizeof line, key % 3 ? "ReportOption%d=value %d of section %d\n"
                                              : "ReportOption%d = value %d of section %d\n",
                   key, key * 7, section);
      out.write(line, n);
      written += static_cast<size_t>(n);
    }
    out.write("\n", 1);
    ++written;
  }
}

std::string MakeKeyFile(const char* name, int count, int offset) {
  std::string path = std::string("/tmp/vxm_ini_bench_") + name + ".ini";
  if (FileSize(path) > 0) return path;
  std::ofstream out(path, std::ios::binary | std::ios::trunc);
  out << "[Keys]\n";
  for (int i = 0; i < count; ++i) out << "Key" << (i + offset) << "=Value" << (i + offset) << "\n";
  return path;
}

void BM_OpenParseWrite(benchmark::State& state) {
  MakeBigFile();
  vxMappedINIFile ini(kBigFile);
  for (auto _ : state) {
    if (ini.Open(1) != 0 || ini.Close(1) != 0) state.SkipWithError("open or write failed");
  }
  state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * FileSize(kBigFile));
}
BENCHMARK(BM_OpenParseWrite)->Unit(benchmark::kMillisecond);

void BM_OpenParse(benchmark::State& state) {
  MakeBigFile();
  vxMappedINIFile ini(kBigFile);
  for (auto _ : state) {
    if (ini.Open(1) != 0 || ini.Close(0) != 0) state.SkipWithError("open failed");
  }
  state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * FileSize(kBigFile));
}
BENCHMARK(BM_OpenParse)->Unit(benchmark::kMillisecond);

void BM_GetVal100kSection(benchmark::State& state) {
  vxMappedINIFile ini(MakeKeyFile("100k_a", 100000, 0).c_str());
  if (ini.Open(1) != 0) state.SkipWithError("open failed");
  std::vector<vxStringBase> keys;
  for (int i = 0; i < 100000; ++i) keys.emplace_back(("KEY" + std::to_string((i * 7919) % 100000)).c_str());
  const vxStringBase section("keys");
  size_t i = 0;
  for (auto _ : state) {
    benchmark::DoNotOptimize(ini.GetVal(section, keys[i]).length());
    if (++i == keys.size()) i = 0;
  }
  state.SetItemsProcessed(state.iterations());
}
BENCHMARK(BM_GetVal100kSection);

void BM_MergeFrom100kInto100k(benchmark::State& state) {
  std::string a = MakeKeyFile("100k_a", 100000, 0);
  std::string b = MakeKeyFile("100k_b", 100000, 50000);
  for (auto _ : state) {
    state.PauseTiming();
    vxMappedINIFile dst(a.c_str());
    vxMappedINIFile src(b.c_str());
    if (dst.Open(1) != 0 || src.Open(1) != 0) state.SkipWithError("open failed");
    state.ResumeTiming();
    dst.MergeFrom(src);
    state.PauseTiming();
    if (dst.GetPropertyList("Keys")->size() != 150000) state.SkipWithError("wrong merge");
    if (dst.Close(0) != 0 || src.Close(0) != 0) state.SkipWithError("close failed");
    state.ResumeTiming();
  }
}
BENCHMARK(BM_MergeFrom100kInto100k)->Unit(benchmark::kMillisecond);

}  // namespace

BENCHMARK_MAIN();
