// Cost of the public stub: a call by the public name against a direct call
// of the same level's prefixed body, for every level this machine runs.
#include <benchmark/benchmark.h>

#include "zor.h"
#include "zor_levels.h"

#define BENCH_DECLARE(index, name, select, need) \
    extern "C" decltype(zoriGetLibVersion) name##_zoriGetLibVersion;
ZOR_LEVEL_LIST(BENCH_DECLARE)
#undef BENCH_DECLARE

namespace {

uint64_t detected() {
    uint64_t features = 0;
    zorGetCpuFeatures(&features, nullptr);
    return features;
}

void public_stub(benchmark::State& state, uint64_t select) {
    zorSetCpuFeatures(select);
    for (auto _ : state) benchmark::DoNotOptimize(zoriGetLibVersion());
    zorInit();
}

template <decltype(zoriGetLibVersion)* body>
void direct_body(benchmark::State& state) {
    for (auto _ : state) benchmark::DoNotOptimize(body());
}

int register_levels() {
#define BENCH_REGISTER(index, name, select, need)                                              \
    if ((detected() & (need)) == (need)) {                                                     \
        benchmark::RegisterBenchmark("dispatch/public_stub/" #name, public_stub, select);      \
        benchmark::RegisterBenchmark("dispatch/direct_body/" #name,                            \
                                     direct_body<name##_zoriGetLibVersion>);                  \
    }
    ZOR_LEVEL_LIST(BENCH_REGISTER)
#undef BENCH_REGISTER
    return 0;
}

const int registered = register_levels();

}  // namespace
