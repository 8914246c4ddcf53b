// Sum of a float vector. The fast form adds in single-precision lanes of
// the level's width. The accurate form adds in eight double lanes in an
// order fixed independently of the level (element 8k+j into lane j, one
// fold order), so that every level returns the same bits.
#include "variant.h"

#include <stdint.h>
#include <string.h>

#include <utility>

#include "simd.h"

ZOR_BEGIN
namespace {
using simd::vf32;
using simd::vf64;

constexpr int kFloatLanes = ZOR_VECTOR_BYTES / 4;
constexpr int kDoubleLanes = ZOR_VECTOR_BYTES / 8;
// Registers that together hold the eight double lanes: 4, 2 or 1.
constexpr int kDoubleRegs = 8 / kDoubleLanes;

// Both halves of a register of floats, widened to registers of doubles.
template <size_t... I>
inline void widen(vf32 v, vf64* lo, vf64* hi, std::index_sequence<I...>) {
    *lo = __builtin_convertvector(__builtin_shufflevector(v, v, I...), vf64);
    *hi = __builtin_convertvector(__builtin_shufflevector(v, v, (I + kDoubleLanes)...), vf64);
}

float sum_accurate(const float* p, int32_t len) {
    // -0 is the neutral start: an all-(-0) input sums to -0.
    double lane[8] = {-0.0, -0.0, -0.0, -0.0, -0.0, -0.0, -0.0, -0.0};
    int32_t i = 0;
    // A start off an 8-byte boundary goes first, into lane 0; lanes count
    // from the element after it.
    if (((uintptr_t)p & 7) != 0) {
        lane[0] = p[0];
        i = 1;
    }
    vf64 acc[kDoubleRegs];
    memcpy(acc, lane, sizeof lane);
    // Sixteen elements a step in full-width loads, each half widened into
    // the register of its lanes. Every lane is one chain of dependent
    // additions, which leaves too few loads in flight to cover memory
    // latency: the prefetch 16 KiB ahead does that.
    const auto halves = std::make_index_sequence<kDoubleLanes>();
    for (; len - i >= 16; i += 16) {
        __builtin_prefetch(p + i + 4096);
        for (int f = 0; f < 16 / kFloatLanes; ++f) {
            vf64 lo, hi;
            widen(simd::load<vf32>(p + i + f * kFloatLanes), &lo, &hi, halves);
            acc[(2 * f) % kDoubleRegs] += lo;
            acc[(2 * f + 1) % kDoubleRegs] += hi;
        }
    }
    memcpy(lane, acc, sizeof lane);
    for (int j = 0; i < len; ++i, j = (j + 1) & 7) lane[j] += p[i];
    // As four two-lane registers: first + third, second + fourth, the two
    // results, then their lanes.
    const double even = (lane[0] + lane[4]) + (lane[2] + lane[6]);
    const double odd = (lane[1] + lane[5]) + (lane[3] + lane[7]);
    return (float)(even + odd);
}

float sum_fast(const float* p, int32_t len) {
    const vf32 zero = -vf32{};  // all lanes -0
    vf32 a0 = zero, a1 = zero, a2 = zero, a3 = zero;
    int32_t i = 0;
    for (; len - i >= 4 * kFloatLanes; i += 4 * kFloatLanes) {
        a0 += simd::load<vf32>(p + i);
        a1 += simd::load<vf32>(p + i + kFloatLanes);
        a2 += simd::load<vf32>(p + i + 2 * kFloatLanes);
        a3 += simd::load<vf32>(p + i + 3 * kFloatLanes);
    }
    for (; len - i >= kFloatLanes; i += kFloatLanes) a0 += simd::load<vf32>(p + i);
    const vf32 a = (a0 + a1) + (a2 + a3);
    float lane[kFloatLanes];
    simd::store(lane, a);
    float s = -0.0f;
    for (int k = 0; k < kFloatLanes; ++k) s += lane[k];
    for (; i < len; ++i) s += p[i];
    return s;
}

}  // namespace
ZOR_END

ZOR_ENTRY ZorStatus ZOR_NAME(zorsSum_32f)(const Zor32f* pSrc, int32_t len, Zor32f* pSum, int32_t hint) {
    if (pSrc == nullptr || pSum == nullptr) return zorStsNullPtrErr;
    if (len < 1) return zorStsSizeErr;
    *pSum = hint == 1 ? ZOR_NS::sum_fast(pSrc, len) : ZOR_NS::sum_accurate(pSrc, len);
    return zorStsNoErr;
}
