// The level-private clear of the level this processor selects, called by
// its prefixed name, next to memset and memcpy, at 1 KiB, 256 KiB and
// 64 MiB; and the level's copy with a cache size handed in that makes the
// large copies take their non-temporal way (the public copy takes it only
// where the processor reports its cache). Bytes per second count the bytes
// written (copies: read and written, as in the public vector benchmark).
#include <benchmark/benchmark.h>

#include <array>
#include <cstdlib>
#include <cstring>

#include "zor.h"
#include "zor_internal.h"
#include "zor_levels.h"

#define ZERO_DECLARE(level, fn) extern "C" decltype(::fn) level##_##fn;
ZOR_LEVEL_NAMES(ZERO_DECLARE, zorsZero_32f)
ZOR_LEVEL_NAMES(ZERO_DECLARE, ownsCopy_8u_cache)
#undef ZERO_DECLARE
#define ZERO_BODY(level, fn) &level##_##fn,

namespace {

const std::array<decltype(&::zorsZero_32f), ZOR_LEVEL_COUNT> kZero = {ZOR_LEVEL_NAMES(ZERO_BODY, zorsZero_32f)};

void vector_zero(benchmark::State& state) {
    zorInit();
    const auto body = kZero[zorJumpIndexForMergedLibs];
    const size_t bytes = state.range(0);
    float* d = static_cast<float*>(std::aligned_alloc(64, bytes));
    std::memset(d, 1, bytes);
    for (auto _ : state) {
        body(d, (int32_t)(bytes / sizeof(float)));
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * bytes);
    std::free(d);
}

// 1 MiB of cache: every copy from 4 MiB on is large enough to stream.
void vector_copy_streaming(benchmark::State& state) {
    zorInit();
    const auto body = std::array<decltype(&::ownsCopy_8u_cache), ZOR_LEVEL_COUNT>{
        ZOR_LEVEL_NAMES(ZERO_BODY, ownsCopy_8u_cache)}[zorJumpIndexForMergedLibs];
    const size_t bytes = state.range(0);
    Zor8u* s = static_cast<Zor8u*>(std::aligned_alloc(64, bytes));
    Zor8u* d = static_cast<Zor8u*>(std::aligned_alloc(64, bytes));
    std::memset(s, 1, bytes);
    std::memset(d, 0, bytes);
    for (auto _ : state) {
        body(s, d, bytes, 1 << 20);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * 2 * bytes);
    std::free(s);
    std::free(d);
}

void vector_memset(benchmark::State& state) {
    const size_t bytes = state.range(0);
    char* d = static_cast<char*>(std::aligned_alloc(64, bytes));
    std::memset(d, 1, bytes);
    for (auto _ : state) {
        std::memset(d, 0, bytes);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * bytes);
    std::free(d);
}

void vector_zero_memcpy(benchmark::State& state) {
    const size_t bytes = state.range(0);
    char* s = static_cast<char*>(std::aligned_alloc(64, bytes));
    char* d = static_cast<char*>(std::aligned_alloc(64, bytes));
    std::memset(s, 1, bytes);
    std::memset(d, 0, bytes);
    for (auto _ : state) {
        std::memcpy(d, s, bytes);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * 2 * bytes);
    std::free(s);
    std::free(d);
}

BENCHMARK(vector_zero)->Arg(1 << 10)->Arg(256 << 10)->Arg(64 << 20);
BENCHMARK(vector_memset)->Arg(1 << 10)->Arg(256 << 10)->Arg(64 << 20);
BENCHMARK(vector_copy_streaming)->Arg(1 << 10)->Arg(256 << 10)->Arg(64 << 20);
BENCHMARK(vector_zero_memcpy)->Arg(1 << 10)->Arg(256 << 10)->Arg(64 << 20);

}  // namespace
