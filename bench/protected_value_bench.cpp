// Speed of making and reading protected values of password-sized lengths. Each call sets up the
// Twofish key schedule afresh, as the exported functions do, so these figures are mostly that cost.

#include <benchmark/benchmark.h>

#include <string>
#include <vector>

#include "crypt/protected_value.h"

namespace {

std::string ValueOf(benchmark::State& state) {
  return std::string(static_cast<std::size_t>(state.range(0)), 'v');
}

void BM_Encrypt(benchmark::State& state) {
  std::string value = ValueOf(state);
  std::vector<char> stored(5 + 32 * ((value.size() + 3) / 16 + 1));
  for (auto _ : state) {
    int ok = VXUI_Encrypt(reinterpret_cast<unsigned char*>(&value[0]), value.size(), stored.data());
    benchmark::DoNotOptimize(ok);
    benchmark::DoNotOptimize(stored.data());
  }
  state.SetItemsProcessed(state.iterations());
}

void BM_Decrypt(benchmark::State& state) {
  std::string value = ValueOf(state);
  std::vector<char> stored(5 + 32 * ((value.size() + 3) / 16 + 1));
  VXUI_Encrypt(reinterpret_cast<unsigned char*>(&value[0]), value.size(), stored.data());
  std::vector<unsigned char> clear(value.size() + 1);
  for (auto _ : state) {
    unsigned long length = clear.size();
    int ok = VXUI_Decrypt(stored.data(), clear.data(), &length, nullptr);
    benchmark::DoNotOptimize(ok);
    benchmark::DoNotOptimize(clear.data());
  }
  state.SetItemsProcessed(state.iterations());
}

BENCHMARK(BM_Encrypt)->Arg(8)->Arg(32)->Arg(200);
BENCHMARK(BM_Decrypt)->Arg(8)->Arg(32)->Arg(200);

}  // namespace

BENCHMARK_MAIN();
