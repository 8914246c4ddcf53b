// What the benchmark programs share: one benchmark per level this machine
// runs, named "<base>zor_<level>", each getting the level's selection word
// as its first argument after the state.
#ifndef ZOR_BENCH_SUPPORT_H
#define ZOR_BENCH_SUPPORT_H

#include <benchmark/benchmark.h>

#include <string>
#include <vector>

#include "zor.h"
#include "zor_levels.h"

namespace zorbench {

struct Level {
    const char* name;
    uint64_t select;
};

inline std::vector<Level> runnable_levels() {
    uint64_t features = 0;
    zorGetCpuFeatures(&features, nullptr);
    std::vector<Level> levels;
#define ZORBENCH_LEVEL(index, name, select, need) \
    if ((features & (need)) == (need)) levels.push_back({#name, (uint64_t)(select)});
    ZOR_LEVEL_LIST(ZORBENCH_LEVEL)
#undef ZORBENCH_LEVEL
    return levels;
}

template <typename Fn, typename... Args>
void register_levels(const std::string& base, benchmark::TimeUnit unit, Fn fn, Args... args) {
    for (const Level& level : runnable_levels())
        benchmark::RegisterBenchmark((base + "zor_" + level.name).c_str(), fn, level.select, args...)
            ->Unit(unit);
}

}  // namespace zorbench

#endif
