// Unscaled float arithmetic on images: sums, differences, products, the
// constant forms and the masked product accumulation. Each row goes
// through the level's row function; steps are not tested, so zero and
// negative steps work. Images whose rows all follow each other without a
// gap go through as one row, which changes nothing but the speed.
#include "variant.h"

#include <limits.h>

#include "piinternal.h"
#include "zor_internal.h"

ZOR_BEGIN
namespace {

using simd::vf32;
using simd::vs32;

// One row of width * height elements where every step is the row length.
inline bool merged(ZoriSize roi, int32_t s1, int32_t s2, int32_t s3) {
    const int64_t row = (int64_t)roi.width * 4;
    return s1 == row && s2 == row && s3 == row && (int64_t)roi.width * roi.height <= INT32_MAX;
}

typedef void (*BinaryRow)(const Zor32f*, const Zor32f*, Zor32f*, int32_t);
typedef void (*ConstRow)(const Zor32f*, Zor32f*, int32_t, Zor32f);

ZorStatus binary(BinaryRow fn, const Zor32f* pSrc1, int32_t src1Step, const Zor32f* pSrc2,
                 int32_t src2Step, Zor32f* pDst, int32_t dstStep, ZoriSize roi) {
    if (!pSrc1 || !pSrc2 || !pDst) return zorStsNullPtrErr;
    if (roi.width < 1 || roi.height < 1) return zorStsSizeErr;
    if (merged(roi, src1Step, src2Step, dstStep)) {
        fn(pSrc1, pSrc2, pDst, roi.width * roi.height);
        return zorStsNoErr;
    }
    for (int32_t y = 0; y < roi.height; ++y)
        fn(row_at(pSrc1, src1Step, y),
           row_at(pSrc2, src2Step, y), row_at(pDst, dstStep, y),
           roi.width);
    return zorStsNoErr;
}

// After the checks of the caller.
void const_rows(ConstRow fn, const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst, int32_t dstStep,
                ZoriSize roi, Zor32f value) {
    if (merged(roi, srcStep, dstStep, dstStep)) {
        fn(pSrc, pDst, roi.width * roi.height, value);
        return;
    }
    for (int32_t y = 0; y < roi.height; ++y)
        fn(row_at(pSrc, srcStep, y), row_at(pDst, dstStep, y),
           roi.width, value);
}

ZorStatus constant(ConstRow fn, const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                   int32_t dstStep, ZoriSize roi, Zor32f value) {
    if (!pSrc || !pDst) return zorStsNullPtrErr;
    if (roi.width < 1 || roi.height < 1) return zorStsSizeErr;
    const_rows(fn, pSrc, srcStep, pDst, dstStep, roi, value);
    return zorStsNoErr;
}

// ---- masked product accumulation --------------------------------------------

constexpr int L = simd::Lanes<vf32>::count;

inline float masked(float a, Zor8u m) { return m ? a : 0.0f; }

inline vf32 masked(vf32 a, const Zor8u* m) {
    const vs32 sel = arith::load_u8_i32<ZOR_VECTOR_BYTES>(m) != 0;
    return (vf32)((vs32)a & sel);
}

// d += (mask ? a : +0) * b over one row. Wide: two vectors a round, which
// the SSE levels take for images beyond the cache; it changes the loop
// only, never a result.
template <bool Wide>
void add_product_row(const Zor32f* a, const Zor32f* b, const Zor8u* m, Zor32f* d, int32_t w) {
    int32_t i = 0;
    if (Wide) {
        for (; i + 2 * L <= w; i += 2 * L) {
            const vf32 p0 = masked(simd::load<vf32>(a + i), m + i) * simd::load<vf32>(b + i);
            const vf32 p1 =
                masked(simd::load<vf32>(a + i + L), m + i + L) * simd::load<vf32>(b + i + L);
            simd::store(d + i, simd::load<vf32>(d + i) + p0);
            simd::store(d + i + L, simd::load<vf32>(d + i + L) + p1);
        }
    }
    for (; i + L <= w; i += L) {
        const vf32 p = masked(simd::load<vf32>(a + i), m + i) * simd::load<vf32>(b + i);
        simd::store(d + i, simd::load<vf32>(d + i) + p);
    }
    for (; i < w; ++i)
        simd::store(d + i, simd::load<float>(d + i) +
                               masked(simd::load<float>(a + i), m[i]) * simd::load<float>(b + i));
}

#if ZOR_VECTOR_BYTES >= 32
// The wide levels keep the row loop of the image sum here, in blocks of 16
// elements; rows of fewer than 29 elements go element by element.
void add_row(const Zor32f* a, const Zor32f* b, Zor32f* d, int32_t w) {
    int32_t i = 0;
    if (w >= 29) {
        for (; i + 16 <= w; i += 16)
#pragma GCC unroll 2
            for (int k = 0; k < 16; k += L)
                simd::store(d + i + k, simd::load<vf32>(a + i + k) + simd::load<vf32>(b + i + k));
    }
    for (; i < w; ++i) simd::store(d + i, simd::load<float>(a + i) + simd::load<float>(b + i));
}
#endif

}  // namespace

ZOR_ENTRY ZorStatus ZOR_NAME(zoriAdd_32f_C1R)(const Zor32f* pSrc1, int32_t src1Step,
                                              const Zor32f* pSrc2, int32_t src2Step, Zor32f* pDst,
                                              int32_t dstStep, ZoriSize roiSize) {
#if ZOR_VECTOR_BYTES >= 32
    return binary(add_row, pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roiSize);
#else
    return binary(ZOR_NAME(ownsAdd_32f), pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roiSize);
#endif
}
ZOR_ENTRY ZorStatus ZOR_NAME(zoriSub_32f_C1R)(const Zor32f* pSrc1, int32_t src1Step,
                                              const Zor32f* pSrc2, int32_t src2Step, Zor32f* pDst,
                                              int32_t dstStep, ZoriSize roiSize) {
    return binary(ZOR_NAME(ownsSub_32f), pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roiSize);
}
ZOR_ENTRY ZorStatus ZOR_NAME(zoriMul_32f_C1R)(const Zor32f* pSrc1, int32_t src1Step,
                                              const Zor32f* pSrc2, int32_t src2Step, Zor32f* pDst,
                                              int32_t dstStep, ZoriSize roiSize) {
    return binary(ZOR_NAME(ownsMul_32f), pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roiSize);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriAddC_32f_C1R)(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                                               int32_t dstStep, ZoriSize roiSize, Zor32f value) {
    return constant(ZOR_NAME(ownsAddC_32f), pSrc, srcStep, pDst, dstStep, roiSize, value);
}
ZOR_ENTRY ZorStatus ZOR_NAME(zoriSubC_32f_C1R)(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                                               int32_t dstStep, ZoriSize roiSize, Zor32f value) {
    return constant(ZOR_NAME(ownsSubC_32f), pSrc, srcStep, pDst, dstStep, roiSize, value);
}
ZOR_ENTRY ZorStatus ZOR_NAME(zoriMulC_32f_C1R)(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                                               int32_t dstStep, ZoriSize roiSize, Zor32f value) {
    return constant(ZOR_NAME(ownsMulC_32f), pSrc, srcStep, pDst, dstStep, roiSize, value);
}

// A product with the rounded reciprocal: two roundings, and a NaN value is
// not zero, so it passes.
ZOR_ENTRY ZorStatus ZOR_NAME(zoriDivC_32f_C1R)(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                                               int32_t dstStep, ZoriSize roiSize, Zor32f value) {
    if (!pSrc || !pDst) return zorStsNullPtrErr;
    if (roiSize.width < 1 || roiSize.height < 1) return zorStsSizeErr;
    if (srcStep < 1 || dstStep < 1) return zorStsStepErr;
    if (value == 0.0f) return zorStsDivByZeroErr;
    const_rows(ZOR_NAME(ownsMulC_32f), pSrc, srcStep, pDst, dstStep, roiSize, 1.0f / value);
    return zorStsNoErr;
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriAddProduct_32f_C1IMR)(const Zor32f* pSrc1, int32_t src1Step,
                                                       const Zor32f* pSrc2, int32_t src2Step,
                                                       const Zor8u* pMask, int32_t maskStep,
                                                       Zor32f* pSrcDst, int32_t srcDstStep,
                                                       ZoriSize roiSize) {
    if (!pSrc1 || !pSrc2 || !pMask || !pSrcDst) return zorStsNullPtrErr;
    if (roiSize.width < 1 || roiSize.height < 1) return zorStsSizeErr;
    const int32_t w = roiSize.width, h = roiSize.height;
    const int64_t row = 4 * (int64_t)w;  // no wrap for huge widths
    if (src1Step < row || src2Step < row || srcDstStep < row || maskStep < w)
        return zorStsStepErr;
    if ((src1Step | src2Step | srcDstStep) & 3) return zorStsNotEvenStepErr;
    bool wide = false;
#if ZOR_CACHE_TEST_ADDPRODUCT
    int32_t cache = 0;
    zorGetMaxCacheSizeB(&cache);  // a failure leaves 0: the large shape
    wide = (int32_t)((uint32_t)h * 13u * (uint32_t)w) >= cache;
#endif
    for (int32_t y = 0; y < h; ++y) {
        const Zor32f* a = row_at(pSrc1, src1Step, y);
        const Zor32f* b = row_at(pSrc2, src2Step, y);
        const Zor8u* m = row_at(pMask, maskStep, y);
        Zor32f* d = row_at(pSrcDst, srcDstStep, y);
        if (wide)
            add_product_row<true>(a, b, m, d, w);
        else
            add_product_row<false>(a, b, m, d, w);
    }
    return zorStsNoErr;
}

ZOR_END
