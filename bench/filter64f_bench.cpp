// Direct double filter, 5x5, over a 1920x1080 ROI of an image the caller
// has framed by 2 pixels on every side: zor on each level this machine
// runs, and OpenCV's filter2D on one thread where it was found (on the
// same framed image, so it reads real pixels around the ROI too, and with
// the kernel flipped, as it correlates). Bytes per second count the
// destination's bytes.
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

constexpr int kW = 1920, kH = 1080, kK = 5, kB = kK / 2;
constexpr int kFW = kW + 2 * kB, kFH = kH + 2 * kB;

struct Images {
    std::vector<double> framed, dst, kernel;
    Images() : framed((size_t)kFW * kFH), dst((size_t)kW * kH), kernel(kK * kK) {
        for (size_t i = 0; i < framed.size(); ++i) framed[i] = sin(0.001 * (double)i);
        for (int i = 0; i < kK * kK; ++i) kernel[i] = 1.0 / (1 + i);
    }
    const double* roi() const { return framed.data() + (size_t)kB * kFW + kB; }
};

void zor_5x5(benchmark::State& state, uint64_t select) {
    zorSetCpuFeatures(select);
    Images im;
    for (auto _ : state) {
        ZorStatus s = zoriFilter_64f_C1R(im.roi(), kFW * 8, im.dst.data(), kW * 8, {kW, kH},
                                         im.kernel.data(), {kK, kK}, {kB, kB}, nullptr);
        benchmark::DoNotOptimize(s);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * kW * kH * 8);
    zorInit();
}

#ifdef ZOR_BENCH_OPENCV
void opencv_5x5(benchmark::State& state) {
    cv::setNumThreads(1);
    Images im;
    cv::Mat framed(kFH, kFW, CV_64F, im.framed.data());
    cv::Mat roi = framed(cv::Rect(kB, kB, kW, kH));
    cv::Mat kernel(kK, kK, CV_64F, im.kernel.data()), flipped, dst(kH, kW, CV_64F);
    cv::flip(kernel, flipped, -1);
    // Same sums as zor's, up to the order of the additions.
    cv::filter2D(roi, dst, CV_64F, flipped, cv::Point(-1, -1), 0, cv::BORDER_REPLICATE);
    zoriFilter_64f_C1R(im.roi(), kFW * 8, im.dst.data(), kW * 8, {kW, kH}, im.kernel.data(),
                       {kK, kK}, {kB, kB}, nullptr);
    for (int y = 0; y < kH; ++y)
        for (int x = 0; x < kW; ++x)
            if (fabs(dst.at<double>(y, x) - im.dst[(size_t)y * kW + x]) > 1e-9) {
                state.SkipWithError("OpenCV and zor disagree");
                return;
            }
    for (auto _ : state) {
        cv::filter2D(roi, dst, CV_64F, flipped, cv::Point(-1, -1), 0, cv::BORDER_REPLICATE);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * kW * kH * 8);
}
#endif

int register_all() {
    zorbench::register_levels("filter64f/5x5/", benchmark::kMicrosecond, zor_5x5);
#ifdef ZOR_BENCH_OPENCV
    benchmark::RegisterBenchmark("filter64f/5x5/opencv", opencv_5x5)->Unit(benchmark::kMicrosecond);
#endif
    return 0;
}

const int registered = register_all();

}  // namespace
