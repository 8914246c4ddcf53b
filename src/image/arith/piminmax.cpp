// zoriMinMax_32f_C1R. Sixteen running lanes of minimum and maximum on every
// level (four, two or one vectors): pixel x of a row goes to lane x mod 16,
// a row's last partial block is padded with the start constants, and the
// lanes are folded in order 0..15 at the end. Each step is the processor's
// minimum or maximum with the accumulator first, so a NaN pixel replaces
// its lane's value until the next pixel of that lane (or a padding
// constant) replaces it in turn. The result is thus the same on every
// level and path, NaNs included.
#include "variant.h"

#include "piinternal.h"

ZOR_BEGIN
namespace {

using simd::vf32;

constexpr int L = simd::Lanes<vf32>::count;
constexpr int N = 16 / L;

template <typename F>
inline F min_acc(F acc, F x) {
    return acc < x ? acc : x;
}
template <typename F>
inline F max_acc(F acc, F x) {
    return acc > x ? acc : x;
}

inline float from_bits(uint32_t b) {
    float f;
    memcpy(&f, &b, 4);
    return f;
}

}  // namespace
ZOR_END

ZOR_ENTRY ZorStatus ZOR_NAME(zoriMinMax_32f_C1R)(const Zor32f* pSrc, int32_t srcStep,
                                                 ZoriSize roiSize, Zor32f* pMin, Zor32f* pMax) {
    using namespace ZOR_NS;
    if (!pSrc || !pMin || !pMax) return zorStsNullPtrErr;
    if (roiSize.width < 1 || roiSize.height < 1) return zorStsSizeErr;
    // The greatest finite float and its negative: an all +inf image reports
    // this as its minimum.
    const float kHigh = from_bits(0x7f7fffffu), kLow = from_bits(0xff7fffffu);
    vf32 mn[N], mx[N];
    for (int k = 0; k < N; ++k) {
        mn[k] = simd::broadcast<vf32>(kHigh);
        mx[k] = simd::broadcast<vf32>(kLow);
    }
    const int32_t full = roiSize.width & ~15;
    const int32_t rest = roiSize.width - full;
    for (int32_t y = 0; y < roiSize.height; ++y) {
        const Zor32f* s = row_at(pSrc, srcStep, y);
        for (int32_t i = 0; i < full; i += 16) {
            for (int k = 0; k < N; ++k) {
                const vf32 x = simd::load<vf32>(s + i + k * L);
                mn[k] = min_acc(mn[k], x);
                mx[k] = max_acc(mx[k], x);
            }
        }
        if (rest) {
            float lo[16], hi[16];
            for (int j = 0; j < 16; ++j) {
                lo[j] = kHigh;
                hi[j] = kLow;
            }
            memcpy(lo, s + full, (size_t)rest * 4);
            memcpy(hi, s + full, (size_t)rest * 4);
            for (int k = 0; k < N; ++k) {
                mn[k] = min_acc(mn[k], simd::load<vf32>(lo + k * L));
                mx[k] = max_acc(mx[k], simd::load<vf32>(hi + k * L));
            }
        }
    }
    float lo[16], hi[16];
    for (int k = 0; k < N; ++k) {
        simd::store(lo + k * L, mn[k]);
        simd::store(hi + k * L, mx[k]);
    }
    float a = lo[0], b = hi[0];
    for (int j = 1; j < 16; ++j) {
        a = min_acc(a, lo[j]);
        b = max_acc(b, hi[j]);
    }
    *pMin = a;
    *pMax = b;
    return zorStsNoErr;
}
