// The two float sorts of the level this processor selects, called by their
// prefixed names, against std::sort. Every iteration sorts fresh random
// data: the copy from a master array is inside the timed loop of all three.
#include <benchmark/benchmark.h>

#include <algorithm>
#include <array>
#include <cstring>
#include <random>
#include <vector>

#include "zor.h"
#include "zor_internal.h"
#include "zor_levels.h"

#define SORT_DECLARE(level, fn) extern "C" decltype(::fn) level##_##fn;
ZOR_LEVEL_NAMES(SORT_DECLARE, zorsSortAscend_32f_I)
ZOR_LEVEL_NAMES(SORT_DECLARE, zorsSortRadixAscend_32f_I)
ZOR_LEVEL_NAMES(SORT_DECLARE, zorsSortRadixGetBufferSize)
#undef SORT_DECLARE
#define SORT_BODY(level, fn) &level##_##fn,
#define SORT_BODIES(fn) (std::array<decltype(&::fn), ZOR_LEVEL_COUNT>{ZOR_LEVEL_NAMES(SORT_BODY, fn)})

namespace {

int selected_level() {
    zorInit();
    return zorJumpIndexForMergedLibs;
}

std::vector<float> master(int n) {
    std::mt19937 gen(42);
    std::uniform_real_distribution<float> d(-1e6f, 1e6f);
    std::vector<float> v(n);
    for (auto& x : v) x = d(gen);
    return v;
}

void quick_sort(benchmark::State& state) {
    const int n = (int)state.range(0);
    const auto body = SORT_BODIES(zorsSortAscend_32f_I)[selected_level()];
    const auto src = master(n);
    std::vector<float> work(n);
    for (auto _ : state) {
        std::memcpy(work.data(), src.data(), n * sizeof(float));
        body(work.data(), n);
        benchmark::ClobberMemory();
    }
    state.SetItemsProcessed((int64_t)state.iterations() * n);
}

void radix_sort(benchmark::State& state) {
    const int n = (int)state.range(0);
    const int level = selected_level();
    const auto body = SORT_BODIES(zorsSortRadixAscend_32f_I)[level];
    int32_t size = 0;
    SORT_BODIES(zorsSortRadixGetBufferSize)[level](n, zor32f, &size);
    std::vector<Zor8u> buffer(size);
    const auto src = master(n);
    std::vector<float> work(n);
    for (auto _ : state) {
        std::memcpy(work.data(), src.data(), n * sizeof(float));
        body(work.data(), n, buffer.data());
        benchmark::ClobberMemory();
    }
    state.SetItemsProcessed((int64_t)state.iterations() * n);
}

void std_sort(benchmark::State& state) {
    const int n = (int)state.range(0);
    const auto src = master(n);
    std::vector<float> work(n);
    for (auto _ : state) {
        std::memcpy(work.data(), src.data(), n * sizeof(float));
        std::sort(work.begin(), work.end());
        benchmark::ClobberMemory();
    }
    state.SetItemsProcessed((int64_t)state.iterations() * n);
}

BENCHMARK(quick_sort)->Arg(100)->Arg(10000)->Arg(1000000);
BENCHMARK(radix_sort)->Arg(100)->Arg(10000)->Arg(1000000);
BENCHMARK(std_sort)->Arg(100)->Arg(10000)->Arg(1000000);

}  // namespace
