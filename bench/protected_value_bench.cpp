// Speed of making and reading protected values of password-sized lengths, and of turning a
// legacy-encoded value into clear text in one step against the encrypt-then-decrypt way. The key
// schedule is built on the first call and reused, so these figures are the per-value work.

#include <benchmark/benchmark.h>

#include <string>
#include <vector>

#include "crypt/protected_value.h"
#include "crypt/value_conversion.h"
#include "foundation/string/string_base.h"

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

// A legacy-encoded value of state.range(0) bytes to clear text: through the protected form
// (range(1) == 0) or straight (range(1) == 1).
void BM_LegacyToClearText(benchmark::State& state) {
  std::string legacy = ValueOf(state);
  Obsolete_EncodePasswordOrUserName(&legacy[0]);
  const bool straight = state.range(1) == 1;
  for (auto _ : state) {
    vxStringBase value(legacy.c_str());
    if (straight) {
      ConvertToClearText(value);
    } else {
      ConvertToProtectedValue(value);
      DecryptToClearText(value);
    }
    benchmark::DoNotOptimize(value.c_str());
  }
  state.SetItemsProcessed(state.iterations());
}

BENCHMARK(BM_Encrypt)->Arg(8)->Arg(32)->Arg(200);
BENCHMARK(BM_Decrypt)->Arg(8)->Arg(32)->Arg(200);
BENCHMARK(BM_LegacyToClearText)->Args({8, 0})->Args({8, 1})->Args({32, 0})->Args({32, 1});

}  // namespace

BENCHMARK_MAIN();
