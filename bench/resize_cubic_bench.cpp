// Cubic resize of a 1920x1080 image to 960x540, 1280x720 and 3840x2160,
// 8u and 32f, one call for the whole destination with a replicated border,
// on each level this machine runs, beside OpenCV's INTER_CUBIC on one
// thread. zor runs (B, C) = (0, 0.5); OpenCV's cubic is the (0, 0.75)
// member of the family: the same work, other weights. Bytes per second
// count the destination's bytes.
#include <benchmark/benchmark.h>

#include <stdlib.h>

#include <string>
#include <vector>

#include "bench_support.h"

#ifdef ZOR_BENCH_OPENCV
#include <opencv2/core.hpp>
#include <opencv2/imgproc.hpp>
#endif

namespace {

constexpr int kW = 1920, kH = 1080;
const ZoriSize kDst[] = {{960, 540}, {1280, 720}, {3840, 2160}};

template <typename T> T* picture(size_t n) {
    T* p = (T*)aligned_alloc(64, (n * sizeof(T) + 63) / 64 * 64);
    uint32_t x = 12345;
    for (size_t i = 0; i < n; ++i) {
        x = x * 1103515245u + 12345u;
        p[i] = (T)((x >> 16) & 255);
    }
    return p;
}

ZorStatus run(const Zor8u* s, Zor8u* d, ZoriSize z, const ZoriResizeSpec* r, Zor8u* b) {
    return zoriResizeCubic_8u_C1R(s, kW, d, z.width, {0, 0}, z, zorBorderRepl, nullptr, r, b);
}
ZorStatus run(const Zor32f* s, Zor32f* d, ZoriSize z, const ZoriResizeSpec* r, Zor8u* b) {
    return zoriResizeCubic_32f_C1R(s, kW * 4, d, z.width * 4, {0, 0}, z, zorBorderRepl, nullptr,
                                   r, b);
}

template <typename T> void zor_cubic(benchmark::State& state, uint64_t select, int size) {
    zorSetCpuFeatures(select);
    const ZoriSize dst = kDst[size];
    int32_t specSize = 0, initSize = 0, bufSize = 0;
    zoriResizeGetSize_8u({kW, kH}, dst, zoriInterCubic, 0, &specSize, &initSize);
    std::vector<Zor8u> rec((size_t)specSize), init((size_t)initSize);
    const ZoriResizeSpec* record = (const ZoriResizeSpec*)rec.data();
    zoriResizeCubicInit_8u({kW, kH}, dst, 0, 0.5f, (ZoriResizeSpec*)rec.data(), init.data());
    zoriResizeGetBufferSize_8u(record, dst, 1, &bufSize);
    std::vector<Zor8u> buf((size_t)bufSize);
    T* src = picture<T>((size_t)kW * kH);
    T* out = picture<T>((size_t)dst.width * dst.height);
    for (auto _ : state) {
        ZorStatus s = run(src, out, dst, record, buf.data());
        benchmark::DoNotOptimize(s);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * dst.width * dst.height *
                            (int64_t)sizeof(T));
    free(src);
    free(out);
    zorInit();
}

#ifdef ZOR_BENCH_OPENCV
template <typename T> void opencv_cubic(benchmark::State& state, int size) {
    cv::setNumThreads(1);
    const ZoriSize dst = kDst[size];
    T* pixels = picture<T>((size_t)kW * kH);
    const int type = sizeof(T) == 1 ? CV_8U : CV_32F;
    cv::Mat src(kH, kW, type, pixels), out(dst.height, dst.width, type);
    for (auto _ : state) {
        cv::resize(src, out, out.size(), 0, 0, cv::INTER_CUBIC);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * dst.width * dst.height *
                            (int64_t)sizeof(T));
    free(pixels);
}
#endif

template <typename T> void register_type(const char* type) {
    for (int size = 0; size < 3; ++size) {
        const std::string base = std::string("resize_cubic/") + type + "/" +
                                 std::to_string(kDst[size].width) + "x" +
                                 std::to_string(kDst[size].height) + "/";
        zorbench::register_levels(base, benchmark::kMicrosecond, zor_cubic<T>, size);
#ifdef ZOR_BENCH_OPENCV
        benchmark::RegisterBenchmark((base + "opencv").c_str(), opencv_cubic<T>, size)
            ->Unit(benchmark::kMicrosecond);
#endif
    }
}

int register_all() {
    register_type<Zor8u>("8u");
    register_type<Zor32f>("32f");
    return 0;
}

const int registered = register_all();

}  // namespace
