// Magnitudes and squares on images: Abs and Sqr through the row functions
// (their steps rounded down to a multiple of 4), and the absolute
// differences of two images or of an image and a constant.
#include "variant.h"

#include "piinternal.h"

ZOR_BEGIN
namespace {

using simd::vf32;
using simd::vs32;
using simd::vu8;
using simd::vu16;

typedef ZorStatus (*UnaryRow)(const Zor32f*, Zor32f*, int32_t);

ZorStatus unary_rounded_steps(UnaryRow fn, const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                              int32_t dstStep, ZoriSize roi) {
    if (!pSrc || !pDst) return zorStsNullPtrErr;
    if (roi.width < 1 || roi.height < 1) return zorStsSizeErr;
    if (srcStep < 1 || dstStep < 1) return zorStsStepErr;
    srcStep &= ~3;
    dstStep &= ~3;
    for (int32_t y = 0; y < roi.height; ++y)
        fn(row_at(pSrc, srcStep, y), row_at(pDst, dstStep, y),
           roi.width);
    return zorStsNoErr;
}

#if ZOR_SQR_WORKING_SET
inline void sqr1(const Zor32f* s, Zor32f* d, int32_t i) {
    const float x = simd::load<float>(s + i);
    simd::store(d + i, x * x);
}

// Squares of one run; nt streams the stores past the caches, prefetch > 0
// touches the source that many bytes ahead.
void ownsSqr_32f_NTP(const Zor32f* s, Zor32f* d, int32_t len, bool nt, int32_t prefetch) {
    constexpr int L = simd::Lanes<vf32>::count;
    int32_t i = 0;
    if (nt && (uintptr_t)d % 4 == 0) {
        for (; i < len && (uintptr_t)(d + i) % ZOR_VECTOR_BYTES != 0; ++i) sqr1(s, d, i);
        for (; i + L <= len; i += L) {
            if (prefetch) _mm_prefetch((const char*)(s + i) + prefetch, _MM_HINT_T0);
            const vf32 x = simd::load<vf32>(s + i);
            simd::stream(d + i, x * x);
        }
        simd::store_fence();
    } else {
        for (; i + L <= len; i += L) {
            if (prefetch) _mm_prefetch((const char*)(s + i) + prefetch, _MM_HINT_T0);
            const vf32 x = simd::load<vf32>(s + i);
            simd::store(d + i, x * x);
        }
    }
    for (; i < len; ++i) sqr1(s, d, i);
}

// Memory behaviour by the working set W = width * 8 * height (signed 32
// bits, wrapping): no prefetch up to 32 KiB, prefetch up to 6 MiB,
// non-temporal stores beyond. Rows that follow each other run as one.
void owniSqr_32f_C1(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst, int32_t dstStep,
                    ZoriSize roi) {
    const int32_t W = (int32_t)((uint32_t)roi.width * 8u * (uint32_t)roi.height);
    const bool small = W <= 32768, mid = !small && W <= 0x600000;
    if (srcStep == dstStep && srcStep == (int64_t)roi.width * 4 &&
        (int64_t)roi.width * roi.height <= INT32_MAX) {
        ownsSqr_32f_NTP(pSrc, pDst, roi.width * roi.height, !small && !mid, small || !mid ? 0 : 256);
        return;
    }
    const int32_t pf = small ? 0 : mid && roi.height == 1 ? 256 : srcStep;
    for (int32_t y = 0; y < roi.height; ++y)
        ownsSqr_32f_NTP(row_at(pSrc, srcStep, y),
                        row_at(pDst, dstStep, y), roi.width, !small && !mid, pf);
}
#endif

// ---- absolute differences ---------------------------------------------------

// |a - b| of unsigned integers: larger minus smaller, which is the sum of
// the two saturating differences.
template <typename V>
inline V absdiff_u(V a, V b) {
    return (a > b ? a : b) - (a > b ? b : a);
}
inline Zor8u absdiff(Zor8u a, Zor8u b) { return (Zor8u)(a > b ? a - b : b - a); }
inline Zor16u absdiff(Zor16u a, Zor16u b) { return (Zor16u)(a > b ? a - b : b - a); }
inline vu8 absdiff(vu8 a, vu8 b) { return absdiff_u(a, b); }
inline vu16 absdiff(vu16 a, vu16 b) { return absdiff_u(a, b); }
// The difference with its sign bit cleared (NaN too).
inline float absdiff(float a, float b) {
    float d = a - b;
    uint32_t u;
    memcpy(&u, &d, 4);
    u &= 0x7fffffffu;
    memcpy(&d, &u, 4);
    return d;
}
inline vf32 absdiff(vf32 a, vf32 b) { return (vf32)((vs32)(a - b) & 0x7fffffff); }

// Rows of |a - b| where b is either a second image or a constant (Step 0
// with the constant broadcast). nt: stream the stores; the caller asks for
// it only when every pointer and step is vector aligned.
template <typename T, typename V, bool Const>
void absdiff_rows(const T* pa, int32_t sa, const T* pb, int32_t sb, T* pd, int32_t sd,
                  ZoriSize roi, T value, bool nt) {
    constexpr int L = ZOR_VECTOR_BYTES / sizeof(T);
    const V vv = simd::broadcast<V>(value);
    for (int32_t y = 0; y < roi.height; ++y) {
        const T* a = row_at(pa, sa, y);
        const T* b = Const ? nullptr : row_at(pb, sb, y);
        T* d = row_at(pd, sd, y);
        int32_t i = 0;
        for (; i + L <= roi.width; i += L) {
            const V r = absdiff(simd::load<V>(a + i), Const ? vv : simd::load<V>(b + i));
            if (nt)
                simd::stream(d + i, r);
            else
                simd::store(d + i, r);
        }
        for (; i < roi.width; ++i)
            simd::store(d + i, absdiff(simd::load<T>(a + i), Const ? value : simd::load<T>(b + i)));
    }
    if (nt) simd::store_fence();
}

// Non-temporal stores on the SSE levels that have no faster way, when the
// working set reaches the largest cache (a failed query leaves 0, so large)
// and everything is 16-byte aligned.
inline bool stream_stores(int32_t bytesPerPixel, ZoriSize roi, const void* p1, int32_t s1,
                          const void* p2, int32_t s2, const void* p3, int32_t s3) {
#if ZOR_CACHE_TEST_ABSDIFF
    int32_t cache = 0;
    zorGetMaxCacheSizeB(&cache);
    const int32_t W =
        (int32_t)((uint32_t)roi.height * (uint32_t)bytesPerPixel * (uint32_t)roi.width);
    if (W < cache) return false;
    return (((uintptr_t)p1 | (uintptr_t)p2 | (uintptr_t)p3 | (uintptr_t)(uint32_t)s1 |
              (uintptr_t)(uint32_t)s2 | (uintptr_t)(uint32_t)s3) & 15) == 0;
#else
    (void)bytesPerPixel, (void)roi, (void)p1, (void)s1, (void)p2, (void)s2, (void)p3, (void)s3;
    return false;
#endif
}

template <typename T>
ZorStatus absdiff_checks(const T* p1, int32_t s1, const T* p2, int32_t s2, const T* p3,
                         int32_t s3, ZoriSize roi) {
    if (!p1 || !p2 || !p3) return zorStsNullPtrErr;
    if (roi.width < 1 || roi.height < 1) return zorStsSizeErr;
    // In 64 bits: a width near 2^31 / sizeof(T) must fail here, not wrap.
    const int64_t row = (int64_t)roi.width * (int64_t)sizeof(T);
    if (s1 < row || s2 < row || s3 < row) return zorStsStepErr;
    if ((s1 | s2 | s3) % (int32_t)sizeof(T)) return zorStsNotEvenStepErr;
    return zorStsNoErr;
}

template <typename T, typename V>
ZorStatus absdiff_image(const T* p1, int32_t s1, const T* p2, int32_t s2, T* pd, int32_t sd,
                        ZoriSize roi, bool cacheTest) {
    const ZorStatus st = absdiff_checks(p1, s1, p2, s2, pd, sd, roi);
    if (st != zorStsNoErr) return st;
    const bool nt =
        cacheTest && stream_stores(3 * (int32_t)sizeof(T), roi, p1, s1, p2, s2, pd, sd);
    absdiff_rows<T, V, false>(p1, s1, p2, s2, pd, sd, roi, T(), nt);
    return zorStsNoErr;
}

}  // namespace

ZOR_ENTRY ZorStatus ZOR_NAME(zoriAbs_32f_C1R)(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                                              int32_t dstStep, ZoriSize roiSize) {
    return unary_rounded_steps(ZOR_NAME(zorsAbs_32f), pSrc, srcStep, pDst, dstStep, roiSize);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriSqr_32f_C1R)(const Zor32f* pSrc, int32_t srcStep, Zor32f* pDst,
                                              int32_t dstStep, ZoriSize roiSize) {
#if ZOR_SQR_WORKING_SET
    if (!pSrc || !pDst) return zorStsNullPtrErr;
    if (roiSize.width < 1 || roiSize.height < 1) return zorStsSizeErr;
    if (srcStep < 1 || dstStep < 1) return zorStsStepErr;
    owniSqr_32f_C1(pSrc, srcStep & ~3, pDst, dstStep & ~3, roiSize);
    return zorStsNoErr;
#else
    return unary_rounded_steps(ZOR_NAME(zorsSqr_32f), pSrc, srcStep, pDst, dstStep, roiSize);
#endif
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriAbsDiff_8u_C1R)(const Zor8u* pSrc1, int32_t src1Step,
                                                 const Zor8u* pSrc2, int32_t src2Step, Zor8u* pDst,
                                                 int32_t dstStep, ZoriSize roiSize) {
    return absdiff_image<Zor8u, vu8>(pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roiSize,
                                     false);
}
ZOR_ENTRY ZorStatus ZOR_NAME(zoriAbsDiff_16u_C1R)(const Zor16u* pSrc1, int32_t src1Step,
                                                  const Zor16u* pSrc2, int32_t src2Step,
                                                  Zor16u* pDst, int32_t dstStep,
                                                  ZoriSize roiSize) {
    return absdiff_image<Zor16u, vu16>(pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roiSize,
                                       true);
}
ZOR_ENTRY ZorStatus ZOR_NAME(zoriAbsDiff_32f_C1R)(const Zor32f* pSrc1, int32_t src1Step,
                                                  const Zor32f* pSrc2, int32_t src2Step,
                                                  Zor32f* pDst, int32_t dstStep,
                                                  ZoriSize roiSize) {
    return absdiff_image<Zor32f, vf32>(pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roiSize,
                                       true);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriAbsDiffC_32f_C1R)(const Zor32f* pSrc, int32_t srcStep,
                                                   Zor32f* pDst, int32_t dstStep,
                                                   ZoriSize roiSize, Zor32f value) {
    // The source stands in for the missing second image in the checks.
    const ZorStatus st = absdiff_checks(pSrc, srcStep, pSrc, srcStep, pDst, dstStep, roiSize);
    if (st != zorStsNoErr) return st;
    const bool nt = stream_stores(8, roiSize, pSrc, srcStep, pSrc, srcStep, pDst, dstStep);
    absdiff_rows<Zor32f, vf32, true>(pSrc, srcStep, nullptr, 0, pDst, dstStep, roiSize, value,
                                     nt);
    return zorStsNoErr;
}

ZOR_END
