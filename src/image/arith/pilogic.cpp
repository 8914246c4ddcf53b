// Bitwise logic: zoriNot_8u_C1R as an exclusive-or with 255.
#include "variant.h"

#include "piinternal.h"

ZOR_BEGIN

void ownpi_XorC_8u_C1R(const Zor8u* pSrc, int32_t srcStep, Zor8u value, Zor8u* pDst,
                       int32_t dstStep, ZoriSize roiSize) {
    using arith::VB;
    using simd::vu8;
    const vu8 v = simd::broadcast<vu8>(value);
    const size_t width = (size_t)roiSize.width;
    for (int32_t y = 0; y < roiSize.height; ++y) {
        const Zor8u* s = row_at(pSrc, srcStep, y);
        Zor8u* d = row_at(pDst, dstStep, y);
        size_t i = 0;
        for (; i + 2 * VB <= width; i += 2 * VB) {
            const vu8 a = simd::load<vu8>(s + i), b = simd::load<vu8>(s + i + VB);
            simd::store(d + i, a ^ v);
            simd::store(d + i + VB, b ^ v);
        }
        for (; i + VB <= width; i += VB) simd::store(d + i, simd::load<vu8>(s + i) ^ v);
        for (; i < width; ++i) d[i] = (Zor8u)(s[i] ^ value);
    }
}

ZOR_END

ZOR_ENTRY ZorStatus ZOR_NAME(zoriNot_8u_C1R)(const Zor8u* pSrc, int32_t srcStep, Zor8u* pDst,
                                             int32_t dstStep, ZoriSize roiSize) {
    if (!pSrc || !pDst) return zorStsNullPtrErr;
    // Steps before the ROI, unlike most operations.
    if (srcStep < 1 || dstStep < 1) return zorStsStepErr;
    if (roiSize.width < 1 || roiSize.height < 1) return zorStsSizeErr;
    ZOR_NS::ownpi_XorC_8u_C1R(pSrc, srcStep, 0xff, pDst, dstStep, roiSize);
    return zorStsNoErr;
}
