// Linear resize of a 1920x1080 image to 960x540, 1280x720 and 3840x2160 in
// one tile: 8u with the fixed-point record and 32f, on each level this
// machine runs, beside OpenCV's resize (INTER_LINEAR, one thread) where it
// was found. Bytes per second count the destination's bytes.
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

template <typename T> T* picture(int w, int h) {
    T* p = (T*)aligned_alloc(64, (size_t)w * h * sizeof(T));
    uint32_t x = 12345;
    for (size_t i = 0; i < (size_t)w * h; ++i) {
        x = x * 1103515245u + 12345u;
        p[i] = (T)((x >> 16) & 255);
    }
    return p;
}

template <typename T> void zor_linear(benchmark::State& state, uint64_t select, int size) {
    zorSetCpuFeatures(select);
    const ZoriSize src{kW, kH}, dst = kDst[size];
    int32_t specSize = 0, initSize = 0, bufSize = 0;
    zoriResizeGetSize_8u(src, dst, zoriInterLinear, 0, &specSize, &initSize);
    std::vector<Zor8u> rec((size_t)specSize);
    ZoriResizeSpec* record = (ZoriResizeSpec*)rec.data();
    if (sizeof(T) == 1)
        zoriResizeLinearInit_8u(src, dst, record);
    else
        zoriResizeLinearInit_32f(src, dst, record);
    zoriResizeGetBufferSize_8u(record, dst, 1, &bufSize);
    std::vector<Zor8u> buf((size_t)bufSize);
    T* in = picture<T>(kW, kH);
    T* out = picture<T>(dst.width, dst.height);
    const int32_t ss = kW * (int32_t)sizeof(T), ds = dst.width * (int32_t)sizeof(T);
    for (auto _ : state) {
        ZorStatus s;
        if constexpr (sizeof(T) == 1)
            s = zoriResizeLinear_8u_C1R(in, ss, out, ds, {0, 0}, dst, zorBorderRepl, nullptr, record,
                                        buf.data());
        else
            s = zoriResizeLinear_32f_C1R(in, ss, out, ds, {0, 0}, dst, zorBorderRepl, nullptr,
                                         record, buf.data());
        benchmark::DoNotOptimize(s);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * dst.width * dst.height *
                            (int64_t)sizeof(T));
    free(in);
    free(out);
    zorInit();
}

#ifdef ZOR_BENCH_OPENCV
template <typename T> void opencv_linear(benchmark::State& state, int size) {
    cv::setNumThreads(1);
    const ZoriSize dst = kDst[size];
    T* pixels = picture<T>(kW, kH);
    const int type = sizeof(T) == 1 ? CV_8U : CV_32F;
    cv::Mat src(kH, kW, type, pixels), out(dst.height, dst.width, type);
    for (auto _ : state) {
        cv::resize(src, out, out.size(), 0, 0, cv::INTER_LINEAR);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * dst.width * dst.height *
                            (int64_t)sizeof(T));
    free(pixels);
}
#endif

int register_all() {
    for (int size = 0; size < 3; ++size)
        for (int f = 0; f < 2; ++f) {
            const std::string base = std::string("resize_linear/") + (f ? "32f/" : "8u/") +
                                     std::to_string(kDst[size].width) + "x" +
                                     std::to_string(kDst[size].height) + "/";
            if (f)
                zorbench::register_levels(base, benchmark::kMicrosecond, zor_linear<Zor32f>, size);
            else
                zorbench::register_levels(base, benchmark::kMicrosecond, zor_linear<Zor8u>, size);
#ifdef ZOR_BENCH_OPENCV
            benchmark::RegisterBenchmark((base + "opencv").c_str(),
                                         f ? opencv_linear<Zor32f> : opencv_linear<Zor8u>, size)
                ->Unit(benchmark::kMicrosecond);
#endif
        }
    return 0;
}

const int registered = register_all();

}  // namespace
