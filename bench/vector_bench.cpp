// Element-wise vector operations through the public library on the level it
// selects, next to memcpy, at 1 KiB, 256 KiB and 64 MiB per vector. Bytes
// per second count every byte read and written (Add: two vectors in, one
// out; Copy, MulC and memcpy: one in, one out), so the four rates compare
// as memory traffic.
#include <benchmark/benchmark.h>

#include <cstdlib>
#include <cstring>

#include "zor.h"

namespace {

float* make_floats(size_t n, float start) {
    float* p = static_cast<float*>(std::aligned_alloc(64, (n * sizeof(float) + 63) / 64 * 64));
    for (size_t i = 0; i < n; ++i) p[i] = start + (float)(i % 1000) * 0.25f;
    return p;
}

void vector_add(benchmark::State& state) {
    const size_t n = state.range(0) / sizeof(float);
    float *a = make_floats(n, 1), *b = make_floats(n, 2), *d = make_floats(n, 0);
    for (auto _ : state) {
        zorsAdd_32f(a, b, d, (int32_t)n);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * 3 * n * sizeof(float));
    std::free(a), std::free(b), std::free(d);
}

void vector_copy(benchmark::State& state) {
    const size_t n = state.range(0) / sizeof(float);
    float *a = make_floats(n, 1), *d = make_floats(n, 0);
    for (auto _ : state) {
        zorsCopy_32f(a, d, (int32_t)n);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * 2 * n * sizeof(float));
    std::free(a), std::free(d);
}

void vector_mulc(benchmark::State& state) {
    const size_t n = state.range(0) / sizeof(float);
    float *a = make_floats(n, 1), *d = make_floats(n, 0);
    for (auto _ : state) {
        zorsMulC_32f(a, d, (int32_t)n, 1.5f);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * 2 * n * sizeof(float));
    std::free(a), std::free(d);
}

void vector_memcpy(benchmark::State& state) {
    const size_t bytes = state.range(0);
    float *a = make_floats(bytes / 4, 1), *d = make_floats(bytes / 4, 0);
    for (auto _ : state) {
        std::memcpy(d, a, bytes);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * 2 * bytes);
    std::free(a), std::free(d);
}

#define SIZES Arg(1 << 10)->Arg(256 << 10)->Arg(64 << 20)
BENCHMARK(vector_add)->SIZES;
BENCHMARK(vector_copy)->SIZES;
BENCHMARK(vector_mulc)->SIZES;
BENCHMARK(vector_memcpy)->SIZES;
#undef SIZES

}  // namespace
