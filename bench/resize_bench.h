// What the three resize benches share: a 1920x1080 picture resized in one
// call to 960x540, 1280x720 and 3840x2160, 8u and 32f, on each level this
// machine runs, beside OpenCV's resize of the same interpolation on one
// thread where it was found. Bytes per second count the destination's bytes.
#ifndef ZOR_BENCH_RESIZE_H
#define ZOR_BENCH_RESIZE_H

#include <benchmark/benchmark.h>
#include <stdlib.h>

#include <string>
#include <vector>

#include "bench_support.h"

#ifdef ZOR_BENCH_OPENCV
#include <opencv2/core.hpp>
#include <opencv2/imgproc.hpp>
#endif

namespace zorbench {

constexpr int kResizeW = 1920, kResizeH = 1080;
const ZoriSize kResizeDst[] = {{960, 540}, {1280, 720}, {3840, 2160}};

template <typename T> T* resize_picture(size_t n) {
    T* p = (T*)aligned_alloc(64, (n * sizeof(T) + 63) / 64 * 64);
    uint32_t x = 12345;
    for (size_t i = 0; i < n; ++i) {
        x = x * 1103515245u + 12345u;
        p[i] = (T)((x >> 16) & 255);
    }
    return p;
}

template <int M> ZorStatus resize_call(const Zor8u* s, int32_t ss, Zor8u* d, int32_t ds, ZoriSize z,
                                       const ZoriResizeSpec* r, Zor8u* b) {
    if (M == zoriInterNN) return zoriResizeNearest_8u_C1R(s, ss, d, ds, {0, 0}, z, r, b);
    return (M == zoriInterLinear ? zoriResizeLinear_8u_C1R : zoriResizeCubic_8u_C1R)(
        s, ss, d, ds, {0, 0}, z, zorBorderRepl, nullptr, r, b);
}
template <int M> ZorStatus resize_call(const Zor32f* s, int32_t ss, Zor32f* d, int32_t ds,
                                       ZoriSize z, const ZoriResizeSpec* r, Zor8u* b) {
    if (M == zoriInterNN) return zoriResizeNearest_32f_C1R(s, ss, d, ds, {0, 0}, z, r, b);
    return (M == zoriInterLinear ? zoriResizeLinear_32f_C1R : zoriResizeCubic_32f_C1R)(
        s, ss, d, ds, {0, 0}, z, zorBorderRepl, nullptr, r, b);
}

// Linear 8u runs the fixed-point record; cubic runs (B, C) = (0, 0.5).
template <typename T, int M> void zor_resize(benchmark::State& state, uint64_t select, int size) {
    zorSetCpuFeatures(select);
    const ZoriSize src{kResizeW, kResizeH}, dst = kResizeDst[size];
    int32_t specSize = 0, initSize = 0, bufSize = 0;
    zoriResizeGetSize_8u(src, dst, (ZoriInterpolationType)M, 0, &specSize, &initSize);
    std::vector<Zor8u> rec((size_t)specSize), init((size_t)initSize + 1);
    ZoriResizeSpec* record = (ZoriResizeSpec*)rec.data();
    if (M == zoriInterNN) zoriResizeNearestInit_8u(src, dst, record);
    if (M == zoriInterLinear)
        (sizeof(T) == 1 ? zoriResizeLinearInit_8u : zoriResizeLinearInit_32f)(src, dst, record);
    if (M == zoriInterCubic) zoriResizeCubicInit_8u(src, dst, 0, 0.5f, record, init.data());
    zoriResizeGetBufferSize_8u(record, dst, 1, &bufSize);
    std::vector<Zor8u> buf((size_t)bufSize);
    T* in = resize_picture<T>((size_t)kResizeW * kResizeH);
    T* out = resize_picture<T>((size_t)dst.width * dst.height);
    const int32_t ss = kResizeW * (int32_t)sizeof(T), ds = dst.width * (int32_t)sizeof(T);
    for (auto _ : state) {
        ZorStatus s = resize_call<M>(in, ss, out, ds, dst, record, buf.data());
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
// OpenCV's cubic is the (0, 0.75) member of the family: the same work.
template <typename T, int M> void opencv_resize(benchmark::State& state, int size) {
    cv::setNumThreads(1);
    const ZoriSize dst = kResizeDst[size];
    T* pixels = resize_picture<T>((size_t)kResizeW * kResizeH);
    const int type = sizeof(T) == 1 ? CV_8U : CV_32F;
    const int interp = M == zoriInterNN       ? cv::INTER_NEAREST
                       : M == zoriInterLinear ? cv::INTER_LINEAR
                                              : cv::INTER_CUBIC;
    cv::Mat src(kResizeH, kResizeW, type, pixels), out(dst.height, dst.width, type);
    for (auto _ : state) {
        cv::resize(src, out, out.size(), 0, 0, interp);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * dst.width * dst.height *
                            (int64_t)sizeof(T));
    free(pixels);
}
#endif

// name/type/WxH/zor_<level> and name/type/WxH/opencv.
template <typename T, int M> void register_resize_type(const std::string& name, const char* type) {
    for (int size = 0; size < 3; ++size) {
        const std::string base = name + "/" + type + "/" + std::to_string(kResizeDst[size].width) +
                                 "x" + std::to_string(kResizeDst[size].height) + "/";
        register_levels(base, benchmark::kMicrosecond, zor_resize<T, M>, size);
#ifdef ZOR_BENCH_OPENCV
        benchmark::RegisterBenchmark((base + "opencv").c_str(), opencv_resize<T, M>, size)
            ->Unit(benchmark::kMicrosecond);
#endif
    }
}

template <int M> int register_resize(const std::string& name) {
    register_resize_type<Zor8u, M>(name, "8u");
    register_resize_type<Zor32f, M>(name, "32f");
    return 0;
}

}  // namespace zorbench

#endif
