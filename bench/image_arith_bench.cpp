// Point operations on 1920x1080 and 3840x2160 images with contiguous rows:
// zor on each level this machine runs, OpenCV on one thread where it was
// found, and memcpy of one image as the bandwidth reference. Bytes per
// second count one image's bytes (the destination's, or the source's for
// MinMax), so the figures compare directly with memcpy of the same size.
#include <benchmark/benchmark.h>

#include <stdlib.h>
#include <string.h>

#include <string>

#include "zor.h"
#include "bench_support.h"
#include "zor_levels.h"

#ifdef ZOR_BENCH_OPENCV
#include <opencv2/core.hpp>
#include <opencv2/imgproc.hpp>
#endif

namespace {

struct Size {
    int w, h;
};
const Size kSizes[] = {{1920, 1080}, {3840, 2160}};

// An image of w x h elements of the given size, 64-byte aligned, filled
// with a repeatable pattern; every element of an 8u divisor is non-zero.
struct Image {
    void* p;
    size_t bytes;
    Image(Size s, size_t elem, unsigned seed) : bytes((size_t)s.w * s.h * elem) {
        p = aligned_alloc(64, (bytes + 63) / 64 * 64);
        uint32_t x = 0x9E3779B9u * (seed + 1);
        uint8_t* b = (uint8_t*)p;
        if (elem == 4) {
            float* f = (float*)p;
            for (size_t i = 0; i < bytes / 4; ++i) {
                x = x * 1664525u + 1013904223u;
                f[i] = (float)(x >> 8) * (1.0f / 16777216.0f);
            }
        } else {
            for (size_t i = 0; i < bytes; ++i) {
                x = x * 1664525u + 1013904223u;
                b[i] = (uint8_t)((x >> 24) | 1);
            }
        }
    }
    ~Image() { free(p); }
    template <typename T>
    T* as() const {
        return (T*)p;
    }
};

enum Op { kCopy, kSet, kThreshold, kMinMax, kAdd, kMulC, kAbsDiff, kMul, kDiv, kOpCount };
const char* const kOpNames[] = {"copy_32f",  "set_32f",       "threshold_gt_32f",
                                "minmax_32f", "add_32f",      "mulc_32f",
                                "absdiff_8u", "mul_8u_sfs",   "div_8u_sfs"};
size_t elem_of(int op) { return op >= kAbsDiff ? 1 : 4; }

void zor_op(benchmark::State& state, uint64_t select, int op, Size s) {
    zorSetCpuFeatures(select);
    const size_t elem = elem_of(op);
    Image a(s, elem, 1), b(s, elem, 2), d(s, elem, 3);
    const int32_t step = s.w * (int32_t)elem;
    const ZoriSize roi = {s.w, s.h};
    for (auto _ : state) {
        ZorStatus st = 0;
        Zor32f mn, mx;
        switch (op) {
        case kCopy: st = zoriCopy_32f_C1R(a.as<Zor32f>(), step, d.as<Zor32f>(), step, roi); break;
        case kSet: st = zoriSet_32f_C1R(0.5f, d.as<Zor32f>(), step, roi); break;
        case kThreshold:
            st = zoriThreshold_GT_32f_C1R(a.as<Zor32f>(), step, d.as<Zor32f>(), step, roi, 0.5f);
            break;
        case kMinMax:
            st = zoriMinMax_32f_C1R(a.as<Zor32f>(), step, roi, &mn, &mx);
            benchmark::DoNotOptimize(mn);
            benchmark::DoNotOptimize(mx);
            break;
        case kAdd:
            st = zoriAdd_32f_C1R(a.as<Zor32f>(), step, b.as<Zor32f>(), step, d.as<Zor32f>(), step,
                                 roi);
            break;
        case kMulC:
            st = zoriMulC_32f_C1R(a.as<Zor32f>(), step, d.as<Zor32f>(), step, roi, 0.37f);
            break;
        case kAbsDiff:
            st = zoriAbsDiff_8u_C1R(a.as<Zor8u>(), step, b.as<Zor8u>(), step, d.as<Zor8u>(), step,
                                    roi);
            break;
        case kMul:
            st = zoriMul_8u_C1RSfs(a.as<Zor8u>(), step, b.as<Zor8u>(), step, d.as<Zor8u>(), step,
                                   roi, 8);
            break;
        default:
            st = zoriDiv_8u_C1RSfs(a.as<Zor8u>(), step, b.as<Zor8u>(), step, d.as<Zor8u>(), step,
                                   roi, 0);
            break;
        }
        benchmark::DoNotOptimize(st);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * (int64_t)a.bytes);
    zorInit();
}

void memcpy_image(benchmark::State& state, size_t elem, Size s) {
    Image a(s, elem, 1), d(s, elem, 3);
    for (auto _ : state) {
        memcpy(d.p, a.p, a.bytes);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * (int64_t)a.bytes);
}

#ifdef ZOR_BENCH_OPENCV
// The nearest OpenCV call of each operation, on one thread.
void opencv_op(benchmark::State& state, int op, Size s) {
    cv::setNumThreads(1);
    const size_t elem = elem_of(op);
    const int type = elem == 4 ? CV_32F : CV_8U;
    Image a(s, elem, 1), b(s, elem, 2), d(s, elem, 3);
    cv::Mat A(s.h, s.w, type, a.p), B(s.h, s.w, type, b.p), D(s.h, s.w, type, d.p);
    for (auto _ : state) {
        double mn, mx;
        switch (op) {
        case kCopy: A.copyTo(D); break;
        case kSet: D.setTo(cv::Scalar(0.5)); break;
        case kThreshold: cv::threshold(A, D, 0.5, 0.0, cv::THRESH_TRUNC); break;
        case kMinMax:
            cv::minMaxLoc(A, &mn, &mx);
            benchmark::DoNotOptimize(mn);
            benchmark::DoNotOptimize(mx);
            break;
        case kAdd: cv::add(A, B, D); break;
        case kMulC: cv::multiply(A, cv::Scalar(0.37), D); break;
        case kAbsDiff: cv::absdiff(A, B, D); break;
        case kMul: cv::multiply(A, B, D, 1.0 / 256); break;
        default: cv::divide(B, A, D, 1.0); break;  // the second by the first, as zor
        }
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed((int64_t)state.iterations() * (int64_t)a.bytes);
}
#endif

int register_all() {
    for (const Size& s : kSizes) {
        const std::string size = std::to_string(s.w) + "x" + std::to_string(s.h);
        for (int op = kCopy; op < kOpCount; ++op) {
            const std::string base = std::string("image_arith/") + kOpNames[op] + "/" + size + "/";
            zorbench::register_levels(base, benchmark::kMicrosecond, zor_op, op, s);
#ifdef ZOR_BENCH_OPENCV
            benchmark::RegisterBenchmark((base + "opencv").c_str(), opencv_op, op, s)
                ->Unit(benchmark::kMicrosecond);
#endif
        }
        for (size_t elem : {(size_t)1, (size_t)4}) {
            const std::string name = std::string("image_arith/memcpy_") +
                                     (elem == 1 ? "8u/" : "32f/") + size;
            benchmark::RegisterBenchmark(name.c_str(), memcpy_image, elem, s)
                ->Unit(benchmark::kMicrosecond);
        }
    }
    return 0;
}

const int registered = register_all();

}  // namespace
