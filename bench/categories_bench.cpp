// The categories merge on a large installation: source and destination files of 50,000 profile
// entries each (half of them the same profiles), merged into a fresh copy of the destination file
// in every iteration.

#include <benchmark/benchmark.h>
#include <stdlib.h>
#include <unistd.h>

#include <cstdio>
#include <fstream>
#include <memory>
#include <string>
#include <vector>

#include "bench/bench_files.h"
#include "migrate/manager.h"

namespace {

// categories categories of perCategory entries each; entry numbers start at first.
std::string CategoriesFile(const std::string& folder, int categories, int perCategory, int first) {
  std::string text = "[main]\nNumberOfCategories=" + std::to_string(categories) + "\n";
  for (int c = 1; c <= categories; ++c) text += "Category" + std::to_string(c) + "=Group " + std::to_string(c) + "\n";
  for (int c = 1; c <= categories; ++c) {
    text += "[Group " + std::to_string(c) + "]\nNumberOfProfiles=" + std::to_string(perCategory) + "\n";
    for (int p = 1; p <= perCategory; ++p) {
      int number = first + (c - 1) * perCategory + p;
      text += "Profile" + std::to_string(p) + "=" + folder + "site" + std::to_string(number) +
              "_vxmigrate.wlp\n";
    }
    text += "Expand=1\n";
  }
  return text;
}

void BM_MergeCategories(benchmark::State& state) {
  const int entries = static_cast<int>(state.range(0));
  const int categories = static_cast<int>(state.range(1));
  const int perCategory = entries / categories;
  const std::string root = MakeTempFolder();
  const std::string src = root + "/src", dst = root + "/dst";
  std::system(("mkdir -p " + src + "/profiles " + dst + "/profiles").c_str());
  Write(src + "/profiles/categories.ini",
        CategoriesFile("C:\\Vantix\\profiles\\", categories, perCategory, 0));
  // The destination already lists the second half of the old profiles and as many of its own.
  const std::string destination = CategoriesFile(dst + "/profiles/", categories, perCategory, entries / 2);
  std::vector<std::string> args = {root + "/vxmigrate", "-D1:" + src, "-D2:" + dst, "-P1:pavsuite",
                                    "-P2:pavsuite", "-V1:5.5", "-V2:5.5"};
  std::vector<char*> argv;
  for (std::string& arg : args) argv.push_back(&arg[0]);
  auto manager = std::make_unique<vxMigrationManager>(static_cast<int>(argv.size()), argv.data());
  const std::string exclusions = "demo.wlp,sample.wlp";

  for (auto _ : state) {
    state.PauseTiming();
    Write(dst + "/profiles/categories.ini", destination);
    state.ResumeTiming();
    manager->MergeCategoriesINIFile("profiles", "*.wlp", "wlp", exclusions.c_str(), false);
  }
  state.counters["entries"] = entries;
  manager.reset();
  std::system(("rm -rf " + root).c_str());
}

}  // namespace

BENCHMARK(BM_MergeCategories)
    ->Args({50000, 1})
    ->Args({50000, 50})
    ->Args({5000, 50})
    ->Unit(benchmark::kMillisecond);

BENCHMARK_MAIN();
