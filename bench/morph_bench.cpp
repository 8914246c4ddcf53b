// Erosion and dilation of a 1920x1080 image with a replicated border: 3x3
// and 5x5 rectangles, a 5x5 cross and the 7x7 disc, 8u and 32f, on each
// level this machine runs, beside OpenCV's erode and dilate on one thread
// where it was found. Bytes per second count the destination's bytes.
#include <benchmark/benchmark.h>

#include <stdlib.h>
#include <string.h>

#include <vector>

#include "bench_support.h"

#ifdef ZOR_BENCH_OPENCV
#include <opencv2/core.hpp>
#include <opencv2/imgproc.hpp>
#endif

namespace {

constexpr int kW = 1920, kH = 1080;

struct Shape {
    const char* name;
    int w, h;
    const char* rows;  // null: full rectangle
};

const Shape kShapes[] = {
    {"rect3x3", 3, 3, nullptr},
    {"rect5x5", 5, 5, nullptr},
    {"cross5x5", 5, 5, "0010000100111110010000100"},
    {"disc7x7", 7, 7, "0001000011111001111101111111011111001111100001000"},
};

std::vector<Zor8u> cells(const Shape& s) {
    std::vector<Zor8u> m((size_t)s.w * s.h, 1);
    if (s.rows)
        for (size_t i = 0; i < m.size(); ++i) m[i] = s.rows[i] == '1';
    return m;
}

// Contiguous rows with a varied picture, as the OpenCV matrices have them.
template <typename T> T* picture() {
    T* p = (T*)aligned_alloc(64, (size_t)kW * kH * sizeof(T));
    uint32_t x = 12345;
    for (size_t i = 0; i < (size_t)kW * kH; ++i) {
        x = x * 1103515245u + 12345u;
        p[i] = (T)((x >> 16) & 255);
    }
    return p;
}

template <typename T> struct Ops;
template <> struct Ops<Zor8u> {
    static ZorStatus size(ZoriSize r, ZoriSize m, int32_t* s, int32_t* b) {
        return zoriMorphologyBorderGetSize_8u_C1R(r, m, s, b);
    }
    static ZorStatus init(ZoriSize r, const Zor8u* m, ZoriSize ms, ZoriMorphState* s, Zor8u* b) {
        return zoriMorphologyBorderInit_8u_C1R(r, m, ms, s, b);
    }
    static ZorStatus run(bool erode, const Zor8u* s, Zor8u* d, const ZoriMorphState* st,
                         Zor8u* b) {
        return erode ? zoriErodeBorder_8u_C1R(s, kW, d, kW, {kW, kH}, 1, 0, st, b)
                     : zoriDilateBorder_8u_C1R(s, kW, d, kW, {kW, kH}, 1, 0, st, b);
    }
};
template <> struct Ops<Zor32f> {
    static ZorStatus size(ZoriSize r, ZoriSize m, int32_t* s, int32_t* b) {
        return zoriMorphologyBorderGetSize_32f_C1R(r, m, s, b);
    }
    static ZorStatus init(ZoriSize r, const Zor8u* m, ZoriSize ms, ZoriMorphState* s, Zor8u* b) {
        return zoriMorphologyBorderInit_32f_C1R(r, m, ms, s, b);
    }
    static ZorStatus run(bool erode, const Zor32f* s, Zor32f* d, const ZoriMorphState* st,
                         Zor8u* b) {
        return erode ? zoriErodeBorder_32f_C1R(s, kW * 4, d, kW * 4, {kW, kH}, 1, 0, st, b)
                     : zoriDilateBorder_32f_C1R(s, kW * 4, d, kW * 4, {kW, kH}, 1, 0, st, b);
    }
};

template <typename T>
void zor_morph(benchmark::State& state, uint64_t select, int shape, bool erode) {
    zorSetCpuFeatures(select);
    const Shape& sh = kShapes[shape];
    const std::vector<Zor8u> mask = cells(sh);
    int32_t specSize = 0, bufSize = 0;
    Ops<T>::size({kW, kH}, {sh.w, sh.h}, &specSize, &bufSize);
    std::vector<Zor8u> rec(specSize), buf(bufSize);
    Ops<T>::init({kW, kH}, mask.data(), {sh.w, sh.h}, (ZoriMorphState*)rec.data(), buf.data());
    T* src = picture<T>();
    T* dst = (T*)aligned_alloc(64, (size_t)kW * kH * sizeof(T));
    for (auto _ : state) {
        ZorStatus s = Ops<T>::run(erode, src, dst, (const ZoriMorphState*)rec.data(), buf.data());
        benchmark::DoNotOptimize(s);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * kW * kH * (int64_t)sizeof(T));
    free(src);
    free(dst);
    zorInit();
}

#ifdef ZOR_BENCH_OPENCV
template <typename T> void opencv_morph(benchmark::State& state, int shape, bool erode) {
    cv::setNumThreads(1);
    const Shape& sh = kShapes[shape];
    const std::vector<Zor8u> mask = cells(sh);
    cv::Mat kernel(sh.h, sh.w, CV_8U, (void*)mask.data());
    T* pixels = picture<T>();
    const int type = sizeof(T) == 1 ? CV_8U : CV_32F;
    cv::Mat src(kH, kW, type, pixels), dst(kH, kW, type);
    for (auto _ : state) {
        if (erode)
            cv::erode(src, dst, kernel, cv::Point(-1, -1), 1, cv::BORDER_REPLICATE);
        else
            cv::dilate(src, dst, kernel, cv::Point(-1, -1), 1, cv::BORDER_REPLICATE);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * kW * kH * (int64_t)sizeof(T));
    free(pixels);
}
#endif

int register_all() {
    for (int shape = 0; shape < 4; ++shape)
        for (int erode = 1; erode >= 0; --erode)
            for (int f = 0; f < 2; ++f) {
                const std::string base = std::string("morph/") + (erode ? "erode_" : "dilate_") +
                                         (f ? "32f/" : "8u/") + kShapes[shape].name + "/";
                if (f)
                    zorbench::register_levels(base, benchmark::kMicrosecond, zor_morph<Zor32f>,
                                              shape, erode != 0);
                else
                    zorbench::register_levels(base, benchmark::kMicrosecond, zor_morph<Zor8u>,
                                              shape, erode != 0);
#ifdef ZOR_BENCH_OPENCV
                if (f)
                    benchmark::RegisterBenchmark((base + "opencv").c_str(), opencv_morph<Zor32f>,
                                                 shape, erode != 0)
                        ->Unit(benchmark::kMicrosecond);
                else
                    benchmark::RegisterBenchmark((base + "opencv").c_str(), opencv_morph<Zor8u>,
                                                 shape, erode != 0)
                        ->Unit(benchmark::kMicrosecond);
#endif
            }
    return 0;
}

const int registered = register_all();

}  // namespace
