// General filter with a replicated border, 3x3, 5x5 and 11x11 kernels over
// a 1920x1080 image, 8u and 32f: zor on each level this machine runs, and
// OpenCV's filter2D on one thread where it was found (same kernel, which
// both apply as a correlation about the centre, and the same border).
// Bytes per second count the destination's bytes.
#include <benchmark/benchmark.h>

#include <math.h>
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

std::vector<float> kernel(int k) {
    std::vector<float> t((size_t)k * k);
    for (int i = 0; i < k * k; ++i) t[i] = (float)(1 + (i * 7) % 5) / (float)(3 * k * k);
    return t;
}

template <typename T> struct Images {
    std::vector<T> src, dst;
    Images() : src((size_t)kW * kH), dst((size_t)kW * kH) {
        for (size_t i = 0; i < src.size(); ++i)
            src[i] = (T)(sizeof(T) == 1 ? (i * 37 + i / kW * 11) % 251 : 100.0 * sin(0.001 * i));
    }
};

ZorStatus filter(const Zor8u* s, Zor8u* d, const ZoriFilterBorderSpec* rec, Zor8u* buf) {
    return zoriFilterBorder_8u_C1R(s, kW, d, kW, {kW, kH}, zorBorderRepl, nullptr, rec, buf);
}
ZorStatus filter(const Zor32f* s, Zor32f* d, const ZoriFilterBorderSpec* rec, Zor8u* buf) {
    return zoriFilterBorder_32f_C1R(s, kW * 4, d, kW * 4, {kW, kH}, zorBorderRepl, nullptr, rec,
                                    buf);
}

template <typename T> constexpr ZorDataType type_of() {
    return sizeof(T) == 1 ? zor8u : zor32f;
}

template <typename T> void zor_filter(benchmark::State& state, uint64_t select, int k) {
    zorSetCpuFeatures(select);
    Images<T> im;
    const std::vector<float> taps = kernel(k);
    int32_t specSize = 0, bufSize = 0;
    zoriFilterBorderGetSize({k, k}, {kW, kH}, type_of<T>(), zor32f, 1, &specSize, &bufSize);
    std::vector<Zor8u> rec(specSize), buf(bufSize);
    zoriFilterBorderInit_32f(taps.data(), {k, k}, type_of<T>(), 1, 1,
                             (ZoriFilterBorderSpec*)rec.data());
    for (auto _ : state) {
        ZorStatus s = filter(im.src.data(), im.dst.data(), (ZoriFilterBorderSpec*)rec.data(),
                             buf.data());
        benchmark::DoNotOptimize(s);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * kW * kH * sizeof(T));
    zorInit();
}

#ifdef ZOR_BENCH_OPENCV
template <typename T> void opencv_filter(benchmark::State& state, int k) {
    cv::setNumThreads(1);
    Images<T> im;
    std::vector<float> taps = kernel(k);
    const int type = sizeof(T) == 1 ? CV_8U : CV_32F;
    cv::Mat src(kH, kW, type, im.src.data()), dst(kH, kW, type);
    cv::Mat ker(k, k, CV_32F, taps.data());
    // Same sums as zor's (on the level the library chose), up to the order
    // of the additions: integers within one, floats within a relative 1e-5.
    cv::filter2D(src, dst, -1, ker, cv::Point(-1, -1), 0, cv::BORDER_REPLICATE);
    int32_t specSize = 0, bufSize = 0;
    zoriFilterBorderGetSize({k, k}, {kW, kH}, type_of<T>(), zor32f, 1, &specSize, &bufSize);
    std::vector<Zor8u> rec(specSize), buf(bufSize);
    zoriFilterBorderInit_32f(taps.data(), {k, k}, type_of<T>(), 1, 1,
                             (ZoriFilterBorderSpec*)rec.data());
    filter(im.src.data(), im.dst.data(), (ZoriFilterBorderSpec*)rec.data(), buf.data());
    for (int y = 0; y < kH; ++y)
        for (int x = 0; x < kW; ++x) {
            const double a = (double)dst.at<T>(y, x), b = (double)im.dst[(size_t)y * kW + x];
            if (fabs(a - b) > (sizeof(T) == 1 ? 1.0 : 1e-5 * (1.0 + fabs(a)))) {
                state.SkipWithError("OpenCV and zor disagree");
                return;
            }
        }
    for (auto _ : state) {
        cv::filter2D(src, dst, -1, ker, cv::Point(-1, -1), 0, cv::BORDER_REPLICATE);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * kW * kH * sizeof(T));
}
#endif

int register_all() {
    for (int k : {3, 5, 11}) {
        const std::string size = std::to_string(k) + "x" + std::to_string(k);
        zorbench::register_levels("filter/8u/" + size + "/", benchmark::kMicrosecond,
                                  zor_filter<Zor8u>, k);
        zorbench::register_levels("filter/32f/" + size + "/", benchmark::kMicrosecond,
                                  zor_filter<Zor32f>, k);
#ifdef ZOR_BENCH_OPENCV
        benchmark::RegisterBenchmark(("filter/8u/" + size + "/opencv").c_str(),
                                     opencv_filter<Zor8u>, k)
            ->Unit(benchmark::kMicrosecond);
        benchmark::RegisterBenchmark(("filter/32f/" + size + "/opencv").c_str(),
                                     opencv_filter<Zor32f>, k)
            ->Unit(benchmark::kMicrosecond);
#endif
    }
    return 0;
}

const int registered = register_all();

}  // namespace
