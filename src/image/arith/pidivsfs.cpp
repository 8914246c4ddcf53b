// Scaled integer quotients: zoriDiv_8u/16u/16s_C1RSfs, dst = src2 / src1,
// and the row forms zorsDiv_8u_Sfs and zorsDiv_16s_Sfs.
//
// Inside each type's range of scale factors the quotient is the single
// precision division (n * 2^-s) / d, the scaling being exact, clamped to the
// element's range and converted to the nearest integer (ties to even in
// the default rounding mode). Every level uses the true division
// instruction, so the integers agree on all of them. A zero divisor counts
// for status 2 and gives the largest value for n > 0, 0 for n == 0 and the
// smallest for n < 0: the lane divides by 2^-64 instead, which takes any
// non-zero scaled numerator past the clamp with its own sign. Outside the
// range the results are known without dividing.
#include "variant.h"

#include "piinternal.h"

ZOR_BEGIN
namespace {

using simd::vf32;
using simd::vs32;

constexpr int L = simd::Lanes<vf32>::count;

struct D8u {
    typedef Zor8u T;
    typedef uint8_t N __attribute__((vector_size(L)));
    static constexpr int kMinS = -15, kMaxS = 8;
    static constexpr int32_t kHi = 255, kLo = 0;
};
struct D16u {
    typedef Zor16u T;
    typedef uint16_t N __attribute__((vector_size(2 * L)));
    static constexpr int kMinS = -31, kMaxS = 16;
    static constexpr int32_t kHi = 65535, kLo = 0;
};
struct D16s {
    typedef Zor16s T;
    typedef int16_t N __attribute__((vector_size(2 * L)));
    static constexpr int kMinS = -30, kMaxS = 15;
    static constexpr int32_t kHi = 32767, kLo = -32768;
};

inline float pow2(int e) {
    const uint32_t bits = (uint32_t)(127 + e) << 23;
    float f;
    memcpy(&f, &bits, 4);
    return f;
}

// A zero divisor's result.
template <typename E>
inline int32_t by_zero(int32_t n) {
    return n > 0 ? E::kHi : n < 0 ? E::kLo : 0;
}

template <typename E>
inline int32_t quotient(int32_t n, int32_t d, float scale, float tiny) {
    const float df = d == 0 ? tiny : (float)d;
    float q = ((float)n * scale) / df;
    q = q < (float)E::kHi ? q : (float)E::kHi;
    q = q > (float)E::kLo ? q : (float)E::kLo;
    return arith::round_to_int(q);
}

template <typename E>
inline vs32 quotient(vs32 n, vs32 d, vf32 scale, vf32 tiny, vs32& zeros) {
    const vs32 z = d == 0;
    zeros |= z;
    const vf32 df = z ? tiny : __builtin_convertvector(d, vf32);
    vf32 q = (__builtin_convertvector(n, vf32) * scale) / df;
    const vf32 hi = simd::broadcast<vf32>((float)E::kHi), lo = simd::broadcast<vf32>((float)E::kLo);
    q = q < hi ? q : hi;
    if constexpr (E::kLo != 0) q = q > lo ? q : lo;
    return arith::round_to_int(q);
}

template <typename E>
inline vs32 widen(const typename E::T* p) {
    return __builtin_convertvector(simd::load<typename E::N>(p), vs32);
}

// Sixteen results of the block at i; 8u as one 16-byte store.
template <typename E>
inline void block16(const typename E::T* a, const typename E::T* b, typename E::T* d, vf32 scale,
                    vf32 tiny, vs32& zeros) {
    vs32 r[arith::kMaskVectors];
    for (int k = 0; k < arith::kMaskVectors; ++k)
        r[k] = quotient<E>(widen<E>(b + k * L), widen<E>(a + k * L), scale, tiny, zeros);
    if constexpr (sizeof(typename E::T) == 1) {
        simd::store(d, arith::narrow16<true>(r));
    } else {
        for (int k = 0; k < arith::kMaskVectors; ++k)
            simd::store(d + k * L, __builtin_convertvector(r[k], typename E::N));
    }
}

// One row: a holds the divisors, b the numerators.
template <typename E>
ZorStatus div_row(const typename E::T* a, const typename E::T* b, typename E::T* d, int32_t len,
                  int s) {
    typedef typename E::T T;
    bool zero = false;
    if (s < E::kMinS) {
        // Every non-zero quotient saturates, by the signs (a zero divisor
        // counting as positive).
        for (int32_t i = 0; i < len; ++i) {
            const int32_t n = b[i], dv = a[i];
            zero |= dv == 0;
            d[i] = (T)(n == 0 ? 0 : ((n > 0) == (dv >= 0) ? E::kHi : E::kLo));
        }
    } else if (s > E::kMaxS) {
        // Every quotient rounds to 0; zero divisors keep their own rule.
        for (int32_t i = 0; i < len; ++i) {
            const int32_t n = b[i], dv = a[i];
            zero |= dv == 0;
            d[i] = (T)(dv == 0 ? by_zero<E>(n) : 0);
        }
    } else {
        const float scale = pow2(-s), tiny = pow2(-64);
        const vf32 vscale = simd::broadcast<vf32>(scale), vtiny = simd::broadcast<vf32>(tiny);
        vs32 zeros = vs32{};
        int32_t i = 0;
        for (; i + 16 <= len; i += 16) block16<E>(a + i, b + i, d + i, vscale, vtiny, zeros);
        for (int k = 0; k < L; ++k) zero |= zeros[k] != 0;
        for (; i < len; ++i) {
            zero |= a[i] == 0;
            d[i] = (T)quotient<E>(b[i], a[i], scale, tiny);
        }
    }
    return zero ? zorStsDivByZero : zorStsNoErr;
}

template <typename E>
inline ZorStatus check_row(const void* a, const void* b, const void* d, int32_t len) {
    if (!a || !b || !d) return zorStsNullPtrErr;
    if (len < 1) return zorStsSizeErr;
    return zorStsNoErr;
}

// Rows in order; the first row's non-zero status is the call's, and every
// row is computed.
template <typename E, typename Row>
inline ZorStatus div_rows(const typename E::T* pSrc1, int32_t src1Step, const typename E::T* pSrc2,
                          int32_t src2Step, typename E::T* pDst, int32_t dstStep, ZoriSize roi,
                          int s, Row rowFn) {
    typedef typename E::T T;
    ZorStatus status = zorStsNoErr;
    for (int32_t y = 0; y < roi.height; ++y) {
        const ZorStatus st = rowFn((const T*)arith::row(pSrc1, src1Step, y),
                                   (const T*)arith::row(pSrc2, src2Step, y),
                                   (T*)arith::row(pDst, dstStep, y), roi.width, s);
        if (status == zorStsNoErr) status = st;
    }
    return status;
}

inline ZorStatus check_image(const void* a, int32_t aStep, const void* b, int32_t bStep,
                             const void* d, int32_t dStep, ZoriSize roi, bool testSteps) {
    if (!a || !b || !d) return zorStsNullPtrErr;
    if (roi.width < 1 || roi.height < 1) return zorStsSizeErr;
    if (testSteps && (aStep < 1 || bStep < 1 || dStep < 1)) return zorStsStepErr;
    return zorStsNoErr;
}

ZorStatus ownps_Div_16u_Sfs(const Zor16u* pSrc1, const Zor16u* pSrc2, Zor16u* pDst, int32_t len,
                            int32_t scaleFactor) {
    return div_row<D16u>(pSrc1, pSrc2, pDst, len, scaleFactor);
}

}  // namespace
ZOR_END

ZOR_INTERNAL ZorStatus ZOR_NAME(zorsDiv_8u_Sfs)(const Zor8u* pSrc1, const Zor8u* pSrc2,
                                                Zor8u* pDst, int32_t len, int32_t scaleFactor) {
    using namespace ZOR_NS;
    const ZorStatus st = check_row<D8u>(pSrc1, pSrc2, pDst, len);
    if (st != zorStsNoErr) return st;
    return div_row<D8u>(pSrc1, pSrc2, pDst, len, scaleFactor);
}

ZOR_INTERNAL ZorStatus ZOR_NAME(zorsDiv_16s_Sfs)(const Zor16s* pSrc1, const Zor16s* pSrc2,
                                                 Zor16s* pDst, int32_t len, int32_t scaleFactor) {
    using namespace ZOR_NS;
    const ZorStatus st = check_row<D16s>(pSrc1, pSrc2, pDst, len);
    if (st != zorStsNoErr) return st;
    return div_row<D16s>(pSrc1, pSrc2, pDst, len, scaleFactor);
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriDiv_8u_C1RSfs)(const Zor8u* pSrc1, int32_t src1Step,
                                                const Zor8u* pSrc2, int32_t src2Step, Zor8u* pDst,
                                                int32_t dstStep, ZoriSize roiSize,
                                                int32_t scaleFactor) {
    using namespace ZOR_NS;
    const ZorStatus st =
        check_image(pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roiSize, true);
    if (st != zorStsNoErr) return st;
    return div_rows<D8u>(pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roiSize, scaleFactor,
                         ZOR_NAME(zorsDiv_8u_Sfs));
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriDiv_16s_C1RSfs)(const Zor16s* pSrc1, int32_t src1Step,
                                                 const Zor16s* pSrc2, int32_t src2Step,
                                                 Zor16s* pDst, int32_t dstStep, ZoriSize roiSize,
                                                 int32_t scaleFactor) {
    using namespace ZOR_NS;
    const ZorStatus st =
        check_image(pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roiSize, true);
    if (st != zorStsNoErr) return st;
    return div_rows<D16s>(pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roiSize, scaleFactor,
                          ZOR_NAME(zorsDiv_16s_Sfs));
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriDiv_16u_C1RSfs)(const Zor16u* pSrc1, int32_t src1Step,
                                                 const Zor16u* pSrc2, int32_t src2Step,
                                                 Zor16u* pDst, int32_t dstStep, ZoriSize roiSize,
                                                 int32_t scaleFactor) {
    using namespace ZOR_NS;
    // No step test on this one.
    const ZorStatus st =
        check_image(pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roiSize, false);
    if (st != zorStsNoErr) return st;
    return div_rows<D16u>(pSrc1, src1Step, pSrc2, src2Step, pDst, dstStep, roiSize, scaleFactor,
                          ownps_Div_16u_Sfs);
}
