// zoriCompareC_32f_C1R: 255 where the pixel compares true with the value,
// else 0. Ordered comparisons: a NaN on either side gives 0 for every
// selector, in the vector blocks and the scalar tail alike.
#include "variant.h"

#include "piinternal.h"

ZOR_BEGIN
namespace {

using simd::vf32;
using simd::vs32;

enum { kLess = 0, kLessEq = 1, kEq = 2, kGreaterEq = 3, kGreater = 4 };

template <int Op, typename F>
inline auto holds(F a, F b) {
    if constexpr (Op == kLess) return a < b;
    if constexpr (Op == kLessEq) return a <= b;
    if constexpr (Op == kEq) return a == b;
    if constexpr (Op == kGreaterEq) return a >= b;
    if constexpr (Op == kGreater) return a > b;
}

// One row kernel per selector: 16 pixels a block, then one at a time.
template <int Op>
void compare_rows(const Zor32f* pSrc, int32_t srcStep, Zor8u* pDst, int32_t dstStep,
                  ZoriSize roi, Zor32f value) {
    constexpr int L = simd::Lanes<vf32>::count;
    const vf32 v = simd::broadcast<vf32>(value);
    for (int32_t y = 0; y < roi.height; ++y) {
        const Zor32f* s = row_at(pSrc, srcStep, y);
        Zor8u* d = row_at(pDst, dstStep, y);
        int32_t i = 0;
        for (; i + 16 <= roi.width; i += 16) {
            vs32 m[arith::kMaskVectors];
            for (int k = 0; k < arith::kMaskVectors; ++k)
                m[k] = holds<Op>(simd::load<vf32>(s + i + k * L), v);
            simd::store(d + i, arith::narrow16<false>(m));
        }
        for (; i < roi.width; ++i) d[i] = holds<Op>(simd::load<float>(s + i), value) ? 255 : 0;
    }
}

}  // namespace
ZOR_END

ZOR_ENTRY ZorStatus ZOR_NAME(zoriCompareC_32f_C1R)(const Zor32f* pSrc, int32_t srcStep, Zor8u* pDst,
                                                   int32_t dstStep, ZoriSize roiSize,
                                                   int32_t cmpOp, Zor32f value) {
    using namespace ZOR_NS;
    if (!pSrc || !pDst) return zorStsNullPtrErr;
    // Steps before the ROI, unlike most operations.
    if (srcStep < 1 || dstStep < 1) return zorStsStepErr;
    if (roiSize.width < 1 || roiSize.height < 1) return zorStsSizeErr;
    switch ((uint32_t)cmpOp) {
    case kLess: compare_rows<kLess>(pSrc, srcStep, pDst, dstStep, roiSize, value); break;
    case kLessEq: compare_rows<kLessEq>(pSrc, srcStep, pDst, dstStep, roiSize, value); break;
    case kEq: compare_rows<kEq>(pSrc, srcStep, pDst, dstStep, roiSize, value); break;
    case kGreaterEq: compare_rows<kGreaterEq>(pSrc, srcStep, pDst, dstStep, roiSize, value); break;
    case kGreater: compare_rows<kGreater>(pSrc, srcStep, pDst, dstStep, roiSize, value); break;
    default: break;  // unknown selector: success, nothing written
    }
    return zorStsNoErr;
}
