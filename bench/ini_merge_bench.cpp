// Merges a generated installation of 2,000 INI files (50 folders of 40 files, each file 8 sections
// of 12 keys) into a destination holding newer versions of every file: side by side, and in place
// from ".vxinibak" backups. Every repetition starts from a fresh copy of the destination; only the
// merge is timed. The trees live in $VXM_BENCH_DIR (default $TMPDIR or /tmp) and are removed.

#include <benchmark/benchmark.h>
#include <stdlib.h>

#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <string>
#include <vector>

#include "migrate/manager.h"

namespace {

const int kFolders = 50;
const int kFilesPerFolder = 40;
const int kSections = 8;
const int kKeys = 12;

std::string g_root;

void Run(const std::string& command) {
  if (std::system(command.c_str()) != 0) {
    fprintf(stderr, "failed: %s\n", command.c_str());
    std::exit(1);
  }
}

// The old file has keys 0..kKeys-1; the new one keeps two thirds of them with other values and
// adds its own, and one section of the old file is gone from the new one.
std::string Settings(bool newer, int seed) {
  std::string text = "; generated settings\n";
  for (int s = 0; s < kSections; ++s) {
    if (newer && s == kSections - 1) break;
    text += "[Section" + std::to_string(s) + "]\n";
    for (int k = 0; k < kKeys; ++k) {
      if (newer && k % 3 == 2) continue;
      text += "Key" + std::to_string(k) + "=" + (newer ? "new" : "old") + std::to_string(seed + k) + "\n";
    }
    if (newer) text += "Added" + std::to_string(s) + "=1\n";
    text += "\n";
  }
  return text;
}

void Write(const std::string& path, const std::string& text) {
  std::ofstream out(path, std::ios::binary);
  out << text;
}

// src/ holds old files, dst_template/ new ones, inplace_template/ both (backups beside new files).
void GenerateTrees() {
  for (int f = 0; f < kFolders; ++f) {
    const std::string folder = "/area" + std::to_string(f % 5) + "/folder" + std::to_string(f);
    Run("mkdir -p '" + g_root + "/src" + folder + "' '" + g_root + "/dst_template" + folder +
        "' '" + g_root + "/inplace_template" + folder + "'");
    for (int i = 0; i < kFilesPerFolder; ++i) {
      const std::string name = folder + "/settings" + std::to_string(i);
      const int seed = f * kFilesPerFolder + i;
      Write(g_root + "/src" + name + ".ini", Settings(false, seed));
      Write(g_root + "/dst_template" + name + ".ini", Settings(true, seed));
      Write(g_root + "/inplace_template" + name + ".vxinibak", Settings(false, seed));
      Write(g_root + "/inplace_template" + name + ".ini", Settings(true, seed));
    }
  }
}

void MergeBench(benchmark::State& state, const char* templateName, bool inPlace) {
  const std::string work = g_root + "/work";
  for (auto _ : state) {
    state.PauseTiming();
    Run("rm -rf '" + work + "' && cp -a '" + g_root + "/" + templateName + "' '" + work + "'");
    const std::string source = inPlace ? work : g_root + "/src";
    std::vector<std::string> args = {"vxmigrate",    "-D1:" + source, "-D2:" + work, "-P1:pavsuite",
                                     "-P2:pavsuite", "-V1:5.0",       "-V2:5.5"};
    std::vector<char*> argv;
    for (std::string& arg : args) argv.push_back(&arg[0]);
    argv.push_back(nullptr);
    vxMigrationManager manager(static_cast<int>(args.size()), argv.data());
    state.ResumeTiming();
    const auto start = std::chrono::steady_clock::now();
    manager.MergeAllINIFiles(vxStringBase::NullStr);
    const std::chrono::duration<double> elapsed = std::chrono::steady_clock::now() - start;
    state.SetIterationTime(elapsed.count());
  }
  state.SetItemsProcessed(state.iterations() * kFolders * kFilesPerFolder);
}

void BM_MergeAllINIFiles(benchmark::State& state) { MergeBench(state, "dst_template", false); }
void BM_MergeAllINIFilesInPlace(benchmark::State& state) {
  MergeBench(state, "inplace_template", true);
}

}  // namespace

BENCHMARK(BM_MergeAllINIFiles)->Iterations(1)->Repetitions(3)->UseManualTime()->Unit(benchmark::kMillisecond);
BENCHMARK(BM_MergeAllINIFilesInPlace)
    ->Iterations(1)->Repetitions(3)->UseManualTime()->Unit(benchmark::kMillisecond);

int main(int argc, char** argv) {
  const char* base = getenv("VXM_BENCH_DIR");
  if (base == nullptr || *base == '\0') base = getenv("TMPDIR");
  std::string pattern = std::string(base != nullptr && *base != '\0' ? base : "/tmp") +
                        "/vxm_ini_bench.XXXXXX";
  if (mkdtemp(&pattern[0]) == nullptr) {
    perror("mkdtemp");
    return 1;
  }
  g_root = pattern;
  GenerateTrees();
  benchmark::Initialize(&argc, argv);
  benchmark::RunSpecifiedBenchmarks();
  benchmark::Shutdown();
  Run("rm -rf '" + g_root + "'");
  return 0;
}
