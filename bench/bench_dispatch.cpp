// Cost of the public stub: a call by the public name against a direct call
// of the selected level's body.
#include <benchmark/benchmark.h>

#include "zor.h"
#include "zor_levels.h"

#define BENCH_DECLARE(index, name, select, need) \
    extern "C" decltype(zoriGetLibVersion) name##_zoriGetLibVersion;
ZOR_LEVEL_LIST(BENCH_DECLARE)
#undef BENCH_DECLARE

namespace {

using VersionFn = const ZorLibraryVersion* (*)();

VersionFn selected_body() {
#define BENCH_BODY(index, name, select, need) name##_zoriGetLibVersion,
    static const VersionFn bodies[] = {ZOR_LEVEL_LIST(BENCH_BODY)};
#undef BENCH_BODY
    return bodies[zorJumpIndexForMergedLibs];
}

void BM_PublicStub(benchmark::State& state) {
    for (auto _ : state) benchmark::DoNotOptimize(zoriGetLibVersion());
    state.SetLabel(zoriGetLibVersion()->targetCode);
}
BENCHMARK(BM_PublicStub);

void BM_DirectBody(benchmark::State& state) {
    // Through a volatile pointer, so the call stays an indirect call as well.
    VersionFn volatile body = selected_body();
    for (auto _ : state) benchmark::DoNotOptimize(body());
    state.SetLabel(zoriGetLibVersion()->targetCode);
}
BENCHMARK(BM_DirectBody);


}  // namespace
