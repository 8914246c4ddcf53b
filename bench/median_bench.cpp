// Median filters of a 1920x1080 image of uniform noise with a replicated
// border: zor on each level this machine runs, and OpenCV's medianBlur
// (which replicates the border too) on one thread where it was found.
// Items per second count output pixels.
#include <benchmark/benchmark.h>

#include <stdlib.h>
#include <string.h>

#include <random>
#include <vector>

#include "bench_support.h"

#ifdef ZOR_BENCH_OPENCV
#include <opencv2/core.hpp>
#include <opencv2/imgproc.hpp>
#endif

namespace {

constexpr int kW = 1920, kH = 1080;

template <typename T>
std::vector<T> noise() {
    std::mt19937 rng(1);
    std::vector<T> v((size_t)kW * kH);
    for (T& x : v) x = sizeof(T) == 1 ? (T)(rng() & 255) : (T)((rng() & 0xffffff) * (1.0 / 0x1000000));
    return v;
}

void median_8u(benchmark::State& state, uint64_t select, int mask) {
    zorSetCpuFeatures(select);
    const std::vector<Zor8u> src = noise<Zor8u>();
    std::vector<Zor8u> dst((size_t)kW * kH);
    int32_t size = 0;
    zoriFilterMedianBorderGetBufferSize({kW, kH}, {mask, mask}, zor8u, 1, &size);
    std::vector<Zor8u> buffer((size_t)size);
    for (auto _ : state) {
        ZorStatus s = zoriFilterMedianBorder_8u_C1R(src.data(), kW, dst.data(), kW, {kW, kH},
                                                    {mask, mask}, zorBorderRepl, 0, buffer.data());
        benchmark::DoNotOptimize(s);
        benchmark::ClobberMemory();
    }
    state.SetItemsProcessed((int64_t)state.iterations() * kW * kH);
    zorInit();
}

void median_32f(benchmark::State& state, uint64_t select, int mask) {
    zorSetCpuFeatures(select);
    const std::vector<Zor32f> src = noise<Zor32f>();
    std::vector<Zor32f> dst((size_t)kW * kH);
    int32_t size = 0;
    zoriFilterMedianBorderGetBufferSize({kW, kH}, {mask, mask}, zor32f, 1, &size);
    std::vector<Zor8u> buffer((size_t)size);
    for (auto _ : state) {
        ZorStatus s =
            zoriFilterMedianBorder_32f_C1R(src.data(), kW * 4, dst.data(), kW * 4, {kW, kH},
                                           {mask, mask}, zorBorderRepl, 0.0f, buffer.data());
        benchmark::DoNotOptimize(s);
        benchmark::ClobberMemory();
    }
    state.SetItemsProcessed((int64_t)state.iterations() * kW * kH);
    zorInit();
}

#ifdef ZOR_BENCH_OPENCV
void opencv_median(benchmark::State& state, int type, int mask) {
    cv::setNumThreads(1);
    cv::Mat src(kH, kW, type), dst(kH, kW, type);
    if (type == CV_8U) {
        const std::vector<Zor8u> v = noise<Zor8u>();
        memcpy(src.data, v.data(), v.size());
    } else {
        const std::vector<Zor32f> v = noise<Zor32f>();
        memcpy(src.data, v.data(), v.size() * 4);
    }
    for (auto _ : state) {
        cv::medianBlur(src, dst, mask);
        benchmark::ClobberMemory();
    }
    state.SetItemsProcessed((int64_t)state.iterations() * kW * kH);
}
#endif

int register_all() {
    const int masks8u[] = {3, 5, 7, 15};
    const int masks32f[] = {3, 5};
    for (int m : masks8u) {
        const std::string name = "median/8u_" + std::to_string(m) + "x" + std::to_string(m) + "/";
        zorbench::register_levels(name, benchmark::kMillisecond, median_8u, m);
#ifdef ZOR_BENCH_OPENCV
        benchmark::RegisterBenchmark((name + "opencv").c_str(), opencv_median, CV_8U, m)
            ->Unit(benchmark::kMillisecond);
#endif
    }
    for (int m : masks32f) {
        const std::string name = "median/32f_" + std::to_string(m) + "x" + std::to_string(m) + "/";
        zorbench::register_levels(name, benchmark::kMillisecond, median_32f, m);
#ifdef ZOR_BENCH_OPENCV
        benchmark::RegisterBenchmark((name + "opencv").c_str(), opencv_median, CV_32F, m)
            ->Unit(benchmark::kMillisecond);
#endif
    }
    return 0;
}

const int registered = register_all();

}  // namespace
