// Float division: the row form zorsDiv_32f and the image division built on
// it. Each level divides the way its instruction set does it cheaply, and
// the results differ by level on purpose:
//   m7, n8, y8  reciprocal estimate r, t = 1 - d*r, q = n * (r + (r*t)*(1+t))
//   e9          the same in groups of 8
//   l9          t = fma(-d, r, 1), u = fma(t, t, t), q = n * fma(r, u, r)
//   n0, k0      true division, groups of 16
// A row goes through in groups of one vector from its start (the last group
// may be short; it is computed as a whole group padded with 1 / 0). Zero
// divisors are found per group and their lanes replaced afterwards. The
// level's rules are the ZOR_DIV_ facts of level_config.h.
#include "variant.h"

#include <immintrin.h>

#include "piinternal.h"

ZOR_BEGIN
namespace {

using simd::vf32;
using simd::vs32;

constexpr int G = simd::Lanes<vf32>::count;

inline bool any(vs32 m) {
#if ZOR_VECTOR_BYTES == 16
    return _mm_movemask_ps((__m128)m) != 0;
#elif ZOR_VECTOR_BYTES == 32
    return _mm256_movemask_ps((__m256)m) != 0;
#else
    return _mm512_test_epi32_mask((__m512i)m, (__m512i)m) != 0;
#endif
}

#if !ZOR_DIV_TRUE
inline vf32 rcp(vf32 d) {
#if ZOR_VECTOR_BYTES == 16
    return (vf32)_mm_rcp_ps((__m128)d);
#else
    return (vf32)_mm256_rcp_ps((__m256)d);
#endif
}

// The refined reciprocal times n. A divisor whose estimate is 0 (infinite
// or beyond the estimate's range) is cleared first, so t is 1 and not NaN.
inline vf32 estimate_quotient(vf32 n, vf32 d) {
    const vf32 one = simd::broadcast<vf32>(1.0f);
    const vf32 r = rcp(d);
    d = (vf32)((vs32)d & ~(vs32)(r == 0.0f));
#if ZOR_HAS_FMA
    const __m256 t = _mm256_fnmadd_ps((__m256)d, (__m256)r, (__m256)one);
    const __m256 u = _mm256_fmadd_ps(t, t, t);
    return n * (vf32)_mm256_fmadd_ps((__m256)r, u, (__m256)r);
#else
    const vf32 t = one - d * r;
    return n * (r + (r * t) * (one + t));
#endif
}
#endif

// Infinity with the sign of n.
[[maybe_unused]] inline vf32 signed_inf(vf32 n) {
    return (vf32)(((vs32)n & simd::broadcast<vs32>((int32_t)0x80000000)) |
                  simd::broadcast<vs32>(0x7f800000));
}

// One group: quotients into q, returns whether a divisor counted as zero.
inline bool group(vf32 n, vf32 d, vf32& q) {
    const vf32 nan = (vf32)simd::broadcast<vs32>((int32_t)ZOR_DIV_NAN_BITS);
    // Numerator zero or NaN: the NaN pattern in a zero-divisor lane.
    const vs32 noSign = (n == 0.0f) | (n != n);
#if ZOR_DIV_ZERO_BITS
    const vs32 zero = (vs32)d == 0;  // +0 only; -0 runs through the estimate
#else
    const vs32 zero = d == 0.0f;
#endif
    const bool hasZero = any(zero);
#if ZOR_DIV_TRUE
    // Division already gives the right infinity for a signed numerator.
    q = n / d;
    if (hasZero) q = (zero & noSign) ? nan : q;
#elif ZOR_DIV_EXACT_ZERO_GROUPS
    if (!hasZero) {
        q = estimate_quotient(n, d);
        return false;
    }
    // The numerator's sign only, whatever the zero's; other lanes of the
    // group divide exactly, and NaN divisors give the pattern as well.
    const vf32 signedInf = signed_inf(n);
    q = n / d;
    q = (d != d) ? nan : q;
    q = zero ? (noSign ? nan : signedInf) : q;
#else
    q = estimate_quotient(n, d);
    if (hasZero) {
        const vf32 signedInf = signed_inf(n);
        q = zero ? (noSign ? nan : signedInf) : q;
    }
#endif
    return hasZero;
}

}  // namespace

ZOR_INTERNAL ZorStatus ZOR_NAME(zorsDiv_32f)(const Zor32f* pSrc1, const Zor32f* pSrc2,
                                             Zor32f* pDst, int32_t len) {
    if (!pSrc1 || !pSrc2 || !pDst) return zorStsNullPtrErr;
    if (len < 1) return zorStsSizeErr;
    bool zero = false;
    vf32 q;
    int32_t i = 0;
    for (; i + G <= len; i += G) {
        zero |= group(simd::load<vf32>(pSrc2 + i), simd::load<vf32>(pSrc1 + i), q);
        simd::store(pDst + i, q);
    }
    if (i < len) {
        const int32_t k = len - i;
        vf32 n = simd::broadcast<vf32>(0.0f), d = simd::broadcast<vf32>(1.0f);
        memcpy(&n, pSrc2 + i, (size_t)k * 4);
        memcpy(&d, pSrc1 + i, (size_t)k * 4);
        zero |= group(n, d, q);
        memcpy(pDst + i, &q, (size_t)k * 4);
    }
    return zero ? zorStsDivByZero : zorStsNoErr;
}

ZOR_ENTRY ZorStatus ZOR_NAME(zoriDiv_32f_C1R)(const Zor32f* pSrc1, int32_t src1Step,
                                              const Zor32f* pSrc2, int32_t src2Step, Zor32f* pDst,
                                              int32_t dstStep, ZoriSize roiSize) {
    if (!pSrc1 || !pSrc2 || !pDst) return zorStsNullPtrErr;
    if (roiSize.width < 1 || roiSize.height < 1) return zorStsSizeErr;
    if (src1Step < 1 || src2Step < 1 || dstStep < 1) return zorStsStepErr;
    ZorStatus status = zorStsNoErr;
    for (int32_t y = 0; y < roiSize.height; ++y) {
        const ZorStatus st = ZOR_NAME(zorsDiv_32f)(row_at(pSrc1, src1Step, y),
                                                   row_at(pSrc2, src2Step, y),
                                                   row_at(pDst, dstStep, y),
                                                   roiSize.width);
        if (status == zorStsNoErr) status = st;
    }
    return status;
}

ZOR_END
