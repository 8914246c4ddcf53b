// Thresholds on 32f images. Without a value the pixel is clipped by the
// processor's minimum (GT) or maximum (LT) with the source first, so a NaN
// pixel becomes the threshold; with a value a comparison selects, and a
// NaN pixel fails it and passes through. Vector blocks and the scalar tail
// use the same expressions.
#include "variant.h"

#include "piinternal.h"

ZOR_BEGIN
namespace {

using simd::vf32;

constexpr int L = simd::Lanes<vf32>::count;

// s < t ? s : t is the minimum instruction's rule (second operand on NaN),
// s > t ? s : t the maximum's.
template <bool Greater, typename F>
inline F clip(F s, F t) {
    if constexpr (Greater)
        return s < t ? s : t;
    else
        return s > t ? s : t;
}

template <bool Greater, typename F>
inline F replace(F s, F t, F v) {
    if constexpr (Greater)
        return t < s ? v : s;
    else
        return s < t ? v : s;
}

template <bool Greater>
void clip_rows(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst, int32_t dstStep, ZoriSize roi,
               Zor32f threshold) {
    const vf32 t = simd::broadcast<vf32>(threshold);
    for (int32_t y = 0; y < roi.height; ++y) {
        const Zor32f* s = row_at(pSrc, srcStep, y);
        Zor32f* d = row_at(pDst, dstStep, y);
        int32_t i = 0;
        for (; i + 2 * L <= roi.width; i += 2 * L) {
            const vf32 a = simd::load<vf32>(s + i), b = simd::load<vf32>(s + i + L);
            simd::store(d + i, clip<Greater>(a, t));
            simd::store(d + i + L, clip<Greater>(b, t));
        }
        for (; i + L <= roi.width; i += L)
            simd::store(d + i, clip<Greater>(simd::load<vf32>(s + i), t));
        for (; i < roi.width; ++i)
            simd::store(d + i, clip<Greater>(simd::load<float>(s + i), threshold));
    }
}

template <bool Greater>
void replace_rows(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst, int32_t dstStep,
                  ZoriSize roi, Zor32f threshold, Zor32f value) {
    const vf32 t = simd::broadcast<vf32>(threshold), v = simd::broadcast<vf32>(value);
    for (int32_t y = 0; y < roi.height; ++y) {
        const Zor32f* s = row_at(pSrc, srcStep, y);
        Zor32f* d = row_at(pDst, dstStep, y);
        int32_t i = 0;
        for (; i + 2 * L <= roi.width; i += 2 * L) {
            const vf32 a = simd::load<vf32>(s + i), b = simd::load<vf32>(s + i + L);
            simd::store(d + i, replace<Greater>(a, t, v));
            simd::store(d + i + L, replace<Greater>(b, t, v));
        }
        for (; i + L <= roi.width; i += L)
            simd::store(d + i, replace<Greater>(simd::load<vf32>(s + i), t, v));
        for (; i < roi.width; ++i)
            simd::store(d + i, replace<Greater>(simd::load<float>(s + i), threshold, value));
    }
}

inline ZorStatus check(const Zor32f* pSrc, int32_t srcStep, const Zor32f* pDst, int32_t dstStep,
                       ZoriSize roi) {
    if (!pSrc || !pDst) return zorStsNullPtrErr;
    if (roi.width < 1 || roi.height < 1) return zorStsSizeErr;
    if (srcStep < 1 || dstStep < 1) return zorStsStepErr;
    return zorStsNoErr;
}

}  // namespace

ZorStatus owniThreshold_32f_C1R(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                                int32_t dstStep, ZoriSize roiSize, Zor32f threshold,
                                int32_t relation) {
    const ZorStatus st = check(pSrc, srcStep, pDst, dstStep, roiSize);
    if (st != zorStsNoErr) return st;
    if (relation == 4)
        clip_rows<true>(pSrc, srcStep, pDst, dstStep, roiSize, threshold);
    else if (relation == 0)
        clip_rows<false>(pSrc, srcStep, pDst, dstStep, roiSize, threshold);
    else
        return zorStsNotSupportedModeErr;
    return zorStsNoErr;
}

namespace {

template <bool Greater>
inline ZorStatus threshold_value(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                                 int32_t dstStep, ZoriSize roiSize, Zor32f threshold,
                                 Zor32f value) {
    const ZorStatus st = check(pSrc, srcStep, pDst, dstStep, roiSize);
    if (st != zorStsNoErr) return st;
    replace_rows<Greater>(pSrc, srcStep, pDst, dstStep, roiSize, threshold, value);
    return zorStsNoErr;
}

}  // namespace
ZOR_END

ZOR_ENTRY ZorStatus ZOR_NAME(zoriThreshold_GT_32f_C1R)(const Zor32f* pSrc, int32_t srcStep,
                                                       Zor32f* pDst, int32_t dstStep,
                                                       ZoriSize roiSize, Zor32f threshold) {
    return ZOR_NS::owniThreshold_32f_C1R(pSrc, srcStep, pDst, dstStep, roiSize, threshold, 4);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriThreshold_LT_32f_C1R)(const Zor32f* pSrc, int32_t srcStep,
                                                       Zor32f* pDst, int32_t dstStep,
                                                       ZoriSize roiSize, Zor32f threshold) {
    return ZOR_NS::owniThreshold_32f_C1R(pSrc, srcStep, pDst, dstStep, roiSize, threshold, 0);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriThreshold_GTVal_32f_C1R)(const Zor32f* pSrc, int32_t srcStep,
                                                          Zor32f* pDst, int32_t dstStep,
                                                          ZoriSize roiSize, Zor32f threshold,
                                                          Zor32f value) {
    return ZOR_NS::threshold_value<true>(pSrc, srcStep, pDst, dstStep, roiSize, threshold, value);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriThreshold_LTVal_32f_C1R)(const Zor32f* pSrc, int32_t srcStep,
                                                          Zor32f* pDst, int32_t dstStep,
                                                          ZoriSize roiSize, Zor32f threshold,
                                                          Zor32f value) {
    return ZOR_NS::threshold_value<false>(pSrc, srcStep, pDst, dstStep, roiSize, threshold,
                                          value);
}
