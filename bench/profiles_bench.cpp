// The log-profile migration of a large installation: 10,000 profiles with legacy-encoded
// credentials and a home page, copied as marked copies, rewritten and entered in the categories.
// Each iteration starts from an empty destination profile folder.

#include <benchmark/benchmark.h>
#include <stdlib.h>
#include <unistd.h>

#include <fstream>
#include <memory>
#include <string>
#include <vector>

#include "crypt/protected_value.h"
#include "bench/bench_files.h"
#include "migrate/manager.h"

namespace {

std::string Legacy(const std::string& clear) {
  std::vector<char> text(clear.begin(), clear.end());
  text.push_back('\0');
  Obsolete_EncodePasswordOrUserName(text.data());
  return text.data();
}

std::string ProfileName(int n) { return "site" + std::to_string(n) + ".wlp"; }

// range(0): profiles; range(1): 0 migrates all of them, 1 a selection naming every other one.
void BM_DoCopyLogProfiles(benchmark::State& state) {
  const int profiles = static_cast<int>(state.range(0));
  const bool select = state.range(1) != 0;
  const std::string root = MakeTempFolder();
  const std::string src = root + "/src", dst = root + "/dst";
  std::system(("mkdir -p " + src + "/profiles " + dst).c_str());
  std::string categories = "[main]\nNumberOfCategories=1\nCategory1=All\n[All]\nNumberOfProfiles=" +
                           std::to_string(profiles) + "\n";
  std::string selection;
  for (int n = 0; n < profiles; ++n) {
    Write(src + "/profiles/" + ProfileName(n),
          "[Profile]\nName=Site " + std::to_string(n) + "\nHomePageName=reports/site" +
              std::to_string(n) + "/index.htm\nLogFileUsername=" + Legacy("reader") +
              "\nLogFilePassword=" + Legacy("secret" + std::to_string(n)) + "\n[Logs]\nLog1=/var/log/" +
              std::to_string(n) + ".log\n");
    categories += "Profile" + std::to_string(n + 1) + "=C:\\Vantix\\profiles\\" + ProfileName(n) + "\n";
    if (n % 2 == 0) selection += (selection.empty() ? "" : ",") + ProfileName(n);
  }
  Write(src + "/profiles/categories.ini", categories);
  std::vector<std::string> args = {root + "/vxmigrate", "-D1:" + src, "-D2:" + dst, "-P1:pavsuite",
                                    "-P2:pavsuite", "-V1:5.5", "-V2:5.5"};
  if (select) args.push_back("-PFLog:" + selection);
  std::vector<char*> argv;
  for (std::string& arg : args) argv.push_back(&arg[0]);
  auto manager = std::make_unique<vxMigrationManager>(static_cast<int>(argv.size()), argv.data());

  for (auto _ : state) {
    state.PauseTiming();
    std::system(("rm -rf " + dst + "/profiles").c_str());
    state.ResumeTiming();
    manager->DoCopyLogProfiles("profiles", "*.wlp", "wlp", "demo.wlp,sample.wlp");
  }
  state.counters["profiles"] = profiles;
  manager.reset();
  std::system(("rm -rf " + root).c_str());
}

}  // namespace

BENCHMARK(BM_DoCopyLogProfiles)
    ->Args({10000, 0})
    ->Args({10000, 1})
    ->Args({1000, 0})
    ->Unit(benchmark::kMillisecond)
    ->Iterations(3);

BENCHMARK_MAIN();
