// Reductions through the public library on the level it selects: the sum in
// both forms and the real dot product, at 1 KiB, 256 KiB and 64 MiB of data
// read, next to memcpy and a plain read over the same amounts as bandwidth
// references.
#include <benchmark/benchmark.h>

#include <cstdlib>
#include <cstring>
#include <random>

#include "zor.h"

namespace {

// Aligned, filled with values that keep the sums finite and normal.
float* make_floats(size_t n, uint32_t seed) {
    float* p = static_cast<float*>(std::aligned_alloc(64, (n * sizeof(float) + 63) / 64 * 64));
    std::mt19937 gen(seed);
    std::uniform_real_distribution<float> d(-1.0f, 1.0f);
    for (size_t i = 0; i < n; ++i) p[i] = d(gen);
    return p;
}

void sum(benchmark::State& state, int hint) {
    const size_t bytes = state.range(0);
    const int32_t n = (int32_t)(bytes / sizeof(float));
    float* src = make_floats(n, 1);
    float s = 0;
    for (auto _ : state) {
        zorsSum_32f(src, n, &s, hint);
        benchmark::DoNotOptimize(s);
    }
    state.SetBytesProcessed((int64_t)state.iterations() * n * sizeof(float));
    std::free(src);
}

// Both vectors together make up the amount read.
void dot_prod(benchmark::State& state) {
    const size_t bytes = state.range(0);
    const int32_t n = (int32_t)(bytes / (2 * sizeof(float)));
    float* a = make_floats(n, 2);
    float* b = make_floats(n, 3);
    float d = 0;
    for (auto _ : state) {
        zorsDotProd_32f(a, b, n, &d);
        benchmark::DoNotOptimize(d);
    }
    state.SetBytesProcessed((int64_t)state.iterations() * 2 * n * sizeof(float));
    std::free(a);
    std::free(b);
}

// Bytes read, as for the operations above (memcpy writes as many again).
void reference_memcpy(benchmark::State& state) {
    const size_t bytes = state.range(0);
    char* src = static_cast<char*>(std::aligned_alloc(64, bytes));
    char* dst = static_cast<char*>(std::aligned_alloc(64, bytes));
    std::memset(src, 1, bytes);
    std::memset(dst, 0, bytes);
    for (auto _ : state) {
        std::memcpy(dst, src, bytes);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * bytes);
    std::free(src);
    std::free(dst);
}

// A plain read: loads into four independent OR chains, in the widest
// registers the processor has (on some machines only the widest loads
// reach full memory bandwidth).
template <typename V>
__attribute__((always_inline)) inline void read_all(const char* src, size_t bytes) {
    const V* v = reinterpret_cast<const V*>(src);
    const size_t n = bytes / sizeof(V);
    V a = {}, b = {}, c = {}, d = {};
    for (size_t i = 0; i < n; i += 4) {
        a |= v[i];
        b |= v[i + 1];
        c |= v[i + 2];
        d |= v[i + 3];
    }
    V r = (a | b) | (c | d);
    benchmark::DoNotOptimize(r);
}

typedef uint64_t Read16 __attribute__((vector_size(16)));
typedef uint64_t Read32 __attribute__((vector_size(32)));
typedef uint64_t Read64 __attribute__((vector_size(64)));

__attribute__((target("avx2"))) void read_avx2(const char* src, size_t bytes) {
    read_all<Read32>(src, bytes);
}

__attribute__((target("avx512f"))) void read_avx512(const char* src, size_t bytes) {
    read_all<Read64>(src, bytes);
}

void reference_read(benchmark::State& state) {
    const size_t bytes = state.range(0);
    char* src = static_cast<char*>(std::aligned_alloc(64, bytes));
    std::memset(src, 1, bytes);
    const int width = __builtin_cpu_supports("avx512f") ? 64 : __builtin_cpu_supports("avx2") ? 32 : 16;
    for (auto _ : state) {
        if (width == 64) {
            read_avx512(src, bytes);
        } else if (width == 32) {
            read_avx2(src, bytes);
        } else {
            read_all<Read16>(src, bytes);
        }
    }
    state.SetBytesProcessed((int64_t)state.iterations() * bytes);
    std::free(src);
}

void sizes(benchmark::internal::Benchmark* b) {
    b->Arg(1 << 10)->Arg(256 << 10)->Arg(64 << 20);
}

BENCHMARK_CAPTURE(sum, accurate, 0)->Apply(sizes);
BENCHMARK_CAPTURE(sum, fast, 1)->Apply(sizes);
BENCHMARK(dot_prod)->Apply(sizes);
BENCHMARK(reference_memcpy)->Apply(sizes);
BENCHMARK(reference_read)->Apply(sizes);

}  // namespace
