// Border copies of a 1920x1080 image into a frame 2 pixels wide on every
// side: zor on each level this machine runs, OpenCV's copyMakeBorder on one
// thread where it was found, and a memcpy of the frame's bytes as the
// bandwidth reference. Bytes per second count the destination's bytes.
#include <benchmark/benchmark.h>

#include <stdlib.h>
#include <string.h>

#include "bench_support.h"

#ifdef ZOR_BENCH_OPENCV
#include <opencv2/core.hpp>
#include <opencv2/imgproc.hpp>
#endif

namespace {

constexpr int kW = 1920, kH = 1080, kB = 2;
constexpr int kDW = kW + 2 * kB, kDH = kH + 2 * kB;

// Contiguous rows, as the OpenCV matrices have them.
struct Buffers {
    void* src;
    void* dst;
    Buffers(size_t elem) {
        src = aligned_alloc(64, (size_t)kW * kH * elem);
        dst = aligned_alloc(64, ((size_t)kDW * kDH * elem + 63) / 64 * 64);
        memset(src, 0x5a, (size_t)kW * kH * elem);
        memset(dst, 0, (size_t)kDW * kDH * elem);
    }
    ~Buffers() {
        free(src);
        free(dst);
    }
};

void replicate_8u(benchmark::State& state, uint64_t select) {
    zorSetCpuFeatures(select);
    Buffers b(1);
    for (auto _ : state) {
        ZorStatus s = zoriCopyReplicateBorder_8u_C1R((const Zor8u*)b.src, kW, {kW, kH},
                                                     (Zor8u*)b.dst, kDW, {kDW, kDH}, kB, kB);
        benchmark::DoNotOptimize(s);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * kDW * kDH);
    zorInit();
}

void const_32f(benchmark::State& state, uint64_t select) {
    zorSetCpuFeatures(select);
    Buffers b(4);
    for (auto _ : state) {
        ZorStatus s =
            zoriCopyConstBorder_32f_C1R((const Zor32f*)b.src, kW * 4, {kW, kH}, (Zor32f*)b.dst,
                                        kDW * 4, {kDW, kDH}, kB, kB, 0.25f);
        benchmark::DoNotOptimize(s);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * kDW * kDH * 4);
    zorInit();
}

void memcpy_frame(benchmark::State& state, size_t elem) {
    Buffers b(elem);
    // The source holds fewer bytes than the frame: copy from a frame-sized block.
    void* from = aligned_alloc(64, ((size_t)kDW * kDH * elem + 63) / 64 * 64);
    memset(from, 0x5a, (size_t)kDW * kDH * elem);
    for (auto _ : state) {
        memcpy(b.dst, from, (size_t)kDW * kDH * elem);
        benchmark::ClobberMemory();
    }
    free(from);
    state.SetBytesProcessed((int64_t)state.iterations() * kDW * kDH * (int64_t)elem);
}

#ifdef ZOR_BENCH_OPENCV
void opencv_border(benchmark::State& state, int type, int border) {
    cv::setNumThreads(1);
    cv::Mat src(kH, kW, type, cv::Scalar(0.25)), dst(kDH, kDW, type);
    for (auto _ : state) {
        cv::copyMakeBorder(src, dst, kB, kB, kB, kB, border, cv::Scalar(0.25));
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * dst.total() * dst.elemSize());
}
#endif

int register_all() {
    zorbench::register_levels("border/replicate_8u/", benchmark::kMicrosecond, replicate_8u);
    zorbench::register_levels("border/const_32f/", benchmark::kMicrosecond, const_32f);
    benchmark::RegisterBenchmark("border/replicate_8u/memcpy", memcpy_frame, (size_t)1)
        ->Unit(benchmark::kMicrosecond);
    benchmark::RegisterBenchmark("border/const_32f/memcpy", memcpy_frame, (size_t)4)
        ->Unit(benchmark::kMicrosecond);
#ifdef ZOR_BENCH_OPENCV
    benchmark::RegisterBenchmark("border/replicate_8u/opencv", opencv_border, CV_8U,
                                 cv::BORDER_REPLICATE)
        ->Unit(benchmark::kMicrosecond);
    benchmark::RegisterBenchmark("border/const_32f/opencv", opencv_border, CV_32F,
                                 cv::BORDER_CONSTANT)
        ->Unit(benchmark::kMicrosecond);
#endif
    return 0;
}

const int registered = register_all();

}  // namespace
