// What the resize benches share: a 1920x1080 picture resized in one call
// (to 960x540, 1280x720 and 3840x2160 unless a bench names its sizes), 8u
// and 32f (and 8u with three channels where asked), on each level this
// machine runs, beside OpenCV's resize of the matching interpolation on one
// thread where it was found: INTER_LANCZOS4 for Lanczos, INTER_AREA for
// antialiasing. Bytes per second count the destination's bytes.
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

// Not an interpolation: the antialiasing operations (linear kernel).
constexpr int kResizeAntialiasing = -1;

template <int M, int C>
ZorStatus resize_call(const Zor8u* s, int32_t ss, Zor8u* d, int32_t ds, ZoriSize z,
                      const ZoriResizeSpec* r, Zor8u* b) {
    if (M == zoriInterNN) return zoriResizeNearest_8u_C1R(s, ss, d, ds, {0, 0}, z, r, b);
    auto f = M == zoriInterLinear    ? zoriResizeLinear_8u_C1R
             : M == zoriInterCubic   ? zoriResizeCubic_8u_C1R
             : M == zoriInterLanczos ? zoriResizeLanczos_8u_C1R
             : C == 3                ? zoriResizeAntialiasing_8u_C3R
                                     : zoriResizeAntialiasing_8u_C1R;
    return f(s, ss, d, ds, {0, 0}, z, zorBorderRepl, nullptr, r, b);
}
template <int M, int C>
ZorStatus resize_call(const Zor32f* s, int32_t ss, Zor32f* d, int32_t ds, ZoriSize z,
                      const ZoriResizeSpec* r, Zor8u* b) {
    if (M == zoriInterNN) return zoriResizeNearest_32f_C1R(s, ss, d, ds, {0, 0}, z, r, b);
    auto f = M == zoriInterLinear    ? zoriResizeLinear_32f_C1R
             : M == zoriInterCubic   ? zoriResizeCubic_32f_C1R
             : M == zoriInterLanczos ? zoriResizeLanczos_32f_C1R
                                     : zoriResizeAntialiasing_32f_C1R;
    return f(s, ss, d, ds, {0, 0}, z, zorBorderRepl, nullptr, r, b);
}

// Linear 8u runs the fixed-point record; cubic runs (B, C) = (0, 0.5),
// Lanczos three lobes, antialiasing the linear kernel.
template <typename T, int M, int C>
void zor_resize(benchmark::State& state, uint64_t select, ZoriSize dst) {
    zorSetCpuFeatures(select);
    const ZoriSize src{kResizeW, kResizeH};
    const bool aa = M == kResizeAntialiasing;
    int32_t specSize = 0, initSize = 0, bufSize = 0;
    zoriResizeGetSize_8u(src, dst, aa ? zoriInterLinear : (ZoriInterpolationType)M, aa,
                         &specSize, &initSize);
    std::vector<Zor8u> rec((size_t)specSize), init((size_t)initSize + 1);
    ZoriResizeSpec* record = (ZoriResizeSpec*)rec.data();
    if (M == zoriInterNN) zoriResizeNearestInit_8u(src, dst, record);
    if (M == zoriInterLinear)
        (sizeof(T) == 1 ? zoriResizeLinearInit_8u : zoriResizeLinearInit_32f)(src, dst, record);
    if (M == zoriInterCubic) zoriResizeCubicInit_8u(src, dst, 0, 0.5f, record, init.data());
    if (M == zoriInterLanczos) zoriResizeLanczosInit_8u(src, dst, 3, record, init.data());
    if (aa) zoriResizeAntialiasingLinearInit(src, dst, record, init.data());
    zoriResizeGetBufferSize_8u(record, dst, C, &bufSize);
    std::vector<Zor8u> buf((size_t)bufSize);
    T* in = resize_picture<T>((size_t)kResizeW * kResizeH * C);
    T* out = resize_picture<T>((size_t)dst.width * dst.height * C);
    const int32_t ss = kResizeW * C * (int32_t)sizeof(T), ds = dst.width * C * (int32_t)sizeof(T);
    for (auto _ : state) {
        ZorStatus s = resize_call<M, C>(in, ss, out, ds, dst, record, buf.data());
        benchmark::DoNotOptimize(s);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * dst.width * dst.height * C *
                            (int64_t)sizeof(T));
    free(in);
    free(out);
    zorInit();
}

#ifdef ZOR_BENCH_OPENCV
// OpenCV's cubic is the (0, 0.75) member of the family: the same work.
template <typename T, int M, int C> void opencv_resize(benchmark::State& state, ZoriSize dst) {
    cv::setNumThreads(1);
    T* pixels = resize_picture<T>((size_t)kResizeW * kResizeH * C);
    const int type = CV_MAKETYPE(sizeof(T) == 1 ? CV_8U : CV_32F, C);
    const int interp = M == zoriInterNN       ? cv::INTER_NEAREST
                       : M == zoriInterLinear ? cv::INTER_LINEAR
                       : M == zoriInterCubic  ? cv::INTER_CUBIC
                       : M == zoriInterLanczos ? cv::INTER_LANCZOS4
                                               : cv::INTER_AREA;
    cv::Mat src(kResizeH, kResizeW, type, pixels), out(dst.height, dst.width, type);
    for (auto _ : state) {
        cv::resize(src, out, out.size(), 0, 0, interp);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * dst.width * dst.height * C *
                            (int64_t)sizeof(T));
    free(pixels);
}
#endif

// name/type/WxH/zor_<level> and name/type/WxH/opencv.
template <typename T, int M, int C = 1>
void register_resize_type(const std::string& name, const char* type,
                          std::vector<ZoriSize> sizes) {
    for (const ZoriSize dst : sizes) {
        const std::string base = name + "/" + type + "/" + std::to_string(dst.width) + "x" +
                                 std::to_string(dst.height) + "/";
        register_levels(base, benchmark::kMicrosecond, zor_resize<T, M, C>, dst);
#ifdef ZOR_BENCH_OPENCV
        benchmark::RegisterBenchmark((base + "opencv").c_str(), opencv_resize<T, M, C>, dst)
            ->Unit(benchmark::kMicrosecond);
#endif
    }
}

template <int M>
int register_resize(const std::string& name,
                    std::vector<ZoriSize> sizes = {std::begin(kResizeDst), std::end(kResizeDst)}) {
    register_resize_type<Zor8u, M>(name, "8u", sizes);
    register_resize_type<Zor32f, M>(name, "32f", sizes);
    return 0;
}

}  // namespace zorbench

#endif
